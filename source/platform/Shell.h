// What the desktop keeps: standard folders, the recycle bin, shortcuts.
//
// Every function returns false on failure and sets LastError. They may throw std::bad_alloc. Any thread.
#ifndef TESSEL_PLATFORM_SHELL_H
#define TESSEL_PLATFORM_SHELL_H

#include <string>
#include <string_view>

namespace tessel::platform {

// The library's kinds of folder, and where they lie here.
enum class ShellFolder {
    kProfile,          // the home folder
    kDesktop,          // XDG_DESKTOP_DIR
    kDocuments,        // XDG_DOCUMENTS_DIR
    kLocalAppData,     // $XDG_DATA_HOME, ~/.local/share
    kCommonDocuments,  // XDG_PUBLICSHARE_DIR
    kCommonAppData,    // the first of $XDG_DATA_DIRS, /usr/local/share
    kSystem,           // /usr/lib
    kProgramFiles,     // /opt
    kWindows           // the system's root, /
};

// The folder's name, without a separator at its end unless it is a drive. With `create` a missing one is made. 2 when
// there is none of that kind, or it is missing.
bool ShellFolderName(ShellFolder kind, bool create, std::string& name);

// Moves a file or folder to the user's trash. 2 when it is missing, 5 when there is no trash of this user's own on its
// file system. Atomic and durable: it is where it was or whole in the trash, and what is said of it there is never
// without it for longer than until the next is moved there.
bool ShellTrash(const char* name);

// The target that the shortcut file `name` points to. 2 when it is missing, 1006 when it is no shortcut or has no
// target of its own.
bool ShellReadShortcut(const char* name, std::string& target);

// The same of the file's bytes. `linkFolder`, with a separator at its end, is what a target that is only known by its
// way from the shortcut counts from.
bool ParseShortcut(std::string_view bytes, std::string_view linkFolder, std::string& target);

}  // namespace tessel::platform

#endif
