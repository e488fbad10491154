#include "support/SimulatedDisk.h"

#include "platform/posix/SystemCalls.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <set>
#include <unistd.h>

namespace tessel::test {

namespace fs = std::filesystem;
using platform::SystemCalls;
using platform::systemCalls;

namespace {

constexpr std::uint64_t kSector = 512;

SystemCalls real;
std::string root;
DiskState start;
std::vector<DiskStep> steps;
std::map<std::pair<std::uint64_t, std::uint64_t>, int> idOf;  // by device and number of the host
int nextId;

int IdOf(const struct stat& status, bool fresh = false) {
    int& id = idOf[{status.st_dev, status.st_ino}];
    if (fresh || id == 0) id = ++nextId;
    return id;
}

// Of an open file; 0 for what is not under the folder.
int IdOf(int file) {
    struct stat status {};
    if (fstat(file, &status) != 0) return 0;
    const auto known = idOf.find({status.st_dev, status.st_ino});
    return known == idOf.end() ? 0 : known->second;
}

int IdOfNamed(const std::string& name) {
    struct stat status {};
    return lstat((root + (name.empty() ? "" : "/") + name).c_str(), &status) == 0 ? IdOf(status) : -1;
}

// The name from the recorded folder on. False for what is not under it.
bool NameUnderRoot(int folder, const char* name, std::string& inside) {
    std::string path = name;
    if (path[0] != '/' && folder != AT_FDCWD) {
        path = fs::read_symlink("/proc/self/fd/" + std::to_string(folder)).string() + "/" + path;
    }
    const fs::path parent = fs::path(path).parent_path();
    char resolved[PATH_MAX];
    if (!realpath(parent.empty() ? "." : parent.c_str(), resolved)) return false;
    const std::string whole = std::string(resolved) + "/" + fs::path(path).filename().string();
    if (whole.compare(0, root.size() + 1, root + "/") != 0) return false;
    inside = whole.substr(root.size() + 1);
    return true;
}

int FolderOf(const std::string& name) {
    return IdOfNamed(fs::path(name).parent_path());
}

void AddNames(std::vector<std::pair<std::string, int>> names) {
    DiskStep step{DiskStep::kNames, 0, 0, "", std::move(names), {}};
    for (const auto& [name, id] : step.names) step.folders.push_back(FolderOf(name));
    steps.push_back(std::move(step));
}

// After a call that put something under this name, or took it away.
void NameChanged(int folder, const char* name) {
    std::string inside;
    if (NameUnderRoot(folder, name, inside)) AddNames({{inside, IdOfNamed(inside)}});
}

void SizeChanged(int file) {
    struct stat status {};
    if (IdOf(file) && fstat(file, &status) == 0)
        steps.push_back({DiskStep::kSize, IdOf(file), static_cast<std::uint64_t>(status.st_size), "", {}, {}});
}

// ---- stand-ins ------------------------------------------------------------------------------------------------------

int OpenAt(int folder, const char* name, int flags, mode_t mode) {
    struct stat status {};
    const bool unnamed = (flags & O_TMPFILE) == O_TMPFILE;
    const bool there = !unnamed && fstatat(folder, name, &status, 0) == 0;
    const int file = real.openat(folder, name, flags, mode);
    if (file < 0 || fstat(file, &status) != 0) return file;
    std::string inside;
    const bool makes = unnamed || (!there && (flags & O_CREAT));
    if (!makes || !NameUnderRoot(folder, name, inside)) return file;
    const int id = IdOf(status, true);
    steps.push_back({DiskStep::kMode, id, status.st_mode & 07777, "", {}, {}});
    if (!unnamed) AddNames({{inside, id}});
    return file;
}
int Open(const char* name, int flags, mode_t mode) {
    return OpenAt(AT_FDCWD, name, flags, mode);
}

ssize_t Write(int file, const void* data, std::size_t count) {
    const off_t at = ::lseek(file, 0, SEEK_CUR);
    const ssize_t put = real.write(file, data, count);
    if (put > 0 && IdOf(file)) {
        steps.push_back({DiskStep::kWrite,
                         IdOf(file),
                         static_cast<std::uint64_t>(at),
                         std::string(static_cast<const char*>(data), static_cast<std::size_t>(put)),
                         {},
                         {}});
    }
    return put;
}

ssize_t CopyRange(int from, off64_t* fromAt, int to, off64_t* toAt, std::size_t count, unsigned flags) {
    const off64_t at = toAt ? *toAt : ::lseek(to, 0, SEEK_CUR);
    const ssize_t put = real.copy_file_range(from, fromAt, to, toAt, count, flags);
    if (put <= 0 || !IdOf(to)) return put;
    std::ifstream in("/proc/self/fd/" + std::to_string(to), std::ios::binary);
    std::string bytes(static_cast<std::size_t>(put), '\0');
    in.seekg(at).read(bytes.data(), put);
    steps.push_back({DiskStep::kWrite, IdOf(to), static_cast<std::uint64_t>(at), bytes, {}, {}});
    return put;
}

int Truncate(int file, off_t size) {
    const int result = real.ftruncate(file, size);
    if (result == 0) SizeChanged(file);
    return result;
}
int Allocate(int file, int mode, off_t offset, off_t size) {
    const int result = real.fallocate(file, mode, offset, size);
    if (result == 0) SizeChanged(file);
    return result;
}
int Sync(int file) {
    const int result = real.fsync(file);
    if (result == 0 && IdOf(file)) steps.push_back({DiskStep::kFlush, IdOf(file), 0, "", {}, {}});
    return result;
}
int SyncAll(int file) {
    const int result = real.syncfs(file);
    if (result == 0) steps.push_back({DiskStep::kFlushAll, 0, 0, "", {}, {}});
    return result;
}
int ChangeMode(int file, mode_t mode) {
    const int result = real.fchmod(file, mode);
    if (result == 0 && IdOf(file)) steps.push_back({DiskStep::kMode, IdOf(file), mode, "", {}, {}});
    return result;
}

int Rename(int fromFolder, const char* from, int toFolder, const char* to, unsigned flags) {
    const int result = real.renameat2(fromFolder, from, toFolder, to, flags);
    std::string before, after;
    if (result == 0 && NameUnderRoot(fromFolder, from, before) && NameUnderRoot(toFolder, to, after))
        AddNames({{before, IdOfNamed(before)}, {after, IdOfNamed(after)}});
    return result;
}
int LinkAt(int fromFolder, const char* from, int toFolder, const char* to, int flags) {
    const int result = real.linkat(fromFolder, from, toFolder, to, flags);
    if (result == 0) NameChanged(toFolder, to);
    return result;
}
int Link(const char* from, const char* to) {
    return LinkAt(AT_FDCWD, from, AT_FDCWD, to, 0);
}
int UnlinkAt(int folder, const char* name, int flags) {
    const int result = real.unlinkat(folder, name, flags);
    if (result == 0) NameChanged(folder, name);
    return result;
}
int Unlink(const char* name) {
    return UnlinkAt(AT_FDCWD, name, 0);
}
int RemoveFolder(const char* name) {
    return UnlinkAt(AT_FDCWD, name, AT_REMOVEDIR);
}
int MakeFolderAt(int folder, const char* name, mode_t mode) {
    const int result = real.mkdirat(folder, name, mode);
    std::string inside;
    struct stat status {};
    if (result != 0 || !NameUnderRoot(folder, name, inside) || fstatat(folder, name, &status, 0) != 0) return result;
    const int id = IdOf(status, true);
    steps.push_back({DiskStep::kMode, id, status.st_mode, "", {}, {}});
    AddNames({{inside, id}});
    return result;
}
int MakeFolder(const char* name, mode_t mode) {
    return MakeFolderAt(AT_FDCWD, name, mode);
}

// ---- states ---------------------------------------------------------------------------------------------------------

void Store(std::string& bytes, std::uint64_t offset, const std::string& data) {
    if (bytes.size() < offset + data.size()) bytes.resize(offset + data.size());
    bytes.replace(offset, data.size(), data);
}

// What is in a folder goes with it.
void RenameFolder(const DiskStep& step, DiskState& state) {
    if (step.names.size() != 2 || step.names[0].second >= 0 || step.names[1].second < 0) return;
    const std::string from = step.names[0].first + "/", to = step.names[1].first + "/";
    std::map<std::string, int> names;
    for (const auto& [name, id] : state.names) {
        const bool within = name.compare(0, from.size(), from) == 0;
        names[within ? to + name.substr(from.size()) : name] = id;
    }
    state.names = std::move(names);
}

void Apply(const DiskStep& step, DiskState& state) {
    switch (step.kind) {
        case DiskStep::kWrite:
            Store(state.items[step.item].bytes, step.offset, step.bytes);
            break;
        case DiskStep::kSize:
            state.items[step.item].bytes.resize(step.offset);
            break;
        case DiskStep::kMode:
            state.items[step.item].mode = static_cast<unsigned>(step.offset & 07777);
            if (S_ISDIR(step.offset)) state.items[step.item].kind = 'd';
            break;
        case DiskStep::kNames:
            RenameFolder(step, state);
            for (const auto& [name, id] : step.names) {
                if (id < 0)
                    state.names.erase(name);
                else
                    state.names[name] = id;
            }
            break;
        default:
            break;
    }
}

// Only those sectors of a write that `keeps` says.
template <typename Keeps>
void ApplyTorn(const DiskStep& step, DiskState& state, Keeps keeps) {
    for (std::uint64_t at = step.offset, end = at + step.bytes.size(); at < end;) {
        const std::uint64_t next = std::min(end, (at / kSector + 1) * kSector);
        if (keeps(at)) Store(state.items[step.item].bytes, at, step.bytes.substr(at - step.offset, next - at));
        at = next;
    }
}

bool IsFlush(const DiskStep& step) {
    return step.kind == DiskStep::kFlush || step.kind == DiskStep::kFlushAll;
}

// Whether what step `i` did is on the device once all before step `now` are done.
bool IsSafe(std::size_t i, std::size_t now) {
    const auto flushed = [&](int item) {
        return std::any_of(steps.begin() + static_cast<long>(i), steps.begin() + static_cast<long>(now), [&](auto& s) {
            return s.kind == DiskStep::kFlushAll || (s.kind == DiskStep::kFlush && s.item == item);
        });
    };
    const DiskStep& step = steps[i];
    if (step.kind != DiskStep::kNames) return flushed(step.item);
    return std::all_of(step.folders.begin(), step.folders.end(), flushed);
}

class States {
public:
    explicit States(const std::function<void(const DiskState&, bool)>& visit) : visit_(visit) {}

