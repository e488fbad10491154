// Resource files by refnum, and resources by their data handles.
//
// Sections: opening and closing · resources by refnum · resources by handle · strings and paths · chains.
//
// A refnum stands for an open file or a chain of open files; 0 is never one. An unknown or stale refnum gives
// kNotResFileErr, an unknown handle kResNotFoundErr. Functions marked (file) take only refnums of files, not of chains.
// Names are PStrs; a null or empty one is none. The name of a file on disk has at most 259 bytes, drive and folders
// included (kArgErr beyond). Any thread; all resource files of the process share one lock, which is not held while a
// file on disk is found and opened, nor while a report is made.
#ifndef TESSEL_RESOURCES_RESOURCEMANAGER_H
#define TESSEL_RESOURCES_RESOURCEMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

// How a resource file is opened.
enum { kROpenReadWrite = 0, kROpenReadOnly = 1 };

// Bits of the file attributes word.
enum {
    kRFileReadOnly = 0x80,  // opened read-only
    kRFileChanged = 0x20    // the map has changed since it was last written
};

// Bits of a resource's attributes word; the others are the caller's.
enum {
    kRChangedAttr = 0x02,   // the data are not yet written at their place
    kRProtectedAttr = 0x08  // the resource cannot be removed
};

// What the header of a resource file, and the start of its map, hold as they stand in the file. Offsets count from the
// start of the resource file.
typedef struct RFileHeader {
    uint64 base;     // where the resource file starts: not 0 behind a host file
    uint8 eol[2];    // line-end check: 0x0D 0x0A (any bytes in version 2)
    uint16 version;  // 2 or 3
    _FMFileType type;
    _FMFileCreator creator;
    uint32 mapOffset;
    uint32 mapLength;
    uint32 dataOffset;
    uint32 dataLength;
    uint32 fileAttrs;  // the last three are 0 when there is no map
    uint32 typeList;   // from the start of the map
    uint32 nameList;   // from the start of the map; 0 without names
} RFileHeader;

// Asked for every read-only open of a path, and by RGetFileType. When it answers not 0 it has filled in the open file,
// the view of its mapping, and the bytes, and the file is read from those; all stay the host's.
typedef int32 (*IsFileAlreadyInCacheProc)(Path path, File_t** file, void** view, const uint8** data, uint32* size);

TESSEL_BEGIN_C

// ---- opening and closing --------------------------------------------------------------------------------------------
// Each open function gives a new refnum; *refnum is 0 on failure. `type` and `creator` (each may be null) receive the
// type and creator of the file. Results: kNotResFileErr not a resource file, kEOFErr too short for one, kVersionErr
// newer than version 3, kIOErr damaged, kMemFullErr, or those of opening the file.

// Creates an empty resource file on disk. kExistsErr when it exists and `replace` is 0. Atomic and durable: at no
// moment is there an unfinished file under the name, and a failed or interrupted replacement leaves the old one.
TESSEL_API MgErr RCreateFile(Path path, int32 replace, _FMFileCreator creator, _FMFileType type, int32 unused);

// Opens a file on disk. Read-only also finds a resource file behind a host file, by its trailer: the last 4 bytes,
// big-endian, say where it starts.
TESSEL_API MgErr ROpenFile(Path path, int32 mode, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator);

// Over a file that is open already, and stays the caller's to close afterwards.
TESSEL_API MgErr ROpenFileRefnum(File_t* file, int32 mode, RsrcFile* refnum, _FMFileType* type,
                                 _FMFileCreator* creator);

// Over a handle with the image of a whole file. On success the file owns it, unless RGetUHandleOwnership takes it
// back.
TESSEL_API MgErr ROpenUHandle(UHandle image, int32 mode, RsrcFile* refnum, _FMFileType* type, _FMFileCreator* creator);

// Read-only over memory with the image of a whole file, which the caller keeps in place until the file is closed.
TESSEL_API MgErr ROpenUPtr(const void* image, uint32 size, RsrcFile* refnum, _FMFileType* type,
                           _FMFileCreator* creator);

// Opens the file, or the application's own module with a null or empty path.
TESSEL_API MgErr ROpenAppResFile(Path path, int32 mode, RsrcFile* refnum);

// A new empty file in memory; RGetMemFileHandle gives its image.
TESSEL_API MgErr RCreateMemFile(RsrcFile* refnum, _FMFileCreator creator, _FMFileType type);

// Writes pending changes, as RUpdateFile does, and closes. When that fails the file stays open. (A chain:
// RDestroyChain.)
TESSEL_API MgErr RCloseFile(RsrcFile refnum);

// The same, but when the changes cannot be written they are given up, and the file on disk stays as it was. The result
// is that of the try.
TESSEL_API MgErr RCloseFileForce(RsrcFile refnum);

