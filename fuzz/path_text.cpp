// Text from outside as a path: whatever is read is a sound path, every text of it can be made, and no name for the
// system is longer than its buffer.
//
// Input: a byte for the code page and the format, then the text.
#include "platform/CodePage.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/frame/TesselInit.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <cstdlib>
#include <memory>
#include <optional>
#include <string>

using tessel::PathRef;

namespace {

constexpr uint32 kCodePages[] = {65001, 932, 1252};
const char* const kFormats[] = {PathRef::StringDisplay(), PathRef::StringUnix(), PathRef::StringPlatformIndependent(),
                                PathRef::StringPlatformAgnostic()};

void Quiet(CStr, int32, CStr, int32, uint32, CStr) {
}

void Require(bool condition) {
    if (!condition) std::abort();
}

std::optional<PathRef> Read(const std::string& text, const char* format) {
    try {
        return PathRef(text, format);
    } catch (const tessel::OVExcept& e) {
        Require(e.Code() != kNoErr);
        return std::nullopt;
    }
}

void CheckTexts(const PathRef& path) {
    for (const char* format : kFormats) {
        std::string text;
        Require(path.ConvertToString(&text, format) == kNoErr);
        // Reading it may fail or give another path (a name may hold a separator of the other system), but ends well.
        if (const std::optional<PathRef> again = Read(text, format)) Require(again->IsSane(false));
    }
}

// The name that the system is given stands for the same path. In a double-byte page a name may end in half a character,
// which takes the separator behind it along; a server and share go to the system as they are, whatever they hold.
void CheckSystemName(PathRef& path, bool separatorsStandAlone) {
    const std::unique_ptr<char[]> name(new char[kMaxDOSPathName]);
    if (MakeDOSPathName(&path, name.get(), 0) != kNoErr || !separatorsStandAlone) return;
    const std::optional<PathRef> again = Read(name.get(), PathRef::StringDisplay());
    Require(again && (again->Equals(path, PathRef::kExact) || !path.StartsWith(PathRef::kAbsolute)));
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    DebugOutputSetHandler(Quiet);
    return InitTesselBase();
}

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t size) {
    if (size == 0) return -1;
    const uint32 codePage = kCodePages[data[0] % 3];
    Require(tessel::platform::SetCodePage(codePage));
    const std::string text(reinterpret_cast<const char*>(data + 1), size - 1);
    std::optional<PathRef> path = Read(text, kFormats[(data[0] / 3) % 4]);
    if (path) {
        Require(path->IsSane(false));
        CheckTexts(*path);
        CheckSystemName(*path, codePage != 932);
        Require(PathRef::NameWildCardMatch(text, "**"));
        PathRef::NameWildCardMatch("name.txt", text);
    }
    return 0;
}
