// Settings and their collections: defaults, checks, what is saved, the registry.
#include "config/ConfigTestSupport.h"

namespace tessel::test {
namespace {

// A policy, and a check that gives the result it was told to, and counts.
struct Checker : CfgDataValidator {
    CfgDataValidationPolicy Policy(void* context) override {
        EXPECT_EQ(this, context);
        return static_cast<CfgDataValidationPolicy>(policy);
    }
    MgErr Check(CfgData&, MgErr, uint32 flags, void* context, CfgSettings*) override {
        EXPECT_TRUE(context == this && flags == 7);
        ++checks;
        return result;
    }
    int policy = 0, checks = 0;
    MgErr result = kNoErr;
};

using WithDefault = CfgData_T<int32, kConfigI32>;
using WithoutDefault = CfgDataNoDefault_T<int32, kConfigI32>;

TEST(CfgSettings, ReadsASettingAsThePolicySays) {
    StartedConfig started("[App]\ngood=5\nbad=x\n");
    // For each policy: the result and (for a setting with a default of 9) the value, with a check that passes and one
    // that fails with 8, and whether it was checked.
    const struct {
        const char* key;
        int policy;
        MgErr passed, failed, passedWithout, failedWithout;
        int32 valuePassed, valueFailed;
        bool checked, checkedWithout;
    } rows[] = {
        {"good", 0, 0, 0, 0, 0, 5, 5, false, false},     {"none", 0, 0, 0, 0, 8, 9, 9, false, true},
        {"bad", 0, 0, 0, 0, 8, 9, 9, true, true},        {"good", 1, 0, 0, 0, 8, 5, 9, true, true},
        {"none", 1, 0, 0, 0, 8, 9, 9, true, true},       {"bad", 1, 0, 0, 0, 8, 9, 9, true, true},
        {"good", 2, 0, 0, 0, 8, 5, 9, true, true},       {"none", 2, 0, 0, 20, 20, 9, 9, false, false},
        {"bad", 2, 21, 21, 21, 21, 9, 9, false, false},  {"good", 3, 0, 0, 0, 8, 9, 9, true, true},
        {"good", 4, 0, 0, 0, 0, 5, 5, false, false},     {"none", 4, 0, 0, 20, 20, 9, 9, false, false},
        {"bad", 99, 21, 21, 21, 21, 9, 9, false, false}, {nullptr, 4, 0, 0, 0, 0, 9, 9, false, false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.key ? row.key : "nameless") + std::to_string(row.policy));
        for (MgErr result : {kNoErr, kPermissionErr}) {
            Checker checker, checkerWithout;
            checker.policy = checkerWithout.policy = row.policy;
            checker.result = checkerWithout.result = result;
            WithDefault data(row.key, 9);
            WithoutDefault bare(row.key);
            EXPECT_EACH(
                (result ? row.failed : row.passed) == CfgDataInit(&data, nullptr, &checker, 7, &checker, nullptr),
                (result ? row.valueFailed : row.valuePassed) == data.Get(),
                (result ? row.failedWithout : row.passedWithout) ==
                    CfgDataInit(&bare, nullptr, &checkerWithout, 7, &checkerWithout, nullptr),
                row.checked == (checker.checks == 1), row.checkedWithout == (checkerWithout.checks == 1));
        }
    }
    EXPECT_EACH(started.reports.Has(kDebugWarning,
                                    "cfgAlwaysUseDefaultValuePolicy cannot be used without providing a default value!"),
                started.reports.Has(kDebugWarning,
                                    "The setting \"bad\" cannot be read (text cannot be converted to the "
                                    "configuration type); its default holds."),
                CfgDataInit(nullptr, nullptr, nullptr, 0, nullptr, nullptr) == kArgErr);
}

TEST(CfgSettings, SavesASettingAsThePolicySays) {
    // What is in the file afterwards, of a key that had 1: "" when it was removed.
    const struct {
        int policy;
        MgErr err;
        const char *isDefault, *isOther, *hasNone;
    } rows[] = {{0, kNoErr, "1", "1", "1"},  {1, kNoErr, "", "4", "4"}, {2, kNoErr, "", "4", "1"},
                {3, kNoErr, "9", "4", "4"},  {4, kNoErr, "", "", ""},   {5, kArgErr, "1", "1", "1"},
                {-1, kArgErr, "1", "1", "1"}};
    for (const auto& row : rows) {
        StartedConfig started("[App]\nd=1\no=1\nn=1\n");
        WithDefault same("d", 9), other("o", 9), nameless(nullptr, 9);
        WithoutDefault none("n", 4);
        other.Set(4);
        for (CfgData* data :
             {static_cast<CfgData*>(&same), static_cast<CfgData*>(&other), static_cast<CfgData*>(&none)})
            EXPECT_EQ(row.err, CfgDataSave(data, static_cast<CfgSavePolicy>(row.policy), nullptr));
        EXPECT_EQ(kNoErr, CfgDataSave(&nameless, static_cast<CfgSavePolicy>(row.policy), nullptr));
        for (const auto& [key, text] : {std::pair("d", row.isDefault), {"o", row.isOther}, {"n", row.hasNone}}) {
            std::string read;
            GetMainCfgAccess()->GetDefault(kConfigNStr, key, &read);
            EXPECT_EQ(text, read) << key << row.policy;
        }
    }
    EXPECT_EQ(kArgErr, CfgDataSave(nullptr, kCfgSaveAlways, nullptr));
    WithDefault data("d", 1);
    EXPECT_EQ(kGenericErr, CfgDataSave(&data, kCfgSaveAlways, nullptr)) << "nothing is started";
}

TEST(CfgSettings, ChecksPathsForWhatIsOnDisk) {
    StartedConfig started("[App]\nfile=T:\\prefs.ini\nfolder=T:\\\nnone=T:\\x\n");
    constexpr uint32 kTop = kCfgPathCheckDefaultToo;
    const PathRef good("T:\\prefs.ini", PathRef::StringDisplay()), bad("T:\\y", PathRef::StringDisplay());
    const struct {
        const char* key;
        uint32 flags;
        MgErr err;
    } rows[] = {{"file", kCfgPathFile, 0},       {"file", kCfgPathFolder, 10},
                {"file", kCfgPathMissing, 10},   {"folder", kCfgPathFolder, 0},
                {"folder", kCfgPathFile, 10},    {"none", kCfgPathMissing, 0},
                {"none", kCfgPathFile, 7},       {"none", kCfgPathFolder, 7},
                {"none", kCfgPathAnything, 0},   {"none", 3, 1},
                {"file", kCfgPathFile | kTop, 0}};
    CfgPathValidator validator;
    for (const auto& row : rows) {
        CfgDataNoDefault_T<PathRef, kConfigPath> data(row.key);
        EXPECT_EQ(row.err, CfgDataInit(&data, nullptr, &validator, row.flags, nullptr, nullptr))
            << row.key << row.flags;
        EXPECT_EQ(row.err > kArgErr, !data.Get().IsValid()) << row.key;
    }
    CfgData_T<PathRef, kConfigPath> fallsBack("none", good), hasBadDefault("file", bad);
    EXPECT_EACH(CfgDataInit(&fallsBack, nullptr, &validator, kCfgPathFile | kTop, nullptr, nullptr) == kNoErr,
                fallsBack.EqualsDefault(), fallsBack.Get().Equals(good, PathRef::kExact),
                validator.Check(hasBadDefault, 0, kCfgPathMissing, nullptr, nullptr) == kNoErr,
                validator.Check(hasBadDefault, 0, kCfgPathFile | kTop, nullptr, nullptr) == kNotFoundErr,
                !hasBadDefault.GetDefault().IsValid());
    WithDefault number("n", 1);
    EXPECT_EQ(kArgErr, validator.Check(number, 0, kCfgPathAnything, nullptr, nullptr));
}

// ---- collections ----------------------------------------------------------------------------------------------------

struct GridData {
    CfgData_T<int32, kConfigBool> show{"Show", 1};
    WithoutDefault step{"Step"};
    CfgData_T<std::string, kConfigNStr> name{"Name", "grid"};
    void AddTo(CfgSettings& settings) {
        settings.Add(&show);
        settings.Add(&step);
        settings.Add(&name, 3);
    }
};

TEST(CfgSettings, ACollectionIsReadSavedAndReleased) {
    StartedConfig started("[App]\nShow=maybe\nStep=4\n");
    CfgSettings_T<GridData> grid("Grid", "main"), twin("Grid main");
    EXPECT_EACH(grid.Get() == nullptr, CfgSettingsInit(&grid, nullptr, nullptr, nullptr) == kConfigTextErr,
                grid->show.Get() == 1, grid->step.Get() == 4, grid->name.Get() == "grid", grid->show.IsDefaulted(),
                !grid->step.IsDefaulted());
    EXPECT_EQ(&grid, CfgSettingsRegistry::Find("Grid main")) << "every setting has a value";
    EXPECT_EACH(grid.FlagsAt(2) == 3u, grid.FlagsAt(3) == 0u);
    CfgSettingsInit(&twin, nullptr, nullptr, nullptr);
    EXPECT_EQ(kExistsErr, CfgSettingsRegistry::Register(&twin));

    grid->step.Set(6);
    grid->name.Set("x;y");
    EXPECT_EACH(CfgSettingsSave(&grid, nullptr, kCfgSaveNever) == kNoErr,
                CfgSettingsSaveOneSetting(&grid, 3, nullptr, kCfgSaveAlways) == kArgErr,
                CfgSettingsSaveOneSetting(&grid, -1, nullptr, kCfgSaveAlways) == kArgErr,
                started.File() == "[App]\nShow=maybe\nStep=4\n",
                CfgSettingsSaveOneSetting(&grid, 1, nullptr, kCfgSaveOrRemoveDefault) == kNoErr,
                started.File() == "[App]\r\nShow=maybe\r\nStep=6\r\n",
                CfgSettingsUninit(&grid, kCfgSaveOrRemoveDefault, nullptr) == kNoErr,
                started.File() == "[App]\r\nStep=6\r\nName=\"x;y\"\r\n", grid.Get() == nullptr, grid.Count() == 0,
                !CfgSettingsRegistry::Find("Grid main"));
    // Again, after its settings were destroyed.
    EXPECT_EACH(CfgSettingsInit(&grid, nullptr, nullptr, nullptr) == kNoErr, grid->name.Get() == "x;y",
                (Texts{"Grid main"}) == CfgSettingsRegistry::Names(), CfgRemove(kConfigI32, Key("Step")) == kNoErr,
                CfgSettingsUninit(&grid, kCfgSaveNever, nullptr) == kNoErr,
                CfgSettingsInit(&grid, nullptr, nullptr, nullptr) == kConfigKeyErr);
    EXPECT_THAT(CfgSettingsRegistry::Names(), IsEmpty()) << "one setting has no value";
}

TEST(CfgSettings, ACheckCanEndTheReading) {
    StartedConfig started("[App]\na=1\nb=2\n");
    WithoutDefault a("a"), b("b");
    Checker checker;
    checker.policy = cfgAlwaysCheckPolicy;
    checker.result = -1;
    CfgSettings settings;
    settings.Add(&a, 7);
    settings.Add(&b, 7);
    EXPECT_EACH(CfgSettingsInit(&settings, nullptr, &checker, &checker) == -1, checker.checks == 1,
                CfgSettingsRegistry::Find(settings.Name().c_str()) == nullptr);
    const std::string first = settings.Name(), second = CfgSettings(nullptr, "q").Name();
    ASSERT_EQ(0u, first.find("<unnamed settings "));
    EXPECT_EQ("<unnamed settings " + std::to_string(std::stoi(first.substr(18)) + 1) + "> q", second);
}

}  // namespace
}  // namespace tessel::test
