// `tessel rsrc`: resource files from the command line.
#ifndef TESSEL_TOOLS_RSRC_H
#define TESSEL_TOOLS_RSRC_H

#include <string>
#include <vector>

namespace tool {

// Runs the verb that `words` begins with. Returns the exit status. Throws UsageError and Refusal.
int RunRsrc(const std::vector<std::string>& words);

}  // namespace tool

#endif
