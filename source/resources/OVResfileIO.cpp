#include "resources/OVResfileIO.h"

#include "files/FileSupport.h"
#include "resources/ResFileLock.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/resources/ResourceManager.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <limits>

namespace tessel {

namespace {

// Up to this size one read of the whole file costs less than the reads of its parts.
constexpr uint64 kReadWholeLimit = 256 * 1024;

constexpr uint32 kSmallRead = 64;

constexpr uint32 kExtendBlock = 10240;

std::atomic<IsFileAlreadyInCacheProc> gIsFileAlreadyInCache{nullptr};

}  // namespace

OVResfileIO::~OVResfileIO() {
    Close();
}

// ---- kinds of source ------------------------------------------------------------------------------------------------

MgErr OVResfileIO::OpenPath(Path path, bool readOnly, int32 denyMode) {
    fReadOnly = readOnly;
    const IsFileAlreadyInCacheProc hook = readOnly ? gIsFileAlreadyInCache.load() : nullptr;
    if (hook) {
        uint32 size = 0;
        fFromCacheHook = hook(path, &fFile, &fView, &fData, &size) != 0;
        fLength = size;
        if (fFromCacheHook) return kNoErr;
        fFile = nullptr;
        fView = nullptr;
        fData = nullptr;
    }
    const MgErr err = FMOpen(&fFile, path, readOnly ? kFOpenRead : kFOpenReadWrite, denyMode);
    fOpenedByPath = !err;
    return err;
}

void OVResfileIO::UseFile(File_t* file, bool readOnly) {
    fFile = file;
    fReadOnly = readOnly;
}

void OVResfileIO::UseHandle(UHandle handle, bool readOnly) {
    fHandle = handle;
    fReadOnly = readOnly;
    fLength = DSGetHandleSize(handle);
}

void OVResfileIO::UseMemory(const void* data, uint32 size) {
    fData = static_cast<const uint8*>(data);
    fLength = size;
    fReadOnly = true;
}

MgErr OVResfileIO::Prepare() {
    if (fFromCacheHook) return kNoErr;
    if (InMemory() && fFile) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x2E57A1D3u) << "Cannot memory map the resource file"; });
        return kArgErr;
    }
    if (!fFile) return kNoErr;
    if (const MgErr err = FMSeek64(fFile, 0, kFSeekStart)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x60C3F85Bu) << "cannot seek to start of resource file"; });
        return err;
    }
    uint64 size = 0;
    if (!fReadOnly || FGetEOF64(fFile, &size) || size == 0 || size > kReadWholeLimit) return kNoErr;
    return ReadWhole(static_cast<uint32>(size));
}

// Without memory for it, or when the file is being cut, it is read piece by piece.
MgErr OVResfileIO::ReadWhole(uint32 size) {
    UPtr data = DSNewPtr(size);
    if (!data) return kNoErr;
    if (FMRead(fFile, size, nullptr, data)) {
        DSDisposePtr(data);
        return kNoErr;
    }
    fData = data;
    fLength = size;
    fOwnsData = true;
    return kNoErr;
}

// ---- reading and writing --------------------------------------------------------------------------------------------

MgErr OVResfileIO::SeekTo(uint64 position) {
    if (fPosition == position && fOpenedByPath) return kNoErr;
    fPosition = kUnknownPosition;
    if (position > static_cast<uint64>(std::numeric_limits<int64>::max())) return kEOFErr;
    return FMSeek64(fFile, static_cast<int64>(position), kFSeekStart);
}

MgErr OVResfileIO::Read(uint64 position, void* buffer, uint32 count) {
    if (InMemory()) {
        if (position > fLength || count > fLength - position) return kEOFErr;
        if (count) std::memcpy(buffer, Bytes() + position, count);
        return kNoErr;
    }
    if (!fFile) return kEOFErr;
    return fOpenedByPath && count <= kSmallRead ? ReadAhead(position, buffer, count)
                                                : ReadFile(position, buffer, count);
}

MgErr OVResfileIO::ReadFile(uint64 position, void* buffer, uint32 count) {
    if (const MgErr err = SeekTo(position)) return err;
    const MgErr err = FMRead(fFile, count, nullptr, buffer);
    fPosition = err ? kUnknownPosition : position + count;
    return err;
}

