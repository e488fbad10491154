// Constants in every precision.
#include "numerics/Extended.h"
#include "numerics/Service.h"
#include <tessel/numerics/FloatingPointConstants.h>

#include <bit>

namespace tessel {
namespace {

constexpr int kDoubleMantissaBits = 52;
constexpr int kDoubleBias = 1023;

// A positive normal double, or zero, widened.
constexpr floatExt ExtendedOf(double x) {
    const auto bits = std::bit_cast<uint64>(x);
    if (bits == 0) return {0, 0};
    const auto exponent = static_cast<int>(bits >> kDoubleMantissaBits) - kDoubleBias + kExtendedBias;
    return {kExtendedIntegerBit | (bits << (63 - kDoubleMantissaBits)), static_cast<uint16>(exponent)};
}

constexpr floatExt PowerOfTwo(int exponent) {
    return {kExtendedIntegerBit, static_cast<uint16>(exponent + kExtendedBias)};
}

constexpr float kSInfinity = std::bit_cast<float>(uint32{0x7F800000});
constexpr float kSNegInfinity = std::bit_cast<float>(uint32{0xFF800000});
constexpr double kDInfinity = std::bit_cast<double>(uint64{0x7FF0000000000000});
constexpr double kDNegInfinity = std::bit_cast<double>(uint64{0xFFF0000000000000});
constexpr double kDNaN = std::bit_cast<double>(~uint64{0});

}  // namespace

MgErr FloatingPointConstantsStart() {
    return kNoErr;
}

MgErr FloatingPointConstantsStop() {
    return kNoErr;
}

}  // namespace tessel

// NAME returns the address of its value.
#define EXTENDED_CONSTANT(NAME, VALUE)               \
    const floatExt* NAME(void) {                     \
        static constexpr floatExt kConstant = VALUE; \
        return &kConstant;                           \
    }

using namespace tessel;

EXTENDED_CONSTANT(ETwoPi, ExtendedOf(6.283185307179586232))
EXTENDED_CONSTANT(ERecipPi, ExtendedOf(0.31830988618379067154))
EXTENDED_CONSTANT(EE, ExtendedOf(2.71828182845904523536))
EXTENDED_CONSTANT(ERecipE, ExtendedOf(0.36787944117144232160))
EXTENDED_CONSTANT(Eln10, ExtendedOf(2.30258509299404568402))
EXTENDED_CONSTANT(EOne, PowerOfTwo(0))
EXTENDED_CONSTANT(EZero, ExtendedOf(0.0))
EXTENDED_CONSTANT(EInfinity, (floatExt{kExtendedIntegerBit, kExtendedExponentMask}))
EXTENDED_CONSTANT(ENegInfinity, (floatExt{kExtendedIntegerBit, kExtendedSign | kExtendedExponentMask}))
EXTENDED_CONSTANT(ENaN, (floatExt{~uint64{0}, kExtendedExponentMask}))
EXTENDED_CONSTANT(EPlanck, ExtendedOf(6.6260693e-34))    // CODATA 2002
EXTENDED_CONSTANT(EElemChg, ExtendedOf(1.60217653e-19))  // CODATA 2002
EXTENDED_CONSTANT(ESpeedLt, ExtendedOf(299792458))       // exact since 1983
EXTENDED_CONSTANT(EGravity, ExtendedOf(6.6742e-11))      // CODATA 2002
EXTENDED_CONSTANT(EAvgdro, ExtendedOf(6.0221415e23))     // CODATA 2002
EXTENDED_CONSTANT(ERydbrg, ExtendedOf(10973731.568525))  // CODATA 2002
EXTENDED_CONSTANT(EMlrGas, ExtendedOf(8.314472))         // CODATA 2002
EXTENDED_CONSTANT(ELnOfTwo, ExtendedOf(0.69314718055994530942))
EXTENDED_CONSTANT(ELogOfE, ExtendedOf(0.43429448190325182765))
EXTENDED_CONSTANT(ELnOfPi, ExtendedOf(1.14472988584940017414))
EXTENDED_CONSTANT(EEpsilon, PowerOfTwo(-52))
EXTENDED_CONSTANT(EEpsilonExt, PowerOfTwo(-63))
EXTENDED_CONSTANT(EEpsilonSgl, PowerOfTwo(-23))

float SInfinity(void) {
    return kSInfinity;
}
float SNegInfinity(void) {
    return kSNegInfinity;
}
double DInfinity(void) {
    return kDInfinity;
}
double DNegInfinity(void) {
    return kDNegInfinity;
}
double DNaN(void) {
    return kDNaN;
}
