// Any bytes are read as a shortcut file. Cutting a file short may take its target away, never make the reader fail.
#include "platform/Shell.h"

#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    std::string target, again;
    const bool read = tessel::platform::ParseShortcut(bytes, "C:\\links\\", target);
    if (read && target.empty()) std::abort();
    if (read != tessel::platform::ParseShortcut(bytes, "C:\\links\\", again) || target != again) std::abort();
    tessel::platform::ParseShortcut(bytes.substr(0, size / 2), "", again);
    return 0;
}
