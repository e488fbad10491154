#include "platform/File.h"

#include "platform/Mutex.h"
#include "platform/posix/Errors.h"
#include "platform/posix/FileHandles.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"

#include <algorithm>
#include <cstdio>
#include <errno.h>
#include <string>
#include <unistd.h>

namespace tessel::platform {

// ---- what others are denied -----------------------------------------------------------------------------------------

namespace {

// The order of the marks makes the usual sets contiguous.
constexpr unsigned kHasWrite = 1, kHasRead = 2, kDenyWrite = 4, kDenyRead = 8;
constexpr int kMarkCount = 4;

unsigned MarksOf(std::uint32_t access, std::uint32_t deny) {
    unsigned marks = 0;
    if (access & kWrite) marks |= kHasWrite;
    if (access & kRead) marks |= kHasRead;
    if (deny & kWrite) marks |= kDenyWrite;
    if (deny & kRead) marks |= kDenyRead;
    return marks;
}

// The marks of others that stand against ours: what we have against what they deny, and the other way.
unsigned AdverseMarks(unsigned marks) {
    return (marks & 3u) << 2 | marks >> 2;
}

int LockBytes(int descriptor, int command, short type, std::int64_t start, std::int64_t count, struct flock& range) {
    range = {};
    range.l_type = type;
    range.l_whence = SEEK_SET;
    range.l_start = static_cast<off_t>(start);
    range.l_len = static_cast<off_t>(count);
    return Retry([&] { return systemCalls.lock(descriptor, command, &range); });
}

// Calls act(first mark, count) for each run of contiguous marks, until one of them is not kDone.
template <typename Action>
Marking ForEachRun(unsigned marks, Action act) {
    for (int first = 0; first < kMarkCount; ++first) {
        if (!(marks >> first & 1)) continue;
        int count = 1;
        while (marks >> (first + count) & 1) ++count;
        Marking result = act(first, count);
        if (result != Marking::kDone) return result;
        first += count;
    }
    return Marking::kDone;
}

// A descriptor without read access (the file may be written but not read) can only lock for writing, which refuses more
// than it must: never too little.
Marking SetMarks(int descriptor, unsigned marks, bool readable) {
    return ForEachRun(marks, [&](int first, int count) {
        return MarkBytes(descriptor, readable ? F_RDLCK : F_WRLCK, kMarksAt + first, count);
    });
}

Marking TestMarks(int descriptor, unsigned marks) {
    return ForEachRun(marks, [&](int first, int count) { return TestBytes(descriptor, kMarksAt + first, count); });
}

// Marks first and tests then: of two openers at the same moment at least one sees the other's marks. A file system that
// has no locks denies nothing.
bool ShareAllows(int descriptor, std::uint32_t access, std::uint32_t deny, bool readable) {
    unsigned marks = MarksOf(access, deny);
    Marking result = SetMarks(descriptor, marks, readable);
    // Mostly nobody else has the file open, and one look at all the marks tells.
    if (result == Marking::kDone) result = TestMarks(descriptor, (1u << kMarkCount) - 1);
    if (result == Marking::kRefused) result = TestMarks(descriptor, AdverseMarks(marks));
    return result != Marking::kRefused;
}

}  // namespace

Marking MarkBytes(int descriptor, short type, std::int64_t start, std::int64_t count) {
    struct flock range;
    if (LockBytes(descriptor, F_OFD_SETLK, type, start, count, range) == 0) return Marking::kDone;
    return errno == EAGAIN || errno == EACCES ? Marking::kRefused : Marking::kNoLocks;
}

Marking TestBytes(int descriptor, std::int64_t start, std::int64_t count) {
    struct flock range;
    if (LockBytes(descriptor, F_OFD_GETLK, F_WRLCK, start, count, range) != 0) return Marking::kNoLocks;
    return range.l_type == F_UNLCK ? Marking::kDone : Marking::kRefused;
}

Marking MarkShare(int descriptor, std::uint32_t access, std::uint32_t deny) {
    return SetMarks(descriptor, MarksOf(access, deny), true);
}

namespace {

// ---- opening --------------------------------------------------------------------------------------------------------

// Neither a device nor a pipe makes it wait, and no terminal becomes the process's own.
int OpenAtOnce(const char* native, int flags, mode_t mode = 0666) {
    return OpenRetrying(native, flags | O_NOCTTY | O_NONBLOCK, mode);
}

// Marks are set by reading, so files are opened for reading too wherever they may be read.
int OpenDescriptor(const char* native, std::uint32_t access, int flags, bool& readable) {
    readable = true;
    if (access == kRead) return OpenAtOnce(native, O_RDONLY | flags);
    int descriptor = OpenAtOnce(native, O_RDWR | flags);
    if (descriptor >= 0 || errno != EACCES || access != kWrite) return descriptor;
    readable = false;
    return OpenAtOnce(native, O_WRONLY | flags);
}

// Opening never waits, but the later reads and writes of a device do, as those of a file.
bool MakeWaiting(int descriptor) {
    const int flags = systemCalls.fcntl(descriptor, F_GETFL, 0);
    return flags >= 0 && systemCalls.fcntl(descriptor, F_SETFL, flags & ~O_NONBLOCK) == 0;
}

// Folders, pipes and sockets have no bytes at positions. A device may be opened.
bool CheckKind(int descriptor, unsigned mode) {
    if (S_ISREG(mode)) return true;
    if (S_ISDIR(mode) || S_ISFIFO(mode)) return FailWith(kErrorAccessDenied);
    return MakeWaiting(descriptor) || FailErrno();
}

bool Truncate(int descriptor, std::int64_t size) {
    return Retry([&] { return systemCalls.ftruncate(descriptor, static_cast<off_t>(size)); }) == 0;
}

enum class Admission { kGranted, kRefused, kReplaced };

// Who replaces a file lets go of the old one's marks: they are on the new one. A file without a name that was opened by
// one is such an old file, unless the name still leads to it (as those of open files under /proc do).
bool WasReplaced(const char* native, const struct statx& status) {
    if (status.stx_nlink != 0) return false;
    struct statx named;
    return !StatusOf(native, Links::kFollowed, STATX_INO, named) || !SameFile(status, named);
}

// What has to hold of a descriptor before it is handed out. LastError says why it is refused.
Admission Admit(int descriptor, const char* native, std::uint32_t access, std::uint32_t deny, bool readable) {
    const bool allowed = ShareAllows(descriptor, access, deny, readable);
    struct statx status;
    if (systemCalls.statx(descriptor, "", AT_EMPTY_PATH, STATX_TYPE | STATX_NLINK | STATX_INO, &status) != 0)
        return FailErrno(), Admission::kRefused;
    if (!CheckKind(descriptor, status.stx_mode)) return Admission::kRefused;
    if (WasReplaced(native, status)) return Admission::kReplaced;
    if (!allowed) FailWith(kErrorSharingViolation);
    return allowed ? Admission::kGranted : Admission::kRefused;
}

// A descriptor that may be handed out, or kNotOpened with errno, or kNotAdmitted with LastError.
constexpr int kNotOpened = -1, kNotAdmitted = -2;

int OpenAdmitted(const std::string& native, std::uint32_t access, std::uint32_t deny, int flags) {
    for (;;) {
        bool readable = true;
        const int descriptor = OpenDescriptor(native.c_str(), access, flags, readable);
        if (descriptor < 0) return kNotOpened;
        const Admission admission = Admit(descriptor, native.c_str(), access, deny, readable);
        if (admission == Admission::kGranted) return descriptor;
        systemCalls.close(descriptor);
        if (admission == Admission::kRefused) return kNotAdmitted;
    }
}

// ---- private files --------------------------------------------------------------------------------------------------

// When this process began to use the library, by the clock of the files' times.
timespec BeginOfProcess() {
    timespec now{};
    systemCalls.clock_gettime(CLOCK_REALTIME_COARSE, &now);
    return now;
}
const timespec beginOfProcess = BeginOfProcess();

// The private files that this process made last: its own it may make again.
struct OwnFile {
    pid_t process;
    struct statx file;
};
constexpr int kOwnFiles = 16;
constinit Mutex ownFilesMutex;  // guards both; nothing is taken inside
OwnFile ownFiles[kOwnFiles];
unsigned ownFilesMade = 0;

void RememberOwn(int descriptor) {
    OwnFile made = {systemCalls.getpid(), {}};
    if (systemCalls.statx(descriptor, "", AT_EMPTY_PATH, STATX_INO, &made.file) != 0) return;
    MutexHolder holder(ownFilesMutex);
    ownFiles[ownFilesMade++ % kOwnFiles] = made;
}

bool IsOwn(const struct statx& status) {
    MutexHolder holder(ownFilesMutex);
    for (const OwnFile& each : ownFiles) {
        if (each.process == systemCalls.getpid() && SameFile(each.file, status)) return true;
    }
    return false;
}

bool IsOfThisTime(const struct statx& status) {
    const statx_timestamp& time = status.stx_mtime;
    if (time.tv_sec != beginOfProcess.tv_sec) return time.tv_sec > beginOfProcess.tv_sec;
    return std::int64_t{time.tv_nsec} > beginOfProcess.tv_nsec;
}

// Holds what has a name while it makes way for a new file, so that of two only one removes it, and the other does not
// take the new one for it.
class OldFile {
public:
    OldFile() = default;
    ~OldFile() {
        const int error = errno;
        if (descriptor_ >= 0) systemCalls.close(descriptor_);
        errno = error;
    }
    OldFile(const OldFile&) = delete;
    OldFile& operator=(const OldFile&) = delete;

