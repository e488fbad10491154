#include "platform/Shell.h"

#include "platform/CodePage.h"
#include "platform/Process.h"
#include "platform/posix/Folders.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"
#include "platform/posix/TextFile.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <errno.h>
#include <stdio.h>
#include <string_view>

namespace tessel::platform {

// ---- standard folders -----------------------------------------------------------------------------------------------

namespace {

// A line of user-dirs.dirs: XDG_DESKTOP_DIR="$HOME/Desktop". Only absolute folders and those under $HOME count.
bool ParseUserFolder(std::string_view line, std::string_view variable, std::string& folder) {
    line.remove_prefix(std::min(line.find_first_not_of(" \t"), line.size()));
    if (line.substr(0, variable.size()) != variable) return false;
    line.remove_prefix(variable.size());
    if (line.substr(0, 2) != "=\"") return false;
    line.remove_prefix(2);
    std::size_t end = line.find('"');
    if (end == std::string_view::npos) return false;
    std::string_view value = line.substr(0, end);
    constexpr std::string_view kHome = "$HOME";
    bool underHome = value.substr(0, kHome.size()) == kHome;
    if (underHome) value.remove_prefix(kHome.size());
    if (underHome ? !value.empty() && value[0] != '/' : value.empty() || value[0] != '/') return false;
    folder = underHome ? HomeFolder() : "";
    folder += value;
    while (folder.size() > 1 && folder.back() == '/') folder.pop_back();
    return true;
}

std::string UserFolder(const char* variable, const char* underHome) {
    std::string text, folder = HomeFolder() + "/" + underHome;
    ReadTextFile((XdgFolder("XDG_CONFIG_HOME", ".config") + "/user-dirs.dirs").c_str(), text);
    for (std::size_t start = 0; start < text.size();) {
        std::size_t end = std::min(text.find('\n', start), text.size());
        ParseUserFolder(std::string_view(text).substr(start, end - start), variable, folder);
        start = end + 1;
    }
    return folder;
}

std::string FirstOf(const char* variable, const char* otherwise) {
    const char* value = std::getenv(variable);
    std::string_view list = value && *value == '/' ? value : otherwise;
    return std::string(list.substr(0, list.find(':')));
}

std::string NativeShellFolder(ShellFolder kind) {
    switch (kind) {
        case ShellFolder::kProfile:
            return HomeFolder();
        case ShellFolder::kDesktop:
            return UserFolder("XDG_DESKTOP_DIR", "Desktop");
        case ShellFolder::kDocuments:
            return UserFolder("XDG_DOCUMENTS_DIR", "Documents");
        case ShellFolder::kLocalAppData:
            return XdgFolder("XDG_DATA_HOME", ".local/share");
        case ShellFolder::kCommonDocuments:
            return UserFolder("XDG_PUBLICSHARE_DIR", "Public");
        case ShellFolder::kCommonAppData:
            return FirstOf("XDG_DATA_DIRS", "/usr/local/share");
        case ShellFolder::kSystem:
            return "/usr/lib";
        case ShellFolder::kProgramFiles:
            return "/opt";
        case ShellFolder::kWindows:
            return "/";
    }
    return {};
}

}  // namespace

bool ShellFolderName(ShellFolder kind, bool create, std::string& name) {
    std::string native = NativeShellFolder(kind);
    const bool there = IsFolder(native, Links::kFollowed);
    if (!there && !create) return FailWith(kErrorFileNotFound);
    if (!there && !MakeFolders(native, 0700)) return FailErrno();  // new folders of the user's are private
    return NativeToName(native, name);
}

// ---- shortcuts ------------------------------------------------------------------------------------------------------

namespace {

// The parts of a shortcut file as documented by its maker ([MS-SHLLINK]); every number lowest byte first.
class ShortcutReader {
public:
    explicit ShortcutReader(std::string_view bytes) : bytes_(bytes) {}

    // False when it is no shortcut, or has no target in a form that can be read. `linkFolder`: where the shortcut lies,
    // with a separator at its end.
    bool Target(std::string_view linkFolder, std::string& target) {
        constexpr std::string_view kHeader("\x4C\0\0\0\x01\x14\x02\0\0\0\0\0\xC0\0\0\0\0\0\0\x46", 20);
        if (bytes_.size() < kHeaderSize || bytes_.substr(0, kHeader.size()) != kHeader) return false;
        flags_ = Number32(kHeader.size());
        std::size_t at = kHeaderSize;
        if (flags_ & kHasIDList) at += 2 + Number16(at);
        if (flags_ & kHasLinkInfo) {
            bool usable = !(flags_ & kForceNoLinkInfo) && LinkInfoTarget(at, target);
            if (usable) return true;
            at += Number32(at);
        }
        std::string relative = RelativePath(at);
        if (EnvironmentTarget(at, target)) return true;
        target = std::string(linkFolder) + relative;
        return !relative.empty();
    }

private:
    static constexpr std::size_t kHeaderSize = 76;
    static constexpr std::uint32_t kHasIDList = 1, kHasLinkInfo = 2, kHasRelativePath = 8, kIsUnicode = 0x80,
                                   kForceNoLinkInfo = 0x100, kHasExpString = 0x200;

