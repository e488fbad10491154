// What the file functions share: names for the system, what was asked of a file, results.
#ifndef TESSEL_SOURCE_FILES_FILESUPPORT_H
#define TESSEL_SOURCE_FILES_FILESUPPORT_H

#include "platform/File.h"
#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/files/FileManager.h>

#include <string>

namespace tessel {

// A name for the system, and the size of a buffer that takes one.
inline constexpr uint32 kPlatformNameSize = 260;

class PlatformName {
public:
    // kArgErr for a path that is null, relative or without names, or that has a name the system cannot have.
    MgErr Make(Path path, bool resolveShortcuts);
    const char* Text() const { return text_; }

private:
    char text_[kPlatformNameSize] = {};
};

inline platform::FileHandle HandleOf(File_t* file) {
    return reinterpret_cast<platform::FileHandle>(file);
}
inline File_t* FileOf(platform::FileHandle handle) {
    return reinterpret_cast<File_t*>(handle);
}

// What was asked of a file that is to be opened or created.
class OpenRequest {
public:
    // kArgErr for a path that cannot be a file's, and for unknown modes. Drops what the path has cached about its item.
    MgErr Check(Path path, int32 openMode, int32 denyMode);
    // kNoFile: the last failure of the system says why.
    platform::FileHandle Open(platform::Disposition disposition) const {
        return platform::FileOpen(name_.Text(), access_, denied_, disposition);
    }
    const char* Name() const { return name_.Text(); }
    uint32 Access() const { return access_; }
    uint32 Denied() const { return denied_; }

private:
    PlatformName name_;
    uint32 access_ = 0;
    uint32 denied_ = 0;
};

// Makes a file with these bytes, or with `replace` puts it in the place of the one that is there, which must admit what
// is requested. What FWriteWholeFile promises.
MgErr WriteWholeFile(const OpenRequest& request, bool replace, const void* data, uint64 size);

// Hands out what was opened, or says why it was not.
MgErr OpenedFile(platform::FileHandle handle, File_t** file);

// The last failure of the system, for a call that returned `ok`.
inline MgErr ErrUnless(bool ok) {
    return ok ? kNoErr : Win32ToOVFileErr();
}

// The same while permissions are set, which has codes of its own.
MgErr AccessRightsErr();

// Drops what a path has cached about its item. Nothing for null.
void FlushPathCache(Path path);

// Whether the path is absolute and has exactly one name.
bool IsVolume(Path path);

// Sets *path, made when it is null, to the path of a name.
MgErr NameToPath(const std::string& name, Path* path);

// The process-wide mutex around what the system only lets us read by replacing it.
class FileManagerLock {
public:
    FileManagerLock();
    ~FileManagerLock();
    FileManagerLock(const FileManagerLock&) = delete;
    FileManagerLock& operator=(const FileManagerLock&) = delete;
};

}  // namespace tessel

#endif