    // Removes what has the name, when it is this user's, no folder, and not in use. True also when there is nothing.
    bool Remove(const char* native) {
        struct statx status;
        if (!StatusOf(native, Links::kThemselves, STATX_BASIC_STATS, status)) return errno == ENOENT || FailErrno();
        if (S_ISDIR(status.stx_mode) || status.stx_uid != systemCalls.geteuid()) return FailWith(kErrorAccessDenied);
        if (S_ISREG(status.stx_mode) && !Hold(native)) return false;
        return systemCalls.unlink(native) == 0 || errno == ENOENT || FailErrno();
    }

private:
    bool Hold(const char* native) {
        struct statx held, named;
        descriptor_ = OpenAtOnce(native, O_RDWR | O_NOFOLLOW);
        if (descriptor_ < 0) return FailErrno();
        const bool taken = MarkBytes(descriptor_, F_WRLCK, kWriterMark, 1) == Marking::kRefused;
        if (systemCalls.statx(descriptor_, "", AT_EMPTY_PATH, STATX_BASIC_STATS, &held) != 0) return FailErrno();
        if (taken || (IsOfThisTime(held) && !IsOwn(held))) return FailWith(kErrorSharingViolation);
        const bool same = StatusOf(native, Links::kThemselves, STATX_INO, named) && SameFile(held, named);
        return same || FailWith(kErrorSharingViolation);
    }