// (file) Writes pending changes and packs the file. On failure they stay pending, the file on disk is as it was, and
// the next update tries again; kDiskFullErr when there is no room, kNotFoundErr when the file was moved away or removed
// while it was open.
//
// Atomic and durable: whenever the process is killed or the power fails, the next open, a read-only one too, finds the
// old file or the new one, whole; after kNoErr the new one. A new file takes the place of the old one. It keeps
// permissions, owner, attributes, time of creation and what others are denied; a link goes on leading to it. A file
// that has several names, whose folder cannot be written, whose owner cannot be kept, or that was opened by reference
// is written in place, just as safely where the 32 bytes of its header are written whole or not at all, as devices do;
// it needs room for what moves once more, for a while.
//
// On a full disk changes are written where there is room for them alone, and what is removed just goes; the file stays
// longer than it has to be until an update has more room. When there is not even room for a new map, an update that
// makes the file no longer overwrites it: only then a kill or a power loss in that moment may leave a damaged file.
TESSEL_API MgErr RUpdateFile(RsrcFile refnum);

// (file) Takes back the handle given to ROpenUHandle; it must outlive the file, which goes on using it. kGenericErr:
// there is none, or it was taken already.
TESSEL_API MgErr RGetUHandleOwnership(RsrcFile refnum, UHandle* image);

// (file) The image of the whole file. Over ROpenUHandle it is that handle itself; else a new one, for which all
// resources must be loaded (kArgErr). The caller owns it. A file made in memory stays the only one to have its data:
// they cannot be released or detached.
TESSEL_API MgErr RGetMemFileHandle(RsrcFile refnum, UHandle* image);

// (file) Grows the file by `size` bytes ahead of writing. Neither atomic nor durable for the room; what the file holds
// is not touched.
TESSEL_API MgErr RPreAllocFile(RsrcFile refnum, uint32 size);

// Type and creator of a file that is not open; RGetFileType takes null outputs. RSetFileType is atomic and durable in
// the same way as RUpdateFile.
TESSEL_API MgErr RGetFileType(Path path, _FMFileType* type, _FMFileCreator* creator);
// Sets type and creator of a file that is not open.
TESSEL_API MgErr RSetFileType(Path path, _FMFileType type, _FMFileCreator creator);

// The header of a file that is not open for writing, as it stands in the file.
TESSEL_API MgErr RGetFileHeader(Path path, RFileHeader* header);

// Modification date (seconds since 1904-01-01 UTC) of the file at `path`, through the open file `refnum` when it is not
// 0. `readOnly` may be null.
TESSEL_API MgErr RGetModDate(Path path, RsrcFile refnum, uint32* date, int32* readOnly);

// (file) The file attributes word.
TESSEL_API MgErr RGetFileAttrs(RsrcFile refnum, uint32* attrs);
// (file) Sets the file attributes word.
TESSEL_API MgErr RSetFileAttrs(RsrcFile refnum, uint32 attrs);

// Installs the hook that offers files which are in memory already; null for none. Not while files are being opened.
TESSEL_API void Set_IsFileAlreadyInCache(IsFileAlreadyInCacheProc proc);

// ---- resources by refnum --------------------------------------------------------------------------------------------

// The data of a resource, loaded on first use. The handle stays the file's, and lives until RRelease, RDetach, RRemove
// or the close of the file. *data is null on failure. kResNotFoundErr: no such resource; kEOFErr: its data lie outside
// the file.
TESSEL_API MgErr RGet(RsrcFile refnum, ResType type, int32 id, UHandle* data);

// (file) By index from 1, in the order of ascending IDs.
TESSEL_API MgErr RGetInd(RsrcFile refnum, ResType type, int32 index, UHandle* data);

// By name, without regard to case.
TESSEL_API MgErr RGetNamed(RsrcFile refnum, ResType type, ConstPStr name, UHandle* data);

// *exists is 1 and the result kNoErr, or 0 and kResNotFoundErr.
TESSEL_API MgErr RExists(RsrcFile refnum, ResType type, int32 id, int32* exists);
// *loaded is whether the data of the resource are in memory.
TESSEL_API MgErr RIsLoaded(RsrcFile refnum, ResType type, int32 id, bool* loaded);

// (file) Adds a resource; on success the file owns the handle. kResIDExistsErr: the ID is taken, or `data` is null.
// kArgErr: the handle is the data of a resource already, of this file or another.
TESSEL_API MgErr RAdd(UHandle data, RsrcFile refnum, ResType type, int32 id, ConstPStr name);

