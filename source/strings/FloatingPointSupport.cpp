// Whether a number is finite, infinite or none.
#include "numerics/DecimalConversion.h"
#include "numerics/NumericAccess.h"
#include <tessel/strings/NumericText.h>

namespace tessel {
namespace {

int32 Classify(const RealParts& x) {
    switch (x.kind) {
        case RealKind::kNaN:
            return kFloatNaN;
        case RealKind::kInfinite:
            return x.negative ? kFloatNegInfinity : kFloatInfinity;
        default:
            return kFloatFinite;
    }
}

}  // namespace
}  // namespace tessel

using namespace tessel;

int32 ClassifyFloatNumber(const void* value, int16 typeCode) {
    if (value == nullptr) return kFloatFinite;
    switch (TypeOfCode(typeCode)) {
        case kNumSingle:
            return Classify(TakeApart(double{ReadAs<float>(value)}));
        case kNumDouble:
            return Classify(TakeApart(ReadAs<double>(value)));
        case kNumExtended:
            return Classify(TakeApart(ReadAs<floatExt>(value)));
        default:
            return kFloatFinite;
    }
}
