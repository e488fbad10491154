// The formatting engine, for callers that need to know whether the format was good.
#ifndef TESSEL_STRINGS_FMTENGINE_H
#define TESSEL_STRINGS_FMTENGINE_H

#include "strings/FmtArguments.h"
#include <tessel/base/MgErr.h>

#include <cstdarg>
#include <string>

namespace tessel {

constexpr int32 kFmtNoLimit = -1;

struct Formatted {
    int32 length;
    bool good;  // false: stopped, and reported, at what is wrong with the format
};

// As SPrintfv. The arguments are used up.
Formatted FormatText(char* dst, int32 size, const char* format, size_t length, FmtArgumentList& args);

// The same with a list of the caller's, which stays as it is.
Formatted FormatText(char* dst, int32 size, const char* format, int32 formatLength, va_list args);

// A formatted text in storage of its own, so that the arguments may lie in the text that it is to replace or to extend.
class FormattedText {
public:
    // kMemFullErr when memory is short, kGenericErr when the arguments' texts changed meanwhile.
    MgErr Format(const char* format, size_t length, va_list args);

    const char* Bytes() const { return long_.empty() ? short_ : long_.data(); }
    size_t Length() const { return length_; }
    bool Good() const { return good_; }  // false: stopped, and reported, at what is wrong with the format

private:
    char short_[512];
    std::string long_;  // what is too long for that
    size_t length_ = 0;
    bool good_ = false;
};

}  // namespace tessel

#endif
