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

// A location in the file system.
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

    // Not a path.
    PathRef() noexcept = default;
    // The path without names on a base.
    explicit PathRef(PathBase base);
    // A copy; null gives not-a-path.
    explicit PathRef(const PathRef* other);
    // A copy: the same names, which are shared.
    PathRef(const PathRef& other) noexcept;
    // Takes the path over; the other becomes not-a-path.
    PathRef(PathRef&& other) noexcept;
    // Becomes a copy.
    PathRef& operator=(const PathRef& other);
    // Becomes a copy; null gives not-a-path.
    PathRef& operator=(const PathRef* other);
    // Takes the path over; the other becomes not-a-path.
    PathRef& operator=(PathRef&& other) noexcept;
    ~PathRef();

    // The location registered under the name, and registering this path under one (kArgErr when the name is taken).
    explicit PathRef(const char* standardLocationName);
    // Registers this path under a name. kArgErr when the name is taken.
    MgErr AssignToName(const char* name) const;

    // Reads text in a format (the String... names below). Raises 53 for an unknown format, which it names, 1 for text
    // that gives no valid path.
    PathRef(const StringType& text, const char* format);

    // Reads a flattened path, "PTH0" or "PTH1", in the byte order of the Endianizer. Raises the buffer's error, or 74
    // for bytes that are no flattened path.
    PathRef(InputBuf* buffer, const Endianizer* endianizer);

    // Copies into *path, which is made when it is null. DisposePath destroys and sets to null.
    MgErr ConvertToPath(Path* path) const;
    // Destroys the path, if there is one, and sets it to null.
    static void DisposePath(Path& path);

    // The one that is not a path; the library's.
    static const PathRef& NotAPath();

    // A PathRef on the heap is registered as a path object until it is deleted; see UnInit.
    static void* operator new(size_t size);
    // The same; null when there is no memory.
    static void* operator new(size_t size, const std::nothrow_t&) noexcept;
    // In memory of the caller's: not registered.
    static void* operator new(size_t, void* place) noexcept { return place; }
    // Deletes a path object. Null is fine.
    static void operator delete(void* address) noexcept;
    // What a constructor that raises leaves behind.
    static void operator delete(void* address, const std::nothrow_t&) noexcept;
    // Nothing: the memory is the caller's.
    static void operator delete(void*, void*) noexcept {}

    // ---- names ------------------------------------------------------------------------------------------------------
    // Index 0 is the first name; a negative index counts from the end, -1 being the last name.

    // Number of names.
    int32 ItemCount() const;
    // A name; good as long as this path.
    const StringType& ItemAt(int32 index) const;
    // Copies a name. kArgErr for an index out of range or no output.
    MgErr CopyItemAt(int32 index, StringType* name) const;
    // The last name, in the text cache; empty when there is none.
    const StringType& Name();

    // Appends a name.
    PathRef& Append(const StringType& name);
    // Appends a name.
    PathRef& Append(const char* name);
    // Appends the names of a relative path; each of its up-directory elements removes a name.
    PathRef& Append(const PathRef& relativePath);
    // Removes the last name, or adds an up-directory element.
    PathRef& AppendUpDir();
    // Puts another name in the place of one.
    void Replace(int32 index, const StringType& name);
    // Puts another name in the place of one.
    void Replace(int32 index, const char* name);

    // Appends prefix, a random number, suffix and (unless empty) "." and the extension, such that no such item exists.
    void AppendTemporaryName(const StringType& extension, const StringType& prefix, const StringType& suffix);

    // ---- extensions: what follows the last "." of the last name -----------------------------------------------------

    // The extension of the last name, without the dot; empty for none.
    StringType GetExtension() const;
    // The same, in the text cache.
    const StringType& Extension();
    // The same into *extension. kArgErr without an output.
    MgErr CopyExtension(StringType* extension) const;
    // Appends an extension; the dot is added.
    void AppendExtension(const StringType& extension);
    // Appends the extension that is listed for a file type.
    void AppendExtension(_FMFileType type);
    // Takes the extension and its dot off.
    void RemoveExtension();

    // The extension of a name, without the dot; empty for none.
    static StringType NameGetExtension(const StringType& name);
    // Takes the extension and its dot off.
    static void NameRemoveExtension(StringType* name);
    // Appends a dot and the extension. kArgErr for null.
    static MgErr NameAppendExtension(StringType* name, const StringType& extension);
    // Appends the extension of a file type. kArgErr: none is listed.
    static MgErr NameAppendExtension(StringType* name, _FMFileType type);
    // The file type of the extension; 0: none is listed.
    static _FMFileType NameGetExtensionType(const StringType& name);
    // Whether the name has the extension of the file type.
    static bool NameHasExtension(const StringType& name, _FMFileType type);
    // Whether the names are equal under the policy.
    static bool NameEquals(const StringType& a, const StringType& b, ComparePolicy policy);
    // The order of the names under the policy: -1, 0 or 1.
    static int32 NameCompare(const StringType& a, const StringType& b, ComparePolicy policy);

    // "?" one character, "*" and "**" any run without and with "\", "." a dot or the end. Ignores case.
    static bool NameWildCardMatch(const StringType& name, const StringType& pattern);

    // The handles belong to the library from now on. The first list is searched first. To be set once.
    static void SetExtensionList(const ExtensionList** primary, const ExtensionList** secondary);

    // ---- relations --------------------------------------------------------------------------------------------------

    // The path without its last name; not-a-path when there are no names.
    PathRef GetParentDirectory() const;
    // The base and the first name.
    PathRef Volume() const;
    // Whether the path is on that base.
    bool StartsWith(PathBase base) const;
    // Whether the other path is a leading part of this one.
    bool StartsWith(const PathRef& start, ComparePolicy policy) const;
    // Whether the other path lies somewhere below this one.
    bool IsParentDirectoryOf(const PathRef& other, ComparePolicy policy) const;
    // Number of up-directory elements.
    int32 CountUpDir() const;
    // The longest common leading part.
    PathRef GetInCommonWith(const PathRef& other, ComparePolicy policy) const;
    // The relative path that leads from here to there.
    PathRef GetRelativePathFromThisToThat(const PathRef& that, ComparePolicy policy) const;

    // When this path starts with `from`, puts `to` in the place of that part. Up-directory elements that follow it
    // remove names of `to`.
    bool Rebase(const PathRef& from, const PathRef& to, ComparePolicy policy);

    // Splits where the criteria say. Either part may be null. False: nowhere, and the parts become not-a-path.
    bool SplitOn(const SplitCriteria& criteria, PathRef* head, PathRef* tail, SplitDirection direction) const;

    // ---- comparison and checks --------------------------------------------------------------------------------------

    // Whether the two lead the same way under the policy.
    bool Equals(const PathRef& other, ComparePolicy policy) const;

    // 0 when equal. On one base with names on both sides, the magnitude is one more than the number of leading names in
    // common, negative when this path sorts first.
    int32 Compare(const PathRef& other, ComparePolicy policy) const;

    // On a known base; a UNC path has a server.
    bool IsValid() const;
    // Whether it holds together. Not quick: every element is checked, and what is wrong reported.
    bool IsSane(bool quick) const;

    // ---- text: the formats are the names returned here --------------------------------------------------------------

    // C:\dir\file, for people.
    static const char* StringDisplay();
    // The same; not for a path without names.
    static const char* StringCommandLine();
    // C:\dir\file.
    static const char* StringDOS();
    // /C/dir/file.
    static const char* StringUnix();
    // /C/dir/file, reads and writes UNC paths.
    static const char* StringPlatformIndependent();
    // Written as before; read by guessing the kind of text.
    static const char* StringPlatformAgnostic();

    // The text in a format, into *out. 53: unknown format.
    MgErr ConvertToString(StringType* out, const char* format) const;
    // The text in a format, in the text cache.
    const StringType& ToString(const char* format);

    // A short text for each path, by a style and a measure (paths/PathAbbreviation.h).
    static MgErr ToAbbreviatedDisplayStrings(const std::list<PathRef>& paths, std::vector<StringType>* out,
                                             const AbbreviationStyle& style, const MeasurementStyle& measure);

    // ---- flattened form ---------------------------------------------------------------------------------------------

    // Writes "PTH0" or "PTH1". *size (may be null) receives the bytes. A null buffer only measures.
    MgErr Flatten(OutputBuf* buffer, FlattenFormat format, uint32* size, const Endianizer* endianizer) const;
    // Bytes of the flattened form.
    uint32 FlattenedSize(FlattenFormat format) const;

    // ---- file system ------------------------------------------------------------------------------------------------

    // Whether there is such an item.
    bool Exists() const;
    // Whether it is a folder.
    bool IsADirectory() const;
    // Whether it is a file.
    bool IsAFile() const;
    // Bytes of a file.
    uint64 Size(SizeType type) const;
    // Entries of a folder.
    uint64 DirectoryItemCount() const;
    // Bytes of the volume in all.
    double VolumeSize() const;
    // Bytes of the volume that are free.
    double VolumeFree() const;
    // 0: there is nothing to do.
    int32 DisconnectVolume() const;
    // Seconds since 1904-01-01 UTC.
    uint32 ModificationDate() const;
    // Whether it is a shortcut: a file named *.lnk.
    bool IsAShortcut() const;
    // False.
    bool IsSpecial() const;
    // Follows the shortcuts on the way, that of the last name only when asked for all.
    void ResolveShortcuts(ResolveMethod method);
    // The path with the names under which the system lists them.
    PathRef GetLongNames() const;
    // Each name as the disk has it; remembered for so long. Raises 1 for a path of more than 259 bytes, or with a name
    // that no file can have.
    PathRef GetCorrectedCase(double seconds) const;
    // Clears the read-only attribute. kUnsupportedErr for kItemAndContents.
    MgErr MakeWriteable(WriteableDepth depth) const;
    // Deletes the file or empty folder; with kResolveShortcuts what a shortcut stands for, and the shortcut.
    MgErr RemoveFile(ResolveAction action);
    // Copies the file, or what it is a shortcut to.
    MgErr CopyFileTo(const PathRef& to, ResolveAction action) const;
    // Moves the file, or what it is a shortcut to.
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

    // Drops what depends on the file, and what has expired; returns the bytes released.
    uint32 FlushCache() const;

    // Guards the cached items and the tree of names. A thread that takes this mutex itself must not use paths until it
    // has released it; the lock below lets it.
    static ThMutex GetCacheMutex();

    class TESSEL_API CacheLock {
    public:
        // Takes the lock; a thread may hold several.
        CacheLock();
        ~CacheLock();
        CacheLock(const CacheLock&) = delete;
        CacheLock& operator=(const CacheLock&) = delete;
    };

    // ---- process-wide -----------------------------------------------------------------------------------------------

    // Makes paths usable; the start of the library calls it. Raises OVExcept when memory runs out.
    static void Init();
    // Reports the path objects that are left ("ovpathleaks.txt" in the temporary folder).
    static void UnInit();

    // "debug", "nodebug": whether assignments keep the display text for a debugger to show. "utf8", "sysenc": whether
    // every path is flattened as "PTH1", or only one that needs it. Others do nothing.
    static void Setting(const char* setting);
    // Whether assignments keep the display text ("debug").
    static bool& DebugModeEnabled();

    // Gives unused storage of names back. Returns the bytes.
    static uint32 GarbageCollect(OptimizationMethod method);
    // Bytes of a path object; the shared names are not counted.
    static uint32 MemorySize();

    // What stands for a not-a-path in text, and for a path whose text is too long. Empty until set. For start-up.
    static const StringType& GetNotAPathString();
    // Sets the text for a not-a-path. For start-up.
    static void SetNotAPathString(const StringType& text);
    // What stands for a path whose text is too long.
    static const StringType& GetPathTooLongString();
    // Sets the text for a path whose own is too long. For start-up.
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
// The same for a pointer, which may be null.
TESSEL_API void ToDebugStream(DebugStream& stream, PathRef* path);

}  // namespace tessel
#endif

#endif
