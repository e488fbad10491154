// Files: opening, reading and writing them; and files, folders and volumes as whole objects.
//
// Sections: open files · position and size · formatted writing · errors · creating, copying, moving, removing ·
// queries and changes · volumes · names and locations · names of the host system.
//
// Every path must be absolute; a relative or null one gives kArgErr unless a function says otherwise. The name of an
// item, drive and folders included, has at most 259 bytes; a longer one gives kArgErr. Shortcuts (.lnk) along a path
// are followed where they are named with their extension. Failures of the system come back as Win32ToOVFileErr maps
// them: a look at the disk that failed is never "not found", and nothing waits for what is no file (a pipe). Functions
// that change a file drop what the path has cached about it. Any thread; no lock is held except where noted.
//
// Each function that changes the disk says what it promises when the process is killed or the power fails. Atomic: the
// change is there whole or not at all. Durable: what it reported done is on the device. Neither: what was under way may
// be there in part, and what was done may be lost, until FFlush.
#ifndef TESSEL_FILES_FILEMANAGER_H
#define TESSEL_FILES_FILEMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#include <stdarg.h>

// How a file is opened: what the handle may do. 4 to 7 ask for the cache to be bypassed, which this host does not
// offer: they are 0 to 3, except that kFOpenWriteTruncDirect does not truncate.
enum {
    kFOpenReadWrite = 0,
    kFOpenRead = 1,
    kFOpenWrite = 2,
    kFOpenWriteTrunc = 3,  // the file is emptied on open
    kFOpenReadWriteDirect = 4,
    kFOpenReadDirect = 5,
    kFOpenWriteDirect = 6,
    kFOpenWriteTruncDirect = 7
};

// What others, in this process or another, may do while the file is open.
enum {
    kFDenyReadWrite = 0,  // nothing
    kFDenyWrite = 1,      // read
    kFDenyNone = 2        // read and write
};

// What an offset is measured from.
enum { kFSeekStart = 1, kFSeekEnd = 2, kFSeekCurrent = 3 };

// Which fields FGetInfo64 and FGetInfoResolve fill; the folder flag always is.
enum {
    kFInfoType = 1,         // type and creator
    kFInfoPermissions = 4,  // permissions, owner and group
    kFInfoSize = 8,         // size
    kFInfoCreationDate = 32,
    kFInfoModDate = 64,
    kFInfoAll = 255
};

// What is known about a file or folder. Dates are seconds since 1904-01-01 00:00:00 UTC.
typedef struct FInfo64Rec {
    _FMFileType type;        // "????" when unknown
    _FMFileCreator creator;  // "????" when unknown
    int32 permissions;       // Unix-style mode bits
    int64 size;              // bytes of a file, entries of a folder
    int64 rfSize;            // always 0
    uint32 creationDate;
    uint32 modificationDate;
    int32 folder;  // 1 for a folder or volume
    int32 reserved1;
    int16 reserved2;
    int16 reserved3;
    Str255 owner;  // always empty
    Str255 group;  // always empty
} FInfo64Rec;

// The same with 32-bit sizes.
typedef struct FInfoRec {
    _FMFileType type;
    _FMFileCreator creator;
    int32 permissions;
    int32 size;
    int32 rfSize;
    uint32 creationDate;
    uint32 modificationDate;
    int32 folder;
    int32 reserved1;
    int16 reserved2;
    int16 reserved3;
    Str255 owner;
    Str255 group;
} FInfoRec;

// Bytes of a volume; 0xFFFFFFFF for a value that does not fit.
typedef struct VolInfoRec {
    uint32 total;
    uint32 used;
    uint32 free;
} VolInfoRec;

// The kind of a volume, one for each name that FListDesktop lists.
typedef struct VolKindRec {
    uint32 flags;  // bit 0x2 is set
    FourCC kind;   // "flpy" removable or CD, "hdsk" fixed or RAM, "srvr" network
} VolKindRec;

TESSEL_BEGIN_C

// ---- open files -----------------------------------------------------------------------------------------------------
// A null file gives kArgErr everywhere. A file has one position; callers that share it must take turns.

// Opens an existing file, without waiting for what is no file: a folder, a pipe or a socket is refused at once
// (kPermissionErr, or kIOErr from the system). A file that someone else holds is tried again twice, 50 ms apart, before
// kFileInUseErr. kArgErr: an unknown mode, a volume, or a path that is not absolute. *file is null on failure. Close
// with FMClose.
TESSEL_API MgErr FMOpen(File_t** file, Path path, int32 openMode, int32 denyMode);
// Closes the file; the pointer is dead then. kArgErr for null.
TESSEL_API MgErr FMClose(File_t* file);

