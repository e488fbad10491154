// The library with its occurrences, started for as long as it lives. Leftovers and leaks are failures.
#pragma once

#include "events/OccurrenceLocks.h"
#include "support/StartedLibrary.h"
#include "support/Test.h"
#include <tessel/tessel.h>

namespace tessel::test {

class EventsTest : public testing::Test {
protected:
    EventsTest() {
        EXPECT_EQ(1, AssimilateStartUpThread());
        reports.Clear();
        EXPECT_EQ(kNoErr, OccurrenceManagerService()->Init());
    }
    ~EventsTest() override {
        EXPECT_EQ(kNoErr, OccurrenceManagerService()->Uninit());
        EXPECT_EQ(0u, reports.CountAt(kDebugWarning));
    }
    // As the whole library does, with all that its mutexes and memory leave behind.
    void Restart() {
        EXPECT_EQ(kNoErr, OccurrenceManagerService()->Uninit());
        EXPECT_EQ(kNoErr, OccurrenceManagerService()->Init());
    }

    ReportRecorder reports;
    StartedLibrary library;
};

// A callback that notes its argument, and that no lock is held.
struct Log {
    static inline std::vector<std::string> entries;
    static void Note(void* name) {
        EXPECT_EQ(0u, OccurrenceLock::HeldRanks());
        entries.push_back(static_cast<const char*>(name));
    }
    // What was noted since.
    static std::vector<std::string> Take() { return std::exchange(entries, {}); }
};

inline void* Name(const char* text) {
    return const_cast<char*>(text);
}

}  // namespace tessel::test
