// Where reports go: a handler of the host's, or the default behaviour; and the counters of what was reported.
//
// A report is made with TESSEL_REPORT (diagnostics/DebugStream.h).
#ifndef TESSEL_DIAGNOSTICS_DEBUGOUTPUT_H
#define TESSEL_DIAGNOSTICS_DEBUGOUTPUT_H

#include <tessel/base/Types.h>

// How serious a report is.
enum {
    kDebugInfo = 0,     // informational
    kDebugTrace = 1,    // memory dumps
    kDebugWarning = 2,  // something looks wrong
    kDebugError = 3,    // something is wrong; shown to an attached debugger
    kDebugFatal = 4,    // the default behaviour ends the process with exit status 1
    kNumDebugLevels = 5
};
// One of those levels.
typedef int32 _DebugOutputLevel;

// Takes a report: source file and line of the reporting site, its identifier (the function's name), the level, the
// site's own constant, and the text. The texts live for the duration of the call. It may be called by several threads
// at once, and may itself lead to further reports: eight deep, beyond that they get the default behaviour. It must not
// throw: reports are made where nothing may be thrown, so that an exception can end the process (std::terminate).
typedef void (*DebugOutputHandler)(CStr file, int32 line, CStr identifier, int32 level, uint32 siteCode, CStr text);

TESSEL_BEGIN_C

// Installs the process-wide handler and returns it; null selects the default behaviour: the report is counted, one of
// level 3 or 4 is sent to the debugger as a line "ERR <site code>: <file>(<line>): <text>", and level 4 ends the
// process. May be called at any time, before the library is started too.
TESSEL_API DebugOutputHandler DebugOutputSetHandler(DebugOutputHandler handler);

// The handler installed; null when there is none.
TESSEL_API DebugOutputHandler DebugOutputGetHandler(void);

// Hands a report to the handler installed, or gives it the default behaviour. Null texts count as empty. Any thread.
TESSEL_API void DebugOutputCallHandler(CStr file, int32 line, CStr identifier, int32 level, uint32 siteCode, CStr text);

// How many reports of a level the default behaviour has taken; 0 for an unknown level. The counters are not exact when
// several threads report at once.
TESSEL_API int32 DebugOutputGetNumEvents(int32 level);
// Sets the counters of all levels to 0.
TESSEL_API void DebugOutputResetNumEvents(void);
// Counts one report of a level; nothing for an unknown level.
TESSEL_API void DebugOutputIncrementEventCount(int32 level);

// Sends a text (null: none) to the debugger channel, and breaks into the debugger when one is attached.
TESSEL_API void DebugOutputCoreBreak(CStr text);

// Ends the process at once with exit status 1.
TESSEL_API void DebugOutputCoreDie(void);

// A place to stop at: DebugOutputCoreBreak, then a level-0 report "StopHere: <text>". Returns a process-wide number
// that stays 0 unless a debugger changes it.
TESSEL_API int32 StopHere(CStr text);

// Reports a hex dump of memory, one level-1 report per 16 bytes; the last line is always whole. Bytes that cannot be
// read show as "??". A length below 1 dumps nothing. Any thread.
TESSEL_API void DumpSomeMemory(const void* memory, int32 length);

// Whether a format contains exactly one '%' that is not part of a "%%" pair. False for null and for empty text.
TESSEL_API bool VerifySingleFormatSpecifier(CStr format);

TESSEL_END_C

#endif
