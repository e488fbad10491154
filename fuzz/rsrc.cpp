// Resource files from anywhere: opened from memory read-only and writable, walked, edited, updated and opened again.
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/frame/TesselInit.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/resources/ResourceManager.h>

#include <climits>
#include <cstdlib>

namespace {

constexpr ResType kDataType = TESSEL_FOURCC('D', 'A', 'T', 'A');

void Ignore(CStr, int32, CStr, int32, uint32, CStr) {
}

struct Library {
    Library() {
        DebugOutputSetHandler(Ignore);
        if (InitTesselBase() || InitTesselAppSupport()) std::abort();
    }
};

void Require(bool holds) {
    if (!holds) std::abort();
}

void ReadStrings(RsrcFile file, ResType type, int32 id) {
    Str255 text;
    RGetIndString(file, text, id, 2);
    RGetPStr(file, id, text);
    LStrHandle longText = nullptr;
    if (RGetIndLString(file, &longText, id, 1, type) == kNoErr) DSDisposeHandle(reinterpret_cast<UHandle>(longText));
    Path path = nullptr;
    RGetIndPath(file, &path, id, 1);
    RGetPath(file, type, id, &path);
    if (path) FDestroyPath(&path);
}

void Walk(RsrcFile file) {
    int32 types = 0;
    Require(RCountTypes(file, &types) == kNoErr);
    for (int32 t = 1; t <= types; ++t) {
        ResType type = 0;
        int32 count = 0;
        Require(RGetIndType(file, &type, t) == kNoErr && RCount(file, type, &count) == kNoErr);
        for (int32 i = 1; i <= count; ++i) {
            UHandle data = nullptr;
            int32 id = 0;
            Str255 name;
            if (RGetInd(file, type, i, &data)) continue;
            Require(RGetInfo(data, &id, nullptr, name) == kNoErr);
            UHandle named = nullptr;
            if (name[0]) Require(RGetNamed(file, type, name, &named) != kResNotFoundErr);
            ReadStrings(file, type, id);
        }
    }
}

// Removes the first and adds before, among and behind the others.
void Edit(RsrcFile file) {
    ResType type = 0;
    UHandle data = nullptr;
    if (RGetIndType(file, &type, 1) == kNoErr && RGetInd(file, type, 1, &data) == kNoErr &&
        RRemove(data, file) == kNoErr)
        DSDisposeHandle(data);
    for (const int32 id : {INT32_MIN, 0, 129, INT32_MAX}) {
        data = DSNewHClr(static_cast<uint32>(id & 0x1FF));
        static const uint8 kName[] = {4, 'n', 'a', 'm', 'e'};
        if (RAdd(data, file, id == 0 ? kDataType : type, id, kName)) DSDisposeHandle(data);
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    static const Library library;
    RsrcFile file = 0;
    if (ROpenUPtr(bytes, static_cast<uint32>(size), &file, nullptr, nullptr) == kNoErr) {
        Walk(file);
        UHandle image = nullptr;
        if (RGetMemFileHandle(file, &image) == kNoErr) DSDisposeHandle(image);
        Require(RCloseFile(file) == kNoErr);
    }
    UHandle copy = nullptr;
    Require(DSPtrToHand(bytes, &copy, static_cast<uint32>(size)) == kNoErr);
    if (ROpenUHandle(copy, kROpenReadWrite, &file, nullptr, nullptr) != kNoErr) {
        DSDisposeHandle(copy);
        return 0;
    }
    Walk(file);
    Edit(file);
    Walk(file);
    UHandle image = nullptr;
    if (RGetMemFileHandle(file, &image) != kNoErr) {
        RCloseFileForce(file);
        return 0;
    }
    Require(RCloseFile(file) == kNoErr);
    // What an update wrote opens.
    Require(ROpenUHandle(image, kROpenReadOnly, &file, nullptr, nullptr) == kNoErr);
    Walk(file);
    Require(RCloseFile(file) == kNoErr);
    return 0;
}
