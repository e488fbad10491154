// The process's command line: what of it is for the host, what for the user's program, and the preference file it
// names.
//
//     prog -x -- -y z      the host's: prog -x      the user's: prog -y z
//
// Set by the host at start, before other threads use it; there is no lock. The arguments are the host's and must live
// until UninitUserCommandLine.
#ifndef TESSEL_UTILITIES_USERCOMMANDLINE_H
#define TESSEL_UTILITIES_USERCOMMANDLINE_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// Splits the arguments at the first "--". Without one all are the host's, and the user's is the first alone. kArgErr
// for no arguments, or when it was split before: then all count as the host's. kMemFullErr leaves the user's empty.
TESSEL_API MgErr InitUserCommandLine(int32 count, char** args);

// Forgets the command line and the ignore flag, but not the preference path. Always kNoErr.
TESSEL_API MgErr UninitUserCommandLine(void);

// With a flag that is not 0 the next InitUserCommandLine gives all arguments to the user and none to the host.
TESSEL_API void SetIgnoreCommandLine(int32 ignore);

// The whole line, the user's and the host's. The arrays are the library's. Each output may be null.
TESSEL_API void GetRawCommandLine(int32* count, char*** args);
// The user's part of the line; else as GetRawCommandLine.
TESSEL_API void GetUserCommandLine(int32* count, char*** args);
// The host's part of the line; else as GetRawCommandLine.
TESSEL_API void GetAppCommandLine(int32* count, char*** args);

// Keeps a copy of the path of the preference file; null forgets it. kMemFullErr: none is kept.
TESSEL_API MgErr SetPrefsPath(CStr path);

// That path, else the argument behind the last "-pref" of the host's line, else null. The library's.
TESSEL_API CStr GetPrefsPath(void);

// Arguments from one line of text: `first`, then the words of the line. Blanks and tabs separate words; a word that
// begins with a double quote goes on, without it, to the next double quote or the end of the line. The caller owns args
// (not `first`) and frees it with the other function; null and a count of 0 when there is no memory, and nothing is
// made where one of the outputs is null. A null line is empty.
TESSEL_API void NewCommandLineArgsFromSingleLine(CStr line, char* first, int32* count, char*** args);
// Null is fine.
TESSEL_API void DeleteCommandLineArgsFromSingleLine(int32 count, char** args);

// Whether an argument is the library's own, for hosts that walk their arguments. For "-pref", *index moves on to the
// value, which is to be skipped too.
TESSEL_API bool ShouldIgnoreCommandLineArg(char* arg, int32* index);

TESSEL_END_C

#endif
