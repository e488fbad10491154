// Files that are written as a whole.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/LastError.h"
#include "platform/Replacement.h"
#include <tessel/memory/TrackedMallocFree.h>

#include <vector>

namespace tessel {

namespace {

// A file of the same name may be made or removed by others between a look and the deed.
constexpr int32 kMostTries = 10;

class OpenHandle {
public:
    OpenHandle() = default;
    ~OpenHandle() {
        if (handle_ != platform::kNoFile) platform::FileClose(handle_);
    }
    OpenHandle(const OpenHandle&) = delete;
    OpenHandle& operator=(const OpenHandle&) = delete;

    platform::FileHandle handle_ = platform::kNoFile;
};

bool Put(platform::FileHandle file, const void* data, uint64 size) {
    size_t put = 0;
    return platform::FileWrite(file, data, static_cast<size_t>(size), put);
}

bool PutAllOf(platform::FileHandle file, const void* data, uint64 size) {
    return platform::FileSeek(file, 0, platform::SeekFrom::kStart) && Put(file, data, size) &&
           platform::FileFlush(file) && platform::FileSetSize(file, static_cast<int64>(size)) &&
           platform::FileFlush(file);
}

// Where no other file can stand in for it. What cannot be written is put back as it was.
bool WriteInPlace(platform::FileHandle file, const void* data, uint64 size) {
    int64 oldSize = 0;
    if (!platform::FileSize(file, oldSize)) return false;
    std::vector<uint8, TrackedAllocator<uint8>> old(static_cast<size_t>(oldSize));
    size_t got = 0;
    if (!platform::FileRead(file, old.data(), old.size(), got)) return false;
    if (PutAllOf(file, data, size)) return true;
    const platform::ErrorNumber reason = platform::LastError();
    PutAllOf(file, old.data(), got);
    platform::SetLastError(reason);
    return false;
}

bool ReplaceOrMake(const platform::ReplaceRequest& request, const void* data, uint64 size) {
    platform::Replacement replacement;
    const bool begun = replacement.Begin(request);
    if (begun && Put(replacement.File(), data, size) && replacement.Finish()) return true;
    const bool cannot = replacement.Failure() == platform::ReplaceFailure::kCannotMake;
    return cannot && request.opened != platform::kNoFile && WriteInPlace(request.opened, data, size);
}

}  // namespace

MgErr WriteWholeFile(const OpenRequest& request, bool replace, const void* data, uint64 size) {
    for (int32 tries = 1;; ++tries) {
        OpenHandle old;
        if (replace) old.handle_ = request.Open(platform::Disposition::kOpenExisting);
        const bool none = platform::LastError() == platform::kErrorFileNotFound;
        if (replace && old.handle_ == platform::kNoFile && !none) return Win32ToOVFileErr();
        platform::ReplaceRequest what;
        what.name = request.Name();
        what.opened = old.handle_;
        what.mustNotExist = old.handle_ == platform::kNoFile;
        if (ReplaceOrMake(what, data, size)) return kNoErr;
        const platform::ErrorNumber reason = platform::LastError();
        const bool changed = reason == platform::kErrorFileExists || reason == platform::kErrorFileNotFound;
        if (!replace || !changed || tries == kMostTries) return Win32ToOVFileErr();
    }
}

}  // namespace tessel

using namespace tessel;

MgErr FWriteWholeFile(Path path, const void* data, uint64 size) {
    return Guarded([&] {
        if (!data && size) return kArgErr;
        OpenRequest request;
        if (const MgErr err = request.Check(path, kFOpenReadWrite, kFDenyReadWrite)) return err;
        return WriteWholeFile(request, true, data, size);
    });
}
