// Preference files: reading, looking up, saving.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <QSettings>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <glib.h>
#include <ini.h>
#include <random>
#include <string>
#include <vector>

namespace {

using namespace tessel;
using bench::Keep;

void Require(bool holds, const char* what) {
    if (holds) return;
    std::fprintf(stderr, "%s\n", what);
    std::exit(1);
}

// A file of about 1 MB in a folder of its own.
class LargeFile {
public:
    static constexpr int kSections = 2000, kKeys = 20;

    LargeFile() {
        std::string name = std::filesystem::temp_directory_path() / "tessel-bench-XXXXXX";
        Require(mkdtemp(name.data()) != nullptr, "no folder");
        folder_ = name;
        std::ofstream file(Name("ours.ini"), std::ios::binary);
        for (int section = 0; section < kSections; ++section) {
            file << '[' << Section(section) << "]\r\n";
            for (int key = 0; key < kKeys; ++key) file << Key(key) << '=' << section * 7919 + key << "\r\n";
            file << "\r\n";
        }
        file.close();
        std::filesystem::copy(Name("ours.ini"), Name("theirs.ini"));
        std::printf("The file has %ju bytes.\n\n",
                    static_cast<std::uintmax_t>(std::filesystem::file_size(Name("ours.ini"))));
    }
    ~LargeFile() { std::filesystem::remove_all(folder_); }
    LargeFile(const LargeFile&) = delete;
    LargeFile& operator=(const LargeFile&) = delete;

    static std::string Section(int number) { return "Section" + std::to_string(number); }
    static std::string Key(int number) { return "windowPosition" + std::to_string(number); }
    std::string Name(const char* inside) const { return folder_ / inside; }
    PathRef Ours() const {
        Path path = nullptr;
        Require(NativeToPath(Name("ours.ini").c_str(), &path) == kNoErr, "no path");
        const PathRef ours(path);
        PathRef::DisposePath(path);
        return ours;
    }

private:
    std::filesystem::path folder_;
};

GKeyFile* LoadTheirs(const LargeFile& file) {
    GKeyFile* const theirs = g_key_file_new();
    Require(g_key_file_load_from_file(theirs, file.Name("theirs.ini").c_str(), G_KEY_FILE_NONE, nullptr),
            "GKeyFile cannot load");
    return theirs;
}

void CompareReading(bench::Table& table, const LargeFile& file) {
    const PathRef path = file.Ours();
    const bench::Loop ours = [&](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            BMINIConfigOperations store(path, "Section1999");
            Require(store.HasKey("windowPosition19"), "not read");
        }
    };
    const bench::Loop keyFile = [&](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            GKeyFile* const theirs = LoadTheirs(file);
            Require(g_key_file_has_key(theirs, "Section1999", "windowPosition19", nullptr), "not read");
            g_key_file_free(theirs);
        }
    };
    const bench::Loop inih = [&](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            int count = 0;
            const auto take = [](void* user, const char*, const char*, const char*) {
                return ++*static_cast<int*>(user);
            };
            Require(ini_parse(file.Name("theirs.ini").c_str(), take, &count) == 0, "inih cannot read");
            Require(count == LargeFile::kSections * LargeFile::kKeys, "inih has not read all");
        }
    };
    table.Compare("read a 1 MB file: 2,000 sections of 20 keys", ours, "GKeyFile", keyFile, 0.4);
    table.Compare("the same", ours, "inih: a callback a key", inih, 0.8);
}

void CompareLookingUp(bench::Table& table, const LargeFile& file) {
    struct Place {
        std::string section, key;
    };
    std::vector<Place> places(4096);
    std::mt19937 random(1);
    for (Place& place : places) {
        place = {LargeFile::Section(static_cast<int>(random() % LargeFile::kSections)),
                 LargeFile::Key(static_cast<int>(random() % LargeFile::kKeys))};
    }
    BMINIConfigOperations store(file.Ours(), "a");
    GKeyFile* const theirs = LoadTheirs(file);
    std::string value;
    Require(store.HasKey(places[0].section, places[0].key), "not read");  // the first time reads the file
    table.Compare(
        "look up one key by section and name among 40,000",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                const Place& place = places[i % places.size()];
                Require(store.GetValue(place.section, place.key, &value) == kNoErr, "not found");
            }
        },
        "g_key_file_get_string",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                const Place& place = places[i % places.size()];
                char* const text = g_key_file_get_string(theirs, place.section.c_str(), place.key.c_str(), nullptr);
                Require(text != nullptr, "not found");
                g_free(text);
            }
        },
        1.0);
    g_key_file_free(theirs);
}

void CompareSaving(bench::Table& table, const LargeFile& file) {
    BMINIConfigOperations store(file.Ours(), "Section1000");
    GKeyFile* const theirs = LoadTheirs(file);
    int round = 0;
    table.Compare(
        "change one value and save the 1 MB file",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i)
                Require(store.SetValue("windowPosition7", std::to_string(++round)) == kNoErr, "not saved");
        },
        "GKeyFile set + save",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                g_key_file_set_string(theirs, "Section1000", "windowPosition7", std::to_string(++round).c_str());
                Require(g_key_file_save_to_file(theirs, file.Name("theirs.ini").c_str(), nullptr), "not saved");
            }
        },
        0.8);
    g_key_file_free(theirs);
}

// A setting of the main preference file, which nobody changes meanwhile.
void CompareSettings(bench::Table& table) {
    static constexpr uint8 kKey[] = "\17windowPosition7";
    Path path = nullptr;
    char native[1024];
    int32 value = 12345;
    Require(CfgWrite(kConfigI32, kKey, &value) == kNoErr, "not written");
    Require(CfgGetPrefFilePath(&path) == kNoErr && PathToNative(path, native, sizeof native) == kNoErr, "no name");
    PathRef::DisposePath(path);
    const QSettings theirs(native, QSettings::IniFormat);
    const QString theirKey("Bench/windowPosition7");
    Require(theirs.value(theirKey).toInt() == value, "not read");
    table.Compare(
        "CfgGetDefault of an I32 with no file change",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i)
                Require(CfgGetDefault(kConfigI32, kKey, &value) == kNoErr, "not read");
        },
        "QSettings::value().toInt()",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) Keep(theirs.value(theirKey).toInt());
        },
        1.0);
}

// The preferences are in a file of their own.
struct Application : MGAppInterface {
    Application() {
        MGAppInterfaceSet(this);
        SetPrefsPath(file.c_str());
    }
    ~Application() {
        MGAppInterfaceSet(nullptr);
        std::filesystem::remove(file);
    }
    CStr ApplicationName() override { return "Bench"; }

    const std::string file = std::filesystem::temp_directory_path() / "tessel-bench.ini";
};

}  // namespace

int main() {
    const Application application;
    if (InitTesselBase() != kNoErr || InitTesselAppSupport() != kNoErr) return 1;
    {
        const LargeFile file;
        bench::Table table("config");
        CompareReading(table, file);
        CompareLookingUp(table, file);
        CompareSaving(table, file);
        CompareSettings(table);
    }
    UninitTesselAppSupport();
    return UninitTesselBase();
}
