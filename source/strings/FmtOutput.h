// Where formatted text goes: at most so many bytes at an address, or nowhere, only counted.
#ifndef TESSEL_STRINGS_FMTOUTPUT_H
#define TESSEL_STRINGS_FMTOUTPUT_H

#include "base/Compiler.h"
#include "strings/DecimalDigits.h"
#include <tessel/base/Types.h>

#include <algorithm>
#include <bit>
#include <cstring>

namespace tessel {

// GCC 12 warns of the branches that a constant length does not take, in instrumented builds.
#if defined(__GNUC__) && !defined(__clang__)
#    pragma GCC diagnostic push
#    pragma GCC diagnostic ignored "-Warray-bounds"
#    pragma GCC diagnostic ignored "-Wstringop-overread"
#endif

// Copies and fills of a few bytes without a call, which would cost more than the work.
inline void CopyFew(char* dst, const char* src, size_t n) {
    if (n > 16) {
        std::memcpy(dst, src, n);
    } else if (n >= 8) {
        uint64 first;
        uint64 last;
        std::memcpy(&first, src, 8);
        std::memcpy(&last, src + n - 8, 8);
        std::memcpy(dst, &first, 8);
        std::memcpy(dst + n - 8, &last, 8);
    } else if (n >= 4) {
        uint32 first;
        uint32 last;
        std::memcpy(&first, src, 4);
        std::memcpy(&last, src + n - 4, 4);
        std::memcpy(dst, &first, 4);
        std::memcpy(dst + n - 4, &last, 4);
    } else if (n != 0) {
        dst[0] = src[0];
        if (n > 1) std::memcpy(dst + n - 2, src + n - 2, 2);
    }
}

inline void FillFew(char* dst, char byte, size_t n) {
    if (n > 16) {
        std::memset(dst, byte, n);
        return;
    }
    const uint64 word = static_cast<uint8>(byte) * uint64{0x0101010101010101};
    if (n >= 8) {
        std::memcpy(dst, &word, 8);
        std::memcpy(dst + n - 8, &word, 8);
    } else if (n >= 4) {
        std::memcpy(dst, &word, 4);
        std::memcpy(dst + n - 4, &word, 4);
    } else if (n != 0) {
        dst[0] = byte;
        if (n > 1) std::memcpy(dst + n - 2, &word, 2);
    }
}

#if defined(__GNUC__) && !defined(__clang__)
#    pragma GCC diagnostic pop
#endif

class FmtOutput {
public:
    // A null dst counts. What goes beyond `limit` bytes is dropped.
    FmtOutput(char* dst, size_t limit) : dst_(dst), limit_(limit) {}

    size_t Used() const { return used_; }
    bool HasRoom() const { return used_ < limit_; }
    void Restart() { used_ = 0; }

    // Another output to the same place, and going on where that one is. Only the one word that changes is passed
    // between the two: a copy of all three is made by wider loads, which wait for the word that was just written.
    FmtOutput Twin() const { return FmtOutput(dst_, limit_); }
    void Resume(const FmtOutput& twin) { used_ = twin.used_; }

    void Put(char byte) {
        if (!HasRoom()) return;
        if (dst_) dst_[used_] = byte;
        ++used_;
    }
    void Put(const void* bytes, size_t n) {
        n = std::min(n, limit_ - used_);
        if (dst_) CopyFew(dst_ + used_, static_cast<const char*>(bytes), n);
        used_ += n;
    }
    void Fill(char byte, size_t n) {
        n = std::min(n, limit_ - used_);
        if (dst_) FillFew(dst_ + used_, byte, n);
        used_ += n;
    }
    TESSEL_ALWAYS_INLINE void PutDecimal(uint64 magnitude, bool negative) {
        const size_t length = CountDecimalDigits(magnitude) + negative;
        char* place = Take(length);
        char text[kMaxDecimalDigits + 1];
        char* start = place ? place : text;
        WriteDecimalDigits(start + length, magnitude);
        if (negative) *start = '-';
        if (!place) Put(text, length);
    }

    void PutHex(uint32 value) {
        constexpr int kDigits = 8;
        const uint64 digits = HexDigits(value);
        const int unused = std::countl_zero(value | 1u) / 4;
        char text[kDigits];
        std::memcpy(text, &digits, sizeof text);
        Put(text + unused, static_cast<size_t>(kDigits - unused));
    }

    // The address of n bytes to be written by the caller, or null (then Put them).
    char* Take(size_t n) {
        if (!dst_ || n > limit_ - used_) return nullptr;
        char* place = dst_ + used_;
        used_ += n;
        return place;
    }

private:
    char* dst_;
    size_t used_ = 0;
    size_t limit_;
};

}  // namespace tessel

#endif