// Reads up to `count` bytes. *actual (may be null) receives what was read, also on failure. kEOFErr: fewer than asked.
TESSEL_API MgErr FMRead(File_t* file, uint32 count, uint32* actual, void* buffer);

// Writes `count` bytes. *actual (may be null) receives what was written, also on failure. 0 bytes always succeed.
// Neither atomic nor durable.
TESSEL_API MgErr FMWrite(File_t* file, uint32 count, uint32* actual, const void* data);

// Writes a carriage return and a line feed. Neither atomic nor durable.
TESSEL_API MgErr FMWriteEOL(File_t* file);

// Has the system bring what was written to the device: durable after kNoErr. After a failure what was not there is lost
// for this file; write it again to another.
TESSEL_API MgErr FFlush(File_t* file);

// ---- position and size ----------------------------------------------------------------------------------------------

// Moves the position. kEOFErr when it would fall before the start (it is then 0) or beyond the end (it is then the
// end).
TESSEL_API MgErr FMSeek64(File_t* file, int64 offset, int32 mode);
// Moves the position, as FMSeek64 with a 32-bit offset.
TESSEL_API MgErr FMSeek(File_t* file, int32 offset, int32 mode);

// The position, and the size; the 32-bit forms give the low half.
TESSEL_API MgErr FMTell64(File_t* file, int64* position);
// The low 32 bits of the position.
TESSEL_API MgErr FMTell(File_t* file, uint32* position);
// The size in bytes.
TESSEL_API MgErr FGetEOF64(File_t* file, uint64* size);
// The low 32 bits of the size in bytes.
TESSEL_API MgErr FGetEOF(File_t* file, uint32* size);

// Cuts or extends (with zero bytes) the file. The position stays, unless it would lie beyond the new end. Atomic, not
// durable.
TESSEL_API MgErr FSetEOF64(File_t* file, int64 size);
// Cuts or extends (with zero bytes) the file, as FSetEOF64.
TESSEL_API MgErr FSetEOF(File_t* file, int32 size);

// Locks (`lock` not 0) or unlocks a range of bytes against other processes. `mode`: what the offset is measured from.
TESSEL_API MgErr FLockOrUnlockRange(File_t* file, int32 mode, int32 offset, int32 count, int32 lock);

// ---- formatted writing ----------------------------------------------------------------------------------------------

// Writes text in the library's own format language (strings/StringFmtPrint.h), and returns the bytes written or -1.
// Neither atomic nor durable.
TESSEL_API int32 FPrintf(File_t* file, CStr format, ...);

// The same with a result: kFormatErr for a bad format, kMemFullErr, kGenericErr when the arguments' texts changed
// meanwhile (nothing is written then), else that of the write.
TESSEL_API MgErr FPrintfWErr(File_t* file, CStr format, ...);
// The same from an argument list.
TESSEL_API MgErr FPrintfWErrv(File_t* file, CStr format, va_list args);

// ---- errors ---------------------------------------------------------------------------------------------------------

// The calling thread's last error of the system as a result code. kIOErr for one without a closer code.
TESSEL_API MgErr Win32ToOVFileErr(void);

// Why the calling thread's last call failed, for people: what the system said, where `err` comes from it, else what the
// code means (MgErrMeaning). The text is constant.
TESSEL_API CStr FErrorText(MgErr err);

// ---- creating, copying, moving, removing ----------------------------------------------------------------------------

// Creates a file and opens it. `always` 0: kExistsErr when it exists; else an existing one is replaced by an empty one.
// The unused arguments are ignored. *file is null on failure. Atomic, not durable: the file is there or not, empty.
TESSEL_API MgErr FGenericCreate(File_t** file, Path path, int32 unused1, int32 openMode, int32 denyMode, int32 unused2,
                                int32 always);
// Creates a file and opens it. kExistsErr when it exists.
TESSEL_API MgErr FCreate(File_t** file, Path path, int32 unused1, int32 openMode, int32 denyMode, int32 unused2);
// Creates a file and opens it; an existing one is replaced by an empty one.
TESSEL_API MgErr FCreateAlways(File_t** file, Path path, int32 unused1, int32 openMode, int32 denyMode, int32 unused2);

// Writes a file with these bytes; one that is there is replaced, and keeps permissions, owner, attributes and time of
// creation. `data` may be null when `size` is 0. kFileInUseErr while someone has it open. Atomic and durable: whenever
// the process is killed or the power fails, the old file is there or the new one, whole. Neither where the file has
// several names (hard links), or its folder cannot be written: then it is written in place.
TESSEL_API MgErr FWriteWholeFile(Path path, const void* data, uint64 size);

