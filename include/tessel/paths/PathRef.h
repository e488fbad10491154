// PathRef: a location in the file system, as a base and the names that lead from it.
//
// Sections: kinds · construction · names · extensions · relations · comparison and checks · text · flattened form ·
// file system · cached attributes · process-wide.
//
// The names are shared: every distinct sequence of names from a base exists once in the process, and a PathRef holds a
// counted reference to its last one. Copying takes no lock and no memory.
//
// A name is bytes in the active code page. Appending ".." or the empty name removes the last name; where there is none
// to remove, it becomes an up-directory element, an element with an empty name. Appending "." changes nothing.
//
// A path can hold any number of names. The system takes paths of at most 259 bytes as display text: what asks the disk
// answers 1 for a longer one.
//
// Failures raise OVExcept unless a member returns MgErr. A PathRef may be read (const members, copying) by many
// threads, and changed by one at a time, as an int. Usable between start and stop of the library.
#ifndef TESSEL_PATHS_PATHREF_H
#define TESSEL_PATHS_PATHREF_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#ifdef __cplusplus
#    include <tessel/diagnostics/DebugStream.h>
#    include <tessel/sync/ThMutex.h>

#    include <list>
#    include <new>
#    include <string>
#    include <vector>

namespace tessel {

class Endianizer;
class InputBuf;
class OutputBuf;
class PathItemElement;

class TESSEL_API PathRef {
public:
    typedef std::string StringType;

    // ---- kinds: the values are fixed --------------------------------------------------------------------------------

    enum PathBase : int32 { kAbsolute = 0, kRelative = 1, kUNC = 2, kNotAPath = 3, kNullPath = 4 };
    enum ComparePolicy : int32 { kIgnoreCase = 0, kExact = 1, kIgnoreCase2 = 2, kIgnoreCase3 = 3 };
    enum FlattenFormat : int32 { kPTH0 = 0, kPTH1 = 1 };
    enum SearchDirection : int32 { kSearchUp = 0, kSearchHere = 1, kSearchDown = 2 };
    enum SplitDirection : int32 { kFromFirst = 0, kFromLast = 1 };
    enum ResolveMethod : int32 { kResolveAll = 0, kResolveAllButLast = 1 };
    enum ResolveAction : int32 { kDontResolve = 0, kResolveShortcuts = 1 };
    enum WriteableDepth : int32 { kItemOnly = 0, kItemAndContents = 1 /* not supported */ };
    enum SizeType : int32 { kLogicalSize = 1 };
    enum OptimizationMethod : int32 { kCountOnly = 0, kFreeUnused = 1, kFreeUnusedAndReport = 2 };

    // The extensions of file types: a handle to a count and that many entries.
    struct ExtensionEntry {
        _FMFileType type;
        char extension[8];  // without the dot, terminated
    };
    struct ExtensionList {
        int32 count;
        ExtensionEntry entries[1];
    };

    class CachedItem;  // paths/PathCachedItem.h
    template <class Item, class Value>
    class CachedValue;
    class CachedBool;
    class CachedInt32;
    class CachedPathString;
    class CachedPath;
    class SplitCriteria;      // below
    class AbbreviationStyle;  // paths/PathAbbreviation.h
    class TrimFromFrontAbbreviationStyle;
    class MeasurementStyle;
    class CharCountMeasurementStyle;

    // ---- construction and assignment --------------------------------------------------------------------------------

    PathRef() noexcept = default;  // not a path
    explicit PathRef(PathBase base);
    explicit PathRef(const PathRef* other);  // null gives not-a-path
    PathRef(const PathRef& other) noexcept;
    PathRef(PathRef&& other) noexcept;
    PathRef& operator=(const PathRef& other);
    PathRef& operator=(const PathRef* other);
    PathRef& operator=(PathRef&& other) noexcept;
    ~PathRef();

    // The location registered under the name, and registering this path under one (kArgErr when the name is taken).
    explicit PathRef(const char* standardLocationName);
    MgErr AssignToName(const char* name) const;

    // Reads text in a format (the String... names below). Raises 53 for an unknown format, which it names, 1 for text
    // that gives no valid path.
    PathRef(const StringType& text, const char* format);

    // Reads a flattened path, "PTH0" or "PTH1", in the byte order of the Endianizer. Raises the buffer's error, or 74
    // for bytes that are no flattened path.
    PathRef(InputBuf* buffer, const Endianizer* endianizer);

    // Copies into *path, which is made when it is null. DisposePath destroys and sets to null.
    MgErr ConvertToPath(Path* path) const;
    static void DisposePath(Path& path);

    static const PathRef& NotAPath();

