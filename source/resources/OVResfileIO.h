// The bytes that a resource file is made of, wherever they are.
#ifndef TESSEL_SOURCE_RESOURCES_OVRESFILEIO_H
#define TESSEL_SOURCE_RESOURCES_OVRESFILEIO_H

#include "files/FileSupport.h"
#include <tessel/base/MgErr.h>
#include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

namespace platform {
class Replacement;
}
struct RsrcHeader;

// The source of one open file: a file on disk, a handle with a whole file in it, or memory of the caller's. A small
// read-only file on disk is read as a whole when it is opened, so that resources are used in place; a large one is read
// piece by piece, so that a file which someone cuts meanwhile gives an error and nothing worse.
class OVResfileIO : public TrackedObject {
public:
    OVResfileIO() = default;
    ~OVResfileIO();
    OVResfileIO(const OVResfileIO&) = delete;
    OVResfileIO& operator=(const OVResfileIO&) = delete;

    // Each sets up a source. The path's file is asked for from the cached-file hook first when it is read-only.
    MgErr OpenPath(Path path, bool readOnly, int32 denyMode);
    void UseFile(File_t* file, bool readOnly);
    void UseHandle(UHandle handle, bool readOnly);
    void OwnHandle() { ownsHandle_ = true; }  // from now on
    void UseMemory(const void* data, uint32 size);

    // Brings a read-only file on disk into memory if that pays. Checks that the source is of one kind.
    MgErr Prepare();

    // Exactly `count` bytes at `position`, else kEOFErr.
    MgErr Read(uint64 position, void* buffer, uint32 count);
    // A memory handle grows when it has to.
    MgErr Write(uint64 position, const void* data, uint32 count);
    MgErr Size(uint64* size);
    MgErr SetSize(uint32 size);
    // Makes room for `size` bytes, so that writing them cannot fail for lack of it. Nothing changes on failure.
    MgErr Reserve(uint32 size);
    // Appends `count` zero bytes. Nothing stays of them on failure.
    MgErr Extend(uint32 count);
    MgErr Flush();
    // A memory handle gets these bytes. Nothing changes on failure.
    MgErr Assign(const void* data, uint32 size);

    // Whether a new file may take this one's place, which needs its name.
    bool CanBeReplaced() const { return openedByPath_ && !readOnly_ && file_; }
    // Begins a new file for that, with the same access. *inPlace: there cannot be one, but the file may still be
    // written.
    MgErr BeginReplacement(platform::Replacement* replacement, bool* inPlace);
    // Lets it take the name, and goes on with it; the old file is closed.
    MgErr FinishReplacement(platform::Replacement* replacement, bool* inPlace);

    // Writes and flushes the header at the start, in file order, which lies in one sector. After a failure the old one
    // is put back and flushed, and *undone says whether that went well; if not, either may be on the device.
    MgErr SwitchHeader(const RsrcHeader& header, bool* undone);

    // Closes what was opened here; disposes of the handle if it is still owned.
    MgErr Close();

    // The bytes in place, when they stay where they are; else null.
    const uint8* InPlace(uint64 position) const;

    bool IsReadOnly() const { return readOnly_; }
    bool CanWrite() const { return !readOnly_ && (file_ || handle_); }
    File_t* File() const { return file_; }
    UHandle Handle() const { return handle_; }
    // The handle if it is owned, which it is not any more afterwards; else null.
    UHandle ReleaseHandle();

private:
    MgErr SeekTo(uint64 position);
    MgErr ReadFile(uint64 position, void* buffer, uint32 count);
    MgErr ReadAhead(uint64 position, void* buffer, uint32 count);
    const uint8* Bytes() const { return handle_ ? *handle_ : data_; }
    bool InMemory() const { return handle_ || data_; }
    MgErr ReadWhole(uint32 size);

    bool fromCacheHook_ = false;
    bool openedByPath_ = false;
    bool readOnly_ = false;
    bool ownsHandle_ = false;
    bool ownsData_ = false;
    OpenRequest request_;  // of a file opened for writing by path
    File_t* file_ = nullptr;
    void* view_ = nullptr;  // the hook's
    UHandle handle_ = nullptr;
    const uint8* data_ = nullptr;
    uint64 length_ = 0;                   // of what is in memory
    uint64 position_ = kUnknownPosition;  // of a file that only we move

    static constexpr uint64 kUnknownPosition = ~uint64{0};
    static constexpr uint32 kAhead = 4096;

    // The bytes around the last small read of a file that only we change: length words of neighbours come with it.
    uint64 aheadStart_ = 0;
    uint32 aheadLength_ = 0;
    uint8 ahead_[kAhead];
};

}  // namespace tessel

#endif
