// Any line becomes arguments, which are split and looked through.
#include <tessel/utilities/UserCommandLine.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

void Check(bool holds) {
    if (!holds) std::abort();
}

void CheckWords(const std::string& line, int32 count, char** args) {
    size_t bytes = 0;
    for (int32 i = 1; i < count; ++i) {
        bytes += std::strlen(args[i]);
        Check(line.find(args[i]) != std::string::npos);
    }
    Check(bytes <= line.size());
}

void CheckSplit(int32 count, char** args) {
    int32 userCount = 0, appCount = 0;
    char **user = nullptr, **app = nullptr;
    Check(InitUserCommandLine(count, args) == kNoErr);
    GetUserCommandLine(&userCount, &user);
    GetAppCommandLine(&appCount, &app);
    Check(app == args && user[0] == args[0]);
    Check(appCount + userCount == (appCount == count ? count + 1 : count));  // the separator is nobody's
    if (CStr path = GetPrefsPath()) Check(std::strlen(path) < 1u << 20);
    for (int32 i = 0; i < appCount; ++i) ShouldIgnoreCommandLineArg(app[i], &i);
    UninitUserCommandLine();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string line(reinterpret_cast<const char*>(data), size);
    char first[] = "prog";
    int32 count = 0;
    char** args = nullptr;
    NewCommandLineArgsFromSingleLine(line.c_str(), first, &count, &args);
    Check(args && count >= 1 && args[0] == first);
    CheckWords(line, count, args);
    CheckSplit(count, args);
    DeleteCommandLineArgsFromSingleLine(count, args);
    return 0;
}
