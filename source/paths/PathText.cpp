// Paths as text through the flat interface.
#include "diagnostics/Guarded.h"
#include "paths/PathSteps.h"
#include "strings/HandleOps.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/memory/MemoryManager.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <string_view>

namespace tessel {
namespace {

constexpr size_t kMaxCStringBlock = 264;
constexpr size_t kMaxCStringText = 260;

MgErr ReadText(std::string_view text, const char* format, Path* path) {
    if (!path) return kArgErr;
    return Guarded([&] { return PathRef(std::string(text), format).ConvertToPath(path); });
}

std::string_view TextOf(LStrHandle handle) {
    if (!handle || (*handle)->count <= 0) return {};
    return {reinterpret_cast<const char*>((*handle)->bytes), static_cast<size_t>((*handle)->count)};
}

// The text of a path, which is that of a not-a-path for null.
MgErr TextOf(Path path, const char* format, std::string& text) {
    return (path ? *path : PathRef::NotAPath()).ConvertToString(&text, format);
}

// Stores text in a string handle, which is made when it is null. A zero byte follows when asked for.
MgErr StoreText(const std::string& text, bool terminated, LStrHandle* handle) {
    const size_t end = terminated ? 1 : 0;
    if (const MgErr err = MakeLStr(handle, text.size(), end)) return err;
    std::memcpy((**handle)->bytes, text.c_str(), text.size() + end);
    return kNoErr;
}

MgErr StorePathText(Path path, const char* format, bool terminated, LStrHandle* handle) {
    if (!handle) return kArgErr;
    return Guarded([&] {
        std::string text;
        const MgErr err = TextOf(path, format, text);
        return err ? err : StoreText(text, terminated, handle);
    });
}

std::string WithDoubledBackslashes(std::string_view text) {
    std::string doubled;
    doubled.reserve(text.size() + 16);
    for (size_t i = 0; i < text.size();) {
        const size_t next = NextCharacter(text, i);
        if (text[i] == '\\') doubled += '\\';
        doubled.append(text.substr(i, next - i));
        i = next;
    }
    return doubled;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

// ---- reading --------------------------------------------------------------------------------------------------------

MgErr FTextToPath(const char* text, int32 length, Path* path) {
    if (length < 0) return kArgErr;
    return ReadText(std::string_view(text, text ? static_cast<size_t>(length) : 0), PathRef::StringDisplay(), path);
}

MgErr FStringToPath(LStrHandle text, Path* path) {
    return ReadText(TextOf(text), PathRef::StringDisplay(), path);
}

MgErr FFileSystemStringToPath(LStrHandle text, Path* path) {
    return FStringToPath(text, path);
}

MgErr FFileSystemCStrToPath(CStr text, Path* path) {
    if (!text) {
        TESSEL_REPORT(kDebugWarning, 0x1D7A40B2u) << "FFileSystemCStrToPath: don't pass NULL for text";
        return kArgErr;
    }
    return ReadText(text, PathRef::StringDisplay(), path);
}

MgErr ConvertPlatformIndependentTextToPath(Path* path, CStr text) {
    if (!path) return kArgErr;
    if (text) return ReadText(text, PathRef::StringPlatformIndependent(), path);
    TESSEL_REPORT(kDebugWarning, 0x1D7A40B3u) << "ConvertPlatformIndependentTextToPathNew: NULL text passed in";
    if (Path empty = FEmptyPath(*path)) *path = empty;
    return kNoErr;
}

// ---- writing --------------------------------------------------------------------------------------------------------

MgErr FPathToText(Path path, LStrPtr text) {
    if (!text) return kArgErr;
    return Guarded([&] {
        std::string converted;
        const MgErr err = TextOf(path, PathRef::StringDisplay(), converted);
        if (err) return err;
        const bool onlyLength = text->count < 0;
        text->count = static_cast<int32>(converted.size());
        if (!onlyLength) std::memcpy(text->bytes, converted.data(), converted.size());
        return kNoErr;
    });
}

MgErr FPathToDSString(Path path, LStrHandle* text) {
    return StorePathText(path, PathRef::StringDisplay(), true, text);
}

MgErr FPathToAZString(Path path, LStrHandle* text) {
    return FPathToDSString(path, text);
}

MgErr FPathToFileSystemDSString(Path path, LStrHandle* text) {
    return path ? FPathToDSString(path, text) : kArgErr;
}

MgErr FPathToUnixString(Path path, LStrHandle* text) {
    return StorePathText(path, PathRef::StringUnix(), true, text);
}

MgErr ConvertPathToPlatformIndependentText(Path path, LStrHandle* text) {
    return StorePathText(path, PathRef::StringPlatformIndependent(), false, text);
}

MgErr FPathToStringRTF(Path path, LStrHandle* text) {
    if (!text) return kArgErr;
    return Guarded([&] {
        std::string converted;
        const MgErr err = TextOf(path, PathRef::StringDisplay(), converted);
        return err ? err : StoreText(WithDoubledBackslashes(converted), false, text);
    });
}

UHandle PathToCString(Path path) {
    return GuardedOr<UHandle>(nullptr, [&]() -> UHandle {
        std::string text;
        if (TextOf(path, PathRef::StringDisplay(), text) || text.size() >= INT32_MAX) return nullptr;
        UHandle handle = DSNewHandle(static_cast<uint32>(text.size() + 1));
        if (handle) std::memcpy(*handle, text.c_str(), text.size() + 1);
        return handle;
    });
}

UHandle PathToCStringEx(Path path, int32) {
    return PathToCString(path);
}

MgErr FPathToMaxCString(Path path, UPtr* text) {
    if (!text) return kArgErr;
    return Guarded([&] {
        std::string converted;
        const MgErr err = TextOf(path, PathRef::StringDisplay(), converted);
        if (err) return err;
        if (converted.size() > kMaxCStringText) return kMemFullErr;
        const UPtr block = DSNewPtr(kMaxCStringBlock);
        if (!block) return kMemFullErr;
        std::memcpy(block, converted.c_str(), converted.size() + 1);
        *text = block;
        return kNoErr;
    });
}

MgErr FPathToURL(Path, LStrHandle*) {
    return kNotFoundErr;
}
