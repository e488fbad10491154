// Paths as text: to show, to hand to the system, to keep in a neutral form; and checks and patterns for names.
//
// Text is in the active code page, and is stepped through by whole characters. Display text is what this library's
// paths look like: C:\dir\file, ..\file, \\server\share\file. Reading it never looks at the disk. Any thread.
#ifndef TESSEL_PATHS_PATHTEXTFORMAT_H
#define TESSEL_PATHS_PATHTEXTFORMAT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

// A name buffer for MakeDOSPathName: 259 bytes and the terminator.
enum { kMaxDOSPathName = 260 };

// What FileNameChk finds.
enum {
    kFileNameEmpty = 2,
    kFileNameBadChar = 4,   // " * / : < > ? \ |
    kFileNameReserved = 8,  // AUX CLOCK$ CON NUL PRN COM0-9 LPT0-9
    kFileNameEndsInDot = 32
};

TESSEL_BEGIN_C

// ---- reading: *path is made when it is null, and unchanged on failure -----------------------------------------------

// Display text of `length` bytes; null and the empty text give the empty absolute path. kArgErr when it gives no valid
// path, and for a negative length.
//
// Display text has backslashes: C:\dir\file, \\server\share\file, dir\file. A "/" is no separator: "/usr/share" reads
// as a relative path of that one name, which no file can have. Names of this host go through NativeToPath, text of
// unknown kind through PathRef with StringPlatformAgnostic.
TESSEL_API MgErr FTextToPath(const char* text, int32 length, Path* path);
// Reads the display text in a string handle; else as FTextToPath.
TESSEL_API MgErr FStringToPath(LStrHandle text, Path* path);
// Reads the display text in a string handle; else as FTextToPath.
TESSEL_API MgErr FFileSystemStringToPath(LStrHandle text, Path* path);
// Reads terminated display text; else as FTextToPath. Null is reported: kArgErr.
TESSEL_API MgErr FFileSystemCStrToPath(CStr text, Path* path);

// ---- writing --------------------------------------------------------------------------------------------------------

// Display text into an LStr with room for it. With a negative count on entry only the length is stored.
TESSEL_API MgErr FPathToText(Path path, LStrPtr text);

// Text into *text, a string handle that is made when it is null and belongs to the caller. A zero byte follows the text
// in the first three. A null path gives the not-a-path text in the first two, and kArgErr in the third.
TESSEL_API MgErr FPathToDSString(Path path, LStrHandle* text);
// Display text and a zero byte into *text. A null path gives the not-a-path text.
TESSEL_API MgErr FPathToAZString(Path path, LStrHandle* text);
// Display text and a zero byte into *text. kArgErr for a null path.
TESSEL_API MgErr FPathToFileSystemDSString(Path path, LStrHandle* text);
// /C/dir/file; a zero byte follows.
TESSEL_API MgErr FPathToUnixString(Path path, LStrHandle* text);
// Display text with every backslash doubled.
TESSEL_API MgErr FPathToStringRTF(Path path, LStrHandle* text);

// Display text as a terminated string: in a new handle (null on failure), or in a new pointer block of 264 bytes
// (kMemFullErr when it is longer than 260). The caller disposes of it.
TESSEL_API UHandle PathToCString(Path path);
// The same; the second argument is not used.
TESSEL_API UHandle PathToCStringEx(Path path, int32 unused);
// Display text in a new pointer block of 264 bytes. kMemFullErr when it is longer than 260.
TESSEL_API MgErr FPathToMaxCString(Path path, UPtr* text);

// kNotFoundErr, always.
TESSEL_API MgErr FPathToURL(Path path, LStrHandle* text);

// The form that is the same on every host: /C/dir/file. Null text reads as the empty path.
TESSEL_API MgErr ConvertPathToPlatformIndependentText(Path path, LStrHandle* text);
// Reads the form that is the same on every host; null reads as the empty path.
TESSEL_API MgErr ConvertPlatformIndependentTextToPath(Path* path, CStr text);

// ---- names for the system -------------------------------------------------------------------------------------------

// The name under which the system is asked for a file. `name` takes kMaxDOSPathName bytes. With `resolve` not 0 each
// shortcut (.lnk) on the way is replaced by its target. kArgErr: not absolute, no names, a name that no file can have,
// no server in front of a UNC path (its steps up led past it), or more than 259 bytes.
TESSEL_API MgErr MakeDOSPathName(Path path, char* name, int32 resolve);

// Whether a file can have the name: 0, or kFileName... flags. `bad` (may be null) receives the offending characters,
// terminated; it takes 256 bytes. With `skip` not 0 only emptiness is checked.
TESSEL_API int32 FileNameChk(ConstPStr name, int32 unused, int32 skip, char* bad);

// ---- patterns -------------------------------------------------------------------------------------------------------

// Whether the name fits the pattern, ignoring case: "?" one character, "*" any run, neither of them a "\"; "**" any run
// at all; "." a dot or the end.
TESSEL_API bool FStrFitsPat(const char* pattern, const char* name, int32 patternLength, int32 nameLength);

// Moves *position on to the next "*", "?" or extra character ("`" in the second form) before `end`. False: none.
TESSEL_API bool FMFindWildCardMatchCh(const char* text, int32* position, int32 end, char extra);
// Moves *position on to the next "*", "?" or "`" before `end`. False: none.
TESSEL_API bool FFindMatchCh(const char* text, int32* position, int32 end);

TESSEL_END_C

#endif
