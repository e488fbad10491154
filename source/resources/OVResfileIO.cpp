#include "resources/OVResfileIO.h"

#include "platform/LastError.h"
#include "platform/Replacement.h"
#include "resources/ResFileLock.h"
#include "resources/RsrcFormat.h"
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

std::atomic<IsFileAlreadyInCacheProc> isFileAlreadyInCache{nullptr};

}  // namespace

OVResfileIO::~OVResfileIO() {
    Close();
}

// ---- kinds of source ------------------------------------------------------------------------------------------------

MgErr OVResfileIO::OpenPath(Path path, bool readOnly, int32 denyMode) {
    readOnly_ = readOnly;
    const IsFileAlreadyInCacheProc hook = readOnly ? isFileAlreadyInCache.load() : nullptr;
    if (hook) {
        uint32 size = 0;
        fromCacheHook_ = hook(path, &file_, &view_, &data_, &size) != 0;
        length_ = size;
        if (fromCacheHook_) return kNoErr;
        file_ = nullptr;
        view_ = nullptr;
        data_ = nullptr;
    }
    const int32 openMode = readOnly ? kFOpenRead : kFOpenReadWrite;
    MgErr err = readOnly ? kNoErr : request_.Check(path, openMode, denyMode);
    if (!err) err = FMOpen(&file_, path, openMode, denyMode);
    openedByPath_ = !err;
    return err;
}

void OVResfileIO::UseFile(File_t* file, bool readOnly) {
    file_ = file;
    readOnly_ = readOnly;
}

void OVResfileIO::UseHandle(UHandle handle, bool readOnly) {
    handle_ = handle;
    readOnly_ = readOnly;
    length_ = DSGetHandleSize(handle);
}

void OVResfileIO::UseMemory(const void* data, uint32 size) {
    data_ = static_cast<const uint8*>(data);
    length_ = size;
    readOnly_ = true;
}

MgErr OVResfileIO::Prepare() {
    if (fromCacheHook_) return kNoErr;
    if (InMemory() && file_) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x2E57A1D3u) << "Cannot memory map the resource file"; });
        return kArgErr;
    }
    if (!file_) return kNoErr;
    if (const MgErr err = FMSeek64(file_, 0, kFSeekStart)) {
        ReportUnlocked([] { TESSEL_REPORT(kDebugError, 0x60C3F85Bu) << "cannot seek to start of resource file"; });
        return err;
    }
    uint64 size = 0;
    if (!readOnly_ || FGetEOF64(file_, &size) || size == 0 || size > kReadWholeLimit) return kNoErr;
    return ReadWhole(static_cast<uint32>(size));
}

// Without memory for it, or when the file is being cut, it is read piece by piece.
MgErr OVResfileIO::ReadWhole(uint32 size) {
    UPtr data = DSNewPtr(size);
    if (!data) return kNoErr;
    if (FMRead(file_, size, nullptr, data)) {
        DSDisposePtr(data);
        return kNoErr;
    }
    data_ = data;
    length_ = size;
    ownsData_ = true;
    return kNoErr;
}

// ---- reading and writing --------------------------------------------------------------------------------------------

MgErr OVResfileIO::SeekTo(uint64 position) {
    if (position_ == position && openedByPath_) return kNoErr;
    position_ = kUnknownPosition;
    if (position > static_cast<uint64>(std::numeric_limits<int64>::max())) return kEOFErr;
    return FMSeek64(file_, static_cast<int64>(position), kFSeekStart);
}

MgErr OVResfileIO::Read(uint64 position, void* buffer, uint32 count) {
    if (InMemory()) {
        if (position > length_ || count > length_ - position) return kEOFErr;
        if (count) std::memcpy(buffer, Bytes() + position, count);
        return kNoErr;
    }
    if (!file_) return kEOFErr;
    return openedByPath_ && count <= kSmallRead ? ReadAhead(position, buffer, count)
                                                : ReadFile(position, buffer, count);
}

MgErr OVResfileIO::ReadFile(uint64 position, void* buffer, uint32 count) {
    if (const MgErr err = SeekTo(position)) return err;
    const MgErr err = FMRead(file_, count, nullptr, buffer);
    position_ = err ? kUnknownPosition : position + count;
    return err;
}

MgErr OVResfileIO::ReadAhead(uint64 position, void* buffer, uint32 count) {
    if (position < aheadStart_ || position + count > aheadStart_ + aheadLength_) {
        aheadLength_ = 0;
        if (const MgErr err = SeekTo(position)) return err;
        const MgErr err = FMRead(file_, kAhead, &aheadLength_, ahead_);
        position_ = err ? kUnknownPosition : position + aheadLength_;
        if (err && err != kEOFErr) {
            aheadLength_ = 0;
            return err;
        }
        aheadStart_ = position;
        if (count > aheadLength_) return kEOFErr;
    }
    std::memcpy(buffer, ahead_ + (position - aheadStart_), count);
    return kNoErr;
}

