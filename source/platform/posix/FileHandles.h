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

// What a version is made of.
constexpr unsigned kVersionMask = STATX_INO | STATX_SIZE | STATX_MTIME;
FileVersion VersionOfStatus(const struct statx& status);

// Every open file holds locks on some of four bytes, which lie far beyond any data and are never written. The locks
// belong to the open file description: they are seen between processes and between two opens of one process, and go
// when the file is closed. All holders lock for reading, so that any number of them can hold the same mark.
constexpr std::int64_t kMarksAt = std::int64_t{1} << 62;

// A fifth byte, which the writer of a temporary file holds while it lives.
constexpr std::int64_t kWriterMark = kMarksAt + 8;

enum class Marking { kDone, kRefused, kNoLocks };

// Takes a lock of its own on `count` bytes; kNoLocks where the file system has none.
Marking MarkBytes(int descriptor, short type, std::int64_t start, std::int64_t count);
// kRefused when another open file has a lock on one of the bytes.
Marking TestBytes(int descriptor, std::int64_t start, std::int64_t count);

// Marks an open file with what it has and what it denies others, without a look at theirs.
Marking MarkShare(int descriptor, std::uint32_t access, std::uint32_t deny);

// Whether both are the same file, by the fields of STATX_INO.
inline bool SameFile(const struct statx& a, const struct statx& b) {
    return a.stx_ino == b.stx_ino && a.stx_dev_major == b.stx_dev_major && a.stx_dev_minor == b.stx_dev_minor;
}

// All of ItemInfo but `hidden` and a `created` that was set.
void FillInfo(const struct statx& status, ItemInfo& info);

}  // namespace tessel::platform

#endif
