// The user's and the system's standard folders. Any thread.
#ifndef TESSEL_FILES_SYSTEMDIRS_H
#define TESSEL_FILES_SYSTEMDIRS_H

#include <tessel/base/MgErr.h>

// Kinds of folder. Several kinds are the same folder.
typedef int32 SystemDirType;
enum {
    kSystemDirUserHome = 0,
    kSystemDirUserDesktop = 1,
    kSystemDirUserDocuments = 2,
    kSystemDirUserApplicationData = 3,
    kSystemDirUserApplicationData2 = 4,  // as 3
    kSystemDirTemporary = 5,
    kSystemDirPublicDocuments = 6,
    kSystemDirPublicApplicationData = 7,
    kSystemDirPublicApplicationData2 = 8,  // as 7
    kSystemDirSystem = 9,
    kSystemDirSystem2 = 10,  // as 9
    kSystemDirProgramFiles = 11,
    kSystemDirSystemVolume = 12,
    kSystemDirPublicApplicationData3 = 13  // as 7
};

TESSEL_BEGIN_C

// The folder of a kind; a missing one is made when `create` is not 0. *path is made when it is null; when the system
// has no such folder it stays as it was, and the result is kNoErr. kArgErr: unknown kind. Lets OVExcept (kGenericErr)
// out when the system does not tell the temporary folder.
TESSEL_API MgErr GetSystemDir(SystemDirType kind, int32 create, Path* path);

// Not provided: kNotFoundErr when `kind` is not 0, else kArgErr.
TESSEL_API MgErr FGetOSFolderPath(Path path, int32 kind);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/paths/PathRef.h>

namespace tessel {

// The same as objects: an empty absolute path when there is no such folder. Raise OVExcept on failure.
class TESSEL_API SystemDirs {
public:
    SystemDirs() = delete;

    // The folder of a kind.
    static PathRef Get(SystemDirType kind, bool create);
    // The user's home folder.
    static PathRef GetUserHomeDir(bool create);
    // The user's desktop.
    static PathRef GetUserDesktopDir(bool create);
    // The user's documents.
    static PathRef GetUserDocumentsDir(bool create);
    // The folder of the user's application data.
    static PathRef GetUserApplicationDataDir(bool create);
};

}  // namespace tessel
#endif

#endif
