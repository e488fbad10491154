// The command `tessel`: what the library does with files, from the command line.
#include "Prefs.h"
#include "Rsrc.h"
#include "Support.h"

#include <cstdio>
#include <exception>
#include <string>
#include <vector>

namespace {

constexpr int kRefused = 1;
constexpr int kWrongUsage = 2;

void PrintHelp() {
    std::printf(
        "usage: tessel COMMAND ARGUMENTS\n"
        "\n"
        "  prefs    lists, reads, changes and checks preference files\n"
        "  rsrc     lists, reads, creates, changes and checks resource files\n"
        "\n"
        "`tessel COMMAND --help` says more. FILE names are those of this system.\n"
        "Exit status: 0 done, 1 refused (the reason is on standard error), 2 wrong usage.\n");
}

int Run(const std::vector<std::string>& words) {
    if (words.empty()) throw tool::UsageError{"a command is missing"};
    if (words[0] == "--help" || words[0] == "-h") {
        PrintHelp();
        return 0;
    }
    const std::vector<std::string> rest(words.begin() + 1, words.end());
    if (words[0] == "prefs") return tool::RunPrefs(rest);
    if (words[0] == "rsrc") return tool::RunRsrc(rest);
    throw tool::UsageError{"there is no command " + words[0]};
}

}  // namespace

int main(int count, char** words) {
    try {
        return Run(std::vector<std::string>(words + 1, words + count));
    } catch (const tool::UsageError& error) {
        std::fprintf(stderr, "tessel: %s\nTry `tessel --help`.\n", error.message.c_str());
        return kWrongUsage;
    } catch (const tool::Refusal& refusal) {
        std::fprintf(stderr, "tessel: %s: %s: %s (%d)\n", refusal.subject.c_str(), refusal.operation.c_str(),
                     refusal.cause.c_str(), refusal.code);
        return kRefused;
    } catch (const std::exception& error) {
        std::fprintf(stderr, "tessel: %s\n", error.what());
        return kRefused;
    }
}
