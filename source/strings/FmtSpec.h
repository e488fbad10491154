// One conversion specifier of the format language (tessel/strings/StringFmtPrint.h), and how it is read.
#ifndef TESSEL_STRINGS_FMTSPEC_H
#define TESSEL_STRINGS_FMTSPEC_H

#include "base/Compiler.h"
#include <tessel/base/NumericTypes.h>
#include <tessel/base/Types.h>

#include <string_view>

namespace tessel {

enum class FmtSize : uint8 { kNone, kLong, kInt32, kInt64 };  // nothing, "l", "I", "ll"

constexpr int16 kFmtNoType = 0;
constexpr int16 kFmtTypeFromArgument = -1;  // "{*}"
constexpr int32 kFmtNoPrecision = -1;
constexpr int32 kFmtMaxPosition = 10;

struct FmtSpec {
    int32 position = 0;  // of the argument, from 1; 0 takes the next one
    int32 width = 0;
    int32 precision = kFmtNoPrecision;
    int16 type = kFmtNoType;  // numeric type code of a typed prefix
    FmtSize size = FmtSize::kNone;
    bool left = false;
    char pad = ' ';
    char conversion = 0;
};

// Reads a specifier, the cursor being behind its "%".
class FmtSpecReader {
public:
    FmtSpecReader(const char* cursor, const char* end) : cursor_(cursor), end_(end) {}

    const char* Cursor() const { return cursor_; }

    // False when the specifier is cut off by the end, or its position or type prefix is none of the language's. Whether
    // there is such a conversion is not looked at.
    TESSEL_ALWAYS_INLINE bool Read(FmtSpec& spec) {
        bool digits = ReadFlagsAndWidth(spec);
        if (digits && !spec.left && Peek() == '$') {
            ++cursor_;
            spec.position = spec.width;
            if (spec.position < 1 || spec.position > kFmtMaxPosition) return false;
            spec.pad = ' ';
            ReadFlagsAndWidth(spec);
        }
        if (Peek() == '.') {
            ++cursor_;
            ReadNumber(spec.precision);
        }
        if (Peek() == '{') {
            if (!ReadType(spec)) return false;
        } else {
            ReadSize(spec);
        }
        if (cursor_ == end_) return false;
        spec.conversion = *cursor_++;
        return true;
    }

private:
    char Peek() const { return cursor_ < end_ ? *cursor_ : '\0'; }

    // Digits as a number that stops growing at the largest int32; whether there were any.
    bool ReadNumber(int32& number) {
        const char* start = cursor_;
        int64 value = 0;
        for (; cursor_ < end_ && *cursor_ >= '0' && *cursor_ <= '9'; ++cursor_) {
            if (value <= INT32_MAX) value = value * 10 + (*cursor_ - '0');
        }
        number = value < INT32_MAX ? static_cast<int32>(value) : INT32_MAX;
        return cursor_ != start;
    }

    bool ReadFlagsAndWidth(FmtSpec& spec) {
        if (Peek() == '-') {
            ++cursor_;
            spec.left = true;
        }
        if (Peek() == '0') spec.pad = '0';
        return ReadNumber(spec.width);
    }

    void ReadSize(FmtSpec& spec) {
        if (Peek() == 'I') {
            ++cursor_;
            spec.size = FmtSize::kInt32;
        } else if (Peek() == 'l') {
            ++cursor_;
            spec.size = FmtSize::kLong;
            if (Peek() == 'l') {
                ++cursor_;
                spec.size = FmtSize::kInt64;
            }
        }
    }

    // "{" and "*" or two letters; the "}" may be left out.
    bool ReadType(FmtSpec& spec) {
        ++cursor_;
        if (Peek() == '*') {
            ++cursor_;
            spec.type = kFmtTypeFromArgument;
        } else {
            if (end_ - cursor_ < 2) return false;
            spec.type = TypeCode(cursor_[0], cursor_[1]);
            if (spec.type == kFmtNoType) return false;
            cursor_ += 2;
        }
        if (Peek() == '}') ++cursor_;
        return true;
    }

    static int16 TypeCode(char kind, char width) {
        constexpr std::string_view kIntegers = "BWLQ";
        constexpr std::string_view kReals = "SDX";
        const size_t integer = kIntegers.find(width);
        const size_t real = kReals.find(width);
        const bool isInteger = integer != std::string_view::npos;
        const bool isReal = real != std::string_view::npos;
        if (kind == 'i' && isInteger) return static_cast<int16>(kNumInt8 + integer);
        if (kind == 'u' && isInteger) return static_cast<int16>(kNumUInt8 + integer);
        if (kind == 'f' && isReal) return static_cast<int16>(kNumSingle + real);
        if (kind == 'c' && isReal) return static_cast<int16>(kNumComplexSingle + real);
        return kFmtNoType;
    }

    const char* cursor_;
    const char* end_;
};

}  // namespace tessel

#endif
