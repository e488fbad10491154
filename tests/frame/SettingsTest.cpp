// What the services read from the preference file: the debugger of the heap, the priorities, the hard waits.
#include "frame/CoreServices.h"
#include "support/ScratchDrive.h"
#include "support/StartedLibrary.h"
#include "support/Test.h"
#include <tessel/base/MGAppInterface.h>
#include <tessel/config/HardWaitBehavior.h>
#include <tessel/threads/ThThread.h>
#include <tessel/utilities/UserCommandLine.h>

#include <optional>
#include <stdlib.h>
#include <sys/resource.h>

namespace tessel::test {
namespace {

struct Application : MGAppInterface {
    Application() { MGAppInterfaceSet(this); }
    ~Application() { MGAppInterfaceSet(nullptr); }
    CStr ApplicationName() override { return "App"; }
};

class Settings : public testing::Test {
protected:
    void Start(const std::string& preferences) {
        drive.Put("prefs.ini", preferences);
        SetPrefsPath("T:\\prefs.ini");
        library.emplace();
    }
    void TearDown() override {
        library.reset();
        SetPrefsPath(nullptr);
    }

    test::ReportRecorder reports;
    test::ScratchDrive drive;
    Application application;
    std::optional<test::StartedLibrary> library;
};

TEST_F(Settings, TheHeapDebuggerIsLoadedWhenItIsWanted) {
    ::unsetenv("TESSEL_TEST_HEAP_DEBUGGER");
    for (const char* refused : {"", "[App]\nLoadHeapDebugger=no\n", "[App]\nLoadHeapDebugger=1\n"}) {
        Start(refused);
        EXPECT_EQ(nullptr, ::getenv("TESSEL_TEST_HEAP_DEBUGGER")) << refused;
        library.reset();
    }
    Start("[App]\nLoadHeapDebugger=yes\n");
    EXPECT_NE(nullptr, ::getenv("TESSEL_TEST_HEAP_DEBUGGER"));
}

TEST_F(Settings, ThePrioritiesOfTheLevels) {
    Start("[App]\nthpri_bgrnd=-9\nthpri_normal=-4\nthpri_high=-5\nTHPRI_VHIGH=3\nthpri_tcrit=x\n");
    int32 p[5];
    ThThreadGetNativePriorityInfo(&p[0], &p[1], &p[2], &p[3], &p[4]);
    EXPECT_THAT(p, ElementsAre(-9, -4, -5, 3, 15));
    uint8 distinct[5];
    ThThreadGetPrioInfo(distinct);
    EXPECT_THAT(distinct, ElementsAre(1, 1, 0, 1, 1));
    EXPECT_THAT(reports.Texts(kDebugError),
                ElementsAre("inconsistent thread priority token configuration: normal is higher priority than high "
                            "(above normal)"));
}

std::atomic<int32> levelOfTheOccurrenceThread;

// The level that the occurrence thread gives itself; the priorities are such that every process may give them.
TEST_F(Settings, HardWaitsChooseTheLevelOfTheOccurrenceThread) {
    if (::getpriority(PRIO_PROCESS, 0) != 0) GTEST_SKIP() << "the process itself does not have the priority 0";
    const std::string low = "thpri_normal=-4\r\nthpri_high=-3\r\nthpri_vhigh=-2\r\nthpri_tcrit=-1\r\n";
    ThThreadPrioritySetProc note = [](ThThread, ThPlatformThread, uint32, int32 level) {
        levelOfTheOccurrenceThread = level;
    };
    // The setting, its value, the level, and what is saved.
    const struct {
        std::string line;
        int32 value, level;
        std::string saved;
    } rows[] = {
        {"", 0, kThPriorityTimeCritical, ""},
        {"HardWaitTimeCritical=True\r\n", 1, kThPriorityVeryHigh, "HardWaitTimeCritical=True\r\n"},
        {"HardWaitTimeCritical=no\r\n", 0, kThPriorityTimeCritical, ""},
        {"HardWaitTimeCritical=soon\r\n", 0, kThPriorityTimeCritical, ""},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        Start("[App]\r\n" + low + row.line);
        EXPECT_EACH(AssimilateStartUpThread() == 1, ThSetThreadPrioritySetProc(note) == kNoErr);
        levelOfTheOccurrenceThread = -1;
        EXPECT_EACH(GetHardWaitTimeCritical() == 0, HardWaitBehaviorService()->Init() == kNoErr,
                    row.value == GetHardWaitTimeCritical(), OccurrenceManagerService()->Init() == kNoErr);
        while (levelOfTheOccurrenceThread < 0) std::this_thread::yield();
        EXPECT_EACH(row.level == levelOfTheOccurrenceThread, OccurrenceManagerService()->Uninit() == kNoErr,
                    HardWaitBehaviorService()->Uninit() == kNoErr, GetHardWaitTimeCritical() == 0,
                    ThClearThreadPrioritySetProc(note) == kNoErr);
        library.reset();
        EXPECT_EQ("[App]\r\n" + low + row.saved, drive.Get("prefs.ini"));
    }
    EXPECT_EQ(1u, reports.CountAt(kDebugWarning)) << "\"soon\"";
}

}  // namespace
}  // namespace tessel::test
