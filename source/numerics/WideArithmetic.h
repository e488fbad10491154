// Integers wider than a register, as far as exact decimal conversion needs them.
#pragma once

#include <tessel/base/Types.h>

#include <array>
#include <bit>

namespace tessel {

struct Uint128 {
    uint64 high;
    uint64 low;
};

constexpr Uint128 Multiply64(uint64 a, uint64 b) {
#ifdef __SIZEOF_INT128__
    __extension__ using Native = unsigned __int128;
    const Native product = static_cast<Native>(a) * b;
    return {static_cast<uint64>(product >> 64), static_cast<uint64>(product)};
#else
    const uint64 aLow = static_cast<uint32>(a);
    const uint64 aHigh = a >> 32;
    const uint64 bLow = static_cast<uint32>(b);
    const uint64 bHigh = b >> 32;
    const uint64 low = aLow * bLow;
    const uint64 middle = aHigh * bLow + (low >> 32);
    const uint64 middle2 = aLow * bHigh + static_cast<uint32>(middle);
    return {aHigh * bHigh + (middle >> 32) + (middle2 >> 32), (middle2 << 32) | static_cast<uint32>(low)};
#endif
}

// An unsigned integer of up to 32 * Limbs bits. What exceeds them is lost; callers choose a size that suffices.
template <int Limbs>
class BigUnsigned {
public:
    constexpr explicit BigUnsigned(uint64 value) : size_(0) {
        for (; value != 0; value >>= 32) limbs_[size_++] = static_cast<uint32>(value);
    }

    constexpr void MultiplyAdd(uint32 factor, uint32 addend) {
        uint64 carry = addend;
        for (int i = 0; i < size_; ++i) {
            carry += static_cast<uint64>(limbs_[i]) * factor;
            limbs_[i] = static_cast<uint32>(carry);
            carry >>= 32;
        }
        if (carry != 0 && size_ < Limbs) limbs_[size_++] = static_cast<uint32>(carry);
    }

    constexpr void DivideBy(uint32 divisor) {
        uint64 rest = 0;
        for (int i = size_ - 1; i >= 0; --i) {
            rest = (rest << 32) | limbs_[i];
            limbs_[i] = static_cast<uint32>(rest / divisor);
            rest %= divisor;
        }
        Trim();
    }

    constexpr void MultiplyByPowerOfFive(int power) {
        constexpr uint32 kFiveTo13 = 1220703125;
        for (; power >= 13; power -= 13) MultiplyAdd(kFiveTo13, 0);
        for (; power > 0; --power) MultiplyAdd(5, 0);
    }

    constexpr void ShiftLeft(int bits) {
        const int words = bits / 32;
        const int rest = bits % 32;
        if (rest != 0) MultiplyAdd(uint32{1} << rest, 0);
        const int moved = size_ + words <= Limbs ? size_ : Limbs - words;
        for (int i = moved - 1; i >= 0; --i) limbs_[i + words] = limbs_[i];
        for (int i = 0; i < words; ++i) limbs_[i] = 0;
        size_ = moved + words;
        Trim();
    }

    // Index of the highest set bit; -1 for zero.
    constexpr int TopBit() const {
        return size_ == 0 ? -1 : 32 * (size_ - 1) + 31 - std::countl_zero(limbs_[size_ - 1]);
    }

    // The 128 bits from the highest set bit down; zeros follow a shorter number.
    constexpr Uint128 Top128() const {
        const int top = TopBit();
        return {Bits64(top - 63), Bits64(top - 127)};
    }

    // -1, 0 or 1.
    constexpr int Compare(const BigUnsigned& other) const {
        if (size_ != other.size_) return size_ < other.size_ ? -1 : 1;
        for (int i = size_ - 1; i >= 0; --i) {
            if (limbs_[i] != other.limbs_[i]) return limbs_[i] < other.limbs_[i] ? -1 : 1;
        }
        return 0;
    }

private:
    constexpr uint32 Limb(int index) const { return index >= 0 && index < size_ ? limbs_[index] : 0; }
    constexpr uint64 Bits64(int first) const {
        const int shift = first & 31;
        const int index = (first - shift) / 32;
        const uint64 low = (static_cast<uint64>(Limb(index + 1)) << 32) | Limb(index);
        return shift == 0 ? low : (low >> shift) | (static_cast<uint64>(Limb(index + 2)) << (64 - shift));
    }
    constexpr void Trim() {
        while (size_ > 0 && limbs_[size_ - 1] == 0) --size_;
    }

    std::array<uint32, Limbs> limbs_{};
    int size_;
};

}  // namespace tessel
