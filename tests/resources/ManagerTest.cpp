// Refnums, chains, handles, strings and paths, readers and writers.
#include "resources/ResourceTestSupport.h"
#include <tessel/files/FileManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/resources/RFReadWrite.h>

#include <atomic>
#include <climits>
#include <gmock/gmock.h>
#include <thread>

namespace tessel::test {
namespace {

using namespace std::string_literals;

using Errors = std::vector<MgErr>;

constexpr ResType kLong = TESSEL_FOURCC('L', 'S', 'T', 'R');
constexpr ResType kPaths = TESSEL_FOURCC('P', 'T', 'H', '#');

std::string TextOf(const PathRef& path) {
    std::string text;
    EXPECT_EQ(kNoErr, path.ConvertToString(&text, PathRef::StringDisplay()));
    return text;
}

// What a call has read, or its error.
std::string Answer(MgErr err, const std::string& read) {
    return err ? "error " + std::to_string(err) : read;
}

class ManagerTest : public ResourceTest {
protected:
    std::string IDs(RsrcFile file, ResType type) {
        std::string ids;
        UHandle data = nullptr;
        for (int32 i = 1; RGetInd(file, type, i, &data) == kNoErr; ++i) {
            int32 id = 0;
            EXPECT_EQ(kNoErr, RGetInfo(data, &id, nullptr, nullptr));
            ids += std::to_string(id) + " ";
        }
        return ids;
    }
};

TEST_F(ManagerTest, ResourcesAreKeptByTypeAndAscendingID) {
    const RsrcFile file = NewMemFile();
    for (const int32 id : {5, 1, INT32_MAX, 3, INT32_MIN})
        EXPECT_EQ(kNoErr, Add(file, kData, id, std::to_string(id), "n" + std::to_string(id)));
    EXPECT_EQ(kNoErr, Add(file, kStr, 3, "other type"));
    EXPECT_EQ(kResIDExistsErr, Add(file, kData, 3, "again"));
    EXPECT_EQ("-2147483648 1 3 5 2147483647 ", IDs(file, kData));
    EXPECT_EQ("3", Get(file, kData, 3));

    UHandle data = nullptr;
    ASSERT_EQ(kNoErr, RGetNamed(file, kData, Name("\2N5"), &data));
    EXPECT_EQ("5", BytesOf(data));
    Remove(file, kData, 1);
    for (const char* name : {"\2n5", "\2n3", "\013n2147483647"}) {
        Str255 found;
        ASSERT_EQ(kNoErr, RGetNamed(file, kData, Name(name), &data));
        EXPECT_EQ(kNoErr, RGetInfo(data, nullptr, nullptr, found));
        EXPECT_EQ(0, std::memcmp(name, found, found[0] + 1u));
    }
    EXPECT_EQ(kResNotFoundErr, RGetNamed(file, kData, Name("\2n1"), &data));

    int32 types = 0, none = 7, exists = 7;
    ResType second = 0, third = 7;
    bool loaded = false;
    EXPECT_EQ((Errors{0, 0, 0, kResNotFoundErr, kResNotFoundErr, kResNotFoundErr, 0}),
              (Errors{RCountTypes(file, &types), RCount(file, kLong, &none), RGetIndType(file, &second, 2),
                      RGetIndType(file, &third, 3), RGetInd(file, kData, 0, &data), RExists(file, kData, 1, &exists),
                      RIsLoaded(file, kStr, 3, &loaded)}));
    EXPECT_EQ(std::tuple(2, 0, kStr, ResType{0}, 0, true), std::tuple(types, none, second, third, exists, loaded));
}

TEST_F(ManagerTest, ChangesAreKeptUntilTheyAreWritten) {
    const ReportRecorder reports;
    RsrcFile file = CreateDisk("f");
    ASSERT_EQ(kNoErr, Add(file, kData, 1, "one"));
    UHandle data = Loaded(file, kData, 1);
    EXPECT_EQ(kArgErr, RRelease(data));
    EXPECT_EQ(kResNotFoundErr, RDetach(data));
    // Attributes are the caller's, but do not lose data.
    EXPECT_EQ(kNoErr, RSetAttrs(data, 0x40));
    EXPECT_EQ(kArgErr, RRelease(data));
    ASSERT_EQ(kNoErr, RUpdateFile(file));
    EXPECT_EQ(
        (std::vector<std::string>{"!!! Tried to release a changed resource", "!!! Tried to detach a changed resource",
                                  "!!! Tried to release a changed resource"}),
        reports.Texts());

    uint32 attrs = 0, size = 0;
    EXPECT_EQ(kNoErr, RGetAttrs(data, &attrs));
    EXPECT_EQ(0x40u, attrs);
    EXPECT_EQ(kNoErr, RSetAttrs(data, kRProtectedAttr));
    EXPECT_EQ(kResNotFoundErr, RRemove(data, file));
    EXPECT_EQ(kNoErr, RSetAttrs(data, 0));
    EXPECT_EQ(kResNotFoundErr, RRemove(data, NewMemFile()));  // another file's
    for (const RsrcFile taker : {file, NewMemFile()}) EXPECT_EQ(kArgErr, RAdd(data, taker, kData, 7, nullptr));
    ASSERT_EQ(kNoErr, DSSetHandleSize(data, 2));
    EXPECT_EQ(kNoErr, RSize(data, &size));
    EXPECT_EQ(2u, size);
    ASSERT_EQ(kNoErr, RChanged(data));
    ASSERT_EQ(kNoErr, RUpdateFile(file));
    EXPECT_EQ(kNoErr, RRelease(data));
    EXPECT_EQ(kResNotFoundErr, RRelease(data));
    EXPECT_EQ(kResNotFoundErr, RSize(data, &size));
    EXPECT_TRUE(reports.Has(kDebugWarning, "Releasing a non-resource"));
    EXPECT_EQ("on", Get(file, kData, 1));

    data = Loaded(file, kData, 1);
    EXPECT_EQ(kNoErr, RDetach(data));
    ResFile* object = RsrcFileToRMapResFile(file);
    EXPECT_EQ(kNoErr, object->RReplacePtr("replaced", 8, kData, 1));
    EXPECT_EQ("replaced", Get(file, kData, 1));
    EXPECT_EQ("on", BytesOf(data));
    EXPECT_EQ(kNoErr, object->RReplaceDSHandle(data, kData, 1));
    EXPECT_EQ(kResIDExistsErr, object->RReplaceDSHandle(data, kData, 2));
    EXPECT_EQ(kResIDExistsErr, object->RReplacePtr(nullptr, 1, kData, 1));
    DSDisposeHandle(data);
    EXPECT_EQ(kNoErr, RCloseFile(file));

    file = OpenDisk("f", kROpenReadOnly);
    EXPECT_EQ("on", Get(file, kData, 1));
    data = Loaded(file, kData, 1);
    EXPECT_THAT((Errors{RChanged(data), RSetAttrs(data, 0), RRemove(data, file), Add(file, kData, 2, "x"),
                        RSetFileAttrs(file, 0), RPreAllocFile(file, 1)}),
                testing::Each(kPermissionErr));
    EXPECT_EQ("on", Get(file, kData, 1));
    EXPECT_TRUE(reports.Has(kDebugWarning, "Tried to call RSetFileAttrs on a readonly file"));
    EXPECT_TRUE(reports.Has(kDebugWarning, "Tried to call RPreAllocFile on a readonly file"));
}

TEST_F(ManagerTest, UnknownRefnumsAndHandlesReachNothing) {
    const RsrcFile stale = NewMemFile();
    ASSERT_EQ(kNoErr, RCloseFile(stale));
    UHandle data = HandleOf("x"), image = nullptr;
    UHandle const own = data;
    uint32 attrs = 0;
    int32 number = 7;
    bool loaded = true;
    ConstPStr string = nullptr;
    for (const RsrcFile refnum : {stale, RsrcFile{0}, RsrcFile{12345}}) {
        EXPECT_THAT((Errors{RGet(refnum, kData, 1, &image), RGetInd(refnum, kData, 1, &image),
                            RGetNamed(refnum, kData, Name("\1n"), &image), RExists(refnum, kData, 1, &number),
                            RAdd(data, refnum, kData, 1, nullptr), RCount(refnum, kData, &number),
                            RCountTypes(refnum, &number), RGetFileAttrs(refnum, &attrs), RSetFileAttrs(refnum, 0),
                            RUpdateFile(refnum), RCloseFile(refnum), RCloseFileForce(refnum), RUniqueID(refnum, kData),
                            RGetIndStringPtr(refnum, &string, 1, 1, kStrList), RReleaseRsrcFileRefnum(refnum)}),
                    testing::Each(kNotResFileErr));
        EXPECT_EQ(nullptr, image);
        EXPECT_EQ(kResNotFoundErr, RIsLoaded(refnum, kData, 1, &loaded));
        EXPECT_THAT(
            (Errors{RPreAllocFile(refnum, 1), RGetUHandleOwnership(refnum, &image), RGetMemFileHandle(refnum, &image)}),
            testing::Each(kPermissionErr));
    }
    EXPECT_THAT((Errors{RRemove(own, stale), RDetach(own), RChanged(own), RGetInfo(own, nullptr, nullptr, nullptr)}),
                testing::Each(kResNotFoundErr));
    EXPECT_EQ(kArgErr, RGet(stale, kData, 1, nullptr));

    const RsrcFile file = NewMemFile();
    const ReportRecorder reports;
    EXPECT_EQ(kResIDExistsErr, RAdd(nullptr, file, kData, 1, nullptr));
    UPtr free = nullptr;
    EXPECT_EQ(kHandleErr, RAdd(&free, file, kData, 1, nullptr));
    EXPECT_TRUE(reports.Has(kDebugError, "RAdd of non-DS Handle"));
    EXPECT_EQ(kNoErr, RCloseFile(file));
    DSDisposeHandle(own);
}

TEST_F(ManagerTest, ChainsAreSearchedInOrder) {
    const RsrcFile a = NewMemFile(), b = NewMemFile();
    ASSERT_EQ(kNoErr, Add(a, kData, 1, "a1"));
    ASSERT_EQ(kNoErr, Add(b, kData, 1, "b1"));
    ASSERT_EQ(kNoErr, Add(b, kData, 2, "b2", "two"));
    const ReportRecorder reports;
    RsrcFile chain = 0, nested = 0;
    const RsrcFile files[] = {a, b, 99};
    EXPECT_EQ(kNotResFileErr, RChain(&chain, 3, files));
    EXPECT_TRUE(reports.Has(kDebugWarning, "RChain called with RsrcFile that is not in map."));
    ASSERT_EQ(kNoErr, RChain(&chain, 2, files));
    EXPECT_EQ("a1", Get(chain, kData, 1));
    EXPECT_EQ("b2", Get(chain, kData, 2));
    EXPECT_EQ("error 15", Get(chain, kData, 3));
    UHandle data = nullptr;
    EXPECT_EQ(kNoErr, RGetNamed(chain, kData, Name("\3TWO"), &data));
    EXPECT_EQ("b2", BytesOf(data));
    int32 count = 0;
    EXPECT_EQ(kNotResFileErr, RCount(chain, kData, &count));
    EXPECT_EQ(kNotResFileErr, RCloseFile(chain));
    EXPECT_EQ(kNotResFileErr, RDestroyChain(a));
    ASSERT_EQ(kNoErr, RChain(&nested, 0, nullptr));
    EXPECT_EQ("error 15", Get(nested, kData, 1));
    EXPECT_EQ(kNoErr, RDestroyChain(nested));

    // A file that answers with another error stops the search; one that is closed leaves.
    ResFile* const both[] = {RsrcFileToRMapResFile(a), RsrcFileToRMapResFile(0), RsrcFileToRMapResFile(b)};
    ResChain* objects = nullptr;
    Resource* resource = nullptr;
    ASSERT_EQ(kNoErr, ResFileFactory::RChain(&objects, 3, both, false));
    EXPECT_EQ(kNoErr, objects->RGet(kData, 1, &resource));
    EXPECT_EQ(kNotResFileErr, objects->RGet(kData, 2, &resource));
    ASSERT_EQ(kNoErr, RCloseFile(a));
    EXPECT_EQ(kNotResFileErr, objects->RGet(kData, 1, &resource));
    EXPECT_EQ("b1", Get(chain, kData, 1));
    EXPECT_EQ(kArgErr, objects->RGet(kData, 2, nullptr));
    delete objects;
    EXPECT_EQ(kNoErr, RDestroyChain(chain));
    EXPECT_EQ("b2", Get(b, kData, 2));
}

// A handler that waits for a thread which needs the lock.
void WorkElsewhere(CStr, int32, CStr, int32, uint32, CStr) {
    std::thread([] {
        int32 types = 0;
        EXPECT_EQ(kNotResFileErr, RCountTypes(0, &types));
    }).join();
}

TEST_F(ManagerTest, ReportsAreMadeWithoutTheLock) {
    const RsrcFile file = Open(Fixture("plain.rsrc"), kROpenReadOnly), unlisted = 99;
    RsrcFile chain = 0;
    const DebugOutputHandler before = DebugOutputSetHandler(WorkElsewhere);
    EXPECT_EQ(kPermissionErr, RSetFileAttrs(file, 0));
    EXPECT_EQ(kArgErr, RGetModDate(nullptr, file, nullptr, nullptr));
    EXPECT_EQ(kNotResFileErr, RChain(&chain, 1, &unlisted));
    EXPECT_EQ(kResNotFoundErr, RRelease(nullptr));
    DebugOutputSetHandler(before);
}

TEST_F(ManagerTest, RefnumsEndWithTheirFile) {
    const RsrcFile file = NewMemFile();
    ASSERT_EQ(kNoErr, Add(file, kData, 1, "x"));
    const RsrcFile second = RMapResFileToRsrcFile(RsrcFileToRMapResFile(file));
    EXPECT_EQ("x", Get(second, kData, 1));
    EXPECT_EQ(kNoErr, RReleaseRsrcFileRefnum(file));
    EXPECT_EQ("error 13", Get(file, kData, 1));
    const RsrcFile third = RMapResFileToRsrcFile(RsrcFileToRMapResFile(second));
    EXPECT_EQ(kNoErr, RCloseFile(second));
    EXPECT_EQ("error 13", Get(third, kData, 1));
}

TEST_F(ManagerTest, HandlesAreFoundAfterOthersWereUsed) {
    const RsrcFile a = Open(Fixture("plain.rsrc")), b = Open(Fixture("plain.rsrc"), kROpenReadOnly);
    UHandle handles[6] = {};
    for (int32 i = 0; i < 6; ++i) ASSERT_EQ(kNoErr, RGetInd(i % 2 ? a : b, kStrList, 1 + i / 2 % 2, &handles[i]));
    for (const UHandle handle : handles) {
        uint32 size = 0;
        EXPECT_EQ(kNoErr, RSize(handle, &size));
        EXPECT_EQ(DSGetHandleSize(handle), size);
    }
    // A reader that takes a resource away takes it from the handles too.
    RFReader reader(b);
    UHandle own = nullptr;
    ASSERT_EQ(kNoErr, reader.AllocDSHandle(kStrList, 5, &own));
    EXPECT_EQ(handles[0], own);
    EXPECT_EQ(kResNotFoundErr, RChanged(own));
    EXPECT_EQ(16u, DSGetHandleSize(own));
    DSDisposeHandle(own);
}

TEST_F(ManagerTest, StringsAndPathsAreReadAndNeverBeyondTheirResource) {
    const RsrcFile file = Open(Fixture("plain.rsrc"), kROpenReadOnly), odd = NewMemFile();
    const std::string path = "PTH0\0\0\0\x08\0\0\0\2\1C\1f"s;
    const std::pair<ResType, std::string> added[] = {{kStr, "\3" + std::string(299, 'x')},
                                                     {kStr, "\0\0\0\0late"s},
                                                     {kStrList, "\0\3\1a\2b"s},
                                                     {kStrList, "\0"s},
                                                     {kLong, "\0\0\0\2\0\0\0\1a\0\0\0\x7F\xFF\xFF\xFF"s},
                                                     {kPaths, "\0\0\0\2nope\0\0\0\0"s},
                                                     {kPaths, "\0\0\0\2"s + path + "PTH0\xFF\xFF\xFF\xFF"s},
                                                     {kPaths, path}};
    int32 number = 1;
    for (const auto& [type, bytes] : added) ASSERT_EQ(kNoErr, Add(odd, type, number++, bytes));

    std::string text;
    const auto indexed = [&](RsrcFile from, int32 id, int32 i) {
        Str255 flat;
        const MgErr err = RGetIndString(from, flat, id, i);
        EXPECT_EQ(err, RGetIndexStringStd(from, &text, id, i));
        EXPECT_TRUE(err || text == std::string(flat + 1, flat + 1 + flat[0]));
        return Answer(err, text);
    };
    const auto longIndexed = [&](RsrcFile from, int32 id, int32 i) {
        LStrHandle flat = nullptr;
        const MgErr err = RGetIndLString(from, &flat, id, i, kLong);
        EXPECT_EQ(err, RGetIndexLongStringStd(from, &text, id, i, kLong));
        EXPECT_TRUE(err || text == std::string((*flat)->bytes, (*flat)->bytes + (*flat)->count));
        if (flat) DSDisposeHandle(reinterpret_cast<UHandle>(flat));
        return Answer(err, text);
    };
    const auto indexedPath = [&](RsrcFile from, int32 id, int32 i) {
        Path read = nullptr;
        const MgErr err = RGetIndPath(from, &read, id, i);
        text = read ? TextOf(*read) : "";
        PathRef::DisposePath(read);
        return Answer(err, text);
    };
    using Texts = std::vector<std::string>;
    EXPECT_EQ((Texts{"error 15", "two", "error 15", "error 15"}),
              (Texts{indexed(file, 5, 0), indexed(file, 5, 2), indexed(file, 5, 4), indexed(file, 6, 1)}));
    EXPECT_EQ((Texts{"a", "error 4", "error 4"}), (Texts{indexed(odd, 3, 1), indexed(odd, 3, 2), indexed(odd, 4, 1)}));
    EXPECT_EQ((Texts{"end", "error 4"}), (Texts{longIndexed(file, 1, 3), longIndexed(odd, 5, 2)}));
    EXPECT_EQ(500u, longIndexed(file, 1, 1).size());
    const ReportRecorder reports;
    EXPECT_EQ(
        (Texts{"C:\\data\\a.rsc", "..\\rel\\b", "\\\\srv\\share\\x", "error 15"}),
        (Texts{indexedPath(file, 7, 1), indexedPath(file, 7, 2), indexedPath(file, 7, 3), indexedPath(file, 7, 4)}));
    EXPECT_EQ((Texts{"error 15", "C:\\f", "error 4"}),
              (Texts{indexedPath(odd, 6, 1), indexedPath(odd, 7, 1), indexedPath(odd, 7, 2)}));
    EXPECT_TRUE(reports.Has(kDebugWarning, "This doesn't contain a path resource"));

    ConstPStr place = nullptr;
    EXPECT_EQ(kNoErr, RGetIndStringPtr(file, &place, 5, 3, kStrList));
    EXPECT_EQ(0, std::memcmp(place, "\5three", 6));
    EXPECT_EQ("negative id", Answer(RGetStringStd(file, &text, -1), text));
    Str255 empty, cut;
    EXPECT_EQ((Errors{0, 0}), (Errors{RGetPStr(file, 300, empty), RGetPStr(odd, 1, cut)}));
    EXPECT_EQ((Errors{0, 299 & 0xFF}), (Errors{empty[0], cut[0]}));
    EXPECT_EQ("", Answer(RGetLongStringStd(odd, &text, 2), text));
    EXPECT_EQ(kEOFErr, RGetLongStringStd(odd, &text, 1));
    Path read = nullptr;
    EXPECT_EQ(kNoErr, RGetPath(odd, kPaths, 8, &read));
    EXPECT_EQ("C:\\f", TextOf(*read));
    PathRef::DisposePath(read);
    EXPECT_EQ(kCorruptErr, RGetPath(odd, kStr, 1, &read));
    EXPECT_EQ(kArgErr, RGetStringStd(odd, nullptr, 1));
}

TEST_F(ManagerTest, ImagesOfWholeFiles) {
    const RsrcFile made = NewMemFile();
    UHandle image = nullptr;
    EXPECT_EQ(kGenericErr, RGetUHandleOwnership(made, &image));
    ASSERT_EQ(kNoErr, Add(made, kData, 2, "two", "name"));
    ASSERT_EQ(kNoErr, Add(made, kData, 1, "one"));
    ASSERT_EQ(kNoErr, RGetMemFileHandle(made, &image));
    // The same resources written to disk in the order of the map give the same bytes, but for the word that says that
    // the map was changed.
    const RsrcFile disk = CreateDisk("f");
    ASSERT_EQ(kNoErr, Add(disk, kData, 1, "one"));
    ASSERT_EQ(kNoErr, Add(disk, kData, 2, "two", "name"));
    ASSERT_EQ(kNoErr, RCloseFile(disk));
    EXPECT_EQ(started.drive.Get("f"), BytesOf(image));
    EXPECT_EQ(kArgErr, RRelease(Loaded(made, kData, 1)));  // it could not be loaded again
    EXPECT_EQ(kNoErr, RCloseFile(made));

    // A file over that handle grows with what is added, and gives the handle back.
    _FMFileType type = 0;
    _FMFileCreator creator = 0;
    RsrcFile file = 0;
    ASSERT_EQ(kNoErr, ROpenUHandle(image, kROpenReadWrite, &file, &type, &creator));
    EXPECT_TRUE(type == kType && creator == kCreator);
    ASSERT_EQ(kNoErr, Add(file, kStr, 9, std::string(5000, 's')));
    UHandle same = nullptr;
    ASSERT_EQ(kNoErr, RGetMemFileHandle(file, &same));
    EXPECT_EQ(image, same);
    EXPECT_EQ(kGenericErr, RGetUHandleOwnership(file, &same));
    EXPECT_EQ(kNoErr, RCloseFile(file));
    const std::string bytes = BytesOf(image);
    EXPECT_EQ(kNoErr, ROpenUPtr(bytes.data(), static_cast<uint32>(bytes.size()), &file, nullptr, nullptr));
    EXPECT_EQ(std::string(5000, 's'), Get(file, kStr, 9));
    EXPECT_EQ(kArgErr, RGetMemFileHandle(file, &same));
    EXPECT_EQ("one", Get(file, kData, 1));
    EXPECT_EQ("two", Get(file, kData, 2));
    ASSERT_EQ(kNoErr, RGetMemFileHandle(file, &same));
    EXPECT_EQ(bytes.size(), BytesOf(same).size());
    EXPECT_EQ(kPermissionErr, RPreAllocFile(file, 1));
    EXPECT_EQ(kNoErr, RCloseFile(file));
    DSDisposeHandle(same);
    DSDisposeHandle(image);
}

TEST_F(ManagerTest, UniqueIDsAreNotTaken) {
    const RsrcFile file = NewMemFile();
    EXPECT_EQ(128, RUniqueID(file, kData));
    ASSERT_EQ(kNoErr, Add(file, kData, 1, "x"));
    const int32 next = RUniqueID(file, kStr);
    EXPECT_GE(next, 128);
    EXPECT_EQ(next + 1, RUniqueID(file, kStr));
    for (int32 id = next + 2; id < next + 10; ++id) ASSERT_EQ(kNoErr, Add(file, kData, id, "x"));
    EXPECT_EQ(next + 10, RUniqueID(file, kData));
}

TEST_F(ManagerTest, TypesDatesAndOpenFiles) {
    started.drive.Put("f", Fixture("plain.rsrc"));
    started.drive.Put("bad", Fixture("bad-mapcopy.rsrc"));
    PathRef path = started.On("f"), missing = started.On("g");
    _FMFileType type = 0;
    _FMFileCreator creator = 0;
    EXPECT_EQ(kNoErr, RSetFileType(&path, kStr, kData));
    EXPECT_EQ(kNoErr, RGetFileType(&path, &type, &creator));
    EXPECT_TRUE(type == kStr && creator == kData);
    EXPECT_EQ(kNotFoundErr, RGetFileType(&missing, &type, &creator));
    EXPECT_EQ(kIOErr, RSetFileType(started.At("bad"), kStr, kData));
    EXPECT_EQ(kArgErr, ROpenFile(&path, 2, nullptr, nullptr, nullptr));

    File_t* open = nullptr;
    RsrcFile file = 0;
    ASSERT_EQ(kNoErr, FMOpen(&open, &path, kFOpenReadWrite, kFDenyNone));
    ASSERT_EQ(kNoErr, ROpenFileRefnum(open, kROpenReadWrite, &file, &type, nullptr));
    EXPECT_EQ(kStr, type);
    ASSERT_EQ(kNoErr, Add(file, kData, 5, "x"));
    uint32 date = 0, same = 0;
    EXPECT_EQ(kNoErr, RGetModDate(&missing, file, &date, nullptr));
    EXPECT_EQ(kNoErr, RGetModDate(&path, 0, &same, nullptr));
    EXPECT_EQ(date, same);
    const ReportRecorder reports;
    EXPECT_EQ(kArgErr, RGetModDate(&path, file, nullptr, nullptr));
    EXPECT_EQ(kArgErr, RGetModDate(&path, 0, nullptr, nullptr));
    EXPECT_EQ((std::vector<std::string>{"OVResFile::RGetModDate modDate is NULL",
                                        "ResFileFactory::RGetModDate, modDate==NULL."}),
              reports.Texts());
    EXPECT_EQ(kNoErr, RCloseFile(file));
    uint32 position = 0;
    EXPECT_EQ(kNoErr, FMTell(open, &position));  // still the caller's
    EXPECT_EQ(kNoErr, FMClose(open));
    // This program is no resource file and has none behind it.
    EXPECT_EQ(kNotResFileErr, ROpenAppResFile(nullptr, kROpenReadOnly, &file));
}

const std::string* gCachedBytes;
int32 OfferCachedFile(Path, File_t**, void**, const uint8** data, uint32* size) {
    *data = reinterpret_cast<const uint8*>(gCachedBytes->data());
    *size = static_cast<uint32>(gCachedBytes->size());
    return 1;
}

TEST_F(ManagerTest, FilesThatTheHostHasInMemory) {
    const std::string bytes = Fixture("plain.rsrc");
    gCachedBytes = &bytes;
    Set_IsFileAlreadyInCache(OfferCachedFile);
    RsrcFile file = OpenDisk("nowhere", kROpenReadOnly);
    _FMFileType type = 0;
    EXPECT_EQ(kNoErr, RGetFileType(started.At("nowhere"), &type, nullptr));
    Set_IsFileAlreadyInCache(nullptr);
    EXPECT_EQ(kType, type);
    EXPECT_EQ("\x0bnegative id", Get(file, kStr, -1));
}

TEST_F(ManagerTest, ReadersAndWriters) {
    RFReadWrite writer;
    const ReportRecorder reports;
    EXPECT_EQ(nullptr, writer.LowLevelResFile());
    UHandle data = HandleOf("taken");
    EXPECT_EQ((Errors{kNotFoundErr, kResNotFoundErr, kResNotFoundErr, kGenericErr}),
              (Errors{writer.Close(), writer.Remove(kData, 1), writer.AddFromHandle(data, 1, kData, 1, nullptr),
                      writer.AddFromHandle(nullptr, 1, kData, 1, nullptr)}));
    ASSERT_EQ(kNoErr, writer.CreateMemoryResourceFile(kCreator, kType));
    EXPECT_THAT(
        (Errors{writer.AddFromHandle(data, 1, kData, 1, Name("\1n")), writer.AddFromPtr("copied", 6, kData, 2, nullptr),
                writer.Remove(kData, 99), writer.Remove(kData, 2)}),
        testing::Each(kNoErr));
    data = HandleOf("replacement");
    EXPECT_EQ(kNoErr, writer.ReplaceFromHandle(data, 0, kData, 1, Name("\1m")));
    DSDisposeHandle(data);
    const uint8* bytes = nullptr;
    uint32 size = 0;
    EXPECT_EQ(kNoErr, writer.PtrToResDataByNameInternal(kData, Name("\1M"), &bytes, &size));
    EXPECT_EQ("replacement", std::string(reinterpret_cast<const char*>(bytes), size));
    const RsrcFile refnum = writer.MapToObsoleteRsrcFile();
    EXPECT_EQ(refnum, writer.MapToObsoleteRsrcFile());
    EXPECT_EQ("replacement", Get(refnum, kData, 1));
    EXPECT_EQ(kNoErr, writer.UpdateFile());
    EXPECT_EQ(kNoErr, writer.Close());
    EXPECT_EQ("error 13", Get(refnum, kData, 1));

    started.drive.Put("f", Fixture("plain.rsrc"));
    RFReader reader;
    EXPECT_EQ(nullptr, reader.LowLevelResChain());
    EXPECT_EQ(kResNotFoundErr, reader.GetString(1, &data));
    ASSERT_EQ(kNoErr, reader.OpenPath(started.At("f"), kROpenReadOnly, nullptr, nullptr));
    EXPECT_EQ(kNoErr, reader.AllocDSHandleByName(kStrList, Name("\7dialogs"), &data));
    EXPECT_EQ(293u, DSGetHandleSize(data));
    DSDisposeHandle(data);
    EXPECT_EQ((std::vector<std::string>{"Uninitialized RFReadWrite", "Do not pass NULL to RFReadWrite::AddFromHandle",
                                        "Uninitialized RFReader"}),
              reports.Texts());
}

TEST_F(ManagerTest, ManyThreadsShareTheFiles) {
    const RsrcFile file = CreateDisk("f");
    std::atomic<int> failures{0};
    std::vector<std::thread> threads;
    for (int32 t = 0; t < 4; ++t) {
        threads.emplace_back([&, t] {
            for (int32 i = 0; i < 60; ++i) {
                const int32 id = t * 1000 + i;
                const std::string bytes(static_cast<size_t>(id % 97), 'x');
                failures += Add(file, kData, id, bytes) != kNoErr;
                failures += Get(file, kData, id) != bytes;
                UHandle data = nullptr;
                if (i % 3 == 0) failures += RUpdateFile(file) != kNoErr;
                failures += RGet(file, kData, id, &data) != kNoErr || RSetAttrs(data, 0x40) != kNoErr;
                if (i % 2) failures += RRemove(data, file) != kNoErr || DSDisposeHandle(data) != kNoErr;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(0, failures.load());
    int32 count = 0;
    EXPECT_EQ(kNoErr, RCount(file, kData, &count));
    EXPECT_EQ(4 * 30, count);
}

TEST_F(ManagerTest, FilesLeftOpenAreReportedAtTheStop) {
    const RsrcFile file = NewMemFile();
    ResFile* object = RsrcFileToRMapResFile(file);
    const ReportRecorder reports;
    EXPECT_EQ(kNoErr, ResourceManagerStop());
    EXPECT_TRUE(reports.Has(kDebugWarning, "The Resource Manager is being shut down with open files!"));
    EXPECT_EQ(kNotResFileErr, RCloseFile(file));
    delete object;
    EXPECT_EQ(kNoErr, ResourceManagerStart());
}

}  // namespace
}  // namespace tessel::test
