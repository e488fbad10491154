// The event log: an interface that hosts link against. It records nothing, and reads as an empty log. Any thread.
#ifndef TESSEL_UTILITIES_PHEVENTLOG_H
#define TESSEL_UTILITIES_PHEVENTLOG_H

#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// These do nothing.
TESSEL_API void InitEventLoggingMgr(void);
// Does nothing.
TESSEL_API void UnInitEventLoggingMgr(void);
// Does nothing.
TESSEL_API void EventLoggingEnable(int32 enable);
// Does nothing.
TESSEL_API void EventLoggingConfigure(uint32 entriesPerThread, uint32 flags);
// Does nothing.
TESSEL_API void EventLoggingSetFlags(uint32 flags, uint32 mask);
// Does nothing.
TESSEL_API void EventLoggingClearLog(void);
// Does nothing.
TESSEL_API void EventLoggingLogUserEvent(uint32 event, uint32 value);
// Does nothing.
TESSEL_API void EventLoggingLogUserBuffer(uint32 event, const void* data, uint32 size);
// Does nothing.
TESSEL_API void EventLoggingEnumerateThreads(void (*visit)(uint32 threadID, void* context), void* context);

// Sets each output to 0. Null outputs are skipped.
TESSEL_API void EventLoggingGetFlags(uint32* flags, uint32* mask);

// Sets each output to 0 and the text (null: none) to the empty string. Null outputs are skipped. Returns 0: no entry.
TESSEL_API int32 EventLoggingEnumLogEntry(uint32 selector, uint32* threadID, uint32* event, uint32* value,
                                          uint32* timeHigh, uint32* timeLow, LStrHandle text);

TESSEL_END_C

#endif
