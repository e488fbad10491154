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
    // Sets the attributes word. kPermissionErr when the file is read-only.
    virtual MgErr RSetAttrs(uint32 attrs) = 0;
    // Bytes of the data. kArgErr for null.
    virtual MgErr RSize(uint32* size) = 0;
    // Each output may be null. `name` takes up to 256 bytes; it becomes empty when there is no name.
    virtual MgErr RGetInfo(int32* id, ResType* type, PStr name) = 0;
    // The attributes word. kArgErr for null.
    virtual MgErr RGetAttrs(uint32* attrs) = 0;
    // The data as a handle that stays the resource's. Null when memory is full.
    virtual UHandle GetSharedDSHandle() = 0;
    // Hands the data handle over to the caller; the resource has no data from then on.
    virtual MgErr DetachHandle(UHandle* data) = 0;
    // Bytes of the data; 0 when it has none.
    virtual uint32 GetSize() = 0;
    // The data in place; null when it has none.
    virtual const uint8* GetData() = 0;
    // Whether the handle is the one that holds the data.
    virtual bool ContainsHandle(UHandle data) = 0;
};

// Anything that can be searched for resources. Outputs must not be null (kArgErr).
class TESSEL_API ResChain {
public:
    virtual ~ResChain() = default;

    // Ends the search: a file is closed as by the flat RCloseFile, a chain let go.
    virtual MgErr RCloseFile() = 0;
    // A resource by its ID, loaded on first use; null and kResNotFoundErr when there is none.
    virtual MgErr RGet(ResType type, int32 id, Resource** resource) = 0;
    // *exists is 1 and the result kNoErr, or 0 and kResNotFoundErr.
    virtual MgErr RExists(ResType type, int32 id, int32* exists) = 0;
    // A resource by its name, without regard to case; else as RGet.
    virtual MgErr RGetNamed(ResType type, ConstPStr name, Resource** resource) = 0;
    // *loaded is whether the data of the resource are in memory.
    virtual MgErr RIsLoaded(ResType type, int32 id, bool* loaded) = 0;
    // A string of a string list in place, valid while the resource stays loaded.
    virtual MgErr RGetIndStringPtr(ConstPStr* string, int32 id, int32 index, ResType type) = 0;
    // The loaded resource whose data this handle is, or null.
    virtual Resource* GetResourceForHandle(UHandle data) = 0;
};

// One resource file. The operations are those of the flat functions of the same name.
class TESSEL_API ResFile : public ResChain {
public:
    // Writes pending changes and packs the file.
    virtual MgErr RUpdateFile() = 0;
    // Adds a resource with a copy of the bytes.
    virtual MgErr RAddPtr(const void* data, uint32 size, ResType type, int32 id, ConstPStr name) = 0;
    // Adds a resource; on success the file owns the handle.
    virtual MgErr RAdd(UHandle data, ResType type, int32 id, ConstPStr name) = 0;
    // Replace the data of a resource by a copy. kResIDExistsErr: no data, no such resource, or the copy failed.
    virtual MgErr RReplacePtr(const void* data, uint32 size, ResType type, int32 id) = 0;
    // Replaces the data of a resource by a copy of those in a handle.
    virtual MgErr RReplaceDSHandle(UHandle data, ResType type, int32 id) = 0;
    // Removes and destroys a resource of this file. kResNotFoundErr: not of this file, or protected.
    virtual MgErr RRemove(Resource* resource) = 0;
    // How many resources of a type there are.
    virtual MgErr RCount(ResType type, int32* count) = 0;
    // How many types there are.
    virtual MgErr RCountTypes(int32* count) = 0;
    // A resource by index from 1, in the order of ascending IDs.
    virtual MgErr RGetInd(ResType type, int32 index, Resource** resource) = 0;
    // A type by index from 1, in the order they were added.
    virtual MgErr RGetIndType(ResType* type, int32 index) = 0;
    // An ID from 128 up that the type does not have, or 0.
    virtual int32 RUniqueID(ResType type) = 0;
    // Modification date of the file, through this open one.
    virtual MgErr RGetModDate(Path path, uint32* date, int32* readOnly) = 0;
    // The file attributes word.
    virtual MgErr RGetFileAttrs(uint32* attrs) = 0;
    // Sets the file attributes word.
    virtual MgErr RSetFileAttrs(uint32 attrs) = 0;
    // Grows the file by `size` bytes ahead of writing.
    virtual MgErr RPreAllocFile(uint32 size) = 0;
    // Takes back the handle that the file was opened over.
    virtual MgErr RGetUHandleOwnership(UHandle* handle) = 0;
    // The image of the whole file.
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
    // Destroys the resource file lock; the ResourceManager service calls it.
    static MgErr UninitResourceMgr();

    // Creates an empty resource file on disk.
    static MgErr RCreateFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32 unused);
    // Type and creator of a file that is not open.
    static MgErr RGetFileType(Path path, _FMFileType* type, _FMFileCreator* creator);
    // Sets type and creator of a file that is not open.
    static MgErr RSetFileType(Path path, _FMFileType type, _FMFileCreator creator);
    // Modification date of the file at the path.
    static MgErr RGetModDate(Path path, uint32* date, int32* readOnly);

    // Opens a file on disk.
    static MgErr ROpenPath(Path path, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    // Opens a file over one that is open already.
    static MgErr ROpenFileref(File_t* fileRef, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    // Opens a file over a handle with its image.
    static MgErr ROpenMemFile(UHandle image, int32 mode, ResFile** file, _FMFileType* type, _FMFileCreator* creator);
    // Opens a file, read-only, over memory with its image.
    static MgErr ROpenMemFile(const void* image, uint32 size, ResFile** file, _FMFileType* type,
                              _FMFileCreator* creator);
    // A new empty file in memory.
    static MgErr RCreateMemFile(ResFile** file, _FMFileCreator creator, _FMFileType type);
    // Opens the file, or the application's own module with a null or empty path.
    static MgErr ROpenAppResFile(Path path, int32 mode, ResFile** file);

    // A chain of `count` files, searched in this order: the first result that is not kResNotFoundErr counts. Closing it
    // empties it, after closing and deleting the files if it `owns` them. Delete it when you are done.
    static MgErr RChain(ResChain** chain, int32 count, ResFile* const* files, bool owns);
};

// ---- refnums for objects --------------------------------------------------------------------------------------------

// A new refnum for an open file or a chain, or 0. RReleaseRsrcFileRefnum forgets it again.
TESSEL_API RsrcFile RMapResFileToRsrcFile(ResFile* file);
// A new refnum for an open file or a chain, or 0.
TESSEL_API RsrcFile RMapResBaseToRsrcFile(ResChain* chain);

// The object behind a refnum. An unknown refnum, or (for a file) one that is a chain, gives an object whose operations
// all fail; it is never null.
TESSEL_API ResChain* RsrcFileToRMapResChain(RsrcFile refnum);
// The file behind a refnum; never null.
TESSEL_API ResFile* RsrcFileToRMapResFile(RsrcFile refnum);

}  // namespace tessel

#endif
#endif
