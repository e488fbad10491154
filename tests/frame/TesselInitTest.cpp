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

namespace tessel {
namespace {

using test::ReportRecorder;
using test::Texts;

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
    bool HasLeakFile(const char* name) const { return std::filesystem::exists(folder / name); }

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

TEST_F(TesselInitTest, OutOfTurnNothingHappens) {
    EXPECT_EACH(InitTesselAppSupport() == kNoErr, UninitTesselAppSupport() == kNoErr, UninitTesselBase() == kNoErr,
                recorder.Count() == 0u);
}

TEST_F(TesselInitTest, TheBaseStopsWhatStandsOnIt) {
    for (int round = 0; round < 2; ++round) {
        EXPECT_EACH(InitTesselBase() == kNoErr, InitTesselAppSupport() == kNoErr, UninitTesselBase() == kNoErr);
        EXPECT_EQ(kNoErr, UninitTesselAppSupport()) << "nothing is left to stop";
    }
    EXPECT_EQ(0u, recorder.CountAt(kDebugError));
}

TEST_F(TesselInitTest, SettingsThatAreNotUnderstoodAreReported) {
    for (const auto& [variable, good, bad] :
         std::vector<std::array<const char*, 3>>{{"OVGuardBytes", "off", "on"},
                                                 {"OVGuardBytes_Ptr", "alloc", "Check"},
                                                 {"OVHandleCheck", "resize", "3"},
                                                 {"OV_ALLOC_TRACKER", "", "OFF"},
                                                 {"OV_USE_MALLOC", "0", "yes"},
                                                 {"TESSEL_DRIVES", "C=/;;t=/tmp", "C=/;TT=/tmp"},
                                                 {"TESSEL_UNC", "/srv", "srv"},
                                                 {"TESSEL_CODEPAGE", "cp932", "klingon"},
                                                 {"TESSEL_REGISTRY", "/tmp", "registry"}}) {
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
    const Texts infos = recorder.Texts(kDebugInfo);
    const bool pointed = std::any_of(infos.begin(), infos.end(), [](const std::string& text) {
        return text.ends_with("\\ovHandleLeaks.txt(1) : 1 Handle Leaks (0 expected)") && text.starts_with("C:\\");
    });
    EXPECT_TRUE(pointed);
    const std::string report = ReadFile(folder / "ovHandleLeaks.txt");
    EXPECT_NE(std::string::npos, report.find("** List of currently allocated Handle Leaks          **\n")) << report;
    EXPECT_EACH(std::string::npos != report.find("Master Pointer: 0x"),
                std::string::npos != report.find("Memory Contents: xxx." + std::string(250, 'x') + '\n'),
                std::string::npos != report.find(" - frame_tests "),
                std::string::npos != report.find("\nNumber of unfreed items: 1\n\n1 Handle Leaks\n"),
                !HasLeakFile("ovPointerLeaks.txt"));
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
        {OccurrenceManagerService, "OccurrenceManager: HardWaitBehavior ThMutex ThThread"},
    };
    for (const auto& [accessor, text] : expected) {
        Names names;
        accessor()->GetDependencies(names);
        EXPECT_EACH(text == accessor()->GetName() + std::string(":") + names.text, accessor() == accessor());
    }
}

// A host's service that records what runs at its own start.
TEST(CoreServices, AHostsRegistryMayDependOnThem) {
    struct Host final : RefcountedServiceObject_T<Host> {
        const char* GetName() override { return "Host"; }
        void GetDependencies(IServiceDependencyList& list) override { list.AddDependency(MemoryManagerService()); }
        MgErr DoInit() override {
            handle = DSNewHandle(8);
            return handle ? kNoErr : kMemFullErr;
        }
        MgErr DoUninit() override { return DSDisposeHandle(handle); }
        UHandle handle = nullptr;
    };
    ReportRecorder recorder;
    IServiceObject* const services[] = {Host::Object(), nullptr};
    IServiceRegistry* const registry = CreateServiceRegistry(services);
    {
        test::StartedLibrary library;
        EXPECT_EACH(registry->InitServices() == kNoErr, registry->UninitServices() == kNoErr);
    }
    registry->Release();
    EXPECT_EQ(0u, recorder.CountAt(kDebugError) + recorder.CountAt(kDebugFatal));
}

}  // namespace
}  // namespace tessel
