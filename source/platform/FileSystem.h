// Files and folders as whole items, by name (see DriveTable.h for names).
//
// Every function returns false on failure and sets LastError. Functions that make texts, or take names, may throw
// std::bad_alloc. Any thread, except where the current folder of the process is changed.
#ifndef TESSEL_PLATFORM_FILESYSTEM_H
#define TESSEL_PLATFORM_FILESYSTEM_H

#include "platform/File.h"

#include <cstdint>
#include <string>
#include <vector>

namespace tessel::platform {

struct ItemInfo {
    bool folder;
    bool readOnly;                             // nobody may write it
    bool hidden;                               // its name begins with a dot; not known (false) of a handle
    std::uint32_t mode;                        // the host's permissions, 0777 at most
    std::int64_t size;                         // bytes; 0 for a folder
    std::int64_t created, accessed, modified;  // 100 ns since 1601-01-01 00:00:00 UTC
};

// Follows the host's symbolic links; one whose end cannot be reached is described itself. 2, or 3 when a folder on the
// way is missing.
bool ItemGetInfo(const char* name, ItemInfo& info);
bool FileGetInfo(FileHandle file, ItemInfo& info);

// What shows whether a name still leads to the file and the text that it led to: another file, another size, or another
// time of the last write, in whatever resolution the host keeps it.
struct FileVersion {
    std::uint64_t device, number;  // of the file
    std::int64_t size;
    std::int64_t seconds, nanoseconds;

    bool operator==(const FileVersion&) const = default;
};

// As ItemGetInfo; but 2 for a link that leads nowhere.
bool ItemGetVersion(const char* name, FileVersion& version);
bool FileGetVersion(FileHandle file, FileVersion& version);

enum class ItemKind { kNone, kFile, kFolder };
ItemKind ItemExists(const char* name);

// The last component of `name` as it is spelled on the disk (empty for a drive). 2 when there is none.
bool ItemRealName(const char* name, std::string& real);

// The whole of `name` as it is spelled on the disk.
bool ItemRealPath(const char* name, std::string& real);

struct FolderEntry {
    std::string name;
    bool folder;
};

// What the folder holds, without `.` and `..`, in the host's order. A character that a name cannot have here (the code
// page lacks it, or it is a separator) shows as `?`. 267 when it is no folder.
bool FolderList(const char* name, std::vector<FolderEntry>& entries);

// How many entries FolderList would give.
bool FolderCount(const char* name, std::int64_t& count);

bool FolderCreate(const char* name);  // 183 when there is an item of that name, 3 when the parent is missing
bool FolderRemove(const char* name);  // 145 when it is not empty, 267 when it is no folder
bool FileDelete(const char* name);    // 5 for a folder

// Renames or moves a file or a folder. The destination must not exist (183), unless it is the same item in another
// spelling. Atomic and durable. Between file systems a file moves by copying, and keeps what it has: permissions,
// attributes, times, and the owner where this user may give files away (else the rights to run as that owner go); a
// link moves itself. It is whole in one place or the other, for a moment in both; a file that is being written is not
// moved (32), and what is still added to it then is added to the copy. A folder does not move between file systems
// (17), nor what is no file (5).
bool ItemRename(const char* from, const char* to);

// Copies bytes, permissions and modification time; holes stay holes. The destination must not exist in any spelling
// (80). Atomic and durable: it appears whole, under its permissions. What is no regular file is refused (5), one that
// ends before its size is not copied (38).
bool FileCopy(const char* from, const char* to);

// Copies all that a regular file holds over what another holds, with what is added meanwhile. `version`: which was
// copied. `keepsHoles`: the other is new, and where it is not written it is to stay empty. Moves both positions. A
// failure says which side failed; then the other holds a part. Neither atomic nor durable.
enum class CopyResult { kDone, kReadFailed, kWriteFailed };
CopyResult FileCopyBytes(FileHandle from, FileHandle to, bool keepsHoles, FileVersion& version);

// Deletes the file that was copied, for good. 2 when `name` leads to another file than `file`, 32 when it has been
// written since: nothing is deleted then. What is added to it in the last moment is added to the copy.
bool FileDeleteCopied(const char* name, FileHandle file, const FileVersion& copied, FileHandle copy);

bool ItemSetReadOnly(const char* name, bool readOnly);
bool ItemSetMode(const char* name, std::uint32_t mode);  // 0777 at most

// The permission bits that new files and folders of this process do not get. No other thread sees it changed.
std::uint32_t PermissionMask();

// The current folder of the process.
bool CurrentFolder(std::string& name);
bool SetCurrentFolder(const char* name);

// The folder for temporary files, with a separator at its end. Not necessarily there.
bool TemporaryFolder(std::string& name);

// Of the volume that holds the item `name`. `freeBytes`: what the caller may still write.
struct VolumeSpace {
    std::uint64_t totalBytes, freeBytes;
    std::uint32_t sectorBytes;
};
bool VolumeGetSpace(const char* name, VolumeSpace& space);

}  // namespace tessel::platform

#endif
