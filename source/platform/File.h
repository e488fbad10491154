// Open files.
//
// A FileHandle is a value: it may be copied and used from any thread, and closing it twice is an error of the caller.
// It carries the access it was opened with, so a write-only file refuses reads even where the host's descriptor could.
// The calls on one handle share its one position.
//
// Every function returns false (or kNoFile) on failure and sets LastError. None throws, except FileOpen
// (std::bad_alloc).
#ifndef TESSEL_PLATFORM_FILE_H
#define TESSEL_PLATFORM_FILE_H

#include <cstddef>
#include <cstdint>
#include <cstdio>

namespace tessel::platform {

using FileHandle = std::intptr_t;
constexpr FileHandle kNoFile = 0;

// Flags of access, and of what others are denied.
constexpr std::uint32_t kRead = 1;
constexpr std::uint32_t kWrite = 2;

enum class Disposition {
    kOpenExisting,      // 2 when there is none
    kTruncateExisting,  // as above, then emptied; needs kWrite
    kCreateNew,         // 80 when there is one
    kCreateAlways       // an existing file is emptied
};

// Opens the file `name` with `access` (kRead, kWrite or both), denying others what `deny` says while it is open.
//
// What is denied holds between processes and between two opens of one process: 32 when another handle has what this
// one denies, or denies what this one wants. Two openers at the same moment may both be refused; never do both win. On
// a file system without locks nothing is denied. A refused open neither creates nor empties the file (a file that this
// very call created may stay when another opener came between). A folder gives 5.
FileHandle FileOpen(const char* name, std::uint32_t access, std::uint32_t deny, Disposition disposition);

// Creates a file afresh that only this user may read or write. What of this user's has the name goes first: a link
// itself, never what it leads to. 5, and nothing is touched, when it is another user's, or a folder; 32 when another
// process is writing it so, or has done since this one began.
FileHandle FileCreatePrivate(const char* name, std::uint32_t access);

bool FileClose(FileHandle file);

// A stream of the C library for writing: at the end of the file with `append`, else after emptying it. It is made where
// there is none. A folder or a pipe is refused (5). Null on failure.
std::FILE* FileOpenStream(const char* name, bool append);

// Move up to `count` bytes at the position, and the position with them. `actual` is set in every case. Reading ends
// early only at the end of the file, which is no failure. Interrupted and short transfers go on by themselves. 5
// without the access.
bool FileRead(FileHandle file, void* buffer, std::size_t count, std::size_t& actual);
bool FileWrite(FileHandle file, const void* data, std::size_t count, std::size_t& actual);

enum class SeekFrom { kStart, kCurrent, kEnd };

// Moves the position, also beyond the end. A target before the start gives 131 and leaves the position.
bool FileSeek(FileHandle file, std::int64_t offset, SeekFrom from);
bool FileTell(FileHandle file, std::int64_t& position);

bool FileSize(FileHandle file, std::int64_t& size);

// Cuts or extends (with zero bytes); the position stays.
bool FileSetSize(FileHandle file, std::int64_t size);

// Makes the file `size` bytes long at least, with room on the device for all of them. Its size stays as it is on
// failure, and where the file system cannot promise room.
bool FileReserve(FileHandle file, std::int64_t size);

// Puts what was written, and the file's size and permissions, onto the device. After a failure nobody knows what is
// there: flushing again proves nothing, what was written has to be written anew.
bool FileFlush(FileHandle file);

// Exclusive locks of byte ranges, between handles, in this process or another. They bind those who lock, not those who
// only read and write. FileLock does not wait: 33 when another handle holds a part. FileUnlock gives 158 when nobody
// holds any of it. A count of 0 does nothing. Closing the handle releases its locks.
bool FileLock(FileHandle file, std::int64_t offset, std::int64_t count);
bool FileUnlock(FileHandle file, std::int64_t offset, std::int64_t count);

// Times: 100 ns since 1601-01-01 00:00:00 UTC; 0 leaves a time as it is. The host sets no time of creation; one that is
// set here is kept, and told afterwards, where the file system keeps attributes of files.
bool FileSetTimes(FileHandle file, std::int64_t created, std::int64_t accessed, std::int64_t modified);

}  // namespace tessel::platform

#endif
