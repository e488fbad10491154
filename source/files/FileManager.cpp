// Open files: access, reading and writing, position and size.
#include "diagnostics/Guarded.h"
#include "files/FileSupport.h"
#include "platform/Clock.h"
#include "platform/LastError.h"
#include "strings/FmtEngine.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/files/FileManager.h>

#include <cstring>

namespace tessel {

namespace {

constexpr int32 kShareAttempts = 3;
constexpr uint32 kShareWaitMs = 50;

// Opens an existing file, waiting a little while someone else holds it.
platform::FileHandle OpenPatiently(const OpenRequest& request, platform::Disposition disposition) {
    for (int32 attempt = 1;; ++attempt) {
        const platform::FileHandle handle = request.Open(disposition);
        if (handle != platform::kNoFile || attempt == kShareAttempts ||
            platform::LastError() != platform::kErrorSharingViolation)
            return handle;
        platform::SleepMilliseconds(kShareWaitMs);
    }
}

// Where an offset of `mode` is measured from. An unknown mode is the start.
MgErr SeekBase(File_t* file, int32 mode, int64 size, int64* base) {
    *base = 0;
    if (mode == kFSeekEnd) *base = size;
    if (mode == kFSeekCurrent) return FMTell64(file, base);
    return kNoErr;
}

MgErr MoveTo(File_t* file, int64 position) {
    return ErrUnless(platform::FileSeek(HandleOf(file), position, platform::SeekFrom::kStart));
}

// Formats and writes. *written is what went to the file. What stands before the fault of a bad format is written only
// on request.
enum class BadFormat { kWriteStart, kWriteNothing };

MgErr PrintToFile(File_t* file, CStr format, va_list args, BadFormat bad, uint32* written) {
    *written = 0;
    if (!file || !format) return kArgErr;
    FormattedText text;
    if (const MgErr err = text.Format(format, std::strlen(format), args)) return err;
    if (!text.Good() && bad == BadFormat::kWriteNothing) return kFormatErr;
    return FMWrite(file, static_cast<uint32>(text.Length()), written, text.Bytes());
}

}  // namespace

}  // namespace tessel

using namespace tessel;

// ---- opening and closing --------------------------------------------------------------------------------------------

MgErr FMOpen(File_t** file, Path path, int32 openMode, int32 denyMode) {
    if (!file) return kArgErr;
    *file = nullptr;
    return Guarded([&] {
        OpenRequest request;
        if (const MgErr err = request.Check(path, openMode, denyMode)) return err;
        const auto disposition = openMode == kFOpenWriteTrunc ? platform::Disposition::kTruncateExisting
                                                              : platform::Disposition::kOpenExisting;
        return OpenedFile(OpenPatiently(request, disposition), file);
    });
}

MgErr FMClose(File_t* file) {
    if (!file) return kArgErr;
    return ErrUnless(platform::FileClose(HandleOf(file)));
}

// ---- reading and writing --------------------------------------------------------------------------------------------

MgErr FMRead(File_t* file, uint32 count, uint32* actual, void* buffer) {
    if (actual) *actual = 0;
    if (!file || (!buffer && count)) return kArgErr;
    size_t got = 0;
    const bool ok = platform::FileRead(HandleOf(file), buffer, count, got);
    if (actual) *actual = static_cast<uint32>(got);
    if (!ok) return Win32ToOVFileErr();
    return got < count ? kEOFErr : kNoErr;
}

MgErr FMWrite(File_t* file, uint32 count, uint32* actual, const void* data) {
    if (actual) *actual = 0;
    if (!file || (!data && count)) return kArgErr;
    if (!count) return kNoErr;
    size_t put = 0;
    const bool ok = platform::FileWrite(HandleOf(file), data, count, put);
    if (actual) *actual = static_cast<uint32>(put);
    return ErrUnless(ok);
}

MgErr FMWriteEOL(File_t* file) {
    return FMWrite(file, 2, nullptr, "\r\n");
}

MgErr FFlush(File_t* file) {
    if (!file) return kArgErr;
    return ErrUnless(platform::FileFlush(HandleOf(file)));
}

// ---- position and size ----------------------------------------------------------------------------------------------