    // A PathRef on the heap is registered as a path object until it is deleted; see UnInit.
    static void* operator new(size_t size);
    static void* operator new(size_t size, const std::nothrow_t&) noexcept;
    static void* operator new(size_t, void* place) noexcept { return place; }
    static void operator delete(void* address) noexcept;
    static void operator delete(void* address, const std::nothrow_t&) noexcept;
    static void operator delete(void*, void*) noexcept {}

    // ---- names ------------------------------------------------------------------------------------------------------
    // Index 0 is the first name; a negative index counts from the end, -1 being the last name.

    int32 ItemCount() const;
    const StringType& ItemAt(int32 index) const;  // good as long as this path
    MgErr CopyItemAt(int32 index, StringType* name) const;
    const StringType& Name();  // the last name, in the text cache; empty when there is none

    PathRef& Append(const StringType& name);
    PathRef& Append(const char* name);
    PathRef& Append(const PathRef& relativePath);  // each of its up-directory elements removes a name
    PathRef& AppendUpDir();
    void Replace(int32 index, const StringType& name);
    void Replace(int32 index, const char* name);

    // Appends prefix, a random number, suffix and (unless empty) "." and the extension, such that no such item exists.
    void AppendTemporaryName(const StringType& extension, const StringType& prefix, const StringType& suffix);

    // ---- extensions: what follows the last "." of the last name -----------------------------------------------------

    StringType GetExtension() const;
    const StringType& Extension();  // in the text cache
    MgErr CopyExtension(StringType* extension) const;
    void AppendExtension(const StringType& extension);  // the dot is added
    void AppendExtension(_FMFileType type);
    void RemoveExtension();

    static StringType NameGetExtension(const StringType& name);
    static void NameRemoveExtension(StringType* name);
    static MgErr NameAppendExtension(StringType* name, const StringType& extension);
    static MgErr NameAppendExtension(StringType* name, _FMFileType type);  // kArgErr: no extension is listed
    static _FMFileType NameGetExtensionType(const StringType& name);       // 0: none is listed
    static bool NameHasExtension(const StringType& name, _FMFileType type);
    static bool NameEquals(const StringType& a, const StringType& b, ComparePolicy policy);
    static int32 NameCompare(const StringType& a, const StringType& b, ComparePolicy policy);  // -1, 0 or 1

    // "?" one character, "*" and "**" any run without and with "\", "." a dot or the end. Ignores case.
    static bool NameWildCardMatch(const StringType& name, const StringType& pattern);

    // The handles belong to the library from now on. The first list is searched first. To be set once.
    static void SetExtensionList(const ExtensionList** primary, const ExtensionList** secondary);

    // ---- relations --------------------------------------------------------------------------------------------------

    PathRef GetParentDirectory() const;  // not-a-path when there are no names
    PathRef Volume() const;              // the base and the first name
    bool StartsWith(PathBase base) const;
    bool StartsWith(const PathRef& start, ComparePolicy policy) const;
    bool IsParentDirectoryOf(const PathRef& other, ComparePolicy policy) const;
    int32 CountUpDir() const;
    PathRef GetInCommonWith(const PathRef& other, ComparePolicy policy) const;  // the longest common leading part
    PathRef GetRelativePathFromThisToThat(const PathRef& that, ComparePolicy policy) const;

    // When this path starts with `from`, puts `to` in the place of that part. Up-directory elements that follow it
    // remove names of `to`.
    bool Rebase(const PathRef& from, const PathRef& to, ComparePolicy policy);

    // Splits where the criteria say. Either part may be null. False: nowhere, and the parts become not-a-path.
    bool SplitOn(const SplitCriteria& criteria, PathRef* head, PathRef* tail, SplitDirection direction) const;

    // ---- comparison and checks --------------------------------------------------------------------------------------

    bool Equals(const PathRef& other, ComparePolicy policy) const;

    // 0 when equal. On one base with names on both sides, the magnitude is one more than the number of leading names in
    // common, negative when this path sorts first.
    int32 Compare(const PathRef& other, ComparePolicy policy) const;

    bool IsValid() const;           // on a known base; a UNC path has a server
    bool IsSane(bool quick) const;  // not quick: every element is checked, and what is wrong reported

    // ---- text: the formats are the names returned here --------------------------------------------------------------

    static const char* StringDisplay();              // C:\dir\file, for people
    static const char* StringCommandLine();          // the same; not for a path without names
    static const char* StringDOS();                  // C:\dir\file
    static const char* StringUnix();                 // /C/dir/file
    static const char* StringPlatformIndependent();  // /C/dir/file, reads and writes UNC paths
    static const char* StringPlatformAgnostic();     // written as before; read by guessing the kind of text

    MgErr ConvertToString(StringType* out, const char* format) const;  // 53: unknown format
    const StringType& ToString(const char* format);                    // in the text cache

