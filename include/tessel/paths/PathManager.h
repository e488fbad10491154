// Paths through the flat interface: making, inspecting, comparing and combining them, and their flattened form.
//
// A Path belongs to whoever made it and is destroyed with FDestroyPath. A null Path is no path at all; every function
// takes one, and says what it does with it. An out-parameter `Path` is changed in place, a `Path*` is made when it is
// null. Any thread; one Path is changed by one thread at a time.
//
// A path can hold any number of names; the functions that ask the disk answer kArgErr for one of more than 259 bytes
// as display text.
//
// A name is a PStr in the active code page. Appending ".." or the empty name removes the last name; where there is none
// to remove, it adds an up-directory element, which counts as a name and is empty. Appending "." changes nothing.
#ifndef TESSEL_PATHS_PATHMANAGER_H
#define TESSEL_PATHS_PATHMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

// Path types: the numbers of the flat interface and of "PTH0".
enum { kPathAbsolute = 0, kPathRelative = 1, kPathNotAPath = 2, kPathUNC = 3 };

TESSEL_BEGIN_C

// ---- construction and destruction -----------------------------------------------------------------------------------

// Makes `path`, or a new path when it is null, the absolute path without names, or not-a-path. Null on failure.
TESSEL_API Path FEmptyPath(Path path);
// Makes `path`, or a new path when it is null, not-a-path. Null on failure.
TESSEL_API Path FNotAPath(Path path);

// Makes `path`, or a new path when it is null, from PStr names; a null pointer ends them: (PStr)NULL. Null on failure.
TESSEL_API Path FMakePath(Path path, int32 type, ConstPStr name, ...);

// kArgErr for a not-a-path, and for an empty name on an absolute path.
TESSEL_API MgErr FAppendName(Path path, ConstPStr name);

// Makes `dst` the same path as `src`. kArgErr when one is null.
TESSEL_API MgErr FPathCpy(Path dst, Path src);
// Replaces *path by a new copy; the old one stays its owner's.
TESSEL_API MgErr FPathToPath(Path* path);

// Destroys *path and sets it to null.
TESSEL_API void FDestroyPath(Path* path);
// Deprecated.
TESSEL_API MgErr FDisposePath(Path path);

// Puts the names under another base; any type but not-a-path.
TESSEL_API MgErr FSetPathType(Path path, int32 type);

// Makes a path whose first name begins with a backslash a UNC path.
TESSEL_API MgErr FNormalizePath(Path path);

// ---- inspection -----------------------------------------------------------------------------------------------------

// *type = the type of the path. kArgErr for null.
TESSEL_API MgErr FGetPathType(Path path, int32* type);
// kPathNotAPath for null.
TESSEL_API int16 PathType(Path path);

// Whether it is a path: neither null nor not-a-path.
TESSEL_API bool FIsAPath(Path path);
// Whether it is a valid path, or not-a-path.
TESSEL_API bool FIsAPathOrNotAPath(Path path);
// Whether it is on the base of that type.
TESSEL_API bool FIsAPathOfType(Path path, int32 type);
// Absolute or UNC.
TESSEL_API bool FIsAbsPath(Path path);
// Whether it is a path without names.
TESSEL_API bool FIsEmptyPath(Path path);
// Checks every element, and reports what is wrong.
TESSEL_API bool FIsSanePath(Path path);
// Holds an up-directory element.
TESSEL_API bool FIsCDUp(Path path);

// Number of names. For null FDepth is -1, as for an invalid path, and PathCnt is 0.
TESSEL_API int32 FDepth(Path path);
// Number of names; 0 for null.
TESSEL_API int32 PathCnt(Path path);

// Bytes of a path object; 0 for null.
TESSEL_API uint32 PathSize(Path path);
// Bytes of a path object; 0 for null.
TESSEL_API uint32 FGetPathStorageSize(Path path);

// Drops what is cached about the file. Returns the bytes released.
TESSEL_API uint32 FShrinkPath(Path path);

// The last name: as a PStr in a handle, which is resized, or in a buffer of 256 bytes, which is empty on failure.
// kArgErr when there is no name, or it is longer than 255 bytes. PathCopyName returns the buffer, or null.
TESSEL_API MgErr FName(Path path, UHandle name);
// The last name into a buffer of 256 bytes, which is empty on failure. kArgErr as in FName.
TESSEL_API MgErr FNamePtr(Path path, PStr name);
// The last name into a buffer of 256 bytes, which is returned; null when there is none or it is too long.
TESSEL_API PStr PathCopyName(Path path, PStr name);

