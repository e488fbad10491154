// `tessel prefs`: preference files from the command line.
#ifndef TESSEL_TOOLS_PREFS_H
#define TESSEL_TOOLS_PREFS_H

#include <string>
#include <vector>

namespace tool {

// Runs `FILE VERB ...`. Returns the exit status. Throws UsageError and Refusal.
int RunPrefs(const std::vector<std::string>& words);

}  // namespace tool

#endif