    static MgErr ToAbbreviatedDisplayStrings(const std::list<PathRef>& paths, std::vector<StringType>* out,
                                             const AbbreviationStyle& style, const MeasurementStyle& measure);

    // ---- flattened form ---------------------------------------------------------------------------------------------

    // Writes "PTH0" or "PTH1". *size (may be null) receives the bytes. A null buffer only measures.
    MgErr Flatten(OutputBuf* buffer, FlattenFormat format, uint32* size, const Endianizer* endianizer) const;
    uint32 FlattenedSize(FlattenFormat format) const;

    // ---- file system ------------------------------------------------------------------------------------------------

    bool Exists() const;
    bool IsADirectory() const;
    bool IsAFile() const;
    uint64 Size(SizeType type) const;   // bytes of a file
    uint64 DirectoryItemCount() const;  // entries of a folder
    double VolumeSize() const;          // bytes
    double VolumeFree() const;
    int32 DisconnectVolume() const;   // 0: there is nothing to do
    uint32 ModificationDate() const;  // seconds since 1904-01-01 UTC
    bool IsAShortcut() const;
    bool IsSpecial() const;  // false
    void ResolveShortcuts(ResolveMethod method);
    PathRef GetLongNames() const;
    // Each name as the disk has it; remembered for so long. Raises 1 for a path of more than 259 bytes, or with a name
    // that no file can have.
    PathRef GetCorrectedCase(double seconds) const;
    MgErr MakeWriteable(WriteableDepth depth) const;
    MgErr RemoveFile(ResolveAction action);
    MgErr CopyFileTo(const PathRef& to, ResolveAction action) const;
    MgErr MoveFileTo(const PathRef& to, ResolveAction action) const;

    // ---- cached attributes ------------------------------------------------------------------------------------------
    // Items under text keys on the last name of a path, shared by all paths that end there. They go when they expire,
    // when FlushCache drops them, and with the last path to the name.

    // Stores an item, which belongs to the path from now on, also on failure. Null removes what is there.
    MgErr Cache(const char* key, CachedItem* item) const;

    // The item of that key and class, unless it has expired; where it was found in *foundAt (may be null). Another
    // thread may flush it: hold a CacheLock while you use it.
    CachedItem* GetCachedProxy(const char* key, const char* className, SearchDirection direction,
                               PathItemElement** foundAt = nullptr) const;

    uint32 FlushCache() const;  // drops what depends on the file, and what has expired; bytes released

    // Guards the cached items and the tree of names. A thread that takes this mutex itself must not use paths until it
    // has released it; the lock below lets it.
    static ThMutex GetCacheMutex();

    class TESSEL_API CacheLock {
    public:
        CacheLock();
        ~CacheLock();
        CacheLock(const CacheLock&) = delete;
        CacheLock& operator=(const CacheLock&) = delete;
    };

    // ---- process-wide -----------------------------------------------------------------------------------------------

    static void Init();
    // Reports the path objects that are left ("ovpathleaks.txt" in the temporary folder).
    static void UnInit();

    // "debug", "nodebug": whether assignments keep the display text for a debugger to show. "utf8", "sysenc": whether
    // every path is flattened as "PTH1", or only one that needs it. Others do nothing.
    static void Setting(const char* setting);
    static bool& DebugModeEnabled();

    // Gives unused storage of names back. Returns the bytes.
    static uint32 GarbageCollect(OptimizationMethod method);
    static uint32 MemorySize();  // bytes of a path object; the shared names are not counted

    // What stands for a not-a-path in text, and for a path whose text is too long. Empty until set. For start-up.
    static const StringType& GetNotAPathString();
    static void SetNotAPathString(const StringType& text);
    static const StringType& GetPathTooLongString();
    static void SetPathTooLongString(const StringType& text);

private:
    friend struct PathRefAccess;

    void Assign(PathItemElement* element);
    void TakeOver(PathItemElement* element) noexcept;
    StringType& TextCache();

    PathItemElement* mPathElement = nullptr;
    StringType* textCache_ = nullptr;
};

// Where SplitOn splits a path.
class TESSEL_API PathRef::SplitCriteria {
public:
    enum Action : int32 {
        kContinue = 0,
        kDropName = 1,  // split here; the name belongs to neither part
        kNameEndsHead = 2,
        kNameStartsTail = 3
    };

    virtual ~SplitCriteria();

    // Called for each name until it says where. `step` is how many names were visited before.
    virtual int32 Decide(const PathRef& path, int32 step, const std::string& name) const = 0;
};

// Display text; "NULL" for a null pointer, "<path too long>" when the text cannot be made.
TESSEL_API void ToDebugStream(DebugStream& stream, const PathRef& path);
TESSEL_API void ToDebugStream(DebugStream& stream, PathRef* path);

}  // namespace tessel
#endif

#endif
