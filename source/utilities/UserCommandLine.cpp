// What of the command line is the host's and what the user's.
#include <tessel/utilities/UserCommandLine.h>

#include <cstdlib>
#include <cstring>

namespace {

struct Arguments {
    int32 count;
    char** args;
};

// Set by the host before other threads look; no lock.
Arguments rawArguments, userArguments, appArguments;
int32 ignoresArguments;
char* prefsPath;

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
    int32 count = rawArguments.count - first + 1;
    userArguments.count = 0;
    userArguments.args = static_cast<char**>(std::malloc(static_cast<size_t>(count) * sizeof(char*)));
    if (!userArguments.args) return kMemFullErr;
    userArguments.count = count;
    userArguments.args[0] = rawArguments.args[0];
    for (int32 i = 1; i < count; ++i) userArguments.args[i] = rawArguments.args[first + i - 1];
    return kNoErr;
}

void Get(const Arguments& from, int32* count, char*** args) {
    if (count) *count = from.count;
    if (args) *args = from.args;
}

}  // namespace

// ---- the process's command line -------------------------------------------------------------------------------------

MgErr InitUserCommandLine(int32 count, char** args) {
    rawArguments = appArguments = {count, args};
    if (count <= 0 || !args || userArguments.args) return kArgErr;
    int32 separator = 0;
    if (!ignoresArguments) {
        while (separator < count && !Is(args[separator], kSeparator)) ++separator;
    }
    appArguments.count = separator;
    return SetUserArguments(separator < count ? separator + 1 : count);
}

MgErr UninitUserCommandLine() {
    std::free(userArguments.args);
    rawArguments = userArguments = appArguments = {};
    ignoresArguments = 0;
    return kNoErr;
}

void SetIgnoreCommandLine(int32 ignore) {
    ignoresArguments = ignore;
}

void GetRawCommandLine(int32* count, char*** args) {
    Get(rawArguments, count, args);
}

void GetUserCommandLine(int32* count, char*** args) {
    Get(userArguments, count, args);
}

void GetAppCommandLine(int32* count, char*** args) {
    Get(appArguments, count, args);
}

// ---- the preference path --------------------------------------------------------------------------------------------

MgErr SetPrefsPath(CStr path) {
    size_t size = path ? std::strlen(path) + 1 : 0;
    char* copy = path ? static_cast<char*>(std::malloc(size)) : nullptr;
    if (copy) std::memcpy(copy, path, size);
    std::free(prefsPath);
    prefsPath = copy;
    return path && !copy ? kMemFullErr : kNoErr;
}

CStr GetPrefsPath() {
    if (prefsPath) return prefsPath;
    CStr found = nullptr;
    for (int32 i = 0; i < appArguments.count && !Is(appArguments.args[i], kSeparator); ++i) {
        if (Is(appArguments.args[i], kPrefsArgument) && i + 1 < appArguments.count) found = appArguments.args[++i];
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
