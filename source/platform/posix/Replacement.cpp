#include "platform/Replacement.h"

#include "platform/posix/FileHandles.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"

#include <climits>
#include <cstdio>
#include <cstring>
#include <errno.h>
#include <linux/fs.h>
#include <unistd.h>
#include <vector>

namespace tessel::platform {

namespace {

constexpr char kPattern[] = ".tessel-%d.tmp";

// On a file with a private name of the caller's pattern, so that it can be told from a stranger's. A moment longer than
// that on the file that takes the name.
constexpr char kTemporaryAttribute[] = "user.tessel.temporary";

// So many private names are looked at for what dead writers left; as many writers at once leave none beyond.
constexpr int kSwept = 8;

constexpr char kAccessList[] = "system.posix_acl_access";

constexpr unsigned kSetIds = S_ISUID | S_ISGID;

bool StatusOfOpen(int descriptor, unsigned mask, struct statx& status) {
    return systemCalls.statx(descriptor, "", AT_EMPTY_PATH, mask, &status) == 0;
}

// The file that `native` leads to through links, which need not exist.
bool FollowLinks(std::string& native) {
    constexpr int kMostLinks = 40;
    char text[PATH_MAX];
    for (int links = 0; links < kMostLinks; ++links) {
        const ssize_t size = systemCalls.readlink(native.c_str(), text, sizeof text);
        if (size < 0) return errno == EINVAL || errno == ENOENT;
        const std::string end(text, static_cast<std::size_t>(size));
        native = end[0] == '/' ? end : NativeParent(native) + "/" + end;
    }
    errno = ELOOP;
    return false;
}

// Whether the value of a file that is replaced belongs to the new one too. What names its content, or is made by the
// system for each file, does not.
bool IsTakenOver(const std::string& attribute) {
    if (attribute == kTemporaryAttribute || attribute == kCreatedAttribute) return false;
    return attribute.rfind("user.", 0) == 0 || attribute == kAccessList || attribute == "security.selinux";
}

// What `ask(buffer, size)` gives, of a size that others may change between two calls. False when it fails.
template <typename Ask>
bool AskWhole(Ask ask, std::vector<char>& answer) {
    for (;;) {
        const ssize_t size = ask(nullptr, 0);
        if (size < 0) return false;
        answer.resize(static_cast<std::size_t>(size) + 1);
        const ssize_t got = ask(answer.data(), answer.size());
        if (got < 0 && errno == ERANGE) continue;
        if (got >= 0) answer.resize(static_cast<std::size_t>(got));
        return got >= 0;
    }
}

bool CopyAttribute(int from, int to, const char* name) {
    std::vector<char> value;
    const auto ask = [&](char* bytes, std::size_t size) { return systemCalls.fgetxattr(from, name, bytes, size); };
    if (!AskWhole(ask, value)) return errno == ENODATA;
    return systemCalls.fsetxattr(to, name, value.data(), value.size(), 0) == 0;
}

bool HasNoAttributes(int error) {
    return error == EOPNOTSUPP || error == ENOSYS;
}

bool CopyAttributes(int from, int to) {
    // What a folder gives its new files is not the old file's.
    systemCalls.fremovexattr(to, kAccessList);
    std::vector<char> names;
    const auto ask = [&](char* bytes, std::size_t size) { return systemCalls.flistxattr(from, bytes, size); };
    if (!AskWhole(ask, names)) return HasNoAttributes(errno);
    names.push_back(0);
    const char* const end = &names.back();
    for (const char* name = names.data(); name < end; name += std::strlen(name) + 1) {
        const bool user = std::strncmp(name, "security.", 9) != 0;
        if (IsTakenOver(name) && !CopyAttribute(from, to, name) && user) return false;
    }
    return true;
}

// Kept where attributes can be kept, as FileSetTimes does.
bool CopyCreated(int from, int to, const struct statx& status) {
    unsigned char bytes[8];
    if (systemCalls.fgetxattr(from, kCreatedAttribute, bytes, sizeof bytes) != sizeof bytes) {
        if (!(status.stx_mask & STATX_BTIME)) return true;
        auto time = static_cast<std::uint64_t>(FileTimeOf(status.stx_btime.tv_sec, status.stx_btime.tv_nsec));
        for (unsigned char& byte : bytes) {
            byte = static_cast<unsigned char>(time);
            time >>= 8;
        }
    }
    return systemCalls.fsetxattr(to, kCreatedAttribute, bytes, sizeof bytes, 0) == 0 || errno != ENOSPC;
}

std::string NameByDescriptor(int descriptor) {
    return "/proc/self/fd/" + std::to_string(descriptor);
}

bool Flush(int descriptor) {
    return Retry([&] { return systemCalls.fsync(descriptor); }) == 0;
}

}  // namespace

struct Replacement::Work {
    ReplaceRequest request;
    ReplaceFailure failure = ReplaceFailure::kNone;
    std::string last;         // the name, in the folder
    std::string privateName;  // in the same folder, while there is one
    int folder = -1;
    bool unreadable = false;  // the folder may be written but not read, nor flushed
    int target = -1;          // the old file; -1 for none
    int file = -1;            // the new one
    bool hasName = false;
    bool exchanged = false;  // the old file has the private name
    struct statx targetStatus {};
    int mode = -1;  // at the end; -1 leaves it as it is made

