// A disk that may stop at any moment. It records what calls of the table of system calls do to the files under one
// folder, and builds what the disk may hold after a kill and after a power loss at any time in between.
#ifndef TESSEL_TESTS_SUPPORT_SIMULATEDDISK_H
#define TESSEL_TESTS_SUPPORT_SIMULATEDDISK_H

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace tessel::test {

struct DiskItem {
    char kind = 'f';    // 'f' file, 'd' folder, 'l' link
    std::string bytes;  // of a link: where it leads
    unsigned mode = 0644;
};

// Names (from the folder on; "" is the folder) and the items that they lead to; a file may have several names.
struct DiskState {
    std::map<std::string, int> names;
    std::map<int, DiskItem> items;

    static DiskState Of(const std::string& folder);
    // Makes the folder hold exactly this.
    void PutInto(const std::string& folder) const;
};

// One step of what happened: bytes of a file, its size or mode, names, or a flush.
struct DiskStep {
    enum Kind { kWrite, kSize, kMode, kNames, kFlush, kFlushAll } kind;
    int item = 0;
    std::uint64_t offset = 0;  // or the size, or the mode
    std::string bytes;
    std::vector<std::pair<std::string, int>> names;  // all at once; -1 for one that goes
    std::vector<int> folders;                        // of those names
};

// Records while it lives. One at a time, on the calling thread.
class DiskRecorder {
public:
    explicit DiskRecorder(const std::string& folder);
    ~DiskRecorder();
    DiskRecorder(const DiskRecorder&) = delete;
    DiskRecorder& operator=(const DiskRecorder&) = delete;
};

// What the last recorder saw.
const DiskState& RecordedStart();
const std::vector<DiskStep>& RecordedSteps();

enum class Stop {
    kKill,          // of the process: what was done is there; a write may be cut at 512 bytes
    kPowerInOrder,  // what was flushed, and some of the rest from its start on; the last write torn at 512 bytes
    kPowerAnyOrder  // what was flushed, and any of the rest; any write torn at 512 bytes
};

// Calls visit(state, finished) for what the disk may hold, each once; `finished`: the power went after the last step.
// Up to `most` combinations a moment where the order is the host's; the same ones each time.
void ForEachDiskState(Stop stop, int most, const std::function<void(const DiskState&, bool finished)>& visit);

}  // namespace tessel::test

#endif
