#include "platform/CodePage.h"
#include "platform/Debugger.h"
#include "platform/FileSystem.h"
#include "platform/Module.h"
#include <tessel/base/MGModule.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <new>
#include <string>
#include <string_view>

namespace tessel {
namespace {

constexpr size_t kExtensionLength = 4;  // with its dot
constexpr size_t kShortestWithLocation = 7;

std::atomic<MGModuleHandle> executableModule{0};
std::atomic<MGModuleHandle> ownModule{0};

int32 CopyText(const std::string& text, char* buffer, size_t size) {
    const size_t length = std::min(text.size(), size - 1);
    std::memcpy(buffer, text.data(), length);
    buffer[length] = 0;
    return static_cast<int32>(length);
}

int32 ModulePath(MGModuleHandle module, char* buffer, size_t size) {
    buffer[0] = 0;
    std::string name;
    if (!platform::ModuleFileName(module, name)) {
        platform::DebuggerOutput("failed to get module filename\n");
        return 0;
    }
    std::string longName;
    if (!platform::ItemRealPath(name.c_str(), longName)) {
        platform::DebuggerOutput("GetLongPathName failed\n");
        longName = name;
    }
    return CopyText(longName.size() < size ? longName : name, buffer, size);
}

// A module's file name, taken apart.
class ModuleName {
public:
    explicit ModuleName(MGModuleHandle module) {
        length_ = static_cast<size_t>(MSWinGetModulePath(module, text_, sizeof text_));
        if (length_ >= kExtensionLength && text_[length_ - kExtensionLength] == '.') length_ -= kExtensionLength;
        // A backslash may be the second byte of a character.
        for (const char* at = text_; at < text_ + length_; at = platform::NextChar(at))
            if (*at == '\\') backslash_ = static_cast<size_t>(at - text_);
    }
    bool HasFolder() const { return std::strlen(text_) >= kShortestWithLocation && backslash_ != std::string::npos; }
    std::string_view Folder() const { return {text_, backslash_}; }
    std::string_view Name() const { return std::string_view(text_, length_).substr(backslash_ + 1); }

private:
    char text_[kModuleTextSize];
    size_t length_;
    size_t backslash_ = std::string::npos;
};

void CopyView(std::string_view text, char* out) {
    out[text.copy(out, text.size())] = 0;
}

bool LastWritten(MGModuleHandle module, int64& time) {
    std::string name;
    platform::ItemInfo info;
    if (!platform::ModuleFileName(module, name)) return false;
    const auto file = platform::FileOpen(name.c_str(), platform::kRead, 0, platform::Disposition::kOpenExisting);
    if (file == platform::kNoFile) return false;
    const bool known = platform::FileGetInfo(file, info);
    platform::FileClose(file);
    time = info.modified;
    return known;
}

void WriteDate(int64 time, char* out) {
    using namespace std::chrono;
    using Ticks = duration<int64, std::ratio<1, 10'000'000>>;
    const auto when = floor<minutes>(sys_days{year{1601} / January / 1} + Ticks{time});
    const auto day = floor<days>(when);
    const year_month_day date{day};
    const hh_mm_ss clock{when - day};
    std::snprintf(out, kModuleTextSize, "%02u/%02u/%04d %02d:%02d GMT", static_cast<unsigned>(date.month()),
                  static_cast<unsigned>(date.day()), static_cast<int>(date.year()),
                  static_cast<int>(clock.hours().count()), static_cast<int>(clock.minutes().count()));
}

}  // namespace
}  // namespace tessel

using namespace tessel;

void MGModuleSetInstance(MGModuleHandle module) {
    executableModule = module;
}
MGModuleHandle MGModuleGetInstance(void) {
    return executableModule;
}
void MGModuleSetModule(MGModuleHandle module) {
    ownModule = module;
}
MGModuleHandle MGModuleGetModule(void) {
    return ownModule;
}

int32 MSWinGetModulePath(MGModuleHandle module, char* buffer, int32 size) try {
    return buffer && size > 0 ? ModulePath(module, buffer, static_cast<size_t>(size)) : 0;
} catch (const std::bad_alloc&) {
    return 0;
}

void MSWinGetModuleLocation(MGModuleHandle module, char* out) {
    if (!out) return;
    const ModuleName name(module);
    CopyView(name.HasFolder() ? name.Folder() : std::string_view(), out);
}

void MSWinGetModuleFileName(MGModuleHandle module, char* out) {
    if (out) CopyView(ModuleName(module).Name(), out);
}

void MSWinGetModuleModDate(MGModuleHandle module, char* out) try {
    if (!out) return;
    out[0] = 0;
    int64 time;
    if (LastWritten(module, time)) WriteDate(time, out);
} catch (const std::bad_alloc&) {
    out[0] = 0;
}
