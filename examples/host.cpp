// A small host: it starts the library, keeps a few resources in a file, reads them through a chain, edits and packs the
// file, and stops the library again. On purpose it forgets one handle, to show how the library tells on it.
#include <tessel/tessel.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>

namespace {

constexpr ResType kStringList = TESSEL_FOURCC('S', 'T', 'R', '#');
constexpr ResType kString = TESSEL_FOURCC('S', 'T', 'R', ' ');
constexpr ResType kPathList = TESSEL_FOURCC('P', 'T', 'H', '#');
constexpr _FMFileType kFileType = TESSEL_FOURCC('D', 'E', 'M', 'O');
constexpr _FMFileCreator kCreator = TESSEL_FOURCC('H', 'O', 'S', 'T');

constexpr int32 kGreetings = 128;
constexpr int32 kPlaces = 7;

void Say(const std::string& text) {
    std::printf("%s\n", text.c_str());
}

// Every call that can fail goes through here.
void Must(MgErr err, const char* what) {
    if (!err) return;
    std::fprintf(stderr, "host: %s: %s (%d)\n", what, MgErrMeaning(err), err);
    std::exit(1);
}

// ---- reports --------------------------------------------------------------------------------------------------------

// The host's own handler: it shows what the library has to say instead of leaving that to the default one.
void ShowReport(CStr file, int32 line, CStr, int32 level, uint32, CStr text) {
    static const char* const kLevels[] = {"info", "trace", "warning", "error", "fatal"};
    std::string shown = text;
    while (!shown.empty() && shown.back() == '\n') shown.pop_back();
    std::printf("    [%s] %s  (%s:%d)\n", kLevels[level], shown.c_str(), file, line);
}

// ---- paths ----------------------------------------------------------------------------------------------------------

std::string TextOf(Path path) {
    UHandle text = PathToCString(path);
    std::string shown = text ? reinterpret_cast<const char*>(*text) : "?";
    DSDisposeHandle(text);
    return shown;
}

Path PathOf(const std::string& text) {
    Path path = nullptr;
    Must(FTextToPath(text.data(), static_cast<int32>(text.size()), &path), "FTextToPath");
    return path;
}

// ---- resource data, as they lie in the file -------------------------------------------------------------------------

std::string Big(uint32 value, int32 bytes) {
    std::string out;
    while (bytes-- > 0) out += static_cast<char>(value >> (8 * bytes));
    return out;
}

std::string PStrOf(const std::string& text) {
    return Big(static_cast<uint32>(text.size()), 1) + text;
}

// A count, then strings with a length byte.
std::string StringListOf(const std::vector<std::string>& texts) {
    std::string out = Big(static_cast<uint32>(texts.size()), 2);
    for (const std::string& text : texts) out += PStrOf(text);
    return out;
}

// A count, then flattened paths, each padded to a multiple of 4.
std::string PathListOf(const std::vector<std::string>& texts) {
    std::string out = Big(static_cast<uint32>(texts.size()), 4);
    for (const std::string& text : texts) {
        Path path = PathOf(text);
        std::string flat(static_cast<size_t>(FFlattenPath(path, nullptr)), '\0');
        FFlattenPath(path, reinterpret_cast<uint8*>(&flat[0]));
        FDestroyPath(&path);
        flat.resize((flat.size() + 3) & ~size_t{3});
        out += flat;
    }
    return out;
}

UHandle HandleOf(const std::string& bytes) {
    UHandle handle = nullptr;
    Must(DSPtrToHand(bytes.data(), &handle, static_cast<uint32>(bytes.size())), "DSPtrToHand");
    return handle;
}

void AddResource(RsrcFile file, ResType type, int32 id, const std::string& name, const std::string& bytes) {
    const std::string pstr = PStrOf(name);
    Must(RAdd(HandleOf(bytes), file, type, id, reinterpret_cast<ConstPStr>(pstr.data())), "RAdd");
}

uint32 SizeOnDisk(Path path) {
    FInfo64Rec info;
    Must(FGetInfo64(path, &info, kFInfoSize), "FGetInfo64");
    return static_cast<uint32>(info.size);
}

// ---- the chapters ---------------------------------------------------------------------------------------------------

void ShowMemory(const char* when) {
    uint32 counters[4] = {};
    uint32 heap[3] = {};
    DSReadCounters(counters);
    Must(DSMemStatsSlow(heap), "DSMemStatsSlow");
    std::printf("   Memory %s: %u bytes in use; so far %u handles made, %u pointers, %u resizes (%u moved data).\n",
                when, heap[1], counters[0], counters[1], counters[2], counters[3]);
}

void WriteFiles(Path phrases, Path fallback) {
    Say("\n1. A new resource file, " + TextOf(phrases));
    RsrcFile file = 0;
    Must(RCreateFile(phrases, 0, kCreator, kFileType, 0), "RCreateFile");
    Must(ROpenFile(phrases, kROpenReadWrite, &file, nullptr, nullptr), "ROpenFile");
    AddResource(file, kStringList, kGreetings, "greetings",
                StringListOf({"Good morning", "Good evening", "Good night"}));
    AddResource(file, kString, 1, "", PStrOf("one lonely string"));
    AddResource(file, kPathList, kPlaces, "places", PathListOf({"C:\\usr\\share", "..\\notes\\today.txt"}));
    Must(RCloseFile(file), "RCloseFile");
    std::printf("   It holds a string list called \"greetings\", a string and a list of paths: %u bytes on disk.\n",
                SizeOnDisk(phrases));

    Must(RCreateFile(fallback, 0, kCreator, kFileType, 0), "RCreateFile");
    Must(ROpenFile(fallback, kROpenReadWrite, &file, nullptr, nullptr), "ROpenFile");
    AddResource(file, kString, 1, "", PStrOf("the string of the file that is asked first"));
    Must(RCloseFile(file), "RCloseFile");
}

void ReadThroughChain(Path phrases, Path first) {
    Say("\n2. Both files read-only, one behind the other");
    RsrcFile files[2] = {};
    RsrcFile chain = 0;
    Must(ROpenFile(first, kROpenReadOnly, &files[0], nullptr, nullptr), "ROpenFile");
    Must(ROpenFile(phrases, kROpenReadOnly, &files[1], nullptr, nullptr), "ROpenFile");
    Must(RChain(&chain, 2, files), "RChain");

    std::string text;
    Must(tessel::RGetStringStd(chain, &text, 1), "RGetStringStd");
    Say("   String 1 is in both, and the first file wins: \"" + text + "\".");
    for (int32 index = 1; index <= 3; ++index) {
        Str255 greeting;
        Must(RGetIndString(chain, greeting, kGreetings, index), "RGetIndString");
        std::printf("   Greeting %d: %.*s\n", index, greeting[0], reinterpret_cast<const char*>(greeting + 1));
    }
    Str255 none;
    std::printf("   Greeting 4: %s\n", MgErrMeaning(RGetIndString(chain, none, kGreetings, 4)));
    for (int32 index = 1; index <= 2; ++index) {
        Path place = nullptr;
        Must(RGetIndPath(chain, &place, kPlaces, index), "RGetIndPath");
        Say("   Place " + std::to_string(index) + ": " + TextOf(place));
        FDestroyPath(&place);
    }
    const std::string name = PStrOf("GREETINGS");
    UHandle data = nullptr;
    int32 id = 0;
    Must(RGetNamed(chain, kStringList, reinterpret_cast<ConstPStr>(name.data()), &data), "RGetNamed");
    Must(RGetInfo(data, &id, nullptr, nullptr), "RGetInfo");
    std::printf("   \"GREETINGS\" is found by name, whatever its case: ID %d, %u bytes.\n", id, DSGetHandleSize(data));
    ShowMemory("with two files open");
    Must(RDestroyChain(chain), "RDestroyChain");
    for (const RsrcFile file : files) Must(RCloseFile(file), "RCloseFile");
}

void Edit(Path phrases) {
    Say("\n3. The file once more, for writing");
    const uint32 before = SizeOnDisk(phrases);
    RsrcFile file = 0;
    Must(ROpenFile(phrases, kROpenReadWrite, &file, nullptr, nullptr), "ROpenFile");

    const std::string shorter = StringListOf({"Hello"});
    UHandle data = nullptr;
    Must(RGet(file, kStringList, kGreetings, &data), "RGet");
    Must(DSSetHandleFromPtr(&data, shorter.data(), static_cast<uint32>(shorter.size())), "DSSetHandleFromPtr");
    Must(RChanged(data), "RChanged");
    Say("   The greetings become a single \"Hello\".");

    Must(RGet(file, kString, 1, &data), "RGet");
    Must(RRemove(data, file), "RRemove");
    Must(DSDisposeHandle(data), "DSDisposeHandle");
    Say("   The lonely string goes; its data stay in the file until the next update packs it.");

    Must(RUpdateFile(file), "RUpdateFile");
    std::printf("   Updated: %u bytes before, %u now, no hole in it.\n", before, SizeOnDisk(phrases));
    Must(RCloseFile(file), "RCloseFile");
}

std::string FirstEntryOf(const std::filesystem::path& report, const std::string& function) {
    std::ifstream in(report);
    std::string line, entry;
    while (std::getline(in, line)) {
        if (line.compare(0, 5, "-----") == 0) {
            if (entry.find(function) != std::string::npos) break;
            entry.clear();
        } else {
            entry += "    " + line + "\n";
        }
        if (line.find(function) != std::string::npos) break;
    }
    return entry;
}

}  // namespace

