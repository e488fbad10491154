// Files that are new under their name: who may make one, and moving one to another file system.
#ifndef TESSEL_PLATFORM_POSIX_COPYING_H
#define TESSEL_PLATFORM_POSIX_COPYING_H

#include "platform/Replacement.h"

#include <string>

namespace tessel::platform {

// Those that give names in a folder do so one after the other, so that no two give one name in two spellings. The wait
// has an end, after two seconds: the lock is any program's to take. Some file systems have none.
class FolderTurn {
public:
    explicit FolderTurn(const std::string& native);
    ~FolderTurn();
    FolderTurn(const FolderTurn&) = delete;
    FolderTurn& operator=(const FolderTurn&) = delete;

    bool IsHeld() const { return held_; }
    bool IsRefused() const { return refused_; }  // another has it all the time

private:
    int file_ = -1;
    bool held_ = false, refused_ = false;
};

// False with errno; EEXIST when `to` is taken. On a file system that cannot rename without replacing, a file has both
// names for a moment, and between the look for a folder's new name and its renaming another may come.
bool RenameWithoutReplacing(const std::string& from, const std::string& to);

// Finishes a new file, if there is none of that name in any spelling (80).
bool FinishNew(Replacement& replacement, const char* name);

// The item `native`, which is `from` in the library's names. 17 for a folder, 5 for what is neither file nor link.
bool MoveAcross(const std::string& native, const char* from, const char* to);

}  // namespace tessel::platform

#endif
