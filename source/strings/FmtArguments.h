// The arguments of a formatting call: one after the other, or through the table of positional parameters.
#ifndef TESSEL_STRINGS_FMTARGUMENTS_H
#define TESSEL_STRINGS_FMTARGUMENTS_H

#include "strings/FmtSpec.h"
#include <tessel/base/Types.h>

#include <cstdarg>

namespace tessel {

// What a conversion takes from the argument list. The numbers are those of the reports.
enum class FmtArgType : int32 {
    kNone = 0,
    kInt = -1,      // default integer or character
    kPointer = -2,  // text, handle, path, rectangle, typed value
    kPoint = -3,    // two int16 in one int32
    kInt32 = 3,
    kInt64 = 4,
    kDouble = 10,
};

union FmtValue {
    int64 integer;
    double real;
    const void* pointer;
};

// A va_list that can be passed by reference on every host.
struct FmtArgumentList {
    va_list list;
};

class FmtArguments {
public:
    explicit FmtArguments(FmtArgumentList& arguments) : list_(arguments.list) {}

    FmtValue Next(FmtArgType type) {
        FmtValue value;
        if (type == FmtArgType::kPointer) {
            value.pointer = va_arg(list_, const void*);
        } else if (type == FmtArgType::kInt64) {  // NOLINT(bugprone-branch-clone): the types that are fetched differ
            value.integer = va_arg(list_, long long);
        } else if (type == FmtArgType::kDouble) {
            value.real = va_arg(list_, double);
        } else {
            value.integer = va_arg(list_, int);
        }
        return value;
    }

    // The table: cleared, told what each parameter is, filled once, then read. Record and Fetch report what is wrong
    // and give false.
    void ClearTable();
    bool Record(int32 position, FmtArgType type);
    bool Fetch();
    FmtValue At(int32 position) const { return table_[position - 1].value; }

private:
    struct Parameter {
        FmtArgType type;
        FmtValue value;
    };

    va_list& list_;
    Parameter table_[kFmtMaxPosition];
};

}  // namespace tessel

#endif