// Copies a file: its bytes, permissions and modification date; what takes no room takes none in the copy. kExistsErr
// when `to` exists in any spelling, also when it comes meanwhile; kArgErr when `from` is a volume; kPermissionErr for
// what is no file; kIOErr when it ends before its size. FCopy follows shortcuts in `from`, the other form only when
// `resolve` is not 0. Atomic and durable: the copy appears whole and under its permissions.
TESSEL_API MgErr FCopy(Path from, Path to);
// Copies a file as FCopy does; shortcuts in `from` are followed when `resolve` is not 0. Atomic and durable.
TESSEL_API MgErr FCopyResolve(Path from, Path to, int32 resolve);

// Renames or moves a file or folder; `to` must not exist. When the current directory lies inside `from`, the parent of
// `from` becomes the current directory first. kArgErr for a volume. Atomic and durable; on a file system that cannot
// rename without replacing, a file has both names for a moment.
// To another file system a file is copied, with its owner, permissions, dates and attributes as far as they can be
// kept, and is on the device there before it goes here: it is always whole in one of the two, for a moment in both.
// kFileInUseErr, and nothing happens, while someone writes it. A link moves itself; a folder does not move (kIOErr).
// When at last the old folder cannot be brought to the device, the file has moved all the same, with kIOErr.
TESSEL_API MgErr FMove(Path from, Path to);
// As FMove, which follows shortcuts in `from`; this one only when `resolve` is not 0.
TESSEL_API MgErr FMoveResolve(Path from, Path to, int32 resolve);

// Copies the bytes of `from` into the existing file `to`, which keeps its permissions, owner, attributes and time of
// creation, then removes `from`. The result is that of the copy; a `from` that has been written meanwhile stays, with
// kFileInUseErr. Atomic and durable: `to` holds the old bytes or the new, and they are on the device before `from`
// goes. Neither where `to` has several names (hard links), its owner cannot be kept or its folder cannot be written:
// then its bytes are overwritten, when there is room for all, and a failure leaves a part of them.
TESSEL_API MgErr FMoveInto(Path from, Path to);

// Deletes a file or an empty folder. Shortcuts are not followed: one is deleted itself. Atomic, not durable.
TESSEL_API MgErr FRemove(Path path);

// Moves a file or folder to the recycle bin; the system may ask the user when `ask` is not 0. kPermissionErr when there
// is none of this user's own: a bin that is another's, or a link, is not used. Atomic and durable.
TESSEL_API MgErr FRemoveToRecycle(Path path, int32 ask);

// Creates one folder. kArgErr for an empty or bad name. Atomic, not durable.
TESSEL_API MgErr FNewDir(Path path, int32 permissions);

// Creates a folder and the parents that are missing. A folder that exists is no error; kGenericErr: it is a file.
// Neither atomic (a parent may be there without the folder) nor durable.
TESSEL_API MgErr FNewDirHier(Path path);

// ---- queries and changes --------------------------------------------------------------------------------------------

// 0 there is no such item (or the path is no good), 1 a file, 2 a folder. An item in use by others counts as a file.
TESSEL_API int32 FExists(Path path);

// What is known about an item; `mask` says which fields are wanted (kFInfo...). Shortcuts are followed by FGetInfo64
// and FGetInfo, and by FGetInfoResolve when `resolve` is not 0. FGetInfo fills all, and reports sizes that do not fit.
TESSEL_API MgErr FGetInfoResolve(Path path, FInfo64Rec* info, int32 resolve, uint8 mask);
// What is known about an item, shortcuts followed; `mask` says which fields (kFInfo...).
TESSEL_API MgErr FGetInfo64(Path path, FInfo64Rec* info, int32 mask);
// All that is known about an item, shortcuts followed; sizes that do not fit are reported.
TESSEL_API MgErr FGetInfo(Path path, FInfoRec* info);

// Applies the permissions and both dates of a file. A record of a folder changes nothing. Neither atomic nor durable.
TESSEL_API MgErr FSetInfo64(Path path, FInfo64Rec* info);
// As FSetInfo64, from the record with 32-bit sizes.
TESSEL_API MgErr FSetInfo(Path path, FInfoRec* info);

// Owner and group (always empty) and permissions: 0666, or 0444 read-only, for a file; 0777 or 0555 for a folder. Each
// output may be null. Setting takes only permissions; with none given it checks that the item exists. Atomic, not
// durable.
TESSEL_API MgErr FGetAccessRights(Path path, PStr owner, PStr group, int32* permissions);
// Sets the permissions; owner and group are not used.
TESSEL_API MgErr FSetAccessRights(Path path, PStr owner, PStr group, int32* permissions);

// `permissions` without those that the process removes by default. Takes the file manager's mutex.
TESSEL_API int32 FGetDefPerm(int32 permissions);

