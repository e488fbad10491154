// The module handles that the host installs, and the files of modules.
#ifndef TESSEL_BASE_MGMODULE_H
#define TESSEL_BASE_MGMODULE_H

#include <tessel/base/Types.h>

// The address that a module is loaded at, as wide as a pointer; 0 stands for the executable.
typedef uintptr_t MGModuleHandle;

// A buffer that takes any of the texts below.
enum { kModuleTextSize = 260 };

TESSEL_BEGIN_C

// The application's executable, and this library's own module. 0 until the host sets them. Any thread.
TESSEL_API void MGModuleSetInstance(MGModuleHandle module);
// The application's executable; 0 until the host sets it. Any thread.
TESSEL_API MGModuleHandle MGModuleGetInstance(void);
// Says which module this library is. Any thread.
TESSEL_API void MGModuleSetModule(MGModuleHandle module);
// This library's own module; 0 until the host sets it. Any thread.
TESSEL_API MGModuleHandle MGModuleGetModule(void);

// The full name of a module's file as the disk spells it, when that fits, else as the system gave it, cut to fit.
// Returns its length without the terminator; 0 (and an empty text) when it cannot be told.
TESSEL_API int32 MSWinGetModulePath(MGModuleHandle module, char* buffer, int32 size);

// The folder of a module's file, without the last backslash. Empty when the full name has 6 characters or fewer, or has
// no backslash. `out` has kModuleTextSize bytes.
TESSEL_API void MSWinGetModuleLocation(MGModuleHandle module, char* out);

// The name of a module's file without its folder and its extension, where it has one of three characters. `out` has
// kModuleTextSize bytes.
TESSEL_API void MSWinGetModuleFileName(MGModuleHandle module, char* out);

// When a module's file was last written, "MM/DD/YYYY hh:mm GMT". Empty when it cannot be opened. `out` has
// kModuleTextSize bytes.
TESSEL_API void MSWinGetModuleModDate(MGModuleHandle module, char* out);

TESSEL_END_C

#endif
