// The event log, which records nothing.
#include <tessel/memory/MemoryManager.h>
#include <tessel/utilities/pheventlog.h>

#include <initializer_list>

void InitEventLoggingMgr() {
}
void UnInitEventLoggingMgr() {
}
void EventLoggingEnable(int32) {
}
void EventLoggingConfigure(uint32, uint32) {
}
void EventLoggingSetFlags(uint32, uint32) {
}
void EventLoggingClearLog() {
}
void EventLoggingLogUserEvent(uint32, uint32) {
}
void EventLoggingLogUserBuffer(uint32, const void*, uint32) {
}
void EventLoggingEnumerateThreads(void (*)(uint32, void*), void*) {
}

void EventLoggingGetFlags(uint32* flags, uint32* mask) {
    if (flags) *flags = 0;
    if (mask) *mask = 0;
}

int32 EventLoggingEnumLogEntry(uint32, uint32* threadID, uint32* event, uint32* value, uint32* timeHigh,
                               uint32* timeLow, LStrHandle text) {
    for (uint32* output : {threadID, event, value, timeHigh, timeLow}) {
        if (output) *output = 0;
    }
    if (text && DSGetHandleSize(reinterpret_cast<UHandle>(text)) >= sizeof(int32)) (*text)->count = 0;
    return 0;
}