    // Names without their folder, and files that have none, are not there.
    void Visit(DiskState state, bool finished) {
        std::string key = finished ? "+" : "-";
        for (const auto& [name, id] : state.names) {
            const DiskItem& item = state.items[id];
            key += name + '\0' + item.kind + std::to_string(id) + ':' + std::to_string(item.mode) + ':' + item.bytes;
        }
        if (seen_.insert(std::move(key)).second) visit_(state, finished);
    }

private:
    const std::function<void(const DiskState&, bool)>& visit_;
    std::set<std::string> seen_;
};

void KillStates(States& states) {
    DiskState state = start;
    for (std::size_t now = 0; now <= steps.size(); ++now) {
        states.Visit(state, now == steps.size());
        if (now == steps.size()) break;
        const DiskStep& step = steps[now];
        const std::uint64_t size = step.kind == DiskStep::kWrite ? step.bytes.size() : 0;
        for (const std::uint64_t at : {std::uint64_t{1}, size / 2, size - 1}) {
            const std::uint64_t cut = (step.offset + at) / kSector * kSector;
            DiskState part = state;
            ApplyTorn(step, part, [&](std::uint64_t sector) { return sector < cut; });
            if (size) states.Visit(std::move(part), false);
        }
        Apply(step, state);
    }
}

std::vector<std::size_t> Unsafe(std::size_t now, DiskState& safe) {
    safe = start;
    std::vector<std::size_t> open;
    for (std::size_t i = 0; i < now; ++i) {
        if (IsFlush(steps[i])) continue;
        if (IsSafe(i, now))
            Apply(steps[i], safe);
        else
            open.push_back(i);
    }
    return open;
}

void InOrderStates(States& states) {
    for (std::size_t now = 0; now <= steps.size(); ++now) {
        DiskState state;
        for (const std::size_t i : Unsafe(now, state)) {
            states.Visit(state, now == steps.size());
            DiskState torn = state;
            const std::uint64_t half = steps[i].offset + steps[i].bytes.size() / 2;
            ApplyTorn(steps[i], torn, [&](std::uint64_t at) { return at < half; });
            states.Visit(std::move(torn), now == steps.size());
            Apply(steps[i], state);
        }
        states.Visit(std::move(state), now == steps.size());
    }
}

// What stands in `chosen`, in the order in which it was done, on top of what is safe.
void VisitChosen(States& states, const DiskState& safe, const std::vector<std::size_t>& open, std::uint64_t chosen,
                 std::mt19937& random, bool finished) {
    DiskState whole = safe, torn = safe;
    for (std::size_t k = 0; k < open.size(); ++k) {
        if (!(chosen >> (k % 64) & 1)) continue;
        const DiskStep& step = steps[open[k]];
        Apply(step, whole);
        if (step.kind == DiskStep::kWrite)
            ApplyTorn(step, torn, [&](std::uint64_t) { return random() % 2 == 0; });
        else
            Apply(step, torn);
    }
    states.Visit(std::move(whole), finished);
    states.Visit(std::move(torn), finished);
}

void AnyOrderStates(States& states, int most) {
    std::mt19937 random(1);
    for (std::size_t now = 0; now <= steps.size(); ++now) {
        DiskState safe;
        const std::vector<std::size_t> open = Unsafe(now, safe);
        const bool finished = now == steps.size();
        const bool all = open.size() < 20 && (std::uint64_t{1} << open.size()) <= static_cast<std::uint64_t>(most);
        const int count = all ? 1 << open.size() : most;
        for (int n = 0; n < count; ++n) {
            const std::uint64_t any = static_cast<std::uint64_t>(random()) << 32 | random();
            const std::uint64_t one = std::uint64_t{1} << (random() % 64);
            const std::uint64_t chosen = all          ? static_cast<std::uint64_t>(n)
                                         : n % 3 == 0 ? any
                                         : n % 3 == 1 ? one
                                                      : ~one;
            VisitChosen(states, safe, open, chosen, random, finished);
        }
    }
}

}  // namespace

// ---- folders --------------------------------------------------------------------------------------------------------

DiskState DiskState::Of(const std::string& folder) {
    DiskState state;
    std::map<std::pair<std::uint64_t, std::uint64_t>, int> ids;
    const auto add = [&](const std::string& name, const fs::path& path) {
        struct stat status {};
        if (lstat(path.c_str(), &status) != 0) return;
        int& id = ids[{status.st_dev, status.st_ino}];
        if (id == 0) id = static_cast<int>(ids.size());
        state.names[name] = id;
        DiskItem& item = state.items[id];
        item.mode = status.st_mode & 07777;
        item.kind = S_ISDIR(status.st_mode) ? 'd' : S_ISLNK(status.st_mode) ? 'l' : 'f';
        if (item.kind == 'l') item.bytes = fs::read_symlink(path);
        std::ifstream in;
        if (item.kind == 'f') in.open(path, std::ios::binary);
        if (in.is_open()) item.bytes.assign(std::istreambuf_iterator<char>(in), {});
    };
    add("", folder);
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        add(entry.path().string().substr(folder.size() + 1), entry.path());
    }
    return state;
}

