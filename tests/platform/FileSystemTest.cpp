#include "platform/CodePage.h"
#include "platform/DriveTable.h"
#include "platform/FileSystem.h"
#include "platform/LastError.h"
#include "support/FailingPlatform.h"
#include "support/ScratchDrive.h"
#include "support/Test.h"

#include <cerrno>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace tessel::platform {
namespace {

using test::FailingPlatform;
using test::ScratchDrive;
namespace fs = std::filesystem;

TEST(DriveTable, TextsOfNames) {
    ScratchDrive drive;
    setenv("TESSEL_DRIVES", "C=/;t=/mnt/x/;bad;Q=relative;Z=/mnt", 1);
    setenv("TESSEL_UNC", "/net", 1);
    ReloadDrives();
    const auto native = [](const char* name) {
        std::string text;
        SetLastError(0);
        return NameToNativeText(name, text) ? text : "error " + std::to_string(LastError());
    };
    EXPECT_EACH(native("C:\\") == "/", native("C:\\dir\\file.txt") == "/dir/file.txt", native("c:/dir/") == "/dir",
                native("T:\\") == "/mnt/x", native("T:\\a\\b") == "/mnt/x/a/b", native("T:a") == "/mnt/x/a",
                native("\\\\server\\share\\a") == "/net/server/share/a", native("dir\\a") == "dir/a",
                native("..\\a") == "../a", native("Q:\\a") == "error 3", native("") == "error 123",
                native("\\\\") == "error 53");
    // No name leads out of its drive or its share.
    EXPECT_EACH(native("T:\\..\\..\\etc\\.\\a\\..\\..\\.b") == "/mnt/x/.b", native("T:..\\a") == "/mnt/x/a",
                native("T:/a//../..") == "/mnt/x", native("T:\\...\\..a") == "/mnt/x/.../..a",
                native("\\\\server\\share\\..\\..\\a") == "/net/server/share/a", native("\\\\..\\share") == "error 53",
                native("\\\\server\\..\\a") == "error 53");
    const auto name = [](const char* text) {
        std::string result;
        return NativeToName(text, result) ? result : "error " + std::to_string(LastError());
    };
    EXPECT_EACH(name("/mnt/x/a/b") == "T:\\a\\b", name("/mnt/x") == "T:\\", name("/mnt/xy") == "Z:\\xy",
                name("/net/server/share") == "\\\\server\\share", name("/net") == "C:\\net", name("/") == "C:\\",
                name("/a\\b/") == "C:\\a?b");
    unsetenv("TESSEL_UNC");
    setenv("TESSEL_DRIVES", "T=/mnt/x", 1);
    ReloadDrives();
    EXPECT_EACH(native("\\\\server\\share") == "error 53", name("/home") == "error 3",
                name("home").substr(0, 5) == "error");
}

TEST(DriveTable, NamesMatchWithoutRegardToCase) {
    ScratchDrive drive;
    fs::create_directories(drive.Native("Größe/Sub"));
    drive.Put("Größe/Sub/File.TXT", "");
    drive.Put("Größe/Sub/both", "");
    drive.Put("Größe/Sub/BOTH", "");
    const std::pair<const char*, const char*> rows[] = {{"GRÖSSE/sub/FILE.txt", "GRÖSSE/sub/FILE.txt"},
                                                        {"gRÖßE/sUB/fILE.txt", "Größe/Sub/File.TXT"},
                                                        {"größe/SUB/both", "Größe/Sub/both"},
                                                        {"größe/SUB/Both", "Größe/Sub/BOTH"},
                                                        {"größe/none/File.TXT", "Größe/none/File.TXT"}};
    for (const auto& [name, expected] : rows) {
        std::string native;
        EXPECT_EACH(NameToNative(drive.Name(name), native), drive.Native(expected) == native);
    }
    std::string real;
    EXPECT_EACH(ItemRealName(drive.Name("größe").c_str(), real), real == "Größe", ItemRealName("T:\\", real),
                real == "", ItemRealPath(drive.Name("größe/sub/file.txt").c_str(), real),
                real == "T:\\Größe\\Sub\\File.TXT", !ItemRealPath(drive.Name("größe/none").c_str(), real),
                LastError() == kErrorFileNotFound);
}

TEST(DriveTable, NamesAreInTheCodePage) {
    ScratchDrive drive;
    drive.Put("ソ.txt", "x");  // in the double-byte page its second byte is a backslash
    ASSERT_TRUE(SetCodePage(932));
    EXPECT_EQ(ItemKind::kFile, ItemExists("T:\\\x83\x5C.txt"));
    std::vector<FolderEntry> entries;
    EXPECT_TRUE(FolderList("T:\\", entries));
    ASSERT_EQ(1u, entries.size());
    EXPECT_EQ("\x83\x5C.txt", entries[0].name);
    std::string real;
    EXPECT_EACH(ItemRealName("T:\\\x83\x5C.TXT", real), real == "\x83\x5C.txt");
    SetCodePage(kCodePageUtf8);
}

TEST(DriveTable, DrivesPresent) {
    ScratchDrive drive;
    setenv("TESSEL_DRIVES", ("C=/;X=/nowhere/at/all;T=" + drive.Native()).c_str(), 1);
    ReloadDrives();
    std::string letters;
    for (const Drive& present : DrivesPresent()) letters += present.letter;
    EXPECT_EQ("CT", letters);
}

TEST(FileSystem, InfoTellsKindModeAndSize) {
    ScratchDrive drive;
    drive.Put(".hidden", "12345");
    fs::create_directory(drive.Native("folder"));
    chmod(drive.Native(".hidden").c_str(), 0444);
    ItemInfo info;
    ASSERT_TRUE(ItemGetInfo(drive.Name(".HIDDEN").c_str(), info));
    EXPECT_EACH(!info.folder, info.readOnly, info.hidden, info.size == 5, info.mode == 0444u);
    ASSERT_TRUE(ItemGetInfo(drive.Name("folder").c_str(), info));
    EXPECT_TRUE(info.folder && !info.readOnly && !info.hidden);

    EXPECT_TRUE(ItemSetReadOnly(drive.Name(".hidden").c_str(), false));
    ASSERT_TRUE(ItemGetInfo(drive.Name(".hidden").c_str(), info));
    EXPECT_EACH((0444u | (0222u & ~PermissionMask())) == info.mode, ItemSetMode(drive.Name(".hidden").c_str(), 0640));
    ASSERT_TRUE(ItemGetInfo(drive.Name(".hidden").c_str(), info));
    EXPECT_EQ(0640u, info.mode);

    EXPECT_EACH(!ItemGetInfo(drive.Name("none").c_str(), info), LastError() == kErrorFileNotFound,
                !ItemGetInfo(drive.Name("none/a").c_str(), info), LastError() == kErrorPathNotFound,
                !ItemGetInfo(drive.Name(".hidden/a").c_str(), info), LastError() == kErrorPathNotFound);
}

TEST(FileSystem, PermissionMaskIsTheProcesss) {
    mode_t before = umask(027);
    EXPECT_EACH(PermissionMask() == 027u, umask(before) == 027u);
}

TEST(FileSystem, FoldersAreMadeListedAndRemoved) {
    ScratchDrive drive;
    EXPECT_EACH(!FolderCreate(drive.Name("a/b").c_str()), LastError() == kErrorPathNotFound,
                FolderCreate(drive.Name("a").c_str()), !FolderCreate(drive.Name("A").c_str()),
                LastError() == kErrorAlreadyExists);
    drive.Put("a/file", "x");
    EXPECT_TRUE(FolderCreate(drive.Name("a/b").c_str()));
    std::vector<FolderEntry> entries;
    EXPECT_TRUE(FolderList(drive.Name("a").c_str(), entries));
    EXPECT_THAT(entries,
                ::testing::UnorderedElementsAre(::testing::FieldsAre("file", false), ::testing::FieldsAre("b", true)));
    std::int64_t count = 0;
    EXPECT_EACH(FolderCount(drive.Name("a").c_str(), count), count == 2,
                !FolderList(drive.Name("a/file").c_str(), entries), LastError() == kErrorNotAFolder,
                !FolderRemove(drive.Name("a").c_str()), LastError() == kErrorFolderNotEmpty,
                !FolderRemove(drive.Name("a/file").c_str()), LastError() == kErrorNotAFolder,
                !FileDelete(drive.Name("a/b").c_str()), LastError() == kErrorAccessDenied);
    fs::create_directory_symlink(drive.Native("a/b"), drive.Native("link"));
    EXPECT_EACH(FolderRemove(drive.Name("LINK").c_str()), FolderRemove(drive.Name("a/b").c_str()),
                FileDelete(drive.Name("a/FILE").c_str()), FolderRemove(drive.Name("a").c_str()),
                fs::is_empty(drive.Native()));
}

TEST(FileSystem, RenamingNeverReplaces) {
    ScratchDrive drive;
    for (bool plainRename : {false, true}) {  // true: a file system that cannot rename without replacing
        drive.Put("a", "from");
        drive.Put("b", "to");
        FailingPlatform failing("renameat2", 1, EINVAL, plainRename ? 1 : 0);
        EXPECT_EACH(!ItemRename(drive.Name("a").c_str(), drive.Name("B").c_str()), LastError() == kErrorAlreadyExists,
                    drive.Get("b") == "to", FileDelete(drive.Name("b").c_str()),
                    ItemRename(drive.Name("A").c_str(), drive.Name("b").c_str()), drive.Get("b") == "from",
                    ItemKind::kNone == ItemExists(drive.Name("a").c_str()));
    }
    EXPECT_EACH(ItemRename(drive.Name("b").c_str(), drive.Name("B").c_str()), fs::exists(drive.Native("B")),
                !fs::exists(drive.Native("b")), !ItemRename(drive.Name("none").c_str(), drive.Name("c").c_str()),
                LastError() == kErrorFileNotFound, !ItemRename(drive.Name("B").c_str(), drive.Name("none/c").c_str()),
                LastError() == kErrorPathNotFound);
}

TEST(FileSystem, MovingToAnotherFileSystemCopiesFilesOnly) {
    ScratchDrive drive;
    drive.Put("a", "content");
    chmod(drive.Native("a").c_str(), 0640);
    fs::create_directory(drive.Native("folder"));
    FailingPlatform failing("renameat2", 1, EXDEV, 2);
    EXPECT_EACH(ItemRename(drive.Name("a").c_str(), drive.Name("b").c_str()), drive.Get("b") == "content",
                static_cast<unsigned>(fs::status(drive.Native("b")).permissions()) == 0640u,
                !fs::exists(drive.Native("a")), !ItemRename(drive.Name("folder").c_str(), drive.Name("other").c_str()),
                LastError() == kErrorNotSameDevice);
}

TEST(FileSystem, CopiesAreWholeOrNotThere) {
    ScratchDrive drive;
    std::string content(300'001, 'x');
    drive.Put("a", content);
    for (int error : {0, ENOSYS}) {  // ENOSYS: a kernel that does not copy
        FailingPlatform failing("copy_file_range", 1, error, error ? 1 : 0);
        EXPECT_EACH(FileCopy(drive.Name("a").c_str(), drive.Name("b").c_str()), content == drive.Get("b"),
                    fs::last_write_time(drive.Native("a")) == fs::last_write_time(drive.Native("b")),
                    !FileCopy(drive.Name("a").c_str(), drive.Name("b").c_str()), LastError() == kErrorFileExists);
        fs::remove(drive.Native("b"));
    }
    for (const char* call : {"copy_file_range", "fchmod", "fsync", "linkat"}) {
        FailingPlatform failing(call, 1, ENOSPC);
        EXPECT_EACH(!FileCopy(drive.Name("a").c_str(), drive.Name("b").c_str()), LastError() == kErrorDiskFull);
        EXPECT_FALSE(fs::exists(drive.Native("b"))) << call;
    }
}

TEST(FileSystem, CurrentAndTemporaryFolders) {
    ScratchDrive drive;
    fs::path before = fs::current_path();
    fs::create_directory(drive.Native("Sub"));
    drive.Put("Sub/a", "");
    EXPECT_TRUE(SetCurrentFolder(drive.Name("sub").c_str()));
    std::string name;
    EXPECT_EACH(CurrentFolder(name), name == "T:\\Sub", ItemKind::kFile == ItemExists("A"),
                ItemKind::kFile == ItemExists("T:a"), ItemKind::kFolder == ItemExists("\\SUB"), ItemRealPath("A", name),
                name == "T:\\Sub\\a");
    fs::current_path(before);

    const char* saved = std::getenv("TMPDIR");
    std::string savedText = saved ? saved : "";
    setenv("TMPDIR", drive.Native("Sub").c_str(), 1);
    EXPECT_EACH(TemporaryFolder(name), name == "T:\\Sub\\");
    saved ? setenv("TMPDIR", savedText.c_str(), 1) : unsetenv("TMPDIR");

    VolumeSpace space;
    ASSERT_TRUE(VolumeGetSpace("T:\\", space));
    fs::space_info expected = fs::space(drive.Native());
    EXPECT_EACH(expected.capacity == space.totalBytes, space.totalBytes % space.sectorBytes == 0u);
}

}  // namespace
}  // namespace tessel::platform