    int descriptor_ = -1;
};

}  // namespace

FileHandle FileOpen(const char* name, std::uint32_t access, std::uint32_t deny, Disposition disposition) {
    bool creates = disposition == Disposition::kCreateNew || disposition == Disposition::kCreateAlways;
    bool empties = disposition == Disposition::kTruncateExisting || disposition == Disposition::kCreateAlways;
    bool valid = name && access != 0 && (access | deny) <= (kRead | kWrite);
    if (!valid || (disposition == Disposition::kTruncateExisting && !(access & kWrite))) {
        FailWith(kErrorInvalidParameter);
        return kNoFile;
    }
    int flags = creates ? O_CREAT : 0;
    if (disposition == Disposition::kCreateNew) flags |= O_EXCL;

    int descriptor = kNotAdmitted;
    auto open = [&](const std::string& native) {
        descriptor = OpenAdmitted(native, access, deny, flags);
        return descriptor != kNotOpened;
    };
    if (creates) {
        std::string native;
        if (!NameToNativeText(name, native)) return kNoFile;
        Match match = MatchOnDisk(native);
        if (match != Match::kAll && match != Match::kLastMissing) {
            FailMatch(match);
            return kNoFile;
        }
        if (!open(native)) FailWith(errno == EEXIST ? kErrorFileExists : ErrorOfErrno(errno));
    } else if (!OnExistingItem(name, open)) {
        return kNoFile;
    }
    if (descriptor < 0) return kNoFile;
    if (!empties || Truncate(descriptor, 0) || errno == EINVAL)
        return HandleOf(descriptor, access);  // EINVAL: a device
    FailErrno();
    systemCalls.close(descriptor);
    return kNoFile;
}

FileHandle FileCreatePrivate(const char* name, std::uint32_t access) {
    std::string native;
    if (!NameToNativeText(name, native)) return kNoFile;
    Match match = MatchOnDisk(native);
    if (match != Match::kAll && match != Match::kLastMissing) {
        FailMatch(match);
        return kNoFile;
    }
    OldFile old;
    if (!old.Remove(native.c_str())) return kNoFile;
    // Whoever puts something there in between is refused, a link too.
    const int descriptor = OpenAtOnce(native.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    if (descriptor < 0) {
        FailWith(errno == EEXIST ? kErrorSharingViolation : ErrorOfErrno(errno));
        return kNoFile;
    }
    MarkBytes(descriptor, F_WRLCK, kWriterMark, 1);
    RememberOwn(descriptor);
    return HandleOf(descriptor, access);
}

std::FILE* FileOpenStream(const char* name, bool append) {
    std::string native;
    if (!NameToNativeText(name, native)) return nullptr;
    const Match match = MatchOnDisk(native);
    if (match != Match::kAll && match != Match::kLastMissing) {
        FailMatch(match);
        return nullptr;
    }
    const int descriptor = OpenAtOnce(native.c_str(), O_WRONLY | O_CREAT | (append ? O_APPEND : 0));
    if (descriptor < 0) {
        FailWith(errno == ENXIO ? kErrorAccessDenied : ErrorOfErrno(errno));  // a pipe that nobody reads
        return nullptr;
    }
    struct statx status;
    const bool known = systemCalls.statx(descriptor, "", AT_EMPTY_PATH, STATX_TYPE, &status) == 0 || FailErrno();
    const bool usable = known && CheckKind(descriptor, status.stx_mode) &&
                        (append || Truncate(descriptor, 0) || errno == EINVAL || FailErrno());
    std::FILE* stream = usable ? ::fdopen(descriptor, append ? "a" : "w") : nullptr;
    if (usable && !stream) FailErrno();
    if (!stream) systemCalls.close(descriptor);
    return stream;
}

bool FileClose(FileHandle file) {
    // After EINTR the descriptor is gone all the same; a second close could hit another thread's file.
    return systemCalls.close(DescriptorOf(file)) == 0 || errno == EINTR || FailErrno();
}

// ---- moving bytes ---------------------------------------------------------------------------------------------------

bool FileRead(FileHandle file, void* buffer, std::size_t count, std::size_t& actual) {
    actual = 0;
    if (!HasAccess(file, kRead)) return FailWith(file ? kErrorAccessDenied : kErrorInvalidHandle);
    return ReadAll(DescriptorOf(file), buffer, count, actual) || FailErrno();
}

bool FileWrite(FileHandle file, const void* data, std::size_t count, std::size_t& actual) {
    actual = 0;
    if (!HasAccess(file, kWrite)) return FailWith(file ? kErrorAccessDenied : kErrorInvalidHandle);
    return WriteAll(DescriptorOf(file), data, count, actual) || FailErrno();
}

bool FileSeek(FileHandle file, std::int64_t offset, SeekFrom from) {
    int whence = from == SeekFrom::kStart ? SEEK_SET : from == SeekFrom::kCurrent ? SEEK_CUR : SEEK_END;
    if (systemCalls.lseek(DescriptorOf(file), static_cast<off_t>(offset), whence) >= 0) return true;
    return errno == EINVAL && offset < 0 ? FailWith(kErrorNegativeSeek) : FailErrno();
}

bool FileTell(FileHandle file, std::int64_t& position) {
    off_t at = systemCalls.lseek(DescriptorOf(file), 0, SEEK_CUR);
    if (at < 0) return FailErrno();
    position = at;
    return true;
}

bool FileSize(FileHandle file, std::int64_t& size) {
    struct statx status;
    if (systemCalls.statx(DescriptorOf(file), "", AT_EMPTY_PATH, STATX_SIZE, &status) != 0) return FailErrno();
    size = static_cast<std::int64_t>(status.stx_size);
    return true;
}

bool FileSetSize(FileHandle file, std::int64_t size) {
    if (!HasAccess(file, kWrite)) return FailWith(file ? kErrorAccessDenied : kErrorInvalidHandle);
    return Truncate(DescriptorOf(file), size) || FailErrno();
}

bool FileReserve(FileHandle file, std::int64_t size) {
    if (!HasAccess(file, kWrite)) return FailWith(file ? kErrorAccessDenied : kErrorInvalidHandle);
    std::int64_t before = 0;
    if (!FileSize(file, before)) return false;
    const int result = Retry([&] { return systemCalls.fallocate(DescriptorOf(file), 0, 0, static_cast<off_t>(size)); });
    if (result == 0 || errno == EOPNOTSUPP || errno == ENOSYS || errno == ENODEV) return true;
    ErrorNumber reason = ErrorOfErrno(errno);
    Truncate(DescriptorOf(file), before);  // a part may have been had
    return FailWith(reason);
}

bool FileFlush(FileHandle file) {
    const int result = Retry([&] { return systemCalls.fsync(DescriptorOf(file)); });
    return result == 0 || errno == EINVAL || FailErrno();  // EINVAL: there is no device to wait for
}

// ---- range locks ----------------------------------------------------------------------------------------------------

namespace {

bool ValidRange(std::int64_t offset, std::int64_t count) {
    return offset >= 0 && count >= 0 && offset <= kMarksAt - count;
}

// True when another handle holds a part of the range.
bool HeldByOther(int descriptor, std::int64_t offset, std::int64_t count) {
    struct flock range;
    return LockBytes(descriptor, F_OFD_GETLK, F_WRLCK, offset, count, range) == 0 && range.l_type != F_UNLCK;
}

// The host locks exclusively only what may be written. A handle that only reads takes a shared lock instead and then
// looks whether anybody else has one: mark, then test, as for the share modes.
bool LockForReader(int descriptor, std::int64_t offset, std::int64_t count) {
    if (HeldByOther(descriptor, offset, count)) return FailWith(kErrorLockViolation);
    struct flock range;
    if (LockBytes(descriptor, F_OFD_SETLK, F_RDLCK, offset, count, range) != 0) return FailErrno();
    if (!HeldByOther(descriptor, offset, count)) return true;
    LockBytes(descriptor, F_OFD_SETLK, F_UNLCK, offset, count, range);
    return FailWith(kErrorLockViolation);
}

}  // namespace

bool FileLock(FileHandle file, std::int64_t offset, std::int64_t count) {
    if (!ValidRange(offset, count)) return FailWith(kErrorInvalidParameter);
    if (count == 0) return true;
    int descriptor = DescriptorOf(file);
    if (!HasAccess(file, kWrite)) return LockForReader(descriptor, offset, count);
    struct flock range;
    return LockBytes(descriptor, F_OFD_SETLK, F_WRLCK, offset, count, range) == 0 || FailErrno();
}

bool FileUnlock(FileHandle file, std::int64_t offset, std::int64_t count) {
    if (!ValidRange(offset, count)) return FailWith(kErrorInvalidParameter);
    if (count == 0) return true;
    // A handle does not see its own locks. A second one on the same file does.
    char self[40];
    std::snprintf(self, sizeof self, "/proc/self/fd/%d", DescriptorOf(file));
    int other = OpenAtOnce(self, O_RDONLY);
    bool locked = other < 0 || HeldByOther(other, offset, count);
    if (other >= 0) systemCalls.close(other);
    // What another handle holds is not this one's to unlock.
    if (!locked || HeldByOther(DescriptorOf(file), offset, count)) return FailWith(kErrorNotLocked);
    struct flock range;
    return LockBytes(DescriptorOf(file), F_OFD_SETLK, F_UNLCK, offset, count, range) == 0 || FailErrno();
}

// ---- information ----------------------------------------------------------------------------------------------------

namespace {

timespec HostTime(std::int64_t fileTime) {
    timespec time{};
    time.tv_nsec = UTIME_OMIT;
    if (fileTime == 0) return time;
    std::int64_t since1970 = fileTime - kFileTimeOf1970;
    std::int64_t part = (since1970 % kFileTimesPerSecond + kFileTimesPerSecond) % kFileTimesPerSecond;
    time.tv_sec = static_cast<time_t>((since1970 - part) / kFileTimesPerSecond);
    time.tv_nsec = static_cast<long>(part * 100);
    return time;
}

void ToBytes(std::int64_t fileTime, unsigned char (&bytes)[8]) {
    for (int i = 0; i < 8; ++i) bytes[i] = static_cast<unsigned char>(static_cast<std::uint64_t>(fileTime) >> (8 * i));
}

}  // namespace

bool FileSetTimes(FileHandle file, std::int64_t created, std::int64_t accessed, std::int64_t modified) {
    if (!HasAccess(file, kWrite)) return FailWith(file ? kErrorAccessDenied : kErrorInvalidHandle);
    int descriptor = DescriptorOf(file);
    if (created != 0) {
        unsigned char bytes[8];
        ToBytes(created, bytes);
        systemCalls.fsetxattr(descriptor, kCreatedAttribute, bytes, sizeof bytes, 0);  // kept where it can be
    }
    timespec times[2] = {HostTime(accessed), HostTime(modified)};
    return systemCalls.futimens(descriptor, times) == 0 || FailErrno();
}

}  // namespace tessel::platform
