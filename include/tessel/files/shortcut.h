// Shortcuts: small files named *.lnk that stand for another file or folder.
//
// All take terminated text in a buffer of at least 260 bytes and change it in place. Any thread.
#ifndef TESSEL_FILES_SHORTCUT_H
#define TESSEL_FILES_SHORTCUT_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// 1: the text named a shortcut (with or without ".lnk") and now is its target. 0: it is as it was.
TESSEL_API int32 Win32ResolveShortCut(char* name);
// The same; the second argument is not used.
TESSEL_API int32 Win32ResolveShortCutExists(char* name, int32 unused);

// Follows the shortcuts in every leading part of the text. 1 when anything changed and the result fits.
TESSEL_API int32 Win32ResolveAllShortCuts(char* name);

TESSEL_END_C

#endif
