// What a FileHandle is here: the descriptor above two bits of access.
#ifndef TESSEL_PLATFORM_POSIX_FILEHANDLES_H
#define TESSEL_PLATFORM_POSIX_FILEHANDLES_H

#include "platform/File.h"
#include "platform/FileSystem.h"

#include <fcntl.h>
#include <sys/stat.h>

namespace tessel::platform {

// Never 0, because access is never 0.
inline FileHandle HandleOf(int descriptor, std::uint32_t access) {
    return static_cast<FileHandle>(descriptor) << 2 | static_cast<FileHandle>(access);
}
inline int DescriptorOf(FileHandle file) {
    return static_cast<int>(file >> 2);
}
inline bool HasAccess(FileHandle file, std::uint32_t access) {
    return (file & static_cast<FileHandle>(access)) != 0;
}

// File times: 100 ns since 1601, against the host's seconds since 1970.
constexpr std::int64_t kFileTimesPerSecond = 10'000'000;
constexpr std::int64_t kFileTimeOf1970 = 116'444'736'000'000'000;

inline std::int64_t FileTimeOf(std::int64_t seconds, std::int64_t nanoseconds) {
    return seconds * kFileTimesPerSecond + nanoseconds / 100 + kFileTimeOf1970;
}

// Hosts cannot set the time a file was made. Where a file system keeps attributes, this one holds what was asked for:
// a file time as 8 bytes, lowest first.
constexpr char kCreatedAttribute[] = "user.tessel.created";

constexpr unsigned kInfoMask = STATX_BASIC_STATS | STATX_BTIME;

// All of ItemInfo but `hidden` and a `created` that was set.
void FillInfo(const struct statx& status, ItemInfo& info);

}  // namespace tessel::platform

#endif
