// Readers and writers of resource files: a chain or a file with the operations that users want most.
#ifndef TESSEL_RESOURCES_RFREADWRITE_H
#define TESSEL_RESOURCES_RFREADWRITE_H

#include <tessel/resources/ovresfile.h>

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

// Reads resources of a chain or a file, which stays its maker's unless the reader opened it itself. Without one, every
// read gives kResNotFoundErr. One thread at a time.
class TESSEL_API RFReader : public TrackedObject {
public:
    RFReader() = default;
    // Reads a file or chain, which stays the caller's; null reads nothing.
    explicit RFReader(ResChain* chain);
    // Reads what a refnum stands for, which stays open for others.
    explicit RFReader(RsrcFile refnum);
    virtual ~RFReader();
    RFReader(const RFReader&) = delete;
    RFReader& operator=(const RFReader&) = delete;

    // Opens a file, which the reader owns. Whatever it read before is let go (closed when it was its own).
    MgErr OpenPath(Path path, int32 mode, _FMFileType* type, _FMFileCreator* creator);
    // Closes and destroys the chain. kNotFoundErr: there is none. On another error the reader keeps it.
    MgErr Close();

    // The data in place; they stay loaded. `size` may be null.
    MgErr PtrToResDataInternal(ResType type, int32 id, const uint8** data, uint32* size);
    // The data by name in place; else as above.
    MgErr PtrToResDataByNameInternal(ResType type, ConstPStr name, const uint8** data, uint32* size);

    // The data as a handle that the caller owns.
    MgErr AllocDSHandle(ResType type, int32 id, UHandle* data);
    // The data by name as a handle that the caller owns.
    MgErr AllocDSHandleByName(ResType type, ConstPStr name, UHandle* data);

    // As the flat functions of almost the same names.
    // As RGetString.
    MgErr GetString(int32 id, UHandle* data);
    // As RGetPStr.
    MgErr GetPStr(int32 id, PStr string);
    // As RGetIndString.
    MgErr GetIndString(PStr string, int32 id, int32 index);
    // As RGetIndLString.
    MgErr GetIndLString(LStrHandle* string, int32 id, int32 index, ResType type);
    // As RGetPath.
    MgErr GetPath(ResType type, int32 id, Path* path);
    // As RGetIndPath.
    MgErr GetIndPath(Path* path, int32 id, int32 index);

    // A refnum for the chain, made on first call, until it is released. 0 without a chain.
    virtual RsrcFile MapToObsoleteRsrcFile();
    // Lets that refnum go. kNoErr without one.
    MgErr ReleaseRsrcFileRefnum();

    // The chain. Reports when there is none.
    ResChain* LowLevelResChain();

protected:
    MgErr Adopt(ResChain* chain);

    bool ownsChain_ = false;
    RsrcFile refnum_ = 0;
    ResChain* chain_ = nullptr;
};

// Also changes a file.
class TESSEL_API RFReadWrite : public RFReader {
public:
    RFReadWrite() = default;
    // Changes a file, which stays the caller's.
    explicit RFReadWrite(ResFile* file);
    // Changes the file of a refnum, which stays open for others.
    explicit RFReadWrite(RsrcFile refnum);

    // Creates an empty resource file on disk, as RCreateFile.
    static MgErr CreateResourceFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32 unused);

    // Works on a new empty file in memory, which the writer owns.
    MgErr CreateMemoryResourceFile(_FMFileCreator creator, _FMFileType type);

    // `mode` 0 copies the bytes, else the file takes the handle on success. kGenericErr without a handle.
    MgErr AddFromHandle(UHandle data, int32 mode, ResType type, int32 id, ConstPStr name);
    // Adds a resource with a copy of the bytes.
    MgErr AddFromPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name);
    // A resource that is not there is no error.
    MgErr Remove(ResType type, int32 id);
    // Replaces the data of a resource; `mode` as of AddFromHandle.
    MgErr ReplaceFromHandle(UHandle data, int32 mode, ResType type, int32 id, ConstPStr name);
    // Writes pending changes, as RUpdateFile.
    MgErr UpdateFile();
    RsrcFile MapToObsoleteRsrcFile() override;

    // The file. Reports when there is none.
    ResFile* LowLevelResFile();

private:
    ResFile* File() const { return static_cast<ResFile*>(chain_); }
};

// On the heap, for the caller to delete; null when memory is full.
TESSEL_API RFReader* CreateRFReader(RsrcFile refnum);
// A writer on the heap without a file, for the caller to delete; null when memory is full.
TESSEL_API RFReadWrite* CreateRFReadWrite();

}  // namespace tessel

#endif
#endif
