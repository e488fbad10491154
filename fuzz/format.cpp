// Format strings from outside: nothing is written past the size, and counting agrees with writing.
//
// Input: a byte for the size, a byte for the code page, then the format. Every argument is the address of one object
// that is good for every conversion that takes an address; an integer conversion takes the address as a number.
#include "platform/CodePage.h"
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/strings/StringFmtPrint.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <sys/mman.h>

static_assert(sizeof(void*) == 8, "the object's first word is an address whose lower half is a count");

namespace {

constexpr uintptr_t kRegion = 0x200000000000;  // its lower half is 0
constexpr size_t kRegionSize = 0x1000;
constexpr size_t kText = 0x40;  // where the LStr of the handle and the bytes of the range lie
constexpr size_t kObject = 0x100;
constexpr std::ptrdiff_t kMaxSpecifiers = 20;  // each takes at most two arguments
constexpr uint32 kCodePages[] = {65001, 932, 1252};
constexpr char kGuard = '\x5A';

void Quiet(CStr, int32, CStr, int32, uint32, CStr) {
}

// As an LStr: 64 bytes. As a PStr: 64 bytes. As a handle: to the LStr at kText. As a range: 5 bytes there.
void* MakeObject() {
    void* region = mmap(reinterpret_cast<void*>(kRegion), kRegionSize, PROT_READ | PROT_WRITE,
                        MAP_PRIVATE | MAP_ANONYMOUS | MAP_FIXED_NOREPLACE, -1, 0);
    if (region == MAP_FAILED) std::abort();
    auto* bytes = static_cast<uint8*>(region);
    const FmtBytes range = {bytes + kText, 5};
    const LStr text = {20, {'t'}};
    std::memcpy(bytes + kText, &text, sizeof text);
    std::memcpy(bytes + kObject, &range, sizeof range);
    return bytes + kObject;
}

int32 Print(char* dst, int32 size, const std::string& format) {
    static void* const o = MakeObject();
    return SNPrintf(dst, size, format.c_str(), 0.5, -1e300, 1e18, 0.0, 3.25, -7.0, 1e-9, 42.0, o, o, o, o, o, o, o, o,
                    o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o, o,
                    o, o, o, o, o, o, o, o, o, o, o, o, o);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t length) {
    if (length < 2) return 0;
    DebugOutputSetHandler(Quiet);
    const int32 size = data[0];
    tessel::platform::SetCodePage(kCodePages[data[1] % std::size(kCodePages)]);
    std::string format(reinterpret_cast<const char*>(data + 2), length - 2);
    if (std::count(format.begin(), format.end(), '%') > kMaxSpecifiers) return 0;
    std::replace(format.begin(), format.end(), 'z', 'h');  // a path is none of the object's forms

    std::string room(static_cast<size_t>(size) + 16, kGuard);
    const int32 written = Print(room.data(), size, format);
    const int32 needed = Print(nullptr, 0, format);
    if (written > size || (written != size && written != needed)) std::abort();
    if (room.find_first_not_of(kGuard, static_cast<size_t>(size)) != std::string::npos) std::abort();
    if (size > 0 && room[static_cast<size_t>(std::min(written, size - 1))] != 0) std::abort();
    return 0;
}
