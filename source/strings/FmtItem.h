// The conversions of the format language: what each prints and which argument it takes.
#ifndef TESSEL_STRINGS_FMTITEM_H
#define TESSEL_STRINGS_FMTITEM_H

#include "strings/FmtArguments.h"
#include "strings/FmtSpec.h"

namespace tessel {

enum class FmtItem : uint8 {
    kUnknown,
    kSigned,  // the first of the numbers
    kUnsigned,
    kHex,
    kOctal,
    kBinary,
    kAddress,
    kExponential,
    kFixed,  // the last of the numbers
    kCharacter,
    kPoint,
    kNamedPoint,
    kRectangle,
    kNamedRectangle,
    kCString,  // the first of the texts
    kPString,
    kLString,
    kLHandle,
    kBytes,
    kPath,
};

inline bool IsNumber(FmtItem item) {
    return item >= FmtItem::kSigned && item <= FmtItem::kFixed;
}

inline FmtItem FmtItemOf(const FmtSpec& spec) {
    switch (spec.conversion) {
        case 'd':
        case 'i':
            return FmtItem::kSigned;
        case 'u':
            return FmtItem::kUnsigned;
        case 'x':
            return FmtItem::kHex;
        case 'o':
            return FmtItem::kOctal;
        case 'b':
            return FmtItem::kBinary;
        case 'a':
            return FmtItem::kAddress;
        case 'e':
        case 'E':
        case 'g':
        case 'G':
            return FmtItem::kExponential;
        case 'f':
        case 'F':
            return FmtItem::kFixed;
        case 'c':
            return FmtItem::kCharacter;
        case 'q':
            return FmtItem::kPoint;
        case 'Q':
            return FmtItem::kNamedPoint;
        case 'r':
            return FmtItem::kRectangle;
        case 'R':
            return FmtItem::kNamedRectangle;
        case 's':
            return FmtItem::kCString;
        case 'p':
            return spec.size == FmtSize::kNone ? FmtItem::kPString : FmtItem::kLString;
        case 'P':
            return FmtItem::kLString;
        case 'H':
            return FmtItem::kLHandle;
        case 'h':
            return FmtItem::kBytes;
        case 'z':
            return FmtItem::kPath;
        default:
            return FmtItem::kUnknown;
    }
}

inline FmtArgType FmtArgTypeOf(FmtItem item, const FmtSpec& spec) {
    if (IsNumber(item) && spec.type != kFmtNoType) return FmtArgType::kPointer;
    switch (item) {
        case FmtItem::kSigned:
        case FmtItem::kUnsigned:
        case FmtItem::kHex:
        case FmtItem::kOctal:
        case FmtItem::kBinary:
            if (spec.size == FmtSize::kInt64) return FmtArgType::kInt64;
            return spec.size == FmtSize::kInt32 ? FmtArgType::kInt32 : FmtArgType::kInt;
        case FmtItem::kAddress:
            return FmtArgType::kInt;
        case FmtItem::kExponential:
        case FmtItem::kFixed:
            return FmtArgType::kDouble;
        case FmtItem::kCharacter:
            return spec.width == 4 ? FmtArgType::kInt32 : FmtArgType::kInt;
        case FmtItem::kPoint:
        case FmtItem::kNamedPoint:
            return FmtArgType::kPoint;
        default:
            return FmtArgType::kPointer;
    }
}

}  // namespace tessel

#endif
