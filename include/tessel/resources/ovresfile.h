// Resource files as objects: what a file, a chain of files and a resource can do, and the factory that makes them.
//
// A resource file holds typed, numbered blobs; docs/formats.md gives its bytes. Every operation takes the one resource
// file lock of the process, so any thread may call; an object must not be used after it was closed. Hosts that do not
// speak C++ use the same operations by refnum (resources/ResourceManager.h).
#ifndef TESSEL_RESOURCES_OVRESFILE_H
#define TESSEL_RESOURCES_OVRESFILE_H

#include <tessel/resources/ResourceManager.h>

#ifdef __cplusplus

namespace tessel {

class OVResfileIO;

// A resource that is loaded. It belongs to its file and lives until it is released, detached or removed, or the file is
// closed. Changing one of a read-only file gives kPermissionErr.
class TESSEL_API Resource {
public:
    virtual ~Resource() = default;

    // Drops the data and destroys this object. kArgErr when it has changes that are not written.
    virtual MgErr RRelease() = 0;
    // Says that the data were changed in place, to be written with the next update.
    virtual MgErr RChanged() = 0;
    // The file forgets the resource, which from now on belongs to the caller (delete it). Its data handle stays with
    // it. kResNotFoundErr when it has changes that are not written.
    virtual MgErr DetachResource() = 0;
    virtual MgErr RSetAttrs(uint32 attrs) = 0;
    virtual MgErr RSize(uint32* size) = 0;
    // Each output may be null. `name` takes up to 256 bytes; it becomes empty when there is no name.
    virtual MgErr RGetInfo(int32* id, ResType* type, PStr name) = 0;
    virtual MgErr RGetAttrs(uint32* attrs) = 0;
    // The data as a handle that stays the resource's. Null when memory is full.
    virtual UHandle GetSharedDSHandle() = 0;
    // Hands the data handle over to the caller; the resource has no data from then on.
    virtual MgErr DetachHandle(UHandle* data) = 0;
    virtual uint32 GetSize() = 0;
    virtual const uint8* GetData() = 0;
    virtual bool ContainsHandle(UHandle data) = 0;
};

// Anything that can be searched for resources. Outputs must not be null (kArgErr).
class TESSEL_API ResChain {
public:
    virtual ~ResChain() = default;

    virtual MgErr RCloseFile() = 0;
    virtual MgErr RGet(ResType type, int32 id, Resource** resource) = 0;
    virtual MgErr RExists(ResType type, int32 id, int32* exists) = 0;
    virtual MgErr RGetNamed(ResType type, ConstPStr name, Resource** resource) = 0;
    virtual MgErr RIsLoaded(ResType type, int32 id, bool* loaded) = 0;
    // A string of a string list in place, valid while the resource stays loaded.
    virtual MgErr RGetIndStringPtr(ConstPStr* string, int32 id, int32 index, ResType type) = 0;
    // The loaded resource whose data this handle is, or null.
    virtual Resource* GetResourceForHandle(UHandle data) = 0;
};

// One resource file. The operations are those of the flat functions of the same name.
class TESSEL_API ResFile : public ResChain {
public:
    virtual MgErr RUpdateFile() = 0;
    virtual MgErr RAddPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name) = 0;
    virtual MgErr RAdd(UHandle data, ResType type, int32 id, ConstPStr name) = 0;
    // Replace the data of a resource by a copy. kResIDExistsErr: no data, no such resource, or the copy failed.
    virtual MgErr RReplacePtr(const void* data, uint32 size, ResType type, int32 id) = 0;
    virtual MgErr RReplaceDSHandle(UHandle data, ResType type, int32 id) = 0;
    // Removes and destroys a resource of this file. kResNotFoundErr: not of this file, or protected.
    virtual MgErr RRemove(Resource* resource) = 0;
    virtual MgErr RCount(ResType type, int32* count) = 0;
    virtual MgErr RCountTypes(int32* count) = 0;
    virtual MgErr RGetInd(ResType type, int32 index, Resource** resource) = 0;
    virtual MgErr RGetIndType(ResType* type, int32 index) = 0;
    virtual int32 RUniqueID(ResType type) = 0;
    virtual MgErr RGetModDate(Path path, uint32* date, int32* readOnly) = 0;
    virtual MgErr RGetFileAttrs(uint32* attrs) = 0;
    virtual MgErr RSetFileAttrs(uint32 attrs) = 0;
    virtual MgErr RPreAllocFile(uint32 size) = 0;
    virtual MgErr RGetUHandleOwnership(UHandle* handle) = 0;
    virtual MgErr RGetMemFileHandle(UHandle* handle) = 0;
    // Opens the file over a source of bytes, which it owns from then on, also on failure.
    virtual MgErr Open(OVResfileIO* io, _FMFileType* type, _FMFileCreator* creator) = 0;
};

// Makes files and chains. `*file` is null on failure; close it with RCloseFile, then delete it. Modes, types and
// creators are as in the flat functions; type and creator outputs may be null.
class TESSEL_API ResFileFactory {
public:
    ResFileFactory() = delete;

    // Create and destroy the resource file lock; the ResourceManager service calls them.
    static MgErr InitResourceMgr();
    static MgErr UninitResourceMgr();

    static MgErr RCreateFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32 unused);
    static MgErr RGetFileType(Path path, _FMFileType* type, _FMFileCreator* creator);
    static MgErr RSetFileType(Path path, _FMFileType type, _FMFileCreator creator);
    static MgErr RGetModDate(Path path, uint32* date, int32* readOnly);

    static MgErr ROpenPath(Path path, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    static MgErr ROpenFileref(File_t* fileRef, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    static MgErr ROpenMemFile(UHandle image, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    static MgErr ROpenMemFile(const void* image, uint32 size, ResFile** file, _FMFileType* type,
                              _FMFileCreator* creator);
    static MgErr RCreateMemFile(ResFile** file, _FMFileCreator creator, _FMFileType type);
    static MgErr ROpenAppResFile(Path path, int32 mode, ResFile** file);

    // A chain of `count` files, searched in this order: the first result that is not kResNotFoundErr counts. Closing it
    // empties it, after closing and deleting the files if it `owns` them. Delete it when you are done.
    static MgErr RChain(ResChain** chain, int32 count, ResFile* const* files, bool owns);
};

// ---- refnums for objects --------------------------------------------------------------------------------------------

// A new refnum for an open file or a chain, or 0. RReleaseRsrcFileRefnum forgets it again.
TESSEL_API RsrcFile RMapResFileToRsrcFile(ResFile* file);
TESSEL_API RsrcFile RMapResBaseToRsrcFile(ResChain* chain);

// The object behind a refnum. An unknown refnum, or (for a file) one that is a chain, gives an object whose operations
// all fail; it is never null.
TESSEL_API ResChain* RsrcFileToRMapResChain(RsrcFile refnum);
TESSEL_API ResFile* RsrcFileToRMapResFile(RsrcFile refnum);

}  // namespace tessel

#endif
#endif
