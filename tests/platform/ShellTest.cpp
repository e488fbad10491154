#include "platform/LastError.h"
#include "platform/Shell.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"

#include <cerrno>
#include <filesystem>
#include <map>
#include <set>
#include <sys/stat.h>

namespace tessel::platform {
namespace {

using test::ScratchDrive;
namespace fs = std::filesystem;

// A home in the scratch folder; what the environment said before comes back.
class Shell : public ::testing::Test {
protected:
    Shell() {
        fs::create_directories(drive_.Native("home/.config"));
        Set("HOME", drive_.Native("home"));
        for (const char* variable : {"XDG_CONFIG_HOME", "XDG_DATA_HOME", "XDG_DATA_DIRS"}) Set(variable, "");
    }
    ~Shell() override {
        for (const auto& [variable, value] : before_) setenv(variable.c_str(), value.c_str(), 1);
    }
    void Set(const char* variable, const std::string& value) {
        const char* old = std::getenv(variable);
        before_.try_emplace(variable, old ? old : "");
        setenv(variable, value.c_str(), 1);
    }
    static std::string Folder(ShellFolder kind, bool create = false) {
        std::string name;
        return ShellFolderName(kind, create, name) ? name : "error " + std::to_string(LastError());
    }

    ScratchDrive drive_;
    std::map<std::string, std::string> before_;
};

TEST_F(Shell, FoldersComeFromTheUsersSettings) {
    EXPECT_EACH(Folder(ShellFolder::kProfile) == "T:\\home", Folder(ShellFolder::kDocuments) == "error 2",
                Folder(ShellFolder::kDocuments, true) == "T:\\home\\Documents",
                Folder(ShellFolder::kDocuments) == "T:\\home\\Documents");
    drive_.Put("home/.config/user-dirs.dirs",
               "# made by hand\nXDG_DESKTOP_DIR=\"$HOME/Bureau/\"\n  XDG_DOCUMENTS_DIR=\"relative\"\n"
               "XDG_PUBLICSHARE_DIR=\"" +
                   drive_.Native("public") + "\"\nXDG_DESKTOP_DIRX=\"$HOME/x\"\n");
    EXPECT_EACH(Folder(ShellFolder::kDesktop, true) == "T:\\home\\Bureau",
                Folder(ShellFolder::kDocuments) == "T:\\home\\Documents",
                Folder(ShellFolder::kCommonDocuments, true) == "T:\\public",
                Folder(ShellFolder::kLocalAppData, true) == "T:\\home\\.local\\share");
    Set("XDG_DATA_HOME", drive_.Native("data"));
    EXPECT_EQ("T:\\data", Folder(ShellFolder::kLocalAppData, true));
    Set("XDG_DATA_DIRS", drive_.Native("home") + ":/nowhere");
    EXPECT_EACH(Folder(ShellFolder::kCommonAppData) == "T:\\home", Folder(ShellFolder::kWindows) == "C:\\");
}

TEST_F(Shell, TrashKeepsItemsAndWhereTheyCameFrom) {
    for (const char* content : {"first", "second"}) {
        drive_.Put("A file.txt", content);
        EXPECT_EACH(ShellTrash(drive_.Name("a FILE.txt").c_str()), !fs::exists(drive_.Native("A file.txt")));
    }
    const std::string trash = "home/.local/share/Trash/";
    EXPECT_EACH(drive_.Get(trash + "files/A file.txt") == "first",
                drive_.Get(trash + "files/A file.txt.2") == "second");
    std::string path = drive_.Native() + "/A%20file.txt";
    EXPECT_THAT(
        drive_.Get(trash + "info/A file.txt.2.trashinfo"),
        ::testing::MatchesRegex("\\[Trash Info\\]\nPath=" + path + "\nDeletionDate=....-..-..T..:..:..\nX-Tessel=1\n"));
    fs::create_directories(drive_.Native("folder/sub"));
    EXPECT_EACH(ShellTrash(drive_.Name("folder").c_str()), fs::exists(drive_.Native(trash + "files/folder/sub")),
                !ShellTrash(drive_.Name("none").c_str()), LastError() == kErrorFileNotFound);
}

TEST_F(Shell, TrashOfOthersAndWhatTheyLeftThere) {
    const std::string trash = "home/.local/share/Trash/";
    fs::create_directories(drive_.Native("elsewhere"));
    fs::create_directories(drive_.Native("home/.local/share"));
    fs::create_directory_symlink(drive_.Native("elsewhere"), drive_.Native("home/.local/share/Trash"));
    drive_.Put("item", "kept");
    {
        test::FailingPlatform failing("mkdir", 2, EROFS, 100);  // none elsewhere either
        EXPECT_EACH(!ShellTrash(drive_.Name("item").c_str()), LastError() == kErrorAccessDenied);
    }
    EXPECT_EACH(drive_.Get("item") == "kept", fs::is_empty(drive_.Native("elsewhere")));

    fs::remove(drive_.Native("home/.local/share/Trash"));
    for (const char* folder : {"files", "info"}) fs::create_directories(drive_.Native(trash + folder));
    drive_.Put(trash + "info/stray.trashinfo", "[Trash Info]\nPath=/x\nX-Tessel=1\n");
    drive_.Put(trash + "info/.tessel.trashinfo.new", "half");
    drive_.Put(trash + "info/theirs.trashinfo", "[Trash Info]\nPath=/x\n");  // another program may be on its way
    EXPECT_TRUE(ShellTrash(drive_.Name("item").c_str()));
    std::set<std::string> infos;
    for (const auto& entry : fs::directory_iterator(drive_.Native(trash + "info")))
        infos.insert(entry.path().filename());
    EXPECT_EQ((std::set<std::string>{"item.trashinfo", "theirs.trashinfo"}), infos);
    drive_.Put(std::string(250, 'n'), "long");
    EXPECT_TRUE(ShellTrash(drive_.Name(std::string(250, 'n')).c_str()));
}

std::string Bytes(std::uint64_t value, int size) {
    std::string bytes;
    for (int i = 0; i < size; ++i) bytes += static_cast<char>(value >> (8 * i));
    return bytes;
}

// The header of a shortcut with these flags, and nothing else in it.
std::string Header(std::uint32_t flags) {
    return std::string("\x4C\0\0\0\x01\x14\x02\0\0\0\0\0\xC0\0\0\0\0\0\0\x46", 20) + Bytes(flags, 4) +
           std::string(52, '\0');
}

std::string Wide(std::string_view text) {
    std::string wide;
    for (char c : text) wide += {c, '\0'};
    return wide;
}

TEST_F(Shell, ShortcutsTellTheirTarget) {
    const std::string idList = Bytes(4, 2) + std::string(4, '\0');
    std::string local = Bytes(28 + 17 + 6, 4) + Bytes(28, 4) + Bytes(1, 4) + Bytes(0, 4) + Bytes(28, 4) + Bytes(0, 4) +
                        Bytes(45, 4) + std::string("C:\\folder\\\0\0\0\0\0\0\0", 17) + std::string("a.txt\0", 6);
    std::string wide = Bytes(36 + 12, 4) + Bytes(36, 4) + Bytes(1, 4) + Bytes(0, 4) + Bytes(36, 4) + Bytes(0, 4) +
                       Bytes(0, 4) + Bytes(38, 4) + Bytes(0, 4) + std::string("X\0", 2) + Wide("C:\\\xE9") +
                       Wide(std::string(1, '\0'));
    std::string network = Bytes(28 + 36 + 5, 4) + Bytes(28, 4) + Bytes(2, 4) + Bytes(0, 4) + Bytes(0, 4) +
                          Bytes(28, 4) + Bytes(64, 4) + Bytes(36, 4) + Bytes(0, 4) + Bytes(20, 4) + Bytes(0, 4) +
                          Bytes(0, 4) + std::string("\\\\server\\share\0", 16) + std::string("b\\c\0\0", 5);
    std::string relative = Bytes(4, 2) + Wide("name") + Bytes(8, 2) + Wide("..\\b.txt");
    std::string environment =
        Bytes(788, 4) + Bytes(0xA0000001, 4) + std::string("%TESSEL_LNK%\\x") + std::string(766, '\0') + Bytes(0, 4);
    setenv("TESSEL_LNK", "C:\\env", 1);
    const std::pair<std::string, std::string> rows[] = {{Header(3) + idList + local, "C:\\folder\\a.txt"},
                                                        {Header(2) + wide, "C:\\\xC3\xA9"},
                                                        {Header(2) + network, "\\\\server\\share\\b\\c"},
                                                        {Header(4 | 8 | 0x80) + relative, "T:\\..\\b.txt"},
                                                        {Header(0x200) + environment, "C:\\env\\x"}};
    std::string target;
    for (const auto& [bytes, expected] : rows) {
        drive_.Put("a.lnk", bytes);
        EXPECT_EACH(ShellReadShortcut(drive_.Name("A.LNK").c_str(), target), expected == target);
        for (std::size_t cut = 0; cut < bytes.size(); ++cut) ParseShortcut(bytes.substr(0, cut), "T:\\", target);
    }
    unsetenv("TESSEL_LNK");
    for (const std::string& bad : {std::string("no shortcut"), std::string(), Header(0), Header(3) + idList,
                                   Header(2) + std::string(28, '\xFF')}) {
        EXPECT_EACH(!ParseShortcut(bad, "T:\\", target), LastError() == kErrorFileInvalid);
    }
    EXPECT_EACH(!ShellReadShortcut(drive_.Name("none.lnk").c_str(), target), LastError() == kErrorFileNotFound);
}

}  // namespace
}  // namespace tessel::platform