// The default group: an empty string in `group`, or in a new handle that the caller owns when it is null.
TESSEL_API LStrHandle FGetDefGroup(LStrHandle group);

// Deprecated: clears the read-only attribute of a file. Atomic, not durable.
TESSEL_API MgErr FMakeFileNotReadOnly(Path path);

// *isHidden or *isShortcut become 1 or 0. A shortcut is a file whose name ends in ".lnk".
TESSEL_API MgErr FIsHiddenFile(Path path, int32* isHidden);
// *isShortcut becomes 1 for a file whose name ends in ".lnk", else 0.
TESSEL_API MgErr FIsShortcut(Path path, int32* isShortcut);

// Always 0.
TESSEL_API int32 FIsSpecialFile(Path path);
// Always 0.
TESSEL_API int32 FEject(Path path);

// Modification date in seconds since 1904-01-01 UTC, and 1 in *readOnly (may be null) for a read-only item. From `file`
// when it is given and answers, else from the path.
TESSEL_API MgErr FMGetModDate(Path path, File_t* file, uint32* seconds, int32* readOnly);

// Seconds since 1904-01-01 UTC as 100 ns ticks since 1601-01-01 UTC, also in *fileTime (may be null).
TESSEL_API int64 SecsToWin32FileTime(uint32 seconds, int64* fileTime);

// ---- volumes --------------------------------------------------------------------------------------------------------

// The one-letter names of the drives, in alphabetical order, and (when `kinds` is not null) a VolKindRec for each.
TESSEL_API MgErr FListDesktop(CPStrHandle names, UHandle kinds);

// Sizes of the volume of a path in bytes. FMGetVolInfo64: each output may be null, all are 0 on failure.
TESSEL_API MgErr FGetVolInfo(Path path, VolInfoRec* info);
// Bytes free and in all, and the bytes of a sector; each output may be null, all are 0 on failure.
TESSEL_API MgErr FMGetVolInfo64(Path path, uint64* freeBytes, uint64* totalBytes, uint32* sectorSize);
// Bytes in all and free.
TESSEL_API MgErr FMGetVolInfo(Path path, double* totalBytes, double* freeBytes);

// The path made of the volume alone. *volume is made when it is null.
TESSEL_API MgErr FMGetVolPath(Path path, Path* volume);

// Sorts the names without regard to case; the 8-byte entries in `entries` (may be null) move with their names.
TESSEL_API MgErr LSort(CPStrHandle names, UHandle entries);

// ---- names and locations --------------------------------------------------------------------------------------------

// `path` with all shortcuts along it followed: into `out`, or a new path that the caller owns when it is null. Null on
// failure.
TESSEL_API Path FResolvePath(Path out, Path path);

// The same with every name in the case that the disk has it in. *out is made when it is null.
TESSEL_API MgErr FGetCanonicalPath(Path path, Path* out);

// Replaces every name after the volume by the one under which the system lists it.
TESSEL_API MgErr Win32GetLongFileName(Path path);

// The current directory of the process, and the system's temporary folder (the application's when there is none).
// path is made when it is null.
TESSEL_API MgErr GetWorkingDir(Path* path);
// The system's temporary folder, or the application's when there is none. *path is made when it is null.
TESSEL_API MgErr FGetStdTmpDirPath(Path* path);

// `out` becomes the parent of `path`. kArgErr for a path without names, or that is only a server.
TESSEL_API MgErr FDirName(Path path, Path out);

// The file type that belongs to the extension of a name, 0 for none; adding the extension of a type; and taking one off
// (of any type when `type` is 0), which returns the number of bytes removed.
TESSEL_API _FMFileType HasRezExt(Path path);
// The file type that belongs to the extension of a name, 0 for none.
TESSEL_API _FMFileType PStrHasRezExt(ConstPStr name);
// Adds the extension of a file type to the name.
TESSEL_API MgErr PStrAppendRezExt(PStr name, _FMFileType type);
// Takes the extension of a type (0: of any) off, and returns the number of bytes removed.
TESSEL_API int32 PStrStripRezExt(PStr name, _FMFileType type);

// ---- names of the host system ---------------------------------------------------------------------------------------
// The library names files as `C:\dir\file`; these two translate from and to names as the host system has them.

// The path of a name like "/home/u/a.rsrc"; a relative one starts at the current directory. *path is made when it is
// null. kNotFoundErr: no drive holds it. kArgErr: a name on the way holds a backslash, which a path cannot say.
TESSEL_API MgErr NativeToPath(CStr native, Path* path);

// The host's name of a path, terminated. kArgErr: it does not fit `size` bytes, or the path has none.
TESSEL_API MgErr PathToNative(Path path, char* buffer, uint32 size);

TESSEL_END_C

#endif
