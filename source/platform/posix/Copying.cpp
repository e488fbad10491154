// Copying files, and moving them to another file system.
#include "platform/posix/Copying.h"

#include "platform/Clock.h"
#include "platform/FileSystem.h"
#include "platform/Replacement.h"
#include "platform/posix/FileHandles.h"
#include "platform/posix/Folders.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"

#include <algorithm>
#include <climits>
#include <errno.h>
#include <memory>
#include <new>
#include <sys/file.h>
#include <unistd.h>

namespace tessel::platform {

// ---- bytes ----------------------------------------------------------------------------------------------------------

namespace {

// False with errno; also for what is no regular file.
bool VersionOf(int file, FileVersion& version) {
    struct statx status;
    if (systemCalls.statx(file, "", AT_EMPTY_PATH, kVersionMask | STATX_TYPE, &status) != 0) return false;
    version = VersionOfStatus(status);
    if (S_ISREG(status.stx_mode)) return true;
    errno = EACCES;
    return false;
}

bool SeekTo(int file, std::int64_t at) {
    return systemCalls.lseek(file, static_cast<off_t>(at), SEEK_SET) >= 0;
}

// Copies `count` bytes, from and to the position of each file.
class ByteCopier {
public:
    ByteCopier(int from, int to) : from_(from), to_(to) {}

    // Lets the kernel copy as long as it gets on; the rest, or what it cannot copy at all, goes through a buffer, which
    // also tells what failed.
    CopyResult Copy(std::int64_t count) {
        while (count > 0 && kernelCopies_) {
            const std::int64_t most = std::min(count, std::int64_t{1} << 30);
            const ssize_t moved = Retry([&] {
                return systemCalls.copy_file_range(from_, nullptr, to_, nullptr, static_cast<std::size_t>(most), 0);
            });
            if (moved > 0) count -= moved;
            if (moved <= 0) kernelCopies_ = false;
            if (moved < 0 && (errno == ENOSPC || errno == EDQUOT || errno == EFBIG)) return WriteFailed();
        }
        return count > 0 ? CopyThroughBuffer(count) : CopyResult::kDone;
    }

private:
    static CopyResult WriteFailed() {
        FailErrno();
        return CopyResult::kWriteFailed;
    }

    CopyResult CopyThroughBuffer(std::int64_t count) {
        constexpr std::size_t kSize = 128 * 1024;
        if (!buffer_) buffer_.reset(new (std::nothrow) char[kSize]);
        if (!buffer_) {
            FailWith(kErrorNotEnoughMemory);
            return CopyResult::kWriteFailed;
        }
        while (count > 0) {
            const auto most = static_cast<std::size_t>(std::min<std::int64_t>(count, kSize));
            std::size_t got = 0, put = 0;
            const bool read = ReadAll(from_, buffer_.get(), most, got);
            if (!read || got < most) {
                read ? FailWith(kErrorEndOfFile) : FailErrno();
                return CopyResult::kReadFailed;
            }
            if (!WriteAll(to_, buffer_.get(), got, put)) return WriteFailed();
            count -= static_cast<std::int64_t>(got);
        }
        return CopyResult::kDone;
    }

