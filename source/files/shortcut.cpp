// Following shortcuts in the name of a file.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "paths/ShortcutResolver.h"
#include "platform/CodePage.h"
#include "platform/FileSystem.h"
#include "platform/Shell.h"
#include <tessel/files/shortcut.h>

#include <cstring>
#include <string>

namespace tessel {

namespace {

constexpr size_t kLongestName = kPlatformNameSize - 1;
constexpr char kExtension[] = ".lnk";
constexpr size_t kExtensionLength = sizeof kExtension - 1;

bool HasShortcutExtension(const std::string& name) {
    if (name.size() < kExtensionLength) return false;
    for (size_t i = 0; i < kExtensionLength; ++i) {
        const auto byte = static_cast<uint8>(name[name.size() - kExtensionLength + i]);
        if (platform::LowerByte(byte) != static_cast<uint8>(kExtension[i])) return false;
    }
    return true;
}

bool Exists(const std::string& name) {
    return platform::ItemExists(name.c_str()) != platform::ItemKind::kNone;
}

// Replaces the name of a shortcut, with or without its extension, by its target.
bool ResolveOne(std::string* name) {
    std::string link = *name;
    if (!HasShortcutExtension(link)) {
        if (Exists(link)) return false;
        link += kExtension;
        if (!Exists(link)) return false;
    }
    std::string target;
    if (!platform::ShellReadShortcut(link.c_str(), target)) return false;
    if (target.empty() || target.size() > kLongestName) return false;
    *name = target;
    return true;
}

// Replaces the first `length` bytes of the text by their target. *length becomes the length of what replaced them.
bool ResolvePart(std::string* text, size_t* length) {
    std::string part = text->substr(0, *length);
    if (!ResolveOne(&part)) return false;
    if (!part.empty() && part.back() == '\\') part.pop_back();
    text->replace(0, *length, part);
    *length = part.size();
    return true;
}

bool ResolveAll(std::string* text) {
    bool changed = false;
    for (size_t at = 0; at < text->size();) {
        if ((*text)[at] == '\\') {
            if (at > kLongestName) break;
            if (at && ResolvePart(text, &at)) changed = true;
            ++at;
        } else {
            at += platform::CharLength(text->data() + at, text->data() + text->size());
        }
    }
    if (text->size() < kPlatformNameSize && ResolveOne(text)) changed = true;
    return changed;
}

int32 ResolveInBuffer(char* name, bool (*resolve)(std::string*)) {
    if (!name) return 0;
    return GuardedOr<int32>(0, [&]() -> int32 {
        std::string text = name;
        if (!resolve(&text) || text.size() > kLongestName) return 0;
        std::memcpy(name, text.c_str(), text.size() + 1);
        return 1;
    });
}

}  // namespace

int ResolveShortcutsInName(char* text) {
    return Win32ResolveAllShortCuts(text);
}

}  // namespace tessel

using namespace tessel;

int32 Win32ResolveShortCut(char* name) {
    return Win32ResolveShortCutExists(name, 0);
}

int32 Win32ResolveShortCutExists(char* name, int32) {
    return ResolveInBuffer(name, ResolveOne);
}

int32 Win32ResolveAllShortCuts(char* name) {
    return ResolveInBuffer(name, ResolveAll);
}
