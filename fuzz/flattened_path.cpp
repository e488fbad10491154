// Flattened paths from outside: nothing is read past the bytes, and what is read comes back the same when it is
// flattened and read again.
//
// Input: a byte for the code page and the setting, then the bytes.
#include "platform/CodePage.h"
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/frame/TesselInit.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>

#include <cstdlib>
#include <cstring>
#include <memory>

namespace {

constexpr uint32 kCodePages[] = {65001, 932, 1252};

void Quiet(CStr, int32, CStr, int32, uint32, CStr) {
}

void Require(bool condition) {
    if (!condition) std::abort();
}

// A block of just that size, so that a read past its end is seen.
std::unique_ptr<uint8[]> Block(const uint8* bytes, size_t size) {
    std::unique_ptr<uint8[]> block(new uint8[size]);
    if (size) std::memcpy(block.get(), bytes, size);
    return block;
}

// Not every text of another code page can be told in UTF-8 and back; where names are UTF-8 the path is the same.
void CheckFlattenedAgain(Path path, bool exact) {
    const int32 size = FFlattenPath(path, nullptr);
    if (size == 0) return;  // a name that has become too long
    std::unique_ptr<uint8[]> block(new uint8[static_cast<size_t>(size)]);
    Require(FFlattenPath(path, block.get()) == size);
    Path again = nullptr;
    Require(FUnFlattenPath2(block.get(), &again, size) == size);
    if (exact) Require(again && again->Equals(*path, tessel::PathRef::kExact));
    FDestroyPath(&again);
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    DebugOutputSetHandler(Quiet);
    return InitTesselBase();
}

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t size) {
    if (size == 0) return -1;
    const uint32 codePage = kCodePages[data[0] % 3];
    Require(tessel::platform::SetCodePage(codePage));
    tessel::PathRef::Setting(data[0] & 0x80 ? "utf8" : "sysenc");
    const int32 length = static_cast<int32>(size - 1);
    const std::unique_ptr<uint8[]> block = Block(data + 1, size - 1);
    Path path = nullptr;
    const int32 read = FUnFlattenPath2(block.get(), &path, length);
    Require(read >= 0 && read <= length + 1 && (path == nullptr || read <= length));
    if (path) CheckFlattenedAgain(path, codePage == 65001);
    FDestroyPath(&path);
    return 0;
}