MgErr FMSeek64(File_t* file, int64 offset, int32 mode) {
    if (!file) return kArgErr;
    if (offset == 0 && mode == kFSeekCurrent) return kNoErr;
    if (mode < kFSeekStart || mode > kFSeekCurrent)
        TESSEL_REPORT(kDebugWarning, 0x5E0A31C7u) << "FMSeek: Unknown mode (" << mode << ")";

    int64 size = 0;
    if (!platform::FileSize(HandleOf(file), size)) return Win32ToOVFileErr();
    int64 base = 0;
    if (const MgErr err = SeekBase(file, mode, size, &base)) return err;

    int64 target = 0;
    if (__builtin_add_overflow(base, offset, &target)) target = offset < 0 ? -1 : INT64_MAX;
    if (target >= 0 && target <= size) return MoveTo(file, target);
    const MgErr err = MoveTo(file, target < 0 ? 0 : size);
    return err ? err : kEOFErr;
}

MgErr FMSeek(File_t* file, int32 offset, int32 mode) {
    return FMSeek64(file, offset, mode);
}

MgErr FMTell64(File_t* file, int64* position) {
    if (!file || !position) return kArgErr;
    return ErrUnless(platform::FileTell(HandleOf(file), *position));
}

MgErr FMTell(File_t* file, uint32* position) {
    if (!position) return kArgErr;
    int64 position64 = 0;
    const MgErr err = FMTell64(file, &position64);
    if (!err) *position = static_cast<uint32>(position64);
    return err;
}

MgErr FGetEOF64(File_t* file, uint64* size) {
    if (!file || !size) return kArgErr;
    int64 size64 = 0;
    if (!platform::FileSize(HandleOf(file), size64)) return Win32ToOVFileErr();
    *size = static_cast<uint64>(size64);
    return kNoErr;
}

MgErr FGetEOF(File_t* file, uint32* size) {
    if (!size) return kArgErr;
    uint64 size64 = 0;
    const MgErr err = FGetEOF64(file, &size64);
    if (!err) *size = static_cast<uint32>(size64);
    return err;
}

MgErr FSetEOF64(File_t* file, int64 size) {
    if (!file || size < 0) return kArgErr;
    int64 position = 0;
    if (const MgErr err = FMTell64(file, &position)) return err;
    if (!platform::FileSetSize(HandleOf(file), size)) return Win32ToOVFileErr();
    return position > size ? MoveTo(file, size) : kNoErr;
}

MgErr FSetEOF(File_t* file, int32 size) {
    return FSetEOF64(file, size);
}

MgErr FLockOrUnlockRange(File_t* file, int32 mode, int32 offset, int32 count, int32 lock) {
    if (!file || mode < kFSeekStart || mode > kFSeekCurrent) return kArgErr;
    uint64 size = 0;
    if (mode == kFSeekEnd) {
        if (const MgErr err = FGetEOF64(file, &size)) return err;
    }
    int64 base = 0;
    if (const MgErr err = SeekBase(file, mode, static_cast<int64>(size), &base)) return err;
    // Start and count are 32 bits wide.
    const auto start = static_cast<int64>(static_cast<uint32>(base + offset));
    const auto length = static_cast<int64>(static_cast<uint32>(count));
    return ErrUnless(lock ? platform::FileLock(HandleOf(file), start, length)
                          : platform::FileUnlock(HandleOf(file), start, length));
}

// ---- formatted writing ----------------------------------------------------------------------------------------------

int32 FPrintf(File_t* file, CStr format, ...) {
    va_list args;
    va_start(args, format);
    uint32 written = 0;
    const MgErr err = PrintToFile(file, format, args, BadFormat::kWriteStart, &written);
    va_end(args);
    return err ? -1 : static_cast<int32>(written);
}

MgErr FPrintfWErr(File_t* file, CStr format, ...) {
    va_list args;
    va_start(args, format);
    const MgErr err = FPrintfWErrv(file, format, args);
    va_end(args);
    return err;
}

MgErr FPrintfWErrv(File_t* file, CStr format, va_list args) {
    uint32 written = 0;
    return PrintToFile(file, format, args, BadFormat::kWriteNothing, &written);
}
