#include "support/Test.h"
#include <tessel/streams/Endianizer.h>

#include <array>

namespace tessel::test {
namespace {

using Bytes16 = std::array<uint8, 16>;

TEST(ByteOrder, HelpersWorkInPlaceAtAnyAddress) {
    uint8 bytes[9] = {0xEE, 1, 2, 3, 4, 5, 6, 7, 8};
    uint32 halves = 0x11223344, reversed = 0x33441122;
    uint16 word = 0x1122;
    RevBQ(bytes + 1);
    SwapWL(&halves);
    RevBL(&reversed);
    SwapBW(&word);
    EXPECT_EACH(std::memcmp(bytes, "\xEE\x08\x07\x06\x05\x04\x03\x02\x01", 9) == 0, halves == 0x33441122u,
                reversed == 0x22114433u, word == 0x2211u);
}

TEST(Endianizer, IntegersInBothOrders) {
    const uint8 stream[16] = {0x81, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
    EXPECT_EACH(int16(0x8102) == BigEndianizer()->ToNative16(stream),
                int16(0x0281) == LittleEndianizer()->ToNative16(stream),
                int32(0x81020304) == BigEndianizer()->ToNative32(stream),
                int32(0x04030281) == NativeEndianizer()->ToNative32(stream));
    uint64 value;
    uint8 all[16], back[16];
    BigEndianizer()->CopyToNative64(stream, &value);
    BigEndianizer()->CopyToNative128(stream, all);
    BigEndianizer()->FromNative128(all, back);
    EXPECT_EACH(value == 0x8102030405060708u, std::equal(all, all + 16, std::rbegin(stream)));
    EXPECT_EACH(std::memcmp(stream, back, 16) == 0, BigEndianizer()->IsSwapping() == 1,
                LittleEndianizer()->IsSwapping() == 0, NativeEndianizer()->IsSwapping() == 0);
}

floatExt Extended(uint16 signExponent, uint64 mantissa) {
    floatExt value;
    value.signExponent = signExponent;
    value.mantissa = mantissa;
    return value;
}

// The stream form is that of binary128: -1.5 is BFFF 8000..., a denormal keeps its mantissa.
TEST(Endianizer, ExtendedRealsInTheStandardForm) {
    const floatExt minusOneAndAHalf = Extended(0xBFFF, 0xC000000000000000u);
    const floatExt denormal = Extended(0, 0x0000000000000301u);
    const std::pair<floatExt, Bytes16> rows[] = {{minusOneAndAHalf, {0xBF, 0xFF, 0x80}},
                                                 {denormal, {0, 0, 0, 0, 0, 0, 0, 0, 3, 1}}};
    for (const auto& [value, bytes] : rows) {
        Bytes16 big, little;
        big.fill(0xAA);
        little.fill(0xAA);
        BigEndianizer()->FromNativeFX(value, big.data());
        LittleEndianizer()->FromNativeFX(value, little.data());
        EXPECT_EACH(bytes == big, std::equal(big.begin(), big.end(), little.rbegin()));
        big[15] = 77;  // the last six bytes are not looked at
        const floatExt fromBig = BigEndianizer()->ToNativeFX(big.data());
        const floatExt fromLittle = LittleEndianizer()->ToNativeFX(little.data());
        EXPECT_EACH(std::memcmp(&value, &fromBig, sizeof fromBig) == 0,
                    std::memcmp(&value, &fromLittle, sizeof fromLittle) == 0);
    }
    EXPECT_EACH(BigEndianizer()->StreamFXSize() == 16u, NativeEndianizer()->StreamFXSize() == 10u);
}

}  // namespace
}  // namespace tessel::test
