#include "strings/FmtArguments.h"

#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>

namespace tessel {

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
        table_[i].value = Next(table_[i].type);
    }
    return true;
}

}  // namespace tessel