// (file) Removes the resource whose data this handle is. The caller owns the handle from then on.
TESSEL_API MgErr RRemove(UHandle data, RsrcFile refnum);

// (file) How many resources of a type, how many types, and a type by index from 1 in the order they were added.
TESSEL_API MgErr RCount(RsrcFile refnum, ResType type, int32* count);
// (file) How many types there are.
TESSEL_API MgErr RCountTypes(RsrcFile refnum, int32* count);
// (file) A type by index from 1, in the order they were added.
TESSEL_API MgErr RGetIndType(RsrcFile refnum, ResType* type, int32 index);

// (file) An ID from 128 up that the type does not have, or 0. No ID either: 13, for an unknown refnum.
TESSEL_API int32 RUniqueID(RsrcFile refnum, ResType type);

// ---- resources by handle --------------------------------------------------------------------------------------------

// Drops the data, which are loaded again when asked for. kArgErr for a resource with unwritten changes.
TESSEL_API MgErr RRelease(UHandle data);

// The caller owns the handle from now on; the file keeps the resource. kResNotFoundErr with unwritten changes.
TESSEL_API MgErr RDetach(UHandle data);

// Says that the data were changed, to be written with the next update. kPermissionErr in a read-only file.
TESSEL_API MgErr RChanged(UHandle data);

// Each output may be null; `name` takes up to 256 bytes.
TESSEL_API MgErr RGetInfo(UHandle data, int32* id, ResType* type, PStr name);
// The attributes word of the resource.
TESSEL_API MgErr RGetAttrs(UHandle data, uint32* attrs);
// Sets the attributes word of the resource.
TESSEL_API MgErr RSetAttrs(UHandle data, uint32 attrs);
// Bytes of the data.
TESSEL_API MgErr RSize(UHandle data, uint32* size);

// ---- strings and paths ----------------------------------------------------------------------------------------------
// Indexes count from 1; kResNotFoundErr for one outside the list. Lists whose entries do not fit the resource give
// kEOFErr.

// The "STR " resource: its data as a handle that stays the file's, or its text (256 bytes).
TESSEL_API MgErr RGetString(RsrcFile refnum, int32 id, UHandle* data);
// The text of a "STR " resource (256 bytes).
TESSEL_API MgErr RGetPStr(RsrcFile refnum, int32 id, PStr string);

// A string of a "STR#" resource (256 bytes), or of one of another type in place.
TESSEL_API MgErr RGetIndString(RsrcFile refnum, PStr string, int32 id, int32 index);
// A string of a list of another type, in place.
TESSEL_API MgErr RGetIndStringPtr(RsrcFile refnum, ConstPStr* string, int32 id, int32 index, ResType type);

// A string of a list of long strings, in a new handle that the caller owns.
TESSEL_API MgErr RGetIndLString(RsrcFile refnum, LStrHandle* string, int32 id, int32 index, ResType type);

// A path kept in a resource of any type, or in a "PTH#" list. *path is made when it is null.
TESSEL_API MgErr RGetPath(RsrcFile refnum, ResType type, int32 id, Path* path);
// A path of a "PTH#" list. *path is made when it is null.
TESSEL_API MgErr RGetIndPath(RsrcFile refnum, Path* path, int32 id, int32 index);

// ---- chains ---------------------------------------------------------------------------------------------------------

// A chain of open files, searched in this order; they stay the caller's. One that is closed leaves the chain. An entry
// that is no open file is reported, and there is no chain: kNotResFileErr.
TESSEL_API MgErr RChain(RsrcFile* refnum, int32 count, const RsrcFile* files);

// Ends a chain; its files stay open.
TESSEL_API MgErr RDestroyChain(RsrcFile refnum);

// Forgets a refnum without closing what it stands for.
TESSEL_API MgErr RReleaseRsrcFileRefnum(RsrcFile refnum);

TESSEL_END_C

// ---- the same as std::string ----------------------------------------------------------------------------------------
// Texts come back as they are in the file, in the active code page. kArgErr without an output.
#ifdef __cplusplus
#    include <string>

namespace tessel {

// The text of a "STR " resource.
TESSEL_API MgErr RGetStringStd(RsrcFile refnum, std::string* text, int32 id);
// A string of a "STR#" resource.
TESSEL_API MgErr RGetIndexStringStd(RsrcFile refnum, std::string* text, int32 id, int32 index);
// A string of a list of long strings.
TESSEL_API MgErr RGetIndexLongStringStd(RsrcFile refnum, std::string* text, int32 id, int32 index, ResType type);

// The "STR " resource taken as an LStr: a 32-bit count in host order, then the text.
TESSEL_API MgErr RGetLongStringStd(RsrcFile refnum, std::string* text, int32 id);

}  // namespace tessel
#endif

#endif