    int from_, to_;
    bool kernelCopies_ = true;
    std::unique_ptr<char[]> buffer_;
};

// The next stretch of data from `at` on, before `end`. A file system that knows no holes has data everywhere. False
// when the rest is a hole.
bool NextData(int file, std::int64_t at, std::int64_t end, std::int64_t& data, std::int64_t& hole) {
    data = systemCalls.lseek(file, static_cast<off_t>(at), SEEK_DATA);
    if (data < 0 && errno == ENXIO) return false;
    if (data < 0) data = at;
    if (data >= end) return false;
    hole = systemCalls.lseek(file, static_cast<off_t>(data), SEEK_HOLE);
    hole = hole <= data ? end : std::min(hole, end);
    return true;
}

CopyResult CopyStretch(int from, int to, std::int64_t at, std::int64_t end, bool keepsHoles) {
    ByteCopier copier(from, to);
    std::int64_t data = at, hole = end;
    while (at < end && (!keepsHoles || NextData(from, at, end, data, hole))) {
        if (!SeekTo(from, data) || !SeekTo(to, data)) {
            FailErrno();
            return CopyResult::kReadFailed;
        }
        const CopyResult result = copier.Copy(hole - data);
        if (result != CopyResult::kDone) return result;
        at = hole;
    }
    return CopyResult::kDone;
}

}  // namespace

CopyResult FileCopyBytes(FileHandle from, FileHandle to, bool keepsHoles, FileVersion& version) {
    constexpr int kMostRounds = 100;
    const int source = DescriptorOf(from), target = DescriptorOf(to);
    std::int64_t done = 0;
    for (int round = 0; round < kMostRounds; ++round) {
        if (!VersionOf(source, version)) {
            FailErrno();
            return CopyResult::kReadFailed;
        }
        if (round > 0 && version.size <= done) break;
        const CopyResult result = CopyStretch(source, target, done, version.size, keepsHoles);
        if (result != CopyResult::kDone) return result;
        done = version.size;
    }
    // Where it was cut there are no holes.
    if (systemCalls.lseek(source, 0, SEEK_END) < done) {
        FailWith(kErrorEndOfFile);
        return CopyResult::kReadFailed;
    }
    // What is at the end may be a hole, or what the target held before.
    if (Retry([&] { return systemCalls.ftruncate(target, static_cast<off_t>(done)); }) == 0) return CopyResult::kDone;
    FailErrno();
    return CopyResult::kWriteFailed;
}

// ---- one at a time --------------------------------------------------------------------------------------------------

FolderTurn::FolderTurn(const std::string& native) {
    constexpr int kMostTries = 2000;
    file_ = OpenRetrying(native.c_str(), O_RDONLY | O_DIRECTORY);
    for (int i = 0; file_ >= 0 && i < kMostTries; ++i) {
        held_ = Retry([&] { return systemCalls.flock(file_, LOCK_EX | LOCK_NB); }) == 0;
        refused_ = !held_ && errno == EWOULDBLOCK;
        if (!refused_) return;
        SleepMilliseconds(1);
    }
}

FolderTurn::~FolderTurn() {
    const int error = errno;
    if (file_ >= 0) systemCalls.close(file_);
    errno = error;
}

bool FinishNew(Replacement& replacement, const char* name) {
    std::string native;
    // So that the turn is short.
    if (!FileFlush(replacement.File()) || !NameToAbsoluteText(name, native)) return false;
    Match match = MatchOnDisk(native);
    const FolderTurn turn(NativeParent(native));
    if (match == Match::kLastMissing) match = MatchOnDisk(native);
    if (match == Match::kLastMissing) return replacement.Finish();
    return match == Match::kAll ? FailWith(kErrorFileExists) : FailMatch(match);
}

// ---- files ----------------------------------------------------------------------------------------------------------

namespace {

timespec TimeOf(const struct statx_timestamp& time) {
    timespec result{};
    result.tv_sec = static_cast<time_t>(time.tv_sec);
    result.tv_nsec = static_cast<long>(time.tv_nsec);
    return result;
}

// The time of the last access only of what is the same file in another place.
bool SetTimes(FileHandle file, const struct statx& like, bool withAccess) {
    timespec times[2] = {TimeOf(like.stx_atime), TimeOf(like.stx_mtime)};
    if (!withAccess) times[0].tv_nsec = UTIME_OMIT;
    return systemCalls.futimens(DescriptorOf(file), times) == 0 || FailErrno();
}

// What is no regular file is refused before it is opened: nothing waits for it, and nothing is read without end.
bool CheckRegular(const char* name) {
    return OnExistingItem(name, [](const std::string& native) {
        struct statx status;
        if (!StatusOf(native, Links::kFollowed, STATX_TYPE, status)) return false;
        if (S_ISREG(status.stx_mode)) return true;
        errno = EACCES;
        return false;
    });
}

class OpenedFile {
public:
    explicit OpenedFile(FileHandle handle) : handle_(handle) {}
    ~OpenedFile() {
        const ErrorNumber reason = LastError();
        if (handle_ != kNoFile) FileClose(handle_);
        SetLastError(reason);
    }
    OpenedFile(const OpenedFile&) = delete;
    OpenedFile& operator=(const OpenedFile&) = delete;
    FileHandle Get() const { return handle_; }

private:
    FileHandle handle_;
};

}  // namespace

bool FileCopy(const char* from, const char* to) {
    if (!CheckRegular(from)) return false;
    const OpenedFile source(FileOpen(from, kRead, 0, Disposition::kOpenExisting));
    if (source.Get() == kNoFile) return false;
    struct statx status;
    if (systemCalls.statx(DescriptorOf(source.Get()), "", AT_EMPTY_PATH, kInfoMask, &status) != 0) return FailErrno();
    ReplaceRequest request;
    request.name = to;
    request.mustNotExist = true;
    request.mode = static_cast<int>(status.stx_mode & 0777u);
    request.deny = kRead | kWrite;
    Replacement copy;
    FileVersion version;
    if (!copy.Begin(request)) return false;
    return FileCopyBytes(source.Get(), copy.File(), true, version) == CopyResult::kDone &&
           SetTimes(copy.File(), status, false) && FinishNew(copy, to);
}

// ---- moving ---------------------------------------------------------------------------------------------------------

bool FileDeleteCopied(const char* name, FileHandle file, const FileVersion& copied, FileHandle copy) {
    std::string native;
    FileVersion now;
    struct statx opened, named;
    if (!NameToAbsoluteNative(name, native)) return false;
    const int source = DescriptorOf(file);
    if (systemCalls.statx(source, "", AT_EMPTY_PATH, STATX_INO, &opened) != 0) return FailErrno();
    if (!StatusOf(native, Links::kFollowed, STATX_INO, named)) return FailErrno();
    if (!SameFile(opened, named)) return FailWith(kErrorFileNotFound);
    if (!VersionOf(source, now)) return FailErrno();
    if (now != copied) return FailWith(kErrorSharingViolation);
    if (systemCalls.unlink(native.c_str()) != 0) return FailErrno();
    // Who had it open may have written a last time: nobody else finds it any more.
    const bool grown = VersionOf(source, now) && now.size > copied.size;
    if (grown && CopyStretch(source, DescriptorOf(copy), copied.size, now.size, true) != CopyResult::kDone)
        return false;
    if (grown && !FileFlush(copy)) return false;
    return FlushFolder(NativeParent(native)) || FailErrno();
}

namespace {

// A copy that could not take the place of its source goes.
bool Forsake(const char* name) {
    const ErrorNumber reason = LastError();
    FileDelete(name);
    return FailWith(reason);
}

bool MoveFile(const char* from, const char* to) {
    const OpenedFile source(FileOpen(from, kRead, kWrite, Disposition::kOpenExisting));
    if (source.Get() == kNoFile) return false;
    struct statx status;
    if (systemCalls.statx(DescriptorOf(source.Get()), "", AT_EMPTY_PATH, kInfoMask, &status) != 0) return FailErrno();
    ItemInfo info;
    ReplaceRequest request;
    request.name = to;
    request.mustNotExist = true;
    request.like = source.Get();
    request.ownerMayChange = true;
    request.deny = kRead | kWrite;
    Replacement copy;
    FileVersion version;
    if (!FileGetInfo(source.Get(), info) || !copy.Begin(request)) return false;
    const bool copied = FileCopyBytes(source.Get(), copy.File(), true, version) == CopyResult::kDone &&
                        FileSetTimes(copy.File(), info.created, 0, 0) && SetTimes(copy.File(), status, true) &&
                        FinishNew(copy, to);
    if (!copied) return false;
    if (FileDeleteCopied(from, source.Get(), version, copy.File())) return true;
    const ErrorNumber reason = LastError();
    const bool stays = systemCalls.statx(DescriptorOf(source.Get()), "", AT_EMPTY_PATH, STATX_NLINK, &status) != 0 ||
                       status.stx_nlink != 0;
    SetLastError(reason);
    return stays ? Forsake(to) : false;
}

// A link itself, not what it leads to.
bool MoveLink(const std::string& native, const struct statx& status, const char* to) {
    char text[PATH_MAX];
    const ssize_t size = systemCalls.readlink(native.c_str(), text, sizeof text - 1);
    if (size < 0) return FailErrno();
    text[size] = 0;
    std::string target;
    if (!NameToAbsoluteText(to, target)) return false;
    const Match match = MatchOnDisk(target);
    if (match != Match::kLastMissing) return match == Match::kAll ? FailWith(kErrorAlreadyExists) : FailMatch(match);
    if (systemCalls.symlink(text, target.c_str()) != 0) return FailErrno();
    systemCalls.lchown(target.c_str(), status.stx_uid, status.stx_gid);  // only some may: then it is the mover's
    if (!FlushFolder(NativeParent(target)) || systemCalls.unlink(native.c_str()) != 0) {
        FailErrno();
        return Forsake(to);
    }
    return FlushFolder(NativeParent(native)) || FailErrno();
}

}  // namespace

bool MoveAcross(const std::string& native, const char* from, const char* to) {
    struct statx status;
    if (!StatusOf(native, Links::kThemselves, STATX_BASIC_STATS, status)) return FailErrno();
    if (S_ISDIR(status.stx_mode)) return FailWith(kErrorNotSameDevice);
    if (S_ISLNK(status.stx_mode)) return MoveLink(native, status, to);
    return S_ISREG(status.stx_mode) ? MoveFile(from, to) : FailWith(kErrorAccessDenied);
}

}  // namespace tessel::platform
