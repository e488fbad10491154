// The start and stop of paths, and what is set for the whole process.
#include "paths/PathProcess.h"

#include "diagnostics/Guarded.h"
#include "diagnostics/ObjectTracker.h"
#include "paths/PathItemStorage.h"
#include "paths/PathLock.h"
#include "paths/PathRefAccess.h"
#include "paths/PathSteps.h"
#include "paths/Service.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DumpLeakInfo.h>

#include <atomic>
#include <cstring>

namespace tessel {
namespace {

struct BaseName {
    PathRef::PathBase base;
    const char* name;
};
constexpr BaseName kBaseNames[] = {{PathRef::kAbsolute, "[absolute]"},
                                   {PathRef::kRelative, "[relative]"},
                                   {PathRef::kUNC, "[unc]"},
                                   {PathRef::kNullPath, "[NULL]"}};

static_assert(kSeparatorNotFound == PathRef::StringType::npos,
              "kSeparatorNotFoundConstantDoNotUse is not the same as PathRef::StringType::npos");

std::atomic<bool> started{false};
ObjectTracker pathTracker;

// Set during start-up.
bool debugMode = false;
bool alwaysUtf8 = false;
std::string notAPathString;
std::string pathTooLongString;

void MakeBases() {
    for (const BaseName& entry : kBaseNames) {
        PathItemElement* element = PathItemStorage::Allocate();
        if (!element) TESSEL_THROW(kMemFullErr, "PathRef Init, base element");
        element->BecomeBase(entry.name);
        PathItemStorage::SetStandard(entry.base, element);
        element->Release();
    }
}

// Takes what is cached out of the whole tree: cached paths are no reason for an element to stay.
void FlushEverything() {
    PathItemCacheList caches;
    PathLock lock;
    for (const BaseName& entry : kBaseNames)
        if (PathItemElement* base = PathItemStorage::Standard(entry.base)) base->TakeCaches(caches);
}

bool HasChildren(const PathItemElement& element) {
    PathLock lock;
    return element.ChildCount() > 0;
}

// An element that is still there after that is somebody's.
void PurgeBases() {
    FlushEverything();
    for (const BaseName& entry : kBaseNames) {
        const PathItemElement* base = PathItemStorage::Standard(entry.base);
        if (base && HasChildren(*base))
            TESSEL_REPORT(kDebugWarning, 0xC04E91B7u)
                << "Possible path leak, unable to purge elements of base #" << static_cast<int32>(entry.base);
        PathItemStorage::SetStandard(entry.base, nullptr);
    }
}

// Writes the display text of the paths that are left.
class PathLeakDumper final : public LeakDumper {
public:
    PathLeakDumper() : LeakDumper(0, "Path Leaks", "ovpathleaks.txt") {}

    void DumpItemContents(const void* address, uint32) override {
        std::string text;
        Guarded([&] { return static_cast<const PathRef*>(address)->ConvertToString(&text, PathRef::StringDisplay()); });
        FormatToOutput("Path Contents: %s\n", text.c_str());
    }
};

void ReportPathLeaks() {
    AllocTracker* tracker = pathTracker.Get();
    if (!tracker || tracker->CountLive() == 0) return;
    PathLeakDumper dumper;
    dumper.DumpLeaks(*tracker);
}

void TearDown() {
    PathItemStorage::ForgetLocations();
    PurgeBases();
    ReleaseExtensionLists();
    PathItemStorage::Stop();
    PathLock::DestroyMutex();
    pathTracker.Stop();
}

}  // namespace

// ---- start and stop -------------------------------------------------------------------------------------------------

void PathRef::Init() {
    if (started) return;
    pathTracker.Start();
    try {
        MgErr err = PathLock::CreateMutex();
        if (!err) err = PathItemStorage::Start();
        if (err) TESSEL_THROW(err, "PathRef Init");
        MakeBases();
    } catch (...) {
        TearDown();
        throw;
    }
    started = true;
}

void PathRef::UnInit() {
    if (!started) return;
    ReportPathLeaks();
    started = false;
    TearDown();
}

MgErr PathManagerStart() {
    return Guarded([] {
        PathRef::Init();
        return kNoErr;
    });
}

MgErr PathManagerStop() {
    return Guarded([] {
        PathRef::UnInit();
        return kNoErr;
    });
}

void TrackPathObject(const void* frame, const void* object, size_t size) {
    pathTracker.Add(frame, object, static_cast<uint32>(size), __FILE__, __LINE__);
}

void UntrackPathObject(const void* object) {
    pathTracker.Remove(object);
}

const PathRef& PathRef::NotAPath() {
    static const PathRef notAPath;
    if (!started)
        TESSEL_REPORT(kDebugWarning, 0x8E2D6C53u)
            << "Call to GetNotAPath before PathRef::Init() or after PathRef::Uninit()?";
    return notAPath;
}

// ---- settings -------------------------------------------------------------------------------------------------------

void PathRef::Setting(const char* setting) {
    if (!setting) return;
    if (std::strcmp(setting, "debug") == 0) debugMode = true;
    if (std::strcmp(setting, "nodebug") == 0) debugMode = false;
    if (std::strcmp(setting, "utf8") == 0) alwaysUtf8 = true;
    if (std::strcmp(setting, "sysenc") == 0) alwaysUtf8 = false;
}

bool& PathRef::DebugModeEnabled() {
    return debugMode;
}

bool FlattensAlwaysAsUtf8() {
    return alwaysUtf8;
}

bool StepsByCharacters() {
    return started.load(std::memory_order_relaxed);
}

uint32 PathRef::GarbageCollect(OptimizationMethod method) {
    return PathItemStorage::GarbageCollect(method);
}

const PathRef::StringType& PathRef::GetNotAPathString() {
    return notAPathString;
}

void PathRef::SetNotAPathString(const StringType& text) {
    notAPathString = text;
}

const PathRef::StringType& PathRef::GetPathTooLongString() {
    return pathTooLongString;
}

void PathRef::SetPathTooLongString(const StringType& text) {
    pathTooLongString = text;
}

}  // namespace tessel