// A name by its index; a negative one counts from the end, -1 being the last.
TESSEL_API MgErr FPathComponent(Path path, int32 index, PStr name);
// A name by its index into a buffer of 256 bytes, which is returned; null on failure.
TESSEL_API PStr PathCopyElt(Path path, int32 index, PStr name);
// Replaces a name by its index, counted as in FPathComponent.
TESSEL_API MgErr PathReplaceElt(Path path, ConstPStr name, int32 index);

// What begins at the last "." of the name, the dot included; empty for none, or when only the first character is one.
// `extension` takes as many bytes as the name.
TESSEL_API void FGetFileExtension(CStr name, char* extension);

// ---- comparison -----------------------------------------------------------------------------------------------------

// Ignores case; false if either is null, unless they are the same.
TESSEL_API bool FPathEqual(Path a, Path b);

// 0 when equal; on one base the magnitude is one more than the number of leading names in common, and it is negative
// when a comes first. FPathCmpLexical ignores case, and has null come last; FPathCmpExact has it come first.
TESSEL_API int32 FPathCmpExact(Path a, Path b);
// As FPathCmpExact, but ignores case, and has null come last.
TESSEL_API int32 FPathCmpLexical(Path a, Path b);

// 0 when equal ignoring case, -1 for different types, else one more than the number of leading names in common.
TESSEL_API int32 FPathCmp(Path a, Path b);

// The same from the end: one more than the number of trailing names in common.
TESSEL_API int32 FPathMatchingTailCount(Path a, Path b);

// Whether two names are equal but for case; the N form looks at the first n bytes only.
TESSEL_API bool FileNameEqual(ConstPStr a, ConstPStr b);
// Whether the first n bytes of two names are equal but for case.
TESSEL_API bool FileNameNEqual(ConstPStr a, ConstPStr b, int32 n);
// Whether two terminated names are equal but for case; false if either is null.
TESSEL_API bool FileNameCStrEqual(CStr a, CStr b);

// ---- combination: `result` must exist, and may be one of the others -------------------------------------------------

// `rel` under `base`. kArgErr when `rel` is not relative, unless `base` has no names.
TESSEL_API MgErr FAddPath(Path base, Path rel, Path result);

// The relative path that leads from one to the other.
TESSEL_API MgErr FRelPath(Path from, Path to, Path result);

// Cuts `a` to what the two have in common; nothing in common makes it the empty path.
TESSEL_API MgErr FCommonPath(Path a, Path b);

// The base and the first name.
TESSEL_API MgErr FVolName(Path path, Path result);

// ---- flattened form -------------------------------------------------------------------------------------------------

// Writes "PTH0", or "PTH1" where a name needs it, most significant byte first, and returns the size; null: only the
// size. There is no check for room. 0 on failure.
TESSEL_API int32 FFlattenPath(Path path, uint8* bytes);

// Reads a flattened path and returns its size. The second form never reads beyond `length` bytes; use it for what comes
// from outside. The null path gives null. On failure 0, or length + 1, and *path is unchanged. A length of INT32_MAX
// counts as one less, so that length + 1 is a number.
TESSEL_API int32 FUnFlattenPath(const uint8* bytes, Path* path);
// As FUnFlattenPath, without reading beyond `length` bytes.
TESSEL_API int32 FUnFlattenPath2(const uint8* bytes, Path* path, int32 length);

// ---- texts for what has no text -------------------------------------------------------------------------------------
// Buffers of 256 bytes, copied; null gets nothing, and sets the empty text. Empty until set; to be set during start-up.
// PathRef has a pair of its own.
TESSEL_API void FGetNotAPathString(PStr text);
// Sets the text for not-a-path; null sets the empty text. For start-up.
TESSEL_API void FSetNotAPathString(ConstPStr text);
// The text for a path whose own is too long, into 256 bytes; null gets nothing.
TESSEL_API void FGetPathTooLongString(PStr text);
// Sets the text for a path whose own is too long; null sets the empty text. For start-up.
TESSEL_API void FSetPathTooLongString(ConstPStr text);

TESSEL_END_C

#ifdef __cplusplus
namespace tessel {

class Endianizer;
class InputBuf;
class OutputBuf;

// As FFlattenPath, into a buffer, in the byte order of the Endianizer.
TESSEL_API int32 FFlattenPath2(Path path, OutputBuf* buffer, const Endianizer* endianizer);

// Reads one flattened path into *path. The null path leaves *path alone; if that is a path, the result is kArgErr.
TESSEL_API MgErr FUnFlattenPath2(InputBuf* buffer, Path* path, const Endianizer* endianizer);
using ::FUnFlattenPath2;

}  // namespace tessel
#endif

#endif