    // Numbers and texts outside the file read as 0 and as empty.
    std::uint32_t Number(std::size_t at, int size) const {
        std::uint32_t number = 0;
        if (at > bytes_.size() || bytes_.size() - at < static_cast<std::size_t>(size)) return 0;
        for (int i = size - 1; i >= 0; --i)
            number = number << 8 | static_cast<unsigned char>(bytes_[at + static_cast<std::size_t>(i)]);
        return number;
    }
    std::uint32_t Number16(std::size_t at) const { return Number(at, 2); }
    std::uint32_t Number32(std::size_t at) const { return Number(at, 4); }

    std::string Wide(std::size_t at, std::size_t count) const {
        std::u16string wide;
        for (std::size_t i = 0; i < count && at < bytes_.size() && Number16(at); ++i, at += 2) {
            wide += static_cast<char16_t>(Number16(at));
        }
        std::string text;
        FromUtf16(wide, text);
        return text;
    }
    std::string Narrow(std::size_t at, std::size_t count) const {
        if (at >= bytes_.size()) return {};
        std::string_view rest = bytes_.substr(at, count);
        return std::string(rest.substr(0, rest.find('\0')));
    }
    // Where the structure at `base` says its text is: in both forms, of which the wide one counts when it is there.
    std::string TextAt(std::size_t base, std::uint32_t offset, std::uint32_t wideOffset) const {
        if (wideOffset) return Wide(base + wideOffset, bytes_.size());
        return offset ? Narrow(base + offset, bytes_.size()) : "";
    }

    bool LinkInfoTarget(std::size_t at, std::string& target) const {
        constexpr std::uint32_t kLocal = 1, kNetwork = 2, kWideHeader = 0x24;
        bool wide = Number32(at + 4) >= kWideHeader;
        std::uint32_t flags = Number32(at + 8);
        std::string suffix = TextAt(at, Number32(at + 24), wide ? Number32(at + 32) : 0);
        if (flags & kLocal) {
            target = TextAt(at, Number32(at + 16), wide ? Number32(at + 28) : 0) + suffix;
        } else if (flags & kNetwork) {
            std::size_t network = at + Number32(at + 20);
            bool wideNames = Number32(network + 8) > 0x14;
            target = TextAt(network, Number32(network + 8), wideNames ? Number32(network + 20) : 0);
            if (!suffix.empty()) target += "\\" + suffix;
        } else {
            return false;
        }
        return !target.empty();
    }

    // Of the counted texts that follow, the relative path is the second. `at` moves behind all of them.
    std::string RelativePath(std::size_t& at) const {
        std::string relative;
        for (std::uint32_t flag = 4; flag <= 0x40; flag <<= 1) {
            if (!(flags_ & flag)) continue;
            bool wide = (flags_ & kIsUnicode) != 0;
            std::size_t count = Number16(at);
            at += 2;
            if (flag == kHasRelativePath) relative = wide ? Wide(at, count) : Narrow(at, count);
            at += wide ? 2 * count : count;
        }
        return relative;
    }

    // A target with environment variables in it, in one of the blocks at the end.
    bool EnvironmentTarget(std::size_t at, std::string& target) const {
        constexpr std::uint32_t kEnvironmentBlock = 0xA0000001;
        constexpr std::size_t kNarrowSize = 260;
        if (!(flags_ & kHasExpString)) return false;
        for (std::uint32_t size; (size = Number32(at)) >= 8 && size <= bytes_.size() - at; at += size) {
            if (Number32(at + 4) != kEnvironmentBlock) continue;
            target = Wide(at + 8 + kNarrowSize, kNarrowSize);
            if (target.empty()) target = Narrow(at + 8, kNarrowSize);
            target = EnvironmentExpand(target);
            return !target.empty();
        }
        return false;
    }

    std::string_view bytes_;
    std::uint32_t flags_ = 0;
};

constexpr std::size_t kMostShortcutBytes = std::size_t{1} << 20;

}  // namespace

bool ParseShortcut(std::string_view bytes, std::string_view linkFolder, std::string& target) {
    return ShortcutReader(bytes).Target(linkFolder, target) || FailWith(kErrorFileInvalid);
}

bool ShellReadShortcut(const char* name, std::string& target) {
    std::string bytes, native, link;
    bool read = OnExistingItem(name, [&](const std::string& file) {
        native = file;
        return ReadTextFile(file.c_str(), bytes, kMostShortcutBytes);
    });
    if (!read || !NameToAbsoluteNative(name, native) || !NativeToName(NativeParent(native), link)) return false;
    if (link.back() != '\\') link += '\\';
    return ParseShortcut(bytes, link, target);
}

}  // namespace tessel::platform
