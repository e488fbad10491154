#include "support/StartedFiles.h"
#include <tessel/base/OVExcept.h>
#include <tessel/files/CachedPathFlavor.h>
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringCPStr.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace tessel::test {
namespace {

constexpr uint32 kSecondsFrom1904To1970 = 2082844800u;

class FileOperationsTest : public testing::Test {
protected:
    MgErr Create(std::string_view name, int32 always, int32 mode = kFOpenReadWrite) {
        File_t* file = nullptr;
        const MgErr err = FGenericCreate(&file, At(name), 0, mode, kFDenyNone, 0, always);
        if (err) return err;
        EXPECT_EQ(kNoErr, FMWrite(file, 3, nullptr, "new"));
        return FMClose(file);
    }
    StartedFiles::Lasting At(std::string_view name) const { return started.At(name); }
    FInfo64Rec Info(std::string_view name) {
        FInfo64Rec info;
        EXPECT_EQ(kNoErr, FGetInfo64(At(name), &info, kFInfoAll));
        return info;
    }

    StartedFiles started;
};

TEST_F(FileOperationsTest, CreatesNewFilesAndReplacesOnlyWhenAsked) {
    EXPECT_EQ(kNoErr, Create("f", 0));
    EXPECT_EQ("new", started.drive.Get("f"));
    started.drive.Put("f", "an older and longer one");
    EXPECT_EQ(kExistsErr, Create("f", 0));
    EXPECT_EQ("an older and longer one", started.drive.Get("f"));
    EXPECT_EQ(kNoErr, Create("f", 1, kFOpenWrite));
    EXPECT_EQ("new", started.drive.Get("f"));
    EXPECT_EQ(kArgErr, Create("f", 1, 8));
    EXPECT_EQ(kNotFoundErr, Create("no/f", 0));
}

TEST_F(FileOperationsTest, CopiesAndMoves) {
    started.drive.Put("a", "data");
    EXPECT_EQ(kNoErr, FCopy(At("a"), At("b")));
    EXPECT_EQ("data", started.drive.Get("b"));
    started.drive.Put("b", "kept");
    EXPECT_EQ(kExistsErr, FCopy(At("a"), At("b")));
    EXPECT_EQ(kExistsErr, FMove(At("a"), At("b")));
    EXPECT_EQ("kept", started.drive.Get("b"));
    EXPECT_EQ(kNoErr, FMove(At("a"), At("c")));
    EXPECT_EQ(0, FExists(At("a")));

    started.drive.Put("big", std::string(20000, 'x'));
    EXPECT_EQ(kNoErr, FMoveInto(At("big"), At("b")));
    EXPECT_EQ(std::string(20000, 'x'), started.drive.Get("b"));
    EXPECT_EQ(0, FExists(At("big")));
    const ReportRecorder reports;
    EXPECT_EQ(kNotFoundErr, FMoveInto(At("c"), At("nothing")));
    EXPECT_TRUE(reports.Has(kDebugWarning, "FCopyIntoWin32 got error 7"));
    EXPECT_EQ("data", started.drive.Get("c"));

    PathRef volume = started.On("").Volume();
    EXPECT_EQ(kArgErr, FMove(&volume, At("x")));
    EXPECT_EQ(kArgErr, FCopy(&volume, At("x")));
}

TEST_F(FileOperationsTest, MovingTheCurrentFolderGoesToItsParentFirst) {
    const auto before = std::filesystem::current_path();
    ASSERT_EQ(kNoErr, FNewDirHier(At("one/two")));
    std::filesystem::current_path(started.drive.Native("one/two"));
    EXPECT_EQ(kNoErr, FMove(At("one/two"), At("one/three")));
    EXPECT_EQ(std::filesystem::canonical(started.drive.Native("one")), std::filesystem::current_path());
    Path here = nullptr;
    EXPECT_EQ(kNoErr, GetWorkingDir(&here));
    EXPECT_TRUE(here->Equals(started.On("one"), PathRef::kExact));
    PathRef::DisposePath(here);
    std::filesystem::current_path(before);
}

TEST_F(FileOperationsTest, FoldersAreMadeAndRemoved) {
    EXPECT_EQ(kNoErr, FNewDirHier(At("a/b/c")));
    EXPECT_EQ(kNoErr, FNewDirHier(At("a/b/c")));
    EXPECT_EQ(2, FExists(At("a/b/c")));
    started.drive.Put("a/f", "");
    EXPECT_EQ(1, FExists(At("A/F")));
    EXPECT_EQ(kGenericErr, FNewDirHier(At("a/f")));
    EXPECT_EQ(kExistsErr, FNewDir(At("a/b"), 0));
    EXPECT_EQ(kIOErr, FRemove(At("a")));
    EXPECT_EQ(kNoErr, FRemove(At("a/b/c")));
    EXPECT_EQ(kNoErr, FRemove(At("a/f")));
    EXPECT_EQ(kNotFoundErr, FRemove(At("a/f")));
    EXPECT_EQ(0, FExists(At("a/f")));
    std::filesystem::create_symlink("itself", started.drive.Native("itself"));
    EXPECT_EQ(kNoErr, FRemove(At("itself")));
    EXPECT_EQ(0, FExists(At("itself")));
    PathRef volumes(PathRef::kAbsolute), relative("a", PathRef::StringDisplay());
    EXPECT_EQ(2, FExists(&volumes));
    EXPECT_EQ(0, FExists(&relative));
}

TEST_F(FileOperationsTest, InformationIsWhatTheSystemSays) {
    started.drive.Put("f.zzz", "12345");
    ASSERT_EQ(kNoErr, FNewDirHier(At("d")));
    for (const char* name : {"d/1", "d/2", "d/3"}) started.drive.Put(name, "");
    struct stat native;
    ASSERT_EQ(0, stat(started.drive.Native("f.zzz").c_str(), &native));

    const FInfo64Rec file = Info("f.zzz");
    const uint32 unknown = TESSEL_FOURCC('?', '?', '?', '?');
    EXPECT_EQ(std::tuple(unknown, unknown, 5, 0666, 0),
              std::tuple(file.type, file.creator, file.size, file.permissions, file.folder));
    const auto rounded = static_cast<uint32>(native.st_mtim.tv_sec + (native.st_mtim.tv_nsec >= 500000000));
    EXPECT_EQ(rounded + kSecondsFrom1904To1970, file.modificationDate);

    const FInfo64Rec folder = Info("d");
    EXPECT_EQ(std::tuple(3, 0777, 1), std::tuple(folder.size, folder.permissions, folder.folder));
    PathRef volumes(PathRef::kAbsolute);
    FInfo64Rec info;
    EXPECT_EQ(kNoErr, FGetInfo64(&volumes, &info, kFInfoAll));
    EXPECT_EQ(std::tuple(2, 1), std::tuple(info.size, info.folder));
    EXPECT_EQ(kNotFoundErr, FGetInfo64(At("missing"), &info, kFInfoAll));
}

TEST_F(FileOperationsTest, ASizeThat32BitsCannotHoldIsReported) {
    started.drive.Put("f", "");
    ASSERT_EQ(0, truncate(started.drive.Native("f").c_str(), 3000000000));
    FInfoRec info;
    const ReportRecorder reports;
    EXPECT_EQ(kNoErr, FGetInfo(At("f"), &info));
    EXPECT_EQ(static_cast<int32>(3000000000u), info.size);
    EXPECT_TRUE(reports.Has(kDebugWarning, "Converting 64-bit to 32-bit, but size is too big! size=3000000000"));
}

TEST_F(FileOperationsTest, DatesAndPermissionsAreSet) {
    started.drive.Put("f", "");
    FInfo64Rec info = Info("f");
    info.modificationDate = kSecondsFrom1904To1970 + 1000000000;
    info.creationDate = info.modificationDate - 1;
    info.permissions = 0444;
    PathRef path = started.On("f");
    EXPECT_EQ(kNoErr, FSetInfo64(&path, &info));
    struct stat native;
    ASSERT_EQ(0, stat(started.drive.Native("f").c_str(), &native));
    EXPECT_EQ(1000000000, native.st_mtim.tv_sec);
    EXPECT_EQ(0444u, native.st_mode & 0777);
    uint32 seconds = 0;
    int32 readOnly = 0;
    EXPECT_EQ(kNoErr, FMGetModDate(&path, nullptr, &seconds, &readOnly));
    EXPECT_EQ(info.modificationDate, seconds);
    EXPECT_EQ(1, readOnly);
    EXPECT_EQ(0444, Info("f").permissions);

    EXPECT_EQ(kNoErr, path.MakeWriteable(PathRef::kItemOnly));
    EXPECT_EQ(0666, Info("f").permissions);
    EXPECT_EQ(kUnsupportedErr, path.MakeWriteable(PathRef::kItemAndContents));
    info.folder = 1;
    EXPECT_EQ(kNoErr, FSetInfo64(&path, &info));
    EXPECT_EQ(0666, Info("f").permissions);
    int32 permissions = 0644;
    EXPECT_EQ(kNotFoundErr, FSetAccessRights(At("missing"), nullptr, nullptr, &permissions));
    EXPECT_EQ(kNoErr, FSetAccessRights(At("missing"), nullptr, nullptr, nullptr));
    int64 ticks = 0;
    EXPECT_EQ(95616288010000000, SecsToWin32FileTime(1, &ticks));
    EXPECT_EQ(95616288010000000, ticks);
}

TEST_F(FileOperationsTest, SpecialNames) {
    for (const char* name : {".hidden", "x.LNK", ".lnk"}) started.drive.Put(name, "");
    const std::tuple<MgErr (*)(Path, int32*), const char*, int32> rows[] = {{FIsHiddenFile, ".hidden", 1},
                                                                            {FIsHiddenFile, "x.LNK", 0},
                                                                            {FIsShortcut, "x.LNK", 1},
                                                                            {FIsShortcut, ".lnk", 0},
                                                                            {FIsShortcut, "missing.lnk", 0}};
    int32 flag = 7;
    for (const auto& [query, name, expected] : rows) {
        EXPECT_EQ(kNoErr, query(At(name), &flag)) << name;
        EXPECT_EQ(expected, flag) << name;
    }
    const ReportRecorder reports;
    PathRef relative("a", PathRef::StringDisplay());
    EXPECT_EQ(kArgErr, FIsHiddenFile(&relative, &flag));
    EXPECT_EQ(kArgErr, FIsShortcut(At("x.LNK"), nullptr));
    EXPECT_EQ((std::vector<std::string>{"FIsHiddenFile: relative path passed in!",
                                        "FIsShortcut: NULL isShortcut passed in!"}),
              reports.Texts());

    Str255 name = {5, 'a', '.', 'b', '.', 'c'};
    EXPECT_EQ(2, PStrStripRezExt(name, 0));
    EXPECT_EQ(3, name[0]);
    EXPECT_EQ(0, PStrStripRezExt(name, TESSEL_FOURCC('t', 'e', 's', 't')));
}

TEST_F(FileOperationsTest, CaseIsCorrectedAndRemembered) {
    ASSERT_EQ(kNoErr, FNewDirHier(At("Folder")));
    started.drive.Put("Folder/File.txt", "");
    PathRef path = started.On("fOLDER/fILE.TXT");
    const auto isCorrected = [&] {
        return path.GetCorrectedCase(100).Equals(started.On("Folder/File.txt"), PathRef::kExact);
    };
    EXPECT_TRUE(isCorrected());
    std::filesystem::remove_all(started.drive.Native("Folder"));
    EXPECT_TRUE(isCorrected());
    path.FlushCache();
    EXPECT_FALSE(isCorrected());
    PathRef deep(PathRef::kAbsolute);
    for (int i = 0; i < 100000; ++i) deep.Append("x");  // more than any stack of calls
    EXPECT_THROW(deep.GetCorrectedCase(100), OVExcept);
    for (double seconds : {-1.0, 1e300, static_cast<double>(NAN)})
        EXPECT_TRUE(path.GetCorrectedCase(seconds).Equals(path, PathRef::kIgnoreCase));

    started.drive.Put("Mixed", "");
    PathRef lower = started.On("mixed");
    EXPECT_EQ(kNoErr, Win32GetLongFileName(&lower));
    EXPECT_TRUE(lower.Equals(started.On("Mixed"), PathRef::kExact));
    EXPECT_EQ(kNotFoundErr, Win32GetLongFileName(At("none")));
}

TEST_F(FileOperationsTest, PathsAskTheDisk) {
    started.drive.Put("f", "12345");
    PathRef file = started.On("f"), folder = started.On("");
    EXPECT_TRUE(file.IsAFile() && folder.IsADirectory() && !started.On("g").Exists());
    EXPECT_EQ(5u, file.Size(PathRef::kLogicalSize));
    EXPECT_EQ(1u, folder.DirectoryItemCount());
    EXPECT_GE(folder.VolumeSize(), folder.VolumeFree());
    EXPECT_GT(folder.VolumeFree(), 0.0);
    const auto detailOfSize = [](PathRef& path, int32 kind) -> std::string {
        try {
            path.Size(static_cast<PathRef::SizeType>(kind));
        } catch (const OVExcept& error) {
            return std::to_string(error.Code()) + " " + error.Detail();
        }
        return "";
    };
    EXPECT_EQ("53 PathRef::Size: Only logical size is supported at the moment", detailOfSize(file, 2));
    EXPECT_EQ("1 PathRef::Size: Can't get the size of a folder, get DirectoryItemCount",
              detailOfSize(folder, PathRef::kLogicalSize));
    // What the host says about the file counts more than the disk.
    file.Cache(kPathFlavorKey, new CachedPathFlavor(60000, PathRef::CachedItem::kDependsOnFile, false, false));
    EXPECT_EQ("7 PathRef::Size: Does not exist", detailOfSize(file, PathRef::kLogicalSize));

    PathRef copy = started.On("copy"), moved = started.On("moved"), temporary = folder;
    EXPECT_EQ(kNoErr, file.CopyFileTo(copy, PathRef::kDontResolve));
    EXPECT_EQ(kNoErr, copy.MoveFileTo(moved, PathRef::kDontResolve));
    EXPECT_EQ("12345", started.drive.Get("moved"));
    EXPECT_EQ(kNoErr, moved.RemoveFile(PathRef::kResolveShortcuts));
    EXPECT_FALSE(moved.Exists());
    temporary.AppendTemporaryName("tmp", "a", "z");
    EXPECT_TRUE(PathRef::NameWildCardMatch(temporary.Name(), "a*z.tmp")) << temporary.Name();
}

TEST_F(FileOperationsTest, VolumesAndLists) {
    CPStrHandle names = reinterpret_cast<CPStrHandle>(DSNewHClr(4));
    UHandle kinds = DSNewHandle(0);
    ASSERT_EQ(kNoErr, FListDesktop(names, kinds));
    ASSERT_EQ(2, (*names)->count);
    EXPECT_EQ(0, std::memcmp((*names)->bytes, "\1C\1T", 4));
    EXPECT_EQ(2u, reinterpret_cast<VolKindRec*>(*kinds)->flags);

    ASSERT_EQ(kNoErr, CPStrClear(names));
    ASSERT_EQ(kNoErr, DSSetHandleSize(kinds, 3 * sizeof(VolKindRec)));
    const char* const kUnsorted[] = {"\1b", "\2AA", "\1C"};
    for (uint32 i = 0; i < 3; ++i) {
        ASSERT_EQ(kNoErr, CPStrInsert(names, reinterpret_cast<ConstPStr>(kUnsorted[i]), static_cast<int32>(i)));
        reinterpret_cast<VolKindRec*>(*kinds)[i] = {i, i};
    }
    ASSERT_EQ(kNoErr, DSSetHandleSize(kinds, 3 * sizeof(VolKindRec) - 1));
    EXPECT_EQ(kArgErr, LSort(names, kinds));
    ASSERT_EQ(kNoErr, DSSetHandleSize(kinds, 3 * sizeof(VolKindRec)));
    reinterpret_cast<VolKindRec*>(*kinds)[2] = {2, 2};
    EXPECT_EQ(kNoErr, LSort(names, kinds));
    EXPECT_EQ(0, std::memcmp((*names)->bytes, "\2AA\1b\1C", 7));
    EXPECT_EQ(1u, reinterpret_cast<VolKindRec*>(*kinds)[0].flags);
    DSDisposeHandle(reinterpret_cast<UHandle>(names));
    DSDisposeHandle(kinds);

    PathRef odd(PathRef::kAbsolute);
    odd.Append("CC");
    VolInfoRec info;
    EXPECT_EQ(kArgErr, FGetVolInfo(&odd, &info));
    EXPECT_EQ(kNoErr, FGetVolInfo(At("f"), &info));
    Path volume = nullptr;
    EXPECT_EQ(kNoErr, FMGetVolPath(At("f"), &volume));
    EXPECT_TRUE(volume->Equals(started.On("").Volume(), PathRef::kExact));
    PathRef::DisposePath(volume);
}

TEST_F(FileOperationsTest, NamesOfTheHostAndBack) {
    started.drive.Put("Some File", "");
    Path path = nullptr;
    ASSERT_EQ(kNoErr, NativeToPath(started.drive.Native("Some File").c_str(), &path));
    EXPECT_TRUE(path->Equals(started.On("Some File"), PathRef::kExact));
    char native[512];
    EXPECT_EQ(kNoErr, PathToNative(path, native, sizeof native));
    EXPECT_EQ(started.drive.Native("Some File"), native);
    EXPECT_EQ(kArgErr, PathToNative(path, native, 5));
    PathRef::DisposePath(path);

    Path program = nullptr;
    const auto before = std::filesystem::current_path();
    EXPECT_EQ(kArgErr, NativeToPath("", &program));
    EXPECT_EQ(kArgErr, NativeToPath("/tmp/a\\b", &program));
    std::filesystem::current_path(started.drive.Native());
    EXPECT_EQ(kNoErr, NativeToPath("Some File", &program));
    EXPECT_TRUE(program->Equals(started.On("Some File"), PathRef::kExact));
    PathRef::DisposePath(program);
    std::filesystem::current_path(before);
}

}  // namespace
}  // namespace tessel::test
