// A file that takes the place of another whole, or a name that is free.
//
// What is new is written beside the old, and takes its name only when all of it is on the device. Whenever the process
// is killed, and whenever the power fails, the name leads to the old file or to the new one, whole; once Finish has
// said true it leads to the new one. Where the host can, the new file has no name until then; else, and for the moment
// in which it changes places with the old one, it has a private name in the same folder. What a writer that died left
// under such a name is removed by the next one in that folder; never what a living writer holds, nor what is somebody
// else's.
#ifndef TESSEL_PLATFORM_REPLACEMENT_H
#define TESSEL_PLATFORM_REPLACEMENT_H

#include "platform/File.h"

#include <memory>

namespace tessel::platform {

// How far a replacement came that failed.
enum class ReplaceFailure {
    kNone,
    // No file can be made that could stand in the old one's stead: the folder cannot be written, no name is free, owner
    // or attributes cannot be kept, the old file has other names (hard links) or is no regular file. Nothing happened.
    kCannotMake,
    // Attributes, or what was written, cannot be put onto the device.
    kCannotFlush,
    // The new file cannot take the name: there is a file where none must be, or where none was in the beginning (80),
    // or it does not lead to the file any more that was to be replaced (2).
    kCannotRename
};

struct ReplaceRequest {
    // What is to be replaced, or made; as for FileOpen. Where it is a link of the host, the file is meant to which it
    // leads.
    const char* name = nullptr;
    // The name must lead to this open file, in the beginning and at the end. kNoFile: to whatever has it at the
    // beginning, or nothing.
    FileHandle opened = kNoFile;
    // 80 when there is anything of that name.
    bool mustNotExist = false;
    // A file with several names is replaced under this one; the others keep the old file.
    bool breaksLinks = false;
    // Access of the handle to the new file, and what it denies others. It is marked with both before it takes the name.
    std::uint32_t access = kRead | kWrite;
    std::uint32_t deny = 0;
    // Whose permissions, owner, attributes and time of creation the new file takes on: by default those of the file
    // that it replaces. Without either it is like any new file.
    FileHandle like = kNoFile;
    // Permissions of a file that is like no other, 07777 at most; -1: those of any new file.
    int mode = -1;
    // An owner that cannot be kept is no failure then; the rights to run as that owner go.
    bool ownerMayChange = false;
    // Names of private files, with one %d for a number from 0 to below `limit`. Under a pattern of the caller's only
    // what carries our mark is removed.
    const char* pattern = nullptr;
    int limit = 1000;
};

class Replacement {
public:
    Replacement();
    // What was begun and not finished is given up: nothing is left of it.
    ~Replacement();
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;

    // Makes the new file, empty, for this user alone. False with LastError and Failure. Once per object. Begin and
    // Finish may throw std::bad_alloc.
    bool Begin(const ReplaceRequest& request);

    // The new file, for reading and writing, to be filled between Begin and Finish.
    FileHandle File() const;

    // Gives the file what it takes on from the old one, flushes it, lets it take the name, and flushes the folder.
    // After a failure the old file has its name, but for one case: see HasName.
    bool Finish();

    ReplaceFailure Failure() const;

    // Whether the new file has the name. After a failed Finish only on a file system that cannot exchange two names,
    // when the folder could not be flushed afterwards.
    bool HasName() const;

    // The new file, open with the access that was asked for; the caller closes it. Else it is closed with the object.
    FileHandle Release();

private:
    struct Work;
    std::unique_ptr<Work> work_;
};

}  // namespace tessel::platform

#endif
