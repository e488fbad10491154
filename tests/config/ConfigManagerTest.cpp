// The manager: which file and section, reading, writing and removing, the shadow in memory, what is reported.
#include "ConfigValue.h"
#include "config/ConfigTestSupport.h"
#include "support/FailingAllocator.h"

#include <filesystem>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {
namespace {

using tool::ConfigValue;

int32 I32(const std::string& key, int32 otherwise = -1) {
    CfgGetDefault(kConfigI32, Key(key), &otherwise);
    return otherwise;
}

std::string Section(ConfigManager& manager) {
    LStrHandle text = nullptr;
    EXPECT_EQ(kNoErr, manager.GetHostPrefsSection(&text));
    return StringUtils::ToNarrowString(text, StringUtils::kReleaseSource);
}

std::string PrefFile(ConfigManager& manager = *GetMainCfgAccess()) {
    Path path = nullptr;
    EXPECT_EQ(kNoErr, manager.GetPrefFilePath(&path));
    std::string text = path ? path->ToString(PathRef::StringDisplay()) : "none";
    FDestroyPath(&path);
    return text;
}

// The text to make a value of each type from, and the line in the file.
const struct {
    int32 type;
    const char *text, *line;
} kTypes[] = {
    {kConfigPStr, "abc", "PStr=\"abc\""},
    {kConfigP255, " blanks ", "P255=\" blanks \""},
    {kConfigLStr, "\"quoted\"", "LStr=\"\"quoted\"\""},
    {kConfigNStr, "", "NStr=\"\""},
    {kConfigNStV, "a;b", "NStV=\"a;b\""},
    {kConfigENSV, "a\\;b;c", "ENSV=\"a\\;b;c\""},
    {kConfigCPSt, "a;;b", "CPSt=\"a;;b\""},
    {kConfigECPS, "\\\\;b", "ECPS=\"\\\\;b\""},
    {kConfigBool, "on", "Bool=True"},
    {kConfigI32, "-7", "I32=-7"},
    {kConfigF32, ".25", "F32=0.250000"},
    {kConfigI32L, "1 2", "I32L=1;2"},
    {kConfigPath, "C:\\a\\b", "Path=C:\\a\\b"},
    {kConfigPthp, "\\\\s\\h\\f", "Pthp=\\\\s\\h\\f"},
    {kConfigPLst, "C:\\a;D:\\b", "PLst=\"C:\\a;D:\\b\""},
    {kConfigPRfL, "C:\\a;D:\\b", "PRfL=C:\\a;D:\\b"},
};

std::string KeyOf(const char* line) {
    return std::string(line, std::strcspn(line, "="));
}

// How many of the types do not read what was written.
int ReadBackWrongly(const char* file) {
    int wrong = 0;
    OwnedManager manager = ManagerOf(file);
    for (const auto& row : kTypes) {
        ConfigValue value(row.type);
        std::string text;
        if (manager->GetDefault(row.type, KeyOf(row.line), value.Pointer()) != kNoErr ||
            manager->ValueToString(row.type, value.Pointer(), &text) != kNoErr ||
            KeyOf(row.line) + "=" + text != row.line)
            ++wrong;
    }
    return wrong;
}

TEST(ConfigManager, EveryTypeIsReadBackByASecondProcess) {
    StartedConfig started;
    std::string expected = "[App]\r\n";
    for (const auto& row : kTypes) {
        ConfigValue value(row.type);
        ASSERT_EQ(kNoErr,
                  ConfigTypeFromString(row.type, row.text, static_cast<int32>(std::strlen(row.text)), value.Pointer()));
        EXPECT_EACH(CfgWrite(row.type, Key(KeyOf(row.line)), value.Pointer()) == kNoErr,
                    GetMainCfgAccess()->Write(row.type, "m" + KeyOf(row.line), value.Pointer(), true) == kNoErr);
        expected += row.line + std::string("\r\n");
        // The same from the manager that wrote it, and from its memory.
        for (const char* prefix : {"", "m"}) {
            ConfigValue again(row.type);
            std::string text;
            EXPECT_EACH(CfgGetDefault(row.type, Key(prefix + KeyOf(row.line)), again.Pointer()) == kNoErr,
                        GetMainCfgAccess()->ValueToString(row.type, again.Pointer(), &text) == kNoErr,
                        row.line == KeyOf(row.line) + "=" + text);
        }
    }
    EXPECT_EQ(expected + "\r\n", started.File());
    const pid_t child = ::fork();
    if (child == 0) ::_exit(ReadBackWrongly("T:\\prefs.ini"));
    int status = -1;
    ASSERT_EQ(child, ::waitpid(child, &status, 0));
    EXPECT_EACH(status == 0, started.reports.Texts(kDebugWarning).empty());
}

// ---- which file, which section --------------------------------------------------------------------------------------

TEST(ConfigManager, StartsOnTheFileThatIsNamed) {
    ScratchDrive drive;
    TestApplication application;
    application.baseName = "tessel-test-" + std::to_string(::getpid());
    char native[1024];
    std::string byDefault;
    {
        StartedLibrary library;
        Path folder = nullptr;
        ASSERT_EQ(kNoErr, FAppPath(&folder));
        byDefault = folder->ToString(PathRef::StringDisplay()) + "\\" + application.baseName + ".ini";
        FDestroyPath(&folder);
    }
    ASSERT_EQ(kNoErr, InitTesselBase());
    const std::string nativeName = drive.Native("native.ini");
    const struct {
        const char* set;
        std::vector<const char*> line;
        std::string file;
    } rows[] = {
        {nullptr, {"app"}, byDefault},
        {nullptr, {"app", "-pref", "T:\\a.ini", "-pref", "T:\\b.ini", "--", "-pref", "T:\\c.ini"}, "T:\\b.ini"},
        {"T:\\sub\\set.ini", {"app", "-pref", "T:\\a.ini"}, "T:\\sub\\set.ini"},
        {nativeName.c_str(), {"app"}, "T:\\native.ini"},
        {"\\\\", {"app"}, byDefault},
    };
    for (const auto& row : rows) {
        std::vector<char*> arguments;
        for (const char* word : row.line) arguments.push_back(const_cast<char*>(word));
        InitUserCommandLine(static_cast<int32>(arguments.size()), arguments.data());
        SetPrefsPath(row.set);
        ReportRecorder reports;
        InitTesselAppSupport();
        EXPECT_EACH(row.file == PrefFile(), byDefault == PrefFile(*OwnedManager(new ConfigManager(PathRef()))),
                    (row.set && row.set[0] == '\\') == (reports.CountAt(kDebugWarning) == 1));
        int32 value = static_cast<int32>(row.file.size());
        EXPECT_EQ(kNoErr, CfgWrite(kConfigI32, Key("n"), &value));
        Path path = nullptr;
        CfgGetPrefFilePath(&path);
        EXPECT_EQ(kNoErr, PathToNative(path, native, sizeof native));
        FDestroyPath(&path);
        EXPECT_TRUE(std::filesystem::remove(native)) << native;
        UninitTesselAppSupport();
        UninitUserCommandLine();
        SetPrefsPath(nullptr);
        EXPECT_EQ(kGenericErr, CfgGetDefault(kConfigI32, Key("n"), &value));
    }
    UninitTesselBase();
}

TEST(ConfigManager, TakesTheSectionOfTheEdition) {
    StartedConfig started("[App]\na=1\n[base]\na=2\n[AltRT]\na=3\n[AltFFRT]\na=4\n[Other]\na=6\n");
    TestApplication& app = started.application;
    for (const auto& [bound, runTime, full, section, value] : std::vector<std::tuple<int, int, int, std::string, int>>{
             {0, 0, 0, "App", 1}, {1, 1, 1, "base", 2}, {0, 1, 1, "AltRT", 3}, {0, 0, 1, "AltFFRT", 4}}) {
        app.isBound = bound, app.isRunTime = runTime, app.isFullRunTime = full;
        OwnedManager manager = ManagerOf("T:\\prefs.ini");
        int32 read = 0;
        EXPECT_EACH(manager->GetDefault(kConfigI32, "A", &read) == kNoErr, section == Section(*manager), value == read,
                    manager->UpdateSectionHeader("other") == kNoErr,
                    manager->GetDefault(kConfigI32, " A ", &read) == kNoErr, read == 6);
    }
    MGAppInterfaceSet(nullptr);
    OwnedManager nameless = ManagerOf("T:\\prefs.ini");
    int32 value = 9;
    EXPECT_EACH(nameless->GetDefault(kConfigI32, "a", &value) == kConfigKeyErr,
                nameless->Write(kConfigI32, "a", &value, false) == kArgErr,
                nameless->Remove(kConfigI32, "a", false) == kNoErr);
}

template <class Body>
std::string Raised(Body body) {
    try {
        body();
        return "nothing";
    } catch (const OVExcept& e) {
        return std::to_string(e.Code()) + ' ' + e.Detail();
    }
}

TEST(ConfigManager, ManagersOfOtherFiles) {
    StartedConfig started;
    started.drive.Put("other.ini", "[App]\nn=5\n");
    started.drive.Put("wide.ini", "\xFF\xFE[");
    PathRef other("T:\\other.ini", PathRef::StringDisplay()), relative("other.ini", PathRef::StringDisplay());
    PathRef wide("T:\\wide.ini", PathRef::StringDisplay()), volume("T:\\", PathRef::StringDisplay()), none;
    int32 n = 0;
    EXPECT_EACH(CfgGetDefaultFrom(&other, kConfigI32, Key("n"), &n) == kNoErr, n == 5,
                CfgGetDefaultFrom(&wide, kConfigI32, Key("n"), &n) == kUnsupportedErr,
                CfgGetDefaultFrom(nullptr, kConfigI32, Key("n"), &n) == kArgErr);
    ConfigManager* manager = nullptr;
    const std::string notValid = "1 Not a Valid path to a preference file.";
    for (PathRef* path : {&none, &relative, &volume}) {
        EXPECT_EQ(kArgErr, ConstructCfgAccess(path, &manager));
        EXPECT_EQ(notValid, Raised([&] { ConstructCfgAccessPathRef(*path, &manager); }));
    }
    EXPECT_EACH(ConstructCfgAccess(&other, nullptr) == kArgErr, ConstructCfgAccessCStr(nullptr, &manager) == kArgErr);
    EXPECT_EQ("1 Error constructing Config Manager", Raised([&] { ConstructCfgAccessCStr("\\\\", &manager); }));
    ASSERT_EQ(kNoErr, ConstructCfgAccess(&other, &manager));
    EXPECT_EACH(manager->AddRef() == 2, manager->RemoveRef() == 1, manager->RemoveRef() == 0);
}

// ---- reading, writing, removing -------------------------------------------------------------------------------------

TEST(ConfigManager, SaysWhyThereIsNoValue) {
    StartedConfig started("[App]\nword=maybe\nn=3\n");
    int32 value = 77;
    const struct {
        int32 type;
        const char* key;
        MgErr err;
    } rows[] = {{kConfigI32, "none", kConfigKeyErr},   {-9, "none", kConfigKeyErr}, {-9, "n", kConfigTypeErr},
                {kConfigBool, "word", kConfigTextErr}, {kConfigI32, "", kArgErr},   {kConfigI32, " \t", kArgErr}};
    for (const auto& row : rows) EXPECT_EQ(row.err, CfgGetDefault(row.type, Key(row.key), &value)) << row.key;
    EXPECT_EACH(value == 77, CfgGetDefault(kConfigI32, Key("n"), nullptr) == kArgErr,
                CfgWrite(kConfigI32, Key("n"), nullptr) == kArgErr, CfgWrite(kConfigI32, Key(" "), &value) == kArgErr,
                CfgWrite(0x20323334, Key("n"), &value) == kConfigTypeErr, CfgRemove(kConfigI32, nullptr) == kArgErr,
                (Texts{"Unknown config type '\xF7\xFF\xFF\xFF'.", "Unknown config type '432 '."}) ==
                    started.reports.Texts(kDebugWarning));

    ConfigManager* held = GetMainCfgAccess();
    held->AddRef();
    EXPECT_EQ(kNoErr, CfgGetDefault(kConfigI32, Key("n"), &value));
    UninitTesselAppSupport();
    EXPECT_EQ(nullptr, GetMainCfgAccess());
    Path path = nullptr;
    LStrHandle text = nullptr;
    for (MgErr err : {CfgGetDefault(kConfigI32, Key("n"), &value), CfgWrite(kConfigI32, Key("n"), &value),
                      CfgRemove(kConfigI32, Key("n")), CfgGetPrefFilePath(&path), CfgGetHostPrefsSection(&text),
                      CfgGetDefaultFrom(nullptr, kConfigI32, Key("n"), &value)})
        EXPECT_EQ(kGenericErr, err);
    EXPECT_EQ(kGenericErr, held->GetDefault(kConfigI32, "n", &value)) << "there are no types";
    EXPECT_EQ("App", Section(*held)) << "it lives on";
    InitTesselAppSupport();
    EXPECT_EACH(held->GetDefault(kConfigI32, "n", &value) == kNoErr, held->RemoveRef() == 0);
}

TEST(ConfigManager, MemoryShadowsTheFile) {
    StartedConfig started("[App]\nn=1\nKey=2\n");
    ConfigManager& main = *GetMainCfgAccess();
    int32 value = 10;
    EXPECT_EACH(main.Write(kConfigI32, " n ", &value, true) == kNoErr,
                main.Write(kConfigI32, Key("key"), &value, true) == kNoErr, started.File() == "[App]\nn=1\nKey=2\n",
                I32("n") == 10);
    EXPECT_EQ(2, I32("KEY")) << "memory tells cases apart";
    EXPECT_THAT(started.reports.Texts(kDebugWarning), IsEmpty());

    value = 11;
    EXPECT_EACH(CfgWrite(kConfigI32, Key("n"), &value) == kNoErr, started.File() == "[App]\r\nn=11\r\nKey=2\r\n",
                main.Remove(kConfigI32, "n", true) == kNoErr);
    EXPECT_EQ(kNoErr, main.Remove(kConfigI32, "n", true)) << "not there is no error";
    EXPECT_EACH(I32("n") == 11, main.Remove(kConfigI32, Key("key"), false) == kNoErr, I32("key") == -1,
                started.File() == "[App]\r\nn=11\r\n", CfgRemove(kConfigI32, Key("key")) == kNoErr,
                (Texts{"In Memory Config Token (n) is now asked to persist in file! Not recommended.",
                       "In Memory Config Token (key) is now asked to be removed from file! Not recommended."}) ==
                    started.reports.Texts(kDebugWarning));
}

TEST(ConfigManager, ListsWhatIsInMemory) {
    StartedConfig started;
    ConfigManager& main = *GetMainCfgAccess();
    LStrArrayHandle keys = nullptr, values = nullptr;
    int32 count = -1;
    EXPECT_EACH(main.GetInMemoryConfigList(&keys, &values, &count) == kNoErr, count == 0, !keys, !values);
    std::string text = "t";
    for (const char* key : {"b", "a.b", ".x", "B"}) {
        text += key;
        EXPECT_EQ(kNoErr, main.Write(kConfigNStr, key, &text, true));
    }
    for (int round = 0; round < 2; ++round) EXPECT_EQ(kNoErr, main.GetInMemoryConfigList(&keys, &values, &count));
    std::string listed;
    for (int32 i = 0; i < count; ++i)
        for (LStrArrayHandle array : {keys, values})
            listed += StringUtils::ToNarrowString((*array)->element[i], StringUtils::kKeepSource) + ' ';
    EXPECT_EQ(".x \"tba.b.x\" B \"tba.b.xB\" a.b \"tba.b\" b \"tb\" ", listed);
    ReallocLStrArrayHandle(&keys, 0);
    ReallocLStrArrayHandle(&values, 0);
    EXPECT_EQ(kArgErr, main.GetInMemoryConfigList(&keys, &values, nullptr));
}

TEST(ConfigManager, ReportsKeysThatTheApplicationDoesNotKnow) {
    StartedConfig started("[App]\nn=1\nm=2\n");
    ConfigManager& main = *GetMainCfgAccess();
    const ConfigManager::KnownToken known[] = {{"N"}, {"other"}};
    EXPECT_EACH(main.SetKnownTokens(nullptr, 1) == kArgErr, main.SetKnownTokens(known, 2) == kNoErr, I32("n") == 1);
    EXPECT_EQ(2, I32("m")) << "it is read all the same";
    EXPECT_EACH(CfgRemove(kConfigI32, Key("m")) == kNoErr, !main.ValidateTokenName("x"),
                main.SetKnownTokens(nullptr, 0) == kNoErr, main.ValidateTokenName("x"),
                (Texts{"If tokens is NULL, tokenCount must be zero", "Unknown INI token: m", "Unknown INI token: m",
                       "Unknown INI token: x"}) == started.reports.Texts(kDebugWarning));
}

// Each operation with its n-th allocation failing, until it has all it wants.
TEST(ConfigManager, AnAllocationThatFailsIsSaid) {
    StartedConfig started("[App]\nPStr=\"x\"\n");
    ConfigManager& main = *GetMainCfgAccess();
    PathRef file("T:\\prefs.ini", PathRef::StringDisplay());
    ConfigValue value(kConfigPStr), paths(kConfigPLst);
    ConfigTypeFromString(kConfigPLst, "C:\\a;C:\\b", 9, paths.Pointer());
    LStrArrayHandle keys = nullptr, texts = nullptr;
    LStrHandle section = nullptr;
    int32 count = 0;
    const std::function<MgErr()> operations[] = {
        [&] { return main.Write(kConfigPLst, "paths", paths.Pointer(), true); },
        [&] { return main.GetDefault(kConfigPLst, "paths", paths.Pointer()); },
        [&] { return main.GetInMemoryConfigList(&keys, &texts, &count); },
        [&] { return CfgGetHostPrefsSection(&section); },
        [&] { return CfgGetDefaultFrom(&file, kConfigPStr, Key("PStr"), value.Pointer()); },
        [&] { return main.Write(kConfigPStr, "PStr", value.Pointer(), false); },
    };
    for (const auto& operation : operations) {
        int failures = 0;
        for (bool failed = true; failed;) {
            const FailingAllocator failing(failures + 1);
            const MgErr err = operation();
            failed = failing.HasFailed();
            EXPECT_TRUE(failed ? err == kMemFullErr || err == kConfigMemErr || !err : !err) << err;
            failures += failed;
        }
        EXPECT_GT(failures, 0) << &operation - operations;
    }
    EXPECT_EACH(count == 1, started.File() == "[App]\r\nPStr=\"x\"\r\n");
    ReallocLStrArrayHandle(&keys, 0);
    ReallocLStrArrayHandle(&texts, 0);
    DSDisposeHandle(reinterpret_cast<UHandle>(section));
}

// ---- names of files, enumerations -----------------------------------------------------------------------------------

TEST(ConfigManager, NamesPreferenceFiles) {
    for (const auto& [text, name] :
         std::vector<std::pair<std::string, std::string>>{{"C:\\dir\\app.exe", "C:\\dir\\app.ini"},
                                                          {".profile", ".profile.ini"},
                                                          {"app", "app.ini"},
                                                          {"a.b.c", "a.b.ini"},
                                                          {"", ".ini"}}) {
        char buffer[32];
        text.copy(buffer, sizeof buffer);
        buffer[text.size()] = 0;
        EXPECT_EACH(GetConfigPath(buffer, buffer, 0) == kNoErr, name == buffer);
    }
    StartedConfig started;
    ::setenv("TESSEL_REGISTRY", started.drive.Native("registry").c_str(), 1);
    char buffer[260] = "x";
    EXPECT_EACH(CfgGetPathToPreviousVersion("Prod", "1.0", "app.exe", buffer) == kRegistryErr, buffer == "");
    AutoRelease<IWinRegistryKey> key;
    GetLocalMachineRegistryKey(0)->CreateSubKey("SOFTWARE\\BRENMOOR\\Prod\\1.0", key.Out());
    EXPECT_EQ(2, CfgGetPathToPreviousVersion("Prod", "1.0", "app.exe", buffer));
    key->SetStringValue("Path", "C:\\old\\");
    EXPECT_EACH(CfgGetPathToPreviousVersion("Prod", "1.0", "app.exe", buffer) == kNoErr, buffer == "C:\\old\\app.ini",
                CfgGetPathToPreviousVersion("Prod", "1.0", std::string(252, 'x').c_str(), buffer) == kArgErr);
    key->SetValue("Path", kRegistryTypeInt32, "abcd", 4);
    EXPECT_EQ(kRegistryTypeErr, CfgGetPathToPreviousVersion("Prod", "1.0", "app.exe", buffer));
    ::unsetenv("TESSEL_REGISTRY");
}

int32 theColours = 0;

TEST(ConfigManager, EnumerationsAreNamesOfAStringList) {
    StartedConfig started("[App]\na=GREEN\nb=blue\n");
    RCreateMemFile(&started.application.resources, 0, 0);
    UHandle list = nullptr;
    DSPtrToHand("\0\2\3red\5green", &list, 12);
    RAdd(list, started.application.resources, TESSEL_FOURCC('S', 'T', 'R', '#'), 128, nullptr);
    constexpr int32 kColour = 0x6C6F4345;
    ConfigFromTextProc fromText = [](const char* text, int32 length, void* value) {
        return ConfigParseGetPStrRsrcIndex(0, static_cast<int32*>(value), text, length, theColours, true);
    };
    ConfigToTextProc toText = [](const void* value, LStrHandle* text) {
        return ConfigWriteEnumPStr(0, theColours, *static_cast<const int32*>(value), text);
    };
    EXPECT_EACH(CfgEnumTypeInit(kColour, fromText, toText, 128, &theColours) == kNoErr,
                CfgEnumTypeInit(kColour, fromText, toText, 129, &theColours) == kGenericErr);
    int32 colour = 1;
    EXPECT_EACH(CfgGetDefault(kColour, Key("a"), &colour) == kNoErr, colour == 2,
                CfgGetDefault(kColour, Key("b"), &colour) == kConfigKeyErr);
    colour = 1;
    EXPECT_EACH(CfgWrite(kColour, Key("a"), &colour) == kNoErr, started.File() == "[App]\r\na=red\r\nb=blue\r\n");
    colour = 3;
    EXPECT_EACH(
        CfgWrite(kColour, Key("a"), &colour) == kResNotFoundErr,
        (Texts{"Failed to find correct value for enumeration string."}) == started.reports.Texts(kDebugWarning));
    const RsrcFile file = started.application.resources;
    EXPECT_EACH(ConfigParseGetPStrRsrcIndex(file, &colour, "Red", 3, 128, false) == kConfigKeyErr, colour == -1,
                ConfigParseGetPStrRsrcIndex(file, &colour, "", 0, 128, false) == kArgErr,
                ConfigParseGetPStrRsrcIndex(file, &colour, "red", 3, 129, false) == kResNotFoundErr,
                ConfigParseGetPStrRsrcIndex(file + 1, &colour, "red", 3, 128, false) == kNotResFileErr,
                CfgEnumTypeUninit(kColour, &theColours) == kNoErr, theColours == 0,
                CfgGetDefault(kColour, Key("a"), &colour) == kConfigTypeErr);
    RCloseFile(file);
}

}  // namespace
}  // namespace tessel::test
