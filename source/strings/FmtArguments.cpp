// The table of positional parameters.
#include "strings/FmtArguments.h"

#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>

namespace tessel {
namespace {

// The table lies on the stack beside what callers hand in: a type that no conversion has must not be fetched.
bool IsFetched(FmtArgType type) {
    switch (type) {
        case FmtArgType::kInt:
        case FmtArgType::kPointer:
        case FmtArgType::kPoint:
        case FmtArgType::kInt32:
        case FmtArgType::kInt64:
        case FmtArgType::kDouble:
            return true;
        default:
            return false;
    }
}

}  // namespace

void FmtArguments::ClearTable() {
    std::fill(std::begin(table_), std::end(table_), Parameter{FmtArgType::kNone, {0}});
}

bool FmtArguments::Record(int32 position, FmtArgType type) {
    Parameter& parameter = table_[position - 1];
    if (parameter.type != FmtArgType::kNone && parameter.type != type) {
        TESSEL_REPORT(kDebugInfo, 0xA6D21F48u) << "Parameter " << position << " type info [" << static_cast<int32>(type)
                                               << "] redefined (was [" << static_cast<int32>(parameter.type) << "])";
        return false;
    }
    parameter.type = type;
    return true;
}

bool FmtArguments::Fetch() {
    int32 highest = kFmtMaxPosition;
    while (highest > 0 && table_[highest - 1].type == FmtArgType::kNone) --highest;
    for (int32 i = 0; i < highest; ++i) {
        if (table_[i].type == FmtArgType::kNone) {
            TESSEL_REPORT(kDebugInfo, 0x1C73E09Bu) << "Not all parameters between 1 and " << highest << " specified";
            return false;
        }
        if (!IsFetched(table_[i].type)) {
            TESSEL_REPORT(kDebugFatal, 0xD13A85B6u) << "Bogus typeInfo";
            return false;
        }
        table_[i].value = Next(table_[i].type);
    }
    return true;
}

}  // namespace tessel
