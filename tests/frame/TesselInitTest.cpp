#include "frame/CoreServices.h"
#include "support/StartedLibrary.h"
#include "support/Test.h"
#include <tessel/frame/TesselInit.h>
#include <tessel/memory/MemoryManager.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <stdlib.h>

namespace tessel::test {
namespace {

std::string ReadFile(const std::filesystem::path& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

// Leak reports go into a folder of their own.
class TesselInitTest : public testing::Test {
protected:
    void SetUp() override {
        folder = std::filesystem::temp_directory_path() / ("tessel_init_" + std::to_string(getpid()));
        std::filesystem::create_directory(folder);
        setenv("TMPDIR", folder.c_str(), 1);
    }
    void TearDown() override {
        unsetenv("TMPDIR");
        std::filesystem::remove_all(folder);
    }

    std::filesystem::path folder;
    ReportRecorder recorder;
};

TEST_F(TesselInitTest, StartsAndStopsCleanlyAgainAndAgain) {
    for (int round = 0; round < 3; ++round) {
        recorder.Clear();
        {
            test::StartedLibrary library;
            EXPECT_EACH(InitTesselBase() == kGenericErr, InitTesselAppSupport() == kNoErr);
            UHandle handle = DSNewHandle(64);
            ASSERT_NE(nullptr, handle);
            EXPECT_EQ(kNoErr, DSDisposeHandle(handle));
        }
        EXPECT_EACH(recorder.Texts(kDebugWarning) == Texts{}, recorder.Texts(kDebugError) == Texts{},
                    recorder.Texts(kDebugFatal) == Texts{});
        // Each tracker is summed up when its service stops, in the reverse order of the start.
        Texts totals = recorder.Texts(kDebugInfo);
        std::erase_if(totals, [](const std::string& text) { return !text.starts_with("Total "); });
        EXPECT_EQ((Texts{"Total Thread Leaks = 0.\n", "Total new/delete leaks = 0.\n", "Total Handle Leaks = 0.\n",
                         "Total Pointer Leaks = 0.\n", "Total Mutex Leaks = 0.\n", "Total Event Leaks = 0.\n"}),
                  totals);
    }
    EXPECT_TRUE(std::filesystem::is_empty(folder));
}

TEST_F(TesselInitTest, OutOfTurnNothingHappensAndTheBaseStopsWhatStandsOnIt) {
    EXPECT_EACH(InitTesselAppSupport() == kNoErr, UninitTesselAppSupport() == kNoErr, UninitTesselBase() == kNoErr,
                recorder.Count() == 0);
    for (int round = 0; round < 2; ++round)
        EXPECT_EACH(InitTesselBase() == kNoErr, InitTesselAppSupport() == kNoErr, UninitTesselBase() == kNoErr,
                    UninitTesselAppSupport() == kNoErr);  // nothing is left to stop
    EXPECT_EQ(0u, recorder.CountAt(kDebugError));
}

TEST_F(TesselInitTest, SettingsThatAreNotUnderstoodAreReported) {
    const std::array<const char*, 3> settings[] = {
        {"OVGuardBytes", "off", "on"},    {"OVGuardBytes_Ptr", "alloc", "Check"},
        {"OVHandleCheck", "resize", "3"}, {"OV_ALLOC_TRACKER", "", "OFF"},
        {"OV_USE_MALLOC", "0", "yes"},    {"TESSEL_DRIVES", "C=/;;t=/tmp", "C=/;TT=/tmp"},
        {"TESSEL_UNC", "/srv", "srv"},    {"TESSEL_CODEPAGE", "cp932", "klingon"}};
    for (const auto& [variable, good, bad] : settings) {
        for (const char* value : {good, bad}) {
            recorder.Clear();
            setenv(variable, value, 1);
            { test::StartedLibrary library; }
            unsetenv(variable);
            const Texts expected = {std::string(variable) + '=' + value + " is not understood; the default holds."};
            EXPECT_EQ(value == good ? Texts() : expected, recorder.Texts(kDebugWarning));
        }
    }
}

TEST_F(TesselInitTest, AHandleLeftBehindIsReported) {
    {
        test::StartedLibrary library;
        UHandle handle = DSNewHandle(300);
        ASSERT_NE(nullptr, handle);
        std::fill(*handle, *handle + 300, uint8('x'));
        (*handle)[3] = 1;
    }
    EXPECT_TRUE(recorder.Has(kDebugError, "We got 1 more Handle Leaks than we see from a basic launch and quit.\n"));
    EXPECT_THAT(recorder.Texts(kDebugInfo),
                Contains(AllOf(StartsWith("C:\\"), EndsWith("\\ovHandleLeaks.txt(1) : 1 Handle Leaks (0 expected)"))));
    EXPECT_THAT(ReadFile(folder / "ovHandleLeaks.txt"),
                AllOf(HasSubstr("Memory Contents: xxx." + std::string(250, 'x') + '\n'), HasSubstr(" - frame_tests ")));
    EXPECT_FALSE(std::filesystem::exists(folder / "ovPointerLeaks.txt"));
}

// The names and what each names as its dependencies, in the order it adds them.
TEST(CoreServices, NamesAndDependencies) {
    struct Names : IServiceDependencyList {
        void AddDependency(IServiceObject* service) override { text += std::string(" ") + service->GetName(); }
        std::string text;
    };
    const std::pair<IServiceObject* (*)(), const char*> expected[] = {
        {DebugStreamService, "DebugStream_Service:"},
        {FloatingPointConstantsService, "FloatingPointConstants:"},
        {ThEventService, "ThEvent:"},
        {ThMutexService, "ThMutex: ThEvent"},
        {ProtectedAtomicOperationsService, "ProtectedAtomicOperations: ThMutex"},
        {MemoryManagerService, "MemoryManager: ThMutex ProtectedAtomicOperations"},
        {TrackedMallocFreeService, "TrackedMallocFree: MemoryManager"},
        {PathManagerService, "PathManager: TrackedMallocFree MemoryManager"},
        {FileManagerService, "FileManager: PathManager MemoryManager"},
        {ResourceManagerService, "ResourceManager: MemoryManager PathManager FileManager"},
        {ConfigCoreTypesService, "ConfigCoreTypes: PathManager ConfigManager"},
        {ConfigManagerService, "ConfigManager: ThMutex PathManager FileManager MemoryManager"},
        {ThThreadService, "ThThread: ThMutex ThEvent ConfigManager ConfigCoreTypes"},
        {HardWaitBehaviorService, "HardWaitBehavior: ConfigManager ConfigCoreTypes"},
        {OccurrenceManagerService, "OccurrenceManager: HardWaitBehavior ThMutex ThThread"}};
    for (const auto& [accessor, text] : expected) {
        Names names;
        accessor()->GetDependencies(names);
        EXPECT_EACH(text == accessor()->GetName() + std::string(":") + names.text, accessor() == accessor());
    }
}

}  // namespace
}  // namespace tessel::test
