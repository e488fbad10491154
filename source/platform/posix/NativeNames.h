// From the library's names to the host's, for the files of this backend that call the kernel by name.
#ifndef TESSEL_PLATFORM_POSIX_NATIVENAMES_H
#define TESSEL_PLATFORM_POSIX_NATIVENAMES_H

#include "platform/DriveTable.h"
#include "platform/posix/Errors.h"
#include "platform/posix/Interrupted.h"

#include <errno.h>
#include <string>
#include <string_view>

namespace tessel::platform {

// kFailed: the disk does not tell, errno says why. A look that failed is not one that found nothing.
enum class Match { kAll, kLastMissing, kParentMissing, kFailed };

// Respells the parts of `native` that exist on the disk in another case only.
Match MatchOnDisk(std::string& native);

// Sets LastError to what stands against an item that must exist, and returns false. Not for kAll.
bool FailMatch(Match match) noexcept;

// What NameToNativeText says, from the current folder on where it is relative.
bool NameToAbsoluteText(std::string_view name, std::string& native);

// The item that `name` names, spelled as on the disk and absolute. False with LastError when it is missing.
bool NameToAbsoluteNative(const char* name, std::string& native);

// Equal but for case, of two names in UTF-8.
bool EqualNames(std::string_view a, std::string_view b) noexcept;

// Takes the first character off a name in UTF-8 (not empty), in upper case. A byte that is none equals only itself.
char32_t TakeUpper(std::string_view& text) noexcept;

// A name on the disk as the library sees it: in the code page, with `?` for what a name cannot hold.
std::string NameFromDisk(std::string_view diskName);

// The current folder, absolute; "/" when the host does not tell.
std::string NativeCurrentFolder();

// Splits off the last component. "/" for the parent of a top one, "." for that of a relative one.
std::string NativeParent(std::string_view native);
std::string_view NativeLast(std::string_view native);

// Runs operation(native) on an item that must exist: exactly as spelled first, and if there is none, as found on the
// disk. The operation returns false and sets errno; so a name that fits costs no look at the disk.
template <typename Operation>
bool OnExistingItem(std::string_view name, Operation operation) {
    std::string native;
    if (!NameToNativeText(name, native)) return false;
    if (operation(native)) return true;
    if (!IsAbsence(errno)) return FailErrno();
    int error = errno;
    std::string asGiven = native;
    Match match = MatchOnDisk(native);
    if (match != Match::kAll) return FailMatch(match);
    if (native == asGiven) return FailWith(ErrorOfErrno(error));
    return operation(native) || FailErrno();
}

}  // namespace tessel::platform

#endif
