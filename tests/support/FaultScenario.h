// What a change of files leaves when something goes wrong in the midst of it.
#ifndef TESSEL_TESTS_SUPPORT_FAULTSCENARIO_H
#define TESSEL_TESTS_SUPPORT_FAULTSCENARIO_H

#include "support/ScratchDrive.h"
#include "support/SimulatedDisk.h"
#include <tessel/base/MgErr.h>

#include <functional>
#include <ostream>
#include <set>
#include <string>

namespace tessel::test {

// The long run: ./dev faults.
bool FaultsAtLength();

// A change, through the library, of files on the scratch drive. It closes all it opens, also when it fails.
struct FaultScenario {
    std::string name;
    std::function<void()> prepare;      // on an empty drive
    std::function<MgErr()> act;         // from what was prepared
    std::function<std::string()> look;  // what the library finds, as a text
    std::function<void()> next{};       // another change beside it, which clears what the dead left
    bool durable = true;                // when it returned, the power may go
    bool undone = true;                 // what failed is as it was; else it may be done all the same
};

struct FaultCount {
    int states = 0, old = 0, fresh = 0, bad = 0;
    int leftovers = 0;  // files that nobody asked for
    std::string first;  // the first bad one

    FaultCount& operator+=(const FaultCount& other);
};
std::ostream& operator<<(std::ostream& out, const FaultCount& count);

// Runs one scenario again and again. The library is started.
class FaultRunner {
public:
    FaultRunner(const ScratchDrive& drive, const FaultScenario& scenario);

    // Every state of the disk after a kill, or a power loss.
    FaultCount Stopped(Stop stop, int most);
    // Each call of the system in turn fails, that one or all from it on. What fails is done again without faults.
    FaultCount FailingCalls(int error, bool forever);
    // In a process of its own, killed before each call of the system in turn; then at random moments.
    FaultCount KilledBeforeCalls();
    FaultCount KilledAtRandom(int kills);

private:
    void Judge(FaultCount& count, const std::string& what, bool oldAllowed, bool freshAllowed);
    void CountLeftovers(FaultCount& count) const;
    void JudgeFailed(FaultCount& count, const std::string& what, MgErr err, bool undone);
    void Reset() const { start_.PutInto(drive_.Native()); }
    std::set<std::string> Names() const;

    const ScratchDrive& drive_;
    const FaultScenario& scenario_;
    DiskState start_;
    std::string old_, fresh_;
    std::set<std::string> names_;  // before or afterwards
};

}  // namespace tessel::test

#endif
