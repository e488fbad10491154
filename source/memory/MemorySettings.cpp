#include "memory/MemorySettings.h"

#include "memory/GuardBytes.h"
#include "memory/Heap.h"
#include "platform/Process.h"
#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>
#include <cstring>
#include <mutex>

namespace tessel {

MemorySettings memorySettings;

namespace {

using Environment = const char* (*)(const char* name);

struct Choice {
    const char* text;
    uint32 value;
};

// Leaves `value` alone for a text that is none of the choices.
template <size_t N>
void Choose(const char* text, const Choice (&choices)[N], uint32& value) {
    for (const Choice& choice : choices)
        if (std::strcmp(text, choice.text) == 0) value = choice.value;
}

void TakeGuardOptions(Environment environment) {
    static constexpr Choice kChoices[] = {
        {"off", 0}, {"alloc", kGuardRoom | kGuardWrite}, {"check", kGuardRoom | kGuardWrite | kGuardCheck}};
    static constexpr const char* kNames[kGuardKinds] = {"OVGuardBytes_Handle", "OVGuardBytes_Ptr",
                                                        "OVGuardBytes_NewDelete"};
    const char* all = environment("OVGuardBytes");
    for (int kind = 0; kind < kGuardKinds; ++kind) {
        const char* own = environment(kNames[kind]);
        const char* text = own ? own : all;
        uint32 options = guardOptions[kind].load();
        if (text) Choose(text, kChoices, options);
        guardOptions[kind].store(options);
    }
}

void TakeHandleChecking(Environment environment) {
    static constexpr Choice kChoices[] = {{"all", 2}, {"2", 2},   {"resize", 1}, {"1", 1},
                                          {"", 0},    {"off", 0}, {"none", 0},   {"0", 0}};
    uint32 level = static_cast<uint32>(memorySettings.checking.load());
    if (const char* text = environment("OVHandleCheck")) Choose(text, kChoices, level);
    memorySettings.checking.store(static_cast<int32>(level));
}

std::once_flag read;
std::atomic<LogMemMutexAccessProc> logMutexAccess{nullptr};
std::atomic<int32> checkHighWaterMarks{0};

}  // namespace

void SetDetour(Detour detour, bool on) {
    if (on)
        memorySettings.detours.fetch_or(detour);
    else
        memorySettings.detours.fetch_and(~static_cast<uint32>(detour));
}

void TakeMemorySettings(Environment environment) {
    TakeGuardOptions(environment);
    TakeHandleChecking(environment);
    SetDetour(kHandlesGuarded, GuardOptions(GuardKind::kHandle) != 0);
    SetDetour(kSettingsUnread, false);
}

void NeedMemorySettings() {
    if (Detours() & kSettingsUnread) std::call_once(read, [] { TakeMemorySettings(platform::EnvironmentGet); });
}

}  // namespace tessel

using namespace tessel;

MemFullProc SetMemFullProc(MemFullProc proc) {
    return memorySettings.memFull.exchange(proc);
}

void CallSetMemFullProc(uint32 size) {
    if (MemFullProc proc = memorySettings.memFull.load()) proc(size);
}

void SetMemEventTraceProc(MemEventTraceProc proc) {
    memorySettings.trace.store(proc);
    SetDetour(kHandlesTraced, proc != nullptr);
}

void SetStressHandles(bool on) {
    memorySettings.stress.store(on);
}

bool GetStressHandles(void) {
    return memorySettings.stress.load();
}

void SetMemoryDebugger(bool on) {
    SetDetour(kMemoryDebugged, on);
}

bool ToggleMemoryDebugging(void) {
    const bool on = !MemoryDebugging();
    TESSEL_REPORT(kDebugInfo, 0x5D3A0B96u) << "turning memory checking " << (on ? "on" : "off");
    SetMemoryDebugger(on);
    return on;
}

void DSSetHandleChecking(int32 level) {
    NeedMemorySettings();
    memorySettings.checking.store(std::clamp<int32>(level, 0, 2));
}

bool ConfigGuardBytes(int32 enable) {
    NeedMemorySettings();
    constexpr uint32 kWritten = kGuardRoom | kGuardWrite;
    bool all = true;
    for (std::atomic<uint32>& options : guardOptions) {
        if ((options.load() & kWritten) != kWritten)
            all = false;
        else if (enable)
            options.fetch_or(kGuardCheck);
        else
            options.fetch_and(~kGuardCheck);
    }
    return all;
}

void SetLogMemMutexAccessProc(LogMemMutexAccessProc proc) {
    logMutexAccess.store(proc);
}

void SetCheckHighWaterMarks(int32 check) {
    checkHighWaterMarks.store(check);
}

// The C allocator decides for itself what to merge.
void SetMergeAdjVirtualAllocs(int32) {
}

void FreeSmartHeapPool(void) {
    heap::ReturnFreeMemory();
}
