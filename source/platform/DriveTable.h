// Names of files, and where they lie on the host.
//
// The library names files `C:\folder\file` and `\\server\share\file`, in bytes of the active code page. The host's own
// names are UTF-8. What lies where:
//
//   TESSEL_DRIVES   `C=/;T=/mnt/x`: the folder that each drive letter stands for. Not set: `C=/`.
//   TESSEL_UNC      the folder under which `server/share` lie. Not set: every such name gives 53.
//
// `/` serves as `\`. A name that begins with one separator lies on the drive of the current folder, any other name
// without a drive in the current folder. Names are matched exactly first, then without regard to case by listing the
// folder, component by component; an exact match never costs a listing. `.` and `..` in a name with a drive or a share
// are taken out of the text, and a `..` at the root stays at the root.
//
// Functions that make texts may throw std::bad_alloc. Any thread.
#ifndef TESSEL_PLATFORM_DRIVETABLE_H
#define TESSEL_PLATFORM_DRIVETABLE_H

#include <string>
#include <string_view>
#include <vector>

namespace tessel::platform {

// The host's name for `name`, with each part that exists spelled as on the disk; parts that do not exist stay as given.
// False with 53 (no such server), 3 (no such drive), 123 (an empty name, or bytes that the code page does not have),
// and when the disk cannot be asked.
bool NameToNative(std::string_view name, std::string& native);

// The same without looking at the disk: what the text says.
bool NameToNativeText(std::string_view name, std::string& native);

// The name of a host's absolute name, through the drive or the network folder that lies nearest above it. A character
// that the code page does not have becomes `?`. False with 123 for a relative name, 3 when no drive holds it.
bool NativeToName(std::string_view native, std::string& name);

enum class DriveKind { kUnknown, kRemovable, kFixed, kNetwork, kCompactDisc, kMemory };

struct Drive {
    char letter;  // 'A' to 'Z'
    DriveKind kind;
};

// The drives whose folder exists, in the order of their letters.
std::vector<Drive> DrivesPresent();

// Reads TESSEL_DRIVES and TESSEL_UNC again; they are read once otherwise. Not while another thread uses names.
void ReloadDrives();

}  // namespace tessel::platform

#endif