// Outside of the anonymous namespace and visible, so that the leak report can tell its name.
__attribute__((visibility("default"), noinline)) UHandle ForgetToDisposeOfThisHandle() {
    UHandle handle = DSNewHandle(42);
    if (handle) std::memcpy(*handle, "nobody will ever dispose of these bytes...", 42);
    return handle;
}

int main() {
    // A folder of our own for the files and the leak reports, removed at the end.
    namespace fs = std::filesystem;
    const fs::path folder = fs::temp_directory_path() / ("tessel-host-" + std::to_string(std::random_device{}()));
    fs::create_directory(folder);
    setenv("TMPDIR", folder.c_str(), 1);

    Say("The library starts, and says what it does");
    DebugOutputSetHandler(ShowReport);
    Must(InitTesselBase(), "InitTesselBase");
    Must(InitTesselAppSupport(), "InitTesselAppSupport");

    Path here = nullptr;
    Must(FGetStdTmpDirPath(&here), "FGetStdTmpDirPath");
    Path phrases = PathOf(TextOf(here) + "\\phrases.rsrc");
    Path first = PathOf(TextOf(here) + "\\first.rsrc");
    WriteFiles(phrases, first);
    ReadThroughChain(phrases, first);
    Edit(phrases);

    Say("\n4. The end. One handle is forgotten on purpose, and the library says so as it stops");
    ForgetToDisposeOfThisHandle();
    FDestroyPath(&first);
    FDestroyPath(&phrases);
    FDestroyPath(&here);
    UninitTesselAppSupport();
    UninitTesselBase();

    const std::string entry = FirstEntryOf(folder / "ovHandleLeaks.txt", "ForgetToDisposeOfThisHandle");
    Say("\n   ovHandleLeaks.txt names the function that made it:\n" + entry);
    fs::remove_all(folder);
    return entry.empty() ? 1 : 0;
}
