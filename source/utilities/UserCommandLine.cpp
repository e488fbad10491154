#include <tessel/utilities/UserCommandLine.h>

#include <cstdlib>
#include <cstring>

namespace {

struct Arguments {
    int32 count;
    char** args;
};

// Set by the host before other threads look; no lock.
Arguments gRaw, gUser, gApp;
int32 gIgnore;
char* gPrefsPath;

constexpr char kSeparator[] = "--";
constexpr char kPrefsArgument[] = "-pref";

bool Is(const char* arg, const char* what) {
    return arg && std::strcmp(arg, what) == 0;
}

bool BeginsWith(const char* arg, const char* what) {
    return std::strncmp(arg, what, std::strlen(what)) == 0;
}

// Gives the user the program's name and the arguments from `first` on.
MgErr SetUserArguments(int32 first) {
    int32 count = gRaw.count - first + 1;
    gUser.count = 0;
    gUser.args = static_cast<char**>(std::malloc(static_cast<size_t>(count) * sizeof(char*)));
    if (!gUser.args) return kMemFullErr;
    gUser.count = count;
    gUser.args[0] = gRaw.args[0];
    for (int32 i = 1; i < count; ++i) gUser.args[i] = gRaw.args[first + i - 1];
    return kNoErr;
}

void Get(const Arguments& from, int32* count, char*** args) {
    if (count) *count = from.count;
    if (args) *args = from.args;
}

}  // namespace

// ---- the process's command line -------------------------------------------------------------------------------------

MgErr InitUserCommandLine(int32 count, char** args) {
    gRaw = gApp = {count, args};
    if (count <= 0 || !args || gUser.args) return kArgErr;
    int32 separator = 0;
    if (!gIgnore) {
        while (separator < count && !Is(args[separator], kSeparator)) ++separator;
    }
    gApp.count = separator;
    return SetUserArguments(separator < count ? separator + 1 : count);
}

MgErr UninitUserCommandLine() {
    std::free(gUser.args);
    gRaw = gUser = gApp = {};
    gIgnore = 0;
    return kNoErr;
}

void SetIgnoreCommandLine(int32 ignore) {
    gIgnore = ignore;
}

void GetRawCommandLine(int32* count, char*** args) {
    Get(gRaw, count, args);
}

void GetUserCommandLine(int32* count, char*** args) {
    Get(gUser, count, args);
}

void GetAppCommandLine(int32* count, char*** args) {
    Get(gApp, count, args);
}

// ---- the preference path --------------------------------------------------------------------------------------------

MgErr SetPrefsPath(CStr path) {
    size_t size = path ? std::strlen(path) + 1 : 0;
    char* copy = path ? static_cast<char*>(std::malloc(size)) : nullptr;
    if (copy) std::memcpy(copy, path, size);
    std::free(gPrefsPath);
    gPrefsPath = copy;
    return path && !copy ? kMemFullErr : kNoErr;
}

CStr GetPrefsPath() {
    if (gPrefsPath) return gPrefsPath;
    CStr found = nullptr;
    for (int32 i = 0; i < gApp.count && !Is(gApp.args[i], kSeparator); ++i) {
        if (Is(gApp.args[i], kPrefsArgument) && i + 1 < gApp.count) found = gApp.args[++i];
    }
    return found;
}

bool ShouldIgnoreCommandLineArg(char* arg, int32* index) {
    if (!arg) return false;
    if (Is(arg, kPrefsArgument)) {
        if (index) ++*index;
        return true;
    }
    return BeginsWith(arg, "OV_ALLOC_TRACKER=") || BeginsWith(arg, "OV_USE_MALLOC=") || BeginsWith(arg, "tessel=");
}

// ---- arguments from one line ----------------------------------------------------------------------------------------

namespace {

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}

// The words of a line, one after the other.
class Words {
public:
    explicit Words(const char* line) : next_(line) {}

    // False when there is none left.
    bool Next() {
        while (IsBlank(*next_)) ++next_;
        if (!*next_) return false;
        bool quoted = *next_ == '"';
        if (quoted) ++next_;
        begin_ = end_ = next_;
        while (*end_ && (quoted ? *end_ != '"' : !IsBlank(*end_))) ++end_;
        next_ = *end_ ? end_ + 1 : end_;
        return true;
    }
    const char* Begin() const { return begin_; }
    size_t Length() const { return static_cast<size_t>(end_ - begin_); }

private:
    const char* next_;
    const char* begin_ = nullptr;
    const char* end_ = nullptr;
};

}  // namespace

void NewCommandLineArgsFromSingleLine(CStr line, char* first, int32* count, char*** args) {
    if (count) *count = 0;
    if (args) *args = nullptr;
    if (!count || !args) return;
    if (!line) line = "";
    size_t total = 1;
    for (Words words(line); words.Next();) ++total;
    // One block: the pointers, then the words, each with its terminator, which takes no more than the line.
    char** block = static_cast<char**>(std::malloc(total * sizeof(char*) + std::strlen(line) + 1));
    *args = block;
    *count = block ? static_cast<int32>(total) : 0;
    if (!block) return;
    char* text = reinterpret_cast<char*>(block + total);
    *block++ = first;
    for (Words words(line); words.Next();) {
        *block++ = text;
        std::memcpy(text, words.Begin(), words.Length());
        text += words.Length();
        *text++ = 0;
    }
}

void DeleteCommandLineArgsFromSingleLine(int32, char** args) {
    std::free(args);
}
