#include "support/FaultScenario.h"

#include "support/FailingPlatform.h"

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <random>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {

namespace fs = std::filesystem;

bool FaultsAtLength() {
    const char* run = std::getenv("TESSEL_FAULTS");
    return run && std::string(run) == "long";
}

FaultCount& FaultCount::operator+=(const FaultCount& other) {
    states += other.states;
    old += other.old;
    fresh += other.fresh;
    bad += other.bad;
    leftovers += other.leftovers;
    if (first.empty()) first = other.first;
    return *this;
}

std::ostream& operator<<(std::ostream& out, const FaultCount& count) {
    out << count.states << " states: " << count.old << " old, " << count.fresh << " new, " << count.bad
        << " neither or lost; " << count.leftovers << " files left over";
    return count.first.empty() ? out : out << "; first: " << count.first;
}

namespace {

long Descriptors() {
    return std::distance(fs::directory_iterator("/proc/self/fd"), {});
}

}  // namespace

FaultRunner::FaultRunner(const ScratchDrive& drive, const FaultScenario& scenario)
    : drive_(drive), scenario_(scenario) {
    DiskState empty;
    empty.PutInto(drive.Native());
    scenario.prepare();
    start_ = DiskState::Of(drive.Native());
    names_ = Names();
    old_ = scenario.look();
    const MgErr err = scenario.act();
    fresh_ = err ? "error " + std::to_string(err) : scenario.look();
    names_.merge(Names());
}

std::set<std::string> FaultRunner::Names() const {
    std::set<std::string> names;
    for (const auto& entry : fs::recursive_directory_iterator(drive_.Native())) names.insert(entry.path());
    return names;
}

void FaultRunner::CountLeftovers(FaultCount& count) const {
    for (const std::string& name : Names()) count.leftovers += !names_.count(name);
}

void FaultRunner::Judge(FaultCount& count, const std::string& what, bool oldAllowed, bool freshAllowed) {
    ++count.states;
    const std::string found = scenario_.look();
    if (found == old_ && oldAllowed) {
        ++count.old;
    } else if (found == fresh_ && freshAllowed) {
        ++count.fresh;
    } else if (++count.bad == 1) {
        const char* kind = found == old_ ? " is lost" : found == fresh_ ? " is done" : " is neither: ";
        count.first = scenario_.name + ", " + what + kind + (found == old_ || found == fresh_ ? "" : found);
    }
}

FaultCount FaultRunner::Stopped(Stop stop, int most) {
    Reset();
    {
        const DiskRecorder recorder(drive_.Native());
        scenario_.act();
    }
    FaultCount count;
    ForEachDiskState(stop, most, [&](const DiskState& state, bool finished) {
        state.PutInto(drive_.Native());
        CountLeftovers(count);
        Judge(count, finished ? "at the end" : "in the midst", !finished || !scenario_.durable, true);
    });
    return count;
}

// What failed is as it was and can be done again; what did not is done. Nothing stays open or, after a success, behind.
void FaultRunner::JudgeFailed(FaultCount& count, const std::string& what, MgErr err, bool undone) {
    Judge(count, what + " gives " + std::to_string(err) + " and", err, !err || !undone);
    if (!err || scenario_.look() != old_) {
        if (scenario_.next) scenario_.next();
        return CountLeftovers(count);
    }
    const MgErr again = scenario_.act();
    const bool done = !again && scenario_.look() == fresh_;
    if (!done && ++count.bad == 1)
        count.first = scenario_.name + ", " + what + ": done again it gives " + std::to_string(again);
    CountLeftovers(count);
}

// Under a sanitizer a call takes a quarter of a second with all around it: there some of them have to do.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr int kCallsAtOnce = 7;
#else
constexpr int kCallsAtOnce = 1;
#endif

FaultCount FaultRunner::FailingCalls(int error, bool forever) {
    FaultCount count;
    for (int n = 1;; n += kCallsAtOnce) {
        Reset();
        const long open = Descriptors();
        MgErr err = kNoErr;
        {
            const FailingPlatform failing("*", n, error, forever ? FailingPlatform::kForever : 1);
            err = scenario_.act();
            if (failing.Calls() < n) return count;
        }
        const std::string what = "error " + std::to_string(error) + " at call " + std::to_string(n);
        // When all that follows fails, so does undoing what was done.
        JudgeFailed(count, what, err, scenario_.undone && !forever);
        if (Descriptors() != open && ++count.bad == 1)
            count.first = scenario_.name + ", " + what + " leaves a file open";
    }
}

FaultCount FaultRunner::KilledBeforeCalls() {
    FaultCount count;
    for (int n = 1;; n += kCallsAtOnce) {
        Reset();
        const pid_t child = fork();
        if (child == 0) {
            const FailingPlatform failing("*", n, FailingPlatform::kKill);
            _exit(scenario_.act() ? 1 : 0);
        }
        int status = 0;
        waitpid(child, &status, 0);
        const bool killed = WIFEXITED(status) && WEXITSTATUS(status) == 99;
        if (!killed) return count;
        JudgeFailed(count, "killed before call " + std::to_string(n), kGenericErr, false);
    }
}

FaultCount FaultRunner::KilledAtRandom(int kills) {
    FaultCount count;
    std::mt19937 random(7);
    double longest = 2000;  // us; so that half of them come in time
    for (int i = 0; i < kills; ++i) {
        Reset();
        const pid_t child = fork();
        if (child == 0) _exit(scenario_.act() ? 1 : 0);
        usleep(static_cast<useconds_t>(std::uniform_real_distribution<>(0, longest)(random)));
        kill(child, SIGKILL);
        int status = 0;
        waitpid(child, &status, 0);
        longest *= WIFEXITED(status) ? 0.9 : 1.1;
        Judge(count, "killed at random", true, true);
        if (scenario_.next) scenario_.next();
        CountLeftovers(count);
    }
    return count;
}

}  // namespace tessel::test