void DiskState::PutInto(const std::string& folder) const {
    for (const auto& entry : fs::directory_iterator(folder)) fs::remove_all(entry.path());
    std::map<int, std::string> made;
    for (const auto& [name, id] : names) {
        const DiskItem& item = items.at(id);
        const std::string path = folder + "/" + name;
        if (name.empty() || !fs::is_directory(fs::path(path).parent_path())) continue;
        if (item.kind == 'd') {
            fs::create_directory(path);
        } else if (item.kind == 'l') {
            fs::create_symlink(item.bytes, path);
        } else if (made.count(id)) {
            fs::create_hard_link(made[id], path);
        } else {
            std::ofstream(path, std::ios::binary) << item.bytes;
            fs::permissions(path, static_cast<fs::perms>(item.mode));
            made[id] = path;
        }
    }
}

// ---- recording ------------------------------------------------------------------------------------------------------

DiskRecorder::DiskRecorder(const std::string& folder) {
    root = fs::canonical(folder);
    start = DiskState::Of(root);
    steps.clear();
    idOf.clear();
    nextId = static_cast<int>(start.items.size());
    for (const auto& [name, id] : start.names) {
        struct stat status {};
        if (lstat((root + "/" + name).c_str(), &status) == 0) idOf[{status.st_dev, status.st_ino}] = id;
    }
    real = systemCalls;
    systemCalls.open = Open;
    systemCalls.openat = OpenAt;
    systemCalls.write = Write;
    systemCalls.copy_file_range = CopyRange;
    systemCalls.ftruncate = Truncate;
    systemCalls.fallocate = Allocate;
    systemCalls.fsync = Sync;
    systemCalls.syncfs = SyncAll;
    systemCalls.fchmod = ChangeMode;
    systemCalls.renameat2 = Rename;
    systemCalls.link = Link;
    systemCalls.linkat = LinkAt;
    systemCalls.unlink = Unlink;
    systemCalls.unlinkat = UnlinkAt;
    systemCalls.rmdir = RemoveFolder;
    systemCalls.mkdir = MakeFolder;
    systemCalls.mkdirat = MakeFolderAt;
}

DiskRecorder::~DiskRecorder() {
    systemCalls = real;
}

const DiskState& RecordedStart() {
    return start;
}
const std::vector<DiskStep>& RecordedSteps() {
    return steps;
}

void ForEachDiskState(Stop stop, int most, const std::function<void(const DiskState&, bool)>& visit) {
    States states(visit);
    if (stop == Stop::kKill)
        KillStates(states);
    else if (stop == Stop::kPowerInOrder)
        InOrderStates(states);
    else
        AnyOrderStates(states, most);
}

}  // namespace tessel::test