MgErr OVResfileIO::Write(uint64 position, const void* data, uint32 count) {
    if (!CanWrite()) return kPermissionErr;
    if (handle_) {
        if (position > length_) return kEOFErr;
        const uint64 end = position + count;
        if (end > length_) {
            if (end > std::numeric_limits<uint32>::max()) return kMemFullErr;
            if (const MgErr err = SetSize(static_cast<uint32>(end))) return err;
        }
        if (count) std::memcpy(*handle_ + position, data, count);
        return kNoErr;
    }
    aheadLength_ = 0;
    if (const MgErr err = SeekTo(position)) return err;
    const MgErr err = FMWrite(file_, count, nullptr, data);
    position_ = err ? kUnknownPosition : position + count;
    return err;
}

MgErr OVResfileIO::Size(uint64* size) {
    if (InMemory() || !file_) {
        *size = length_;
        return kNoErr;
    }
    return FGetEOF64(file_, size);
}

MgErr OVResfileIO::SetSize(uint32 size) {
    if (handle_) {
        const MgErr err = DSSetHSzClr(handle_, size);
        if (!err) length_ = size;
        return err;
    }
    position_ = kUnknownPosition;
    aheadLength_ = 0;
    return FSetEOF64(file_, size);
}

MgErr OVResfileIO::Reserve(uint32 size) {
    uint64 end = 0;
    if (const MgErr err = Size(&end)) return err;
    if (size <= end) return kNoErr;
    if (handle_) return SetSize(size);
    position_ = kUnknownPosition;
    aheadLength_ = 0;
    return platform::FileReserve(HandleOf(file_), static_cast<int64>(size)) ? kNoErr : Win32ToOVFileErr();
}

MgErr OVResfileIO::Extend(uint32 count) {
    if (!CanWrite()) return kPermissionErr;
    uint64 end = 0;
    if (const MgErr err = Size(&end)) return err;
    if (end + count > std::numeric_limits<uint32>::max()) return handle_ ? kMemFullErr : kDiskFullErr;
    if (handle_) return SetSize(static_cast<uint32>(end + count));

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
    return file_ ? FFlush(file_) : kNoErr;
}

MgErr OVResfileIO::Assign(const void* data, uint32 size) {
    if (size > length_) {
        if (const MgErr err = SetSize(size)) return err;
    }
    if (size) std::memcpy(*handle_, data, size);
    return size < length_ ? SetSize(size) : kNoErr;
}

// ---- replacing ------------------------------------------------------------------------------------------------------

namespace {

// Nothing speaks against writing in place but that the name leads elsewhere, or that what is to be written cannot be.
MgErr ReplacementErr(const platform::Replacement& replacement, bool* inPlace) {
    const platform::ReplaceFailure failure = replacement.Failure();
    const bool moved =
        failure == platform::ReplaceFailure::kCannotRename && platform::LastError() == platform::kErrorFileNotFound;
    *inPlace = failure != platform::ReplaceFailure::kCannotFlush && !moved;
    return Win32ToOVFileErr();
}

}  // namespace

MgErr OVResfileIO::BeginReplacement(platform::Replacement* replacement, bool* inPlace) {
    platform::ReplaceRequest request;
    request.name = request_.Name();
    request.opened = HandleOf(file_);
    request.access = request_.Access();
    request.deny = request_.Denied();
    return replacement->Begin(request) ? kNoErr : ReplacementErr(*replacement, inPlace);
}

MgErr OVResfileIO::FinishReplacement(platform::Replacement* replacement, bool* inPlace) {
    const MgErr err = replacement->Finish() ? kNoErr : ReplacementErr(*replacement, inPlace);
    if (err && !replacement->HasName()) return err;
    FMClose(file_);
    file_ = FileOf(replacement->Release());
    position_ = kUnknownPosition;
    aheadLength_ = 0;
    return err;
}

MgErr OVResfileIO::SwitchHeader(const RsrcHeader& header, bool* undone) {
    RsrcHeader old;
    *undone = true;
    if (const MgErr err = Read(0, &old, kHeaderSize)) return err;
    MgErr err = Write(0, &header, kHeaderSize);
    if (!err) err = Flush();
    if (err) *undone = !Write(0, &old, kHeaderSize) && !Flush();
    return err;
}

MgErr OVResfileIO::Close() {
    if (ownsHandle_ && handle_) DSDisposeHandle(handle_);
    if (ownsData_) DSDisposePtr(const_cast<uint8*>(data_));
    const MgErr err = openedByPath_ && file_ ? FMClose(file_) : kNoErr;
    ownsHandle_ = ownsData_ = openedByPath_ = false;
    file_ = nullptr;
    view_ = nullptr;
    handle_ = nullptr;
    data_ = nullptr;
    length_ = 0;
    return err;
}

const uint8* OVResfileIO::InPlace(uint64 position) const {
    // A handle's bytes move when it is resized, which a writable one is.
    if (!InMemory() || (handle_ && !readOnly_)) return nullptr;
    return Bytes() + position;
}

UHandle OVResfileIO::ReleaseHandle() {
    if (!ownsHandle_) return nullptr;
    ownsHandle_ = false;
    return handle_;
}

}  // namespace tessel

void Set_IsFileAlreadyInCache(IsFileAlreadyInCacheProc proc) {
    tessel::isFileAlreadyInCache.store(proc);
}