    ~Work();
    bool Fail(ReplaceFailure kind, int error);
    bool FailNumber(ReplaceFailure kind, ErrorNumber number);

    bool FindFolder();
    bool FindTarget();
    bool CheckTarget();
    bool StatusOfName(const std::string& name, unsigned mask, struct statx& status) const;
    bool LeadsTo(const std::string& name, const struct statx& file) const;

    std::string NumberedName(int number) const;
    bool IsLeftover(int descriptor) const;
    bool RemoveLeftover(const std::string& name) const;
    void RemoveLeftovers() const;
    bool MakeFile();
    bool CanBeNamed() const;
    bool MakeNamed();
    bool HoldNamed(const std::string& name);
    void SetMark(int descriptor, bool on) const;

    bool TakeOver();
    bool TakeOverOwner(const struct statx& wanted);
    bool Seal();
    bool LinkAs(const std::string& name) const;
    bool LinkPrivately();
    bool TakeName();
    bool FlushFolder() const;
    bool TakeFreeName();
    bool TakeNameOver();
    void TakeBack();
};

Replacement::Replacement() = default;
Replacement::~Replacement() = default;

Replacement::Work::~Work() {
    if (!privateName.empty()) systemCalls.unlinkat(folder, privateName.c_str(), 0);
    if (file >= 0) systemCalls.close(file);
    if (target >= 0 && request.opened == kNoFile) systemCalls.close(target);
    if (folder >= 0) systemCalls.close(folder);
}

bool Replacement::Work::Fail(ReplaceFailure kind, int error) {
    return FailNumber(kind, ErrorOfErrno(error));
}

bool Replacement::Work::FailNumber(ReplaceFailure kind, ErrorNumber number) {
    failure = kind;
    return FailWith(number);
}

// ---- what is to be replaced -----------------------------------------------------------------------------------------

bool Replacement::Work::FindFolder() {
    std::string native;
    failure = ReplaceFailure::kCannotMake;
    if (!request.name) return FailWith(kErrorInvalidParameter);
    if (!NameToNativeText(request.name, native)) return false;
    const Match match = MatchOnDisk(native);
    if (match != Match::kAll && match != Match::kLastMissing) return FailMatch(match);
    const bool takenByLink = request.mustNotExist && Exists(native);
    if (takenByLink) return FailNumber(ReplaceFailure::kCannotRename, kErrorFileExists);
    if (!FollowLinks(native)) return FailErrno();
    last = NativeLast(native);
    folder = OpenRetrying(NativeParent(native).c_str(), O_RDONLY | O_DIRECTORY);
    unreadable = folder < 0 && errno == EACCES;
    if (unreadable) folder = OpenRetrying(NativeParent(native).c_str(), O_PATH | O_DIRECTORY);
    if (folder < 0) return FailErrno();
    failure = ReplaceFailure::kNone;
    return true;
}

bool Replacement::Work::StatusOfName(const std::string& name, unsigned mask, struct statx& status) const {
    return systemCalls.statx(folder, name.c_str(), AT_SYMLINK_NOFOLLOW, mask, &status) == 0;
}

bool Replacement::Work::LeadsTo(const std::string& name, const struct statx& wanted) const {
    struct statx status;
    if (!StatusOfName(name, STATX_INO, status)) return false;
    errno = ENOENT;
    return SameFile(status, wanted);
}

bool Replacement::Work::FindTarget() {
    RemoveLeftovers();
    if (request.mustNotExist) return true;
    if (request.opened != kNoFile) {
        target = DescriptorOf(request.opened);
    } else {
        target = OpenAtRetrying(folder, last.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY);
        if (target < 0) return errno == ENOENT || Fail(ReplaceFailure::kCannotMake, errno);
    }
    return CheckTarget();
}

bool Replacement::Work::CheckTarget() {
    if (!StatusOfOpen(target, kInfoMask, targetStatus)) return Fail(ReplaceFailure::kCannotMake, errno);
    if (!S_ISREG(targetStatus.stx_mode)) return Fail(ReplaceFailure::kCannotMake, EACCES);
    if (!LeadsTo(last, targetStatus)) return Fail(ReplaceFailure::kCannotRename, errno);
    if (targetStatus.stx_nlink > 1 && !request.breaksLinks) return Fail(ReplaceFailure::kCannotMake, EMLINK);
    // Who clears leftovers must not take the old file for one while it has the private name.
    MarkBytes(target, F_RDLCK, kWriterMark, 1);
    return true;
}

// ---- private names --------------------------------------------------------------------------------------------------

std::string Replacement::Work::NumberedName(int number) const {
    char name[NAME_MAX + 1];
    // The pattern is the caller's own text, with one %d.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
    std::snprintf(name, sizeof name, request.pattern ? request.pattern : kPattern, number);
#pragma GCC diagnostic pop
    return name;
}

// Of this user's, ours by name or mark, and nobody holds it. Without locks nobody's death is proven. It may have the
// name already that it was made for.
bool Replacement::Work::IsLeftover(int descriptor) const {
    struct statx status;
    if (!StatusOfOpen(descriptor, STATX_BASIC_STATS, status)) return false;
    const uid_t user = systemCalls.geteuid();
    if (!S_ISREG(status.stx_mode) || (user != 0 && status.stx_uid != user)) return false;
    if (request.pattern && systemCalls.fgetxattr(descriptor, kTemporaryAttribute, nullptr, 0) < 0) return false;
    return MarkBytes(descriptor, F_RDLCK, kWriterMark, 1) == Marking::kDone &&
           TestBytes(descriptor, kWriterMark, 1) == Marking::kDone;
}

// While the file is locked here nobody else removes it, and no living writer gives it that name.
bool Replacement::Work::RemoveLeftover(const std::string& name) const {
    const int found = OpenAtRetrying(folder, name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY);
    if (found < 0) return false;
    struct statx status;
    const bool removed = IsLeftover(found) && StatusOfOpen(found, STATX_INO, status) && LeadsTo(name, status) &&
                         systemCalls.unlinkat(folder, name.c_str(), 0) == 0;
    systemCalls.close(found);
    return removed;
}

// Best effort: without it a leftover stays.
void Replacement::Work::SetMark(int descriptor, bool on) const {
    if (!request.pattern || descriptor < 0) return;
    if (on)
        systemCalls.fsetxattr(descriptor, kTemporaryAttribute, "", 0, 0);
    else
        systemCalls.fremovexattr(descriptor, kTemporaryAttribute);
}

void Replacement::Work::RemoveLeftovers() const {
    for (int number = 0; number < kSwept && number < request.limit; ++number) RemoveLeftover(NumberedName(number));
}

// ---- the new file ---------------------------------------------------------------------------------------------------

bool Replacement::Work::MakeFile() {
    // Without a name nobody else reaches it, so that one like any new file may have their mode at once.
    const bool plain = target < 0 && request.like == kNoFile && request.mode < 0;
    mode = request.mode;
    file = OpenAtRetrying(folder, ".", O_TMPFILE | O_RDWR, plain ? 0666 : 0600);
    if (file >= 0 && CanBeNamed()) {
        MarkBytes(file, F_WRLCK, kWriterMark, 1);
        return true;
    }
    const bool unknown = errno == EOPNOTSUPP || errno == EISDIR || errno == EINVAL || errno == ENOENT;
    if (file < 0 && !unknown) return Fail(ReplaceFailure::kCannotMake, errno);
    if (file >= 0) systemCalls.close(file);
    if (plain) mode = static_cast<int>(0666u & ~PermissionMask());
    return MakeNamed();
}

// Where /proc is missing an unnamed file stays one.
bool Replacement::Work::CanBeNamed() const {
    char end;
    return systemCalls.readlink(NameByDescriptor(file).c_str(), &end, 1) == 1;
}

bool Replacement::Work::MakeNamed() {
    for (int number = 0; number < request.limit; ++number) {
        const std::string name = NumberedName(number);
        file = OpenAtRetrying(folder, name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
        if (file >= 0 && HoldNamed(name)) return true;
        if (file < 0 && errno != EEXIST) return Fail(ReplaceFailure::kCannotMake, errno);
        if (file < 0 && number >= kSwept && RemoveLeftover(name)) --number;
        if (file >= 0) systemCalls.close(file);
        file = -1;
    }
    return Fail(ReplaceFailure::kCannotMake, EEXIST);
}

// Between making and locking it a file looks left behind. Who is removing it holds the lock, or has done it.
bool Replacement::Work::HoldNamed(const std::string& name) {
    struct statx status;
    if (MarkBytes(file, F_WRLCK, kWriterMark, 1) == Marking::kRefused) return false;
    if (StatusOfOpen(file, STATX_NLINK, status) && status.stx_nlink == 0) return false;
    privateName = name;
    SetMark(file, true);
    return true;
}

// ---- what it takes on -----------------------------------------------------------------------------------------------

bool Replacement::Work::TakeOver() {
    const int like = request.like != kNoFile ? DescriptorOf(request.like) : target;
    if (like < 0) return true;
    struct statx status;
    if (!StatusOfOpen(like, kInfoMask, status)) return Fail(ReplaceFailure::kCannotMake, errno);
    mode = status.stx_mode & 07777;
    if (!TakeOverOwner(status)) return Fail(ReplaceFailure::kCannotMake, errno);
    const bool created = target < 0 || CopyCreated(target, file, targetStatus);
    if (!created || !CopyAttributes(like, file)) return Fail(ReplaceFailure::kCannotMake, errno);
    // The list of rights may have opened it.
    return systemCalls.fchmod(file, 0600) == 0 || Fail(ReplaceFailure::kCannotMake, errno);
}

bool Replacement::Work::TakeOverOwner(const struct statx& wanted) {
    struct statx status;
    if (!StatusOfOpen(file, STATX_UID | STATX_GID, status)) return false;
    if (status.stx_uid == wanted.stx_uid && status.stx_gid == wanted.stx_gid) return true;
    if (systemCalls.fchown(file, wanted.stx_uid, wanted.stx_gid) == 0) return true;
    mode &= ~static_cast<int>(kSetIds);
    return request.ownerMayChange;
}

bool Replacement::Work::Seal() {
    if (mode >= 0 && systemCalls.fchmod(file, static_cast<mode_t>(mode)) != 0)
        return Fail(ReplaceFailure::kCannotFlush, errno);
    if (MarkShare(file, request.access, request.deny) == Marking::kRefused)
        return FailNumber(ReplaceFailure::kCannotRename, kErrorSharingViolation);
    return Flush(file) || Fail(ReplaceFailure::kCannotFlush, errno);
}

// ---- taking the name ------------------------------------------------------------------------------------------------

bool Replacement::Work::LinkAs(const std::string& name) const {
    const std::string self = NameByDescriptor(file);
    return systemCalls.linkat(AT_FDCWD, self.c_str(), folder, name.c_str(), AT_SYMLINK_FOLLOW) == 0;
}

bool Replacement::Work::LinkPrivately() {
    if (!privateName.empty()) return true;
    SetMark(file, true);
    for (int number = 0; number < request.limit; ++number) {
        const std::string name = NumberedName(number);
        if (LinkAs(name)) {
            privateName = name;
            return true;
        }
        if (errno != EEXIST) return Fail(ReplaceFailure::kCannotMake, errno);
        if (number >= kSwept && RemoveLeftover(name)) --number;
    }
    return Fail(ReplaceFailure::kCannotMake, EEXIST);
}

// The name is free, and stays another's who comes in between.
bool Replacement::Work::TakeFreeName() {
    const bool unnamed = privateName.empty();
    if (unnamed) {
        hasName = LinkAs(last);
    } else {
        hasName = systemCalls.renameat2(folder, privateName.c_str(), folder, last.c_str(), RENAME_NOREPLACE) == 0;
        if (hasName) privateName.clear();
        if (!hasName && (errno == EINVAL || errno == ENOSYS))
            hasName = LinkAs(last);  // the private name goes at the end
    }
    if (hasName) return true;
    return errno == EEXIST ? FailNumber(ReplaceFailure::kCannotRename, kErrorFileExists)
                           : Fail(ReplaceFailure::kCannotRename, errno);
}

// The two files exchange their names, so that the old one can have it back, and so that it shows which one gave it up.
bool Replacement::Work::TakeNameOver() {
    if (!LinkPrivately()) return false;
    if (!LeadsTo(last, targetStatus)) return Fail(ReplaceFailure::kCannotRename, errno);
    SetMark(target, true);  // which is to have the private name
    const char* name = privateName.c_str();
    exchanged = systemCalls.renameat2(folder, name, folder, last.c_str(), RENAME_EXCHANGE) == 0;
    if (!exchanged && (errno == EINVAL || errno == ENOSYS)) {
        hasName = systemCalls.renameat2(folder, name, folder, last.c_str(), 0) == 0;
        if (hasName) privateName.clear();
    } else {
        hasName = exchanged;
    }
    if (hasName && (!exchanged || LeadsTo(privateName, targetStatus))) return true;
    const int error = errno;
    if (hasName) TakeBack();
    SetMark(target, false);
    return Fail(ReplaceFailure::kCannotRename, error);
}

// Undoes what the folder may not have on the device.
void Replacement::Work::TakeBack() {
    if (exchanged) {
        const char* name = privateName.c_str();
        const bool back = systemCalls.renameat2(folder, name, folder, last.c_str(), RENAME_EXCHANGE) == 0;
        hasName = !back;
        exchanged = !back;
    } else if (target < 0 && systemCalls.unlinkat(folder, last.c_str(), 0) == 0) {
        hasName = false;
    }
}

// What cannot be flushed by itself is flushed with all that its file system holds.
bool Replacement::Work::FlushFolder() const {
    if (unreadable) return Retry([&] { return systemCalls.syncfs(file); }) == 0;
    return Flush(folder) || errno == EINVAL;  // a file system that does not flush folders
}

bool Replacement::Work::TakeName() {
    if (target < 0 ? !TakeFreeName() : !TakeNameOver()) return false;
    if (!FlushFolder()) {
        const int error = errno;
        TakeBack();
        SetMark(hasName ? file : target, false);
        return Fail(ReplaceFailure::kCannotFlush, error);
    }
    SetMark(file, false);
    // What is left under the private name the next writer clears.
    if (!privateName.empty()) systemCalls.unlinkat(folder, privateName.c_str(), 0);
    privateName.clear();
    return true;
}

// ---- in order -------------------------------------------------------------------------------------------------------

bool Replacement::Begin(const ReplaceRequest& request) {
    work_ = std::make_unique<Work>();
    work_->request = request;
    return work_->FindFolder() && work_->FindTarget() && work_->MakeFile() && work_->TakeOver();
}

bool Replacement::Finish() {
    if (!work_ || work_->file < 0 || work_->failure != ReplaceFailure::kNone) return FailWith(kErrorInvalidHandle);
    return work_->Seal() && work_->TakeName();
}

FileHandle Replacement::File() const {
    return work_ && work_->file >= 0 ? HandleOf(work_->file, kRead | kWrite) : kNoFile;
}

ReplaceFailure Replacement::Failure() const {
    return work_ ? work_->failure : ReplaceFailure::kNone;
}

bool Replacement::HasName() const {
    return work_ && work_->hasName;
}

FileHandle Replacement::Release() {
    if (!work_ || work_->file < 0) return kNoFile;
    const FileHandle file = HandleOf(work_->file, work_->request.access);
    work_->file = -1;
    return file;
}

}  // namespace tessel::platform
