// What the file functions share: names for the system, access flags, dates.
#ifndef TESSEL_SOURCE_FILES_FILESUPPORT_H
#define TESSEL_SOURCE_FILES_FILESUPPORT_H

#include "platform/File.h"
#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#include <functional>
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

// The open and deny modes as the system's access and denied access.
struct OpenAccess {
    uint32 access = 0;
    uint32 denied = 0;
};
// What opening and creating have in common: checks the path and the modes, then lets `open` have the name and the
// access.
MgErr OpenWith(File_t** file, Path path, int32 openMode, int32 denyMode,
               const std::function<platform::FileHandle(const char* name, const OpenAccess& access)>& open);

// Drops what a path has cached about its item. Nothing for null.
void FlushPathCache(Path path);

// Whether the path is absolute and has exactly one name.
bool IsVolume(Path path);

// Sets *path, made when it is null, to the path of a name.
MgErr NameToPath(const std::string& name, Path* path);

// Seconds since 1904 of 100 ns ticks since 1601, to the nearest; 0 for dates before, the last second for dates beyond.
uint32 FileTimeToSeconds(int64 fileTime);

// The permissions that are reported for an item.
int32 ReportedPermissions(bool folder, bool readOnly);

// When the current directory lies inside `path`, goes to the parent of `path`. A failure is only reported.
void LeaveFolder(Path path);

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
