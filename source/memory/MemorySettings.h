// The process-wide settings of the memory manager.
#ifndef TESSEL_SOURCE_MEMORY_MEMORYSETTINGS_H
#define TESSEL_SOURCE_MEMORY_MEMORYSETTINGS_H

#include <tessel/memory/MemoryManager.h>

#include <atomic>

namespace tessel {

// Reasons to leave the short way through creation and disposal: one word to look at.
enum Detour : uint32 {
    kSettingsUnread = 1,   // the environment has not been looked at
    kHandlesGuarded = 2,   // handles have guard bytes
    kHandlesTracked = 4,   // the trackers are there
    kScopeTracked = 8,     // scoped tracking is on
    kHandlesTraced = 16,   // a trace procedure is installed
    kMemoryDebugged = 32,  // memory debugging is on
    kHeapFiltered = 64,    // allocations may be made to fail
};

struct MemorySettings {
    std::atomic<uint32> detours{kSettingsUnread};
    std::atomic<int32> checking{2};  // the level of handle checking
    std::atomic<bool> stress{false};
    std::atomic<MemFullProc> memFull{nullptr};
    std::atomic<MemEventTraceProc> trace{nullptr};
};
extern MemorySettings memorySettings;

inline uint32 Detours() {
    return memorySettings.detours.load(std::memory_order_relaxed);
}
void SetDetour(Detour detour, bool on);

inline bool MemoryDebugging() {
    return (Detours() & kMemoryDebugged) != 0;
}

// Reads the environment, once.
void NeedMemorySettings();

// Takes the settings from an environment. For NeedMemorySettings, and for tests.
void TakeMemorySettings(const char* (*environment)(const char* name));

}  // namespace tessel

#endif
