// Where the application and its files are. Any thread.
//
// Outputs are made when they are null; kArgErr without one.
#ifndef TESSEL_FILES_APPPATH_H
#define TESSEL_FILES_APPPATH_H

#include <tessel/base/MgErr.h>

TESSEL_BEGIN_C

// The file of the application's module, cut to `size` bytes. Always kNoErr; a name that does not end in a dot and three
// characters is reported.
TESSEL_API MgErr FAppCStr(char* buffer, int32 size);

// The application file, and the folder that holds it.
TESSEL_API MgErr FAppName(Path* path);
// The folder that holds the application file.
TESSEL_API MgErr FAppPath(Path* path);

// The folder of the application or, in a run-time engine, of this library.
TESSEL_API MgErr FMGPath(Path* path);

// The same; not in a run-time engine its "resource" folder.
TESSEL_API MgErr FResDir(Path* path);

TESSEL_END_C

#endif
