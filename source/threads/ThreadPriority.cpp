// The levels of priority, what they are on the host, and the procedure that is told of a change.
#include "platform/LastError.h"
#include "threads/ThreadTable.h"
#include <tessel/diagnostics/DebugStream.h>

#include <atomic>
#include <cstring>

namespace tessel {
namespace {

struct Level {
    CStr name;
    CStr key;  // in the configuration
    int32 usual;
};

constexpr Level kLevels[kNumThPriorities] = {{"background", "thpri_bgrnd", -15},
                                             {"normal", "thpri_normal", 0},
                                             {"high (above normal)", "thpri_high", 1},
                                             {"very high (high)", "thpri_vhigh", 2},
                                             {"time critical", "thpri_tcrit", 15}};

// Written at start only.
int32 priorities[kNumThPriorities] = {-15, 0, 1, 2, 15};
uint8 distinct[kNumThPriorities] = {1, 1, 1, 1, 1};

std::atomic<ThThreadPrioritySetProc> prioritySetProc{nullptr};

void ReportPriorities() {
    TESSEL_REPORT(kDebugInfo, 0x2A64C1F9u) << "using thread priorities:";
    for (int i = 0; i < kNumThPriorities; ++i)
        TESSEL_REPORT(kDebugInfo, 0x6E0B93D4u) << "\t" << kLevels[i].name << ": " << priorities[i];
    for (int i = kThPriorityHigh; i < kNumThPriorities; ++i) {
        if (priorities[i] < priorities[i - 1])
            TESSEL_REPORT(kDebugError, 0x51D7A80Eu)
                << "inconsistent thread priority token configuration: " << kLevels[i - 1].name
                << " is higher priority than " << kLevels[i].name;
    }
}

// What became of setting a priority, told once the lock is given back.
struct PriorityChange {
    bool isThread, set, isForbidden;
    ThPlatformThread handle;
    uint32 id;
};

PriorityChange ChangePriority(ThThread thread, int32 level) {
    LibraryMutexHolder holder(gCreateThread);
    if (!IsThread(thread)) return {};
    const bool set = platform::ThreadSetPriority(HandleOf(thread), priorities[level]);
    const bool isForbidden = !set && platform::LastError() == platform::kErrorAccessDenied;
    return {true, set, isForbidden, thread->platformThread, thread->platformId};
}

void TellHost(ThThread thread, const PriorityChange& change, int32 level) {
    if (ThThreadPrioritySetProc procedure = prioritySetProc) procedure(thread, change.handle, change.id, level);
}

}  // namespace

void BuildPriorityTable(ThreadPriorityReader configured) {
    for (int i = 0; i < kNumThPriorities; ++i) {
        priorities[i] = kLevels[i].usual;
        if (configured) configured(kLevels[i].key, priorities[i]);
    }
    ReportPriorities();
    distinct[kThPriorityBackground] = priorities[kThPriorityBackground] < priorities[kThPriorityNormal];
    distinct[kThPriorityNormal] = 1;
    for (int i = kThPriorityHigh; i < kNumThPriorities; ++i) distinct[i] = priorities[i - 1] < priorities[i];
}

void RaiseThreadPriority(ThThread thread, int32 level) {
    const PriorityChange change = ChangePriority(thread, level);
    if (!change.isForbidden) {
        ThThreadSetPriority(thread, level);
        return;
    }
    int32 given = level - 1;
    while (given > kThPriorityNormal && !ChangePriority(thread, given).set) --given;
    TESSEL_REPORT(kDebugInfo, 0x1E8E9A71u) << "the process may not make a thread " << kLevels[level].name << ", thread "
                                           << change.id << " is " << kLevels[given].name;
    TellHost(thread, change, given);
}

}  // namespace tessel

using namespace tessel;

MgErr ThThreadSetPriority(ThThread thread, int32 level) {
    PriorityChange change{};
    const bool negative = level < 0;
    if (negative) level = kThPriorityNormal;
    if (level < kNumThPriorities) change = ChangePriority(thread, level);
    if (!change.isThread) {
        TESSEL_REPORT(kDebugError, 0x03F8B5C2u) << "bad argument to ThThreadSetPriority()";
        return kNoErr;
    }
    if (negative) TESSEL_REPORT(kDebugError, 0x7C19E46Au);
    if (!change.set) TESSEL_REPORT(kDebugError, 0x48A2D71Fu) << "SetThreadPriority failed";
    TellHost(thread, change, level);
    return kNoErr;
}

int32 ThThreadGetPriority(ThThread thread) {
    if (!IsThread(thread)) {
        TESSEL_REPORT(kDebugError, 0x1D56F08Bu) << "invalid ThThread passed to ThThreadGetPriority";
        return kThPriorityNormal;
    }
    int32 priority = 0;
    if (!platform::ThreadGetPriority(HandleOf(thread), priority)) {
        TESSEL_REPORT(kDebugError, 0x65B30E97u) << "unable to get priority for thread " << thread->platformId
                                                << ", syserr = " << platform::LastError() << ", assuming normal";
        priority = priorities[kThPriorityNormal];
    }
    for (int32 level = kThPriorityBackground; level < kThPriorityTimeCritical; ++level) {
        if (priorities[level] >= priority) return level;
    }
    return kThPriorityTimeCritical;
}

void ThThreadGetNativePriorityInfo(int32* background, int32* normal, int32* high, int32* veryHigh,
                                   int32* timeCritical) {
    int32* const outputs[kNumThPriorities] = {background, normal, high, veryHigh, timeCritical};
    for (int i = 0; i < kNumThPriorities; ++i) {
        if (outputs[i]) *outputs[i] = priorities[i];
    }
}

void ThThreadGetPrioInfo(uint8 out[kNumThPriorities]) {
    if (out) std::memcpy(out, distinct, sizeof distinct);
}

MgErr ThSetThreadPrioritySetProc(ThThreadPrioritySetProc procedure) {
    ThThreadPrioritySetProc none = nullptr;
    return procedure && prioritySetProc.compare_exchange_strong(none, procedure) ? kNoErr : kArgErr;
}

MgErr ThClearThreadPrioritySetProc(ThThreadPrioritySetProc procedure) {
    if (procedure && prioritySetProc.compare_exchange_strong(procedure, nullptr)) return kNoErr;
    TESSEL_REPORT(kDebugWarning, 0x39C07E54u)
        << "Someone is attempting to clear the ThreadPrioritySetProc but didn't set it!";
    return kArgErr;
}
