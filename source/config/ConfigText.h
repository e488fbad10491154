// Texts of settings, between the forms that the interface and the stores have.
#ifndef TESSEL_SOURCE_CONFIG_CONFIGTEXT_H
#define TESSEL_SOURCE_CONFIG_CONFIGTEXT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/memory/MemoryManager.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <string>
#include <string_view>

namespace tessel {

// White space, in every locale.
inline constexpr std::string_view kWhiteSpace = " \t\n\v\f\r";

inline std::string_view Trimmed(std::string_view text) {
    size_t begin = text.find_first_not_of(kWhiteSpace);
    return begin == text.npos ? std::string_view() : text.substr(begin, text.find_last_not_of(kWhiteSpace) - begin + 1);
}

// Resizes or makes *handle, and fills it.
inline MgErr StoreText(std::string_view text, LStrHandle* handle) {
    if (text.size() > static_cast<size_t>(std::numeric_limits<int32>::max()) - offsetof(LStr, bytes))
        return kMemFullErr;
    auto count = static_cast<int32>(text.size());
    MgErr err = DSSetHandleSizeOrNewHandle(reinterpret_cast<UHandle*>(handle), LStrSize(count));
    if (err) return err;
    (**handle)->count = count;
    if (count) std::memcpy((**handle)->bytes, text.data(), text.size());
    return kNoErr;
}

// The bytes of a PStr; null is empty.
inline std::string_view TextOf(ConstPStr text) {
    return text ? std::string_view(reinterpret_cast<const char*>(text + 1), text[0]) : std::string_view();
}

// The bytes of a string handle; null and one that is too short for a count are empty.
inline std::string_view TextOf(LStrHandle handle) {
    if (!handle) return {};
    uint32 size = DSGetHandleSize(reinterpret_cast<UHandle>(handle));
    if (size < LStrSize(0) || (*handle)->count <= 0) return {};
    size_t count = std::min<size_t>(static_cast<size_t>((*handle)->count), size - LStrSize(0));
    return {reinterpret_cast<const char*>((*handle)->bytes), count};
}

}  // namespace tessel

#endif