MgErr OVResfileIO::ReadAhead(uint64 position, void* buffer, uint32 count) {
    if (position < fAheadStart || position + count > fAheadStart + fAheadLength) {
        fAheadLength = 0;
        if (const MgErr err = SeekTo(position)) return err;
        const MgErr err = FMRead(fFile, kAhead, &fAheadLength, fAhead);
        fPosition = err ? kUnknownPosition : position + fAheadLength;
        if (err && err != kEOFErr) {
            fAheadLength = 0;
            return err;
        }
        fAheadStart = position;
        if (count > fAheadLength) return kEOFErr;
    }
    std::memcpy(buffer, fAhead + (position - fAheadStart), count);
    return kNoErr;
}

MgErr OVResfileIO::Write(uint64 position, const void* data, uint32 count) {
    if (!CanWrite()) return kPermissionErr;
    if (fHandle) {
        if (position > fLength) return kEOFErr;
        const uint64 end = position + count;
        if (end > fLength) {
            if (end > std::numeric_limits<uint32>::max()) return kMemFullErr;
            if (const MgErr err = SetSize(static_cast<uint32>(end))) return err;
        }
        if (count) std::memcpy(*fHandle + position, data, count);
        return kNoErr;
    }
    fAheadLength = 0;
    if (const MgErr err = SeekTo(position)) return err;
    const MgErr err = FMWrite(fFile, count, nullptr, data);
    fPosition = err ? kUnknownPosition : position + count;
    return err;
}

MgErr OVResfileIO::Size(uint64* size) {
    if (InMemory() || !fFile) {
        *size = fLength;
        return kNoErr;
    }
    return FGetEOF64(fFile, size);
}

MgErr OVResfileIO::SetSize(uint32 size) {
    if (fHandle) {
        const MgErr err = DSSetHSzClr(fHandle, size);
        if (!err) fLength = size;
        return err;
    }
    fPosition = kUnknownPosition;
    fAheadLength = 0;
    return FSetEOF64(fFile, size);
}

MgErr OVResfileIO::Reserve(uint32 size) {
    uint64 end = 0;
    if (const MgErr err = Size(&end)) return err;
    if (size <= end) return kNoErr;
    if (fHandle) return SetSize(size);
    fPosition = kUnknownPosition;
    fAheadLength = 0;
    return platform::FileReserve(HandleOf(fFile), static_cast<int64>(size)) ? kNoErr : Win32ToOVFileErr();
}

MgErr OVResfileIO::Extend(uint32 count) {
    if (!CanWrite()) return kPermissionErr;
    uint64 end = 0;
    if (const MgErr err = Size(&end)) return err;
    if (end + count > std::numeric_limits<uint32>::max()) return fHandle ? kMemFullErr : kDiskFullErr;
    if (fHandle) return SetSize(static_cast<uint32>(end + count));

    static const uint8 kZeros[kExtendBlock] = {};
    MgErr err = kNoErr;
    for (uint32 done = 0; done < count && !err;) {
        const uint32 part = std::min(count - done, kExtendBlock);
        err = Write(end + done, kZeros, part);
        done += part;
    }
    if (!err) err = Flush();
    if (err) SetSize(static_cast<uint32>(end));
    return err;
}

MgErr OVResfileIO::Flush() {
    return fFile ? FFlush(fFile) : kNoErr;
}

MgErr OVResfileIO::Close() {
    if (fOwnsHandle && fHandle) DSDisposeHandle(fHandle);
    if (fOwnsData) DSDisposePtr(const_cast<uint8*>(fData));
    const MgErr err = fOpenedByPath && fFile ? FMClose(fFile) : kNoErr;
    fOwnsHandle = fOwnsData = fOpenedByPath = false;
    fFile = nullptr;
    fView = nullptr;
    fHandle = nullptr;
    fData = nullptr;
    fLength = 0;
    return err;
}

const uint8* OVResfileIO::InPlace(uint64 position) const {
    // A handle's bytes move when it is resized, which a writable one is.
    if (!InMemory() || (fHandle && !fReadOnly)) return nullptr;
    return Bytes() + position;
}

UHandle OVResfileIO::ReleaseHandle() {
    if (!fOwnsHandle) return nullptr;
    fOwnsHandle = false;
    return fHandle;
}

}  // namespace tessel

void Set_IsFileAlreadyInCache(IsFileAlreadyInCacheProc proc) {
    tessel::gIsFileAlreadyInCache.store(proc);
}
