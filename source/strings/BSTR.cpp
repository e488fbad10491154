// Counted wide texts: a block holds their size and then the text.
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/strings/BSTR.h>

#include <cstring>

namespace tessel {
namespace {

constexpr uint32 kMaxLength = INT32_MAX / sizeof(char16_t) - sizeof(uint32);

}  // namespace

BSTR BSTRAlloc(const char16_t* text, uint32 length) {
    if (length > kMaxLength) return nullptr;
    const auto size = static_cast<uint32>(length * sizeof(char16_t));
    auto* block = static_cast<uint8*>(TrackedMalloc(sizeof size + size + sizeof(char16_t)));
    if (!block) return nullptr;
    std::memcpy(block, &size, sizeof size);
    auto* string = reinterpret_cast<BSTR>(block + sizeof size);
    if (text) std::memcpy(string, text, size);
    string[length] = 0;
    return string;
}

void BSTRFree(BSTR text) {
    if (text) TrackedFree(reinterpret_cast<uint8*>(text) - sizeof(uint32));
}

uint32 BSTRLength(const char16_t* text) {
    if (!text) return 0;
    uint32 size;
    std::memcpy(&size, reinterpret_cast<const uint8*>(text) - sizeof size, sizeof size);
    return static_cast<uint32>(size / sizeof(char16_t));
}

}  // namespace tessel
