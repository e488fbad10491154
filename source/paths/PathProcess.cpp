// The start and stop of paths, and what is set for the whole process.
#include "paths/PathProcess.h"

#include "diagnostics/Guarded.h"
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

std::atomic<bool> gStarted{false};
std::atomic<AllocTracker*> gPathTracker{nullptr};

// Set during start-up.
bool gDebugMode = false;
bool gAlwaysUtf8 = false;
std::string gNotAPathString;
std::string gPathTooLongString;

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

// An element that is still there after that is somebody's.
void PurgeBases() {
    FlushEverything();
    for (const BaseName& entry : kBaseNames) {
        const PathItemElement* base = PathItemStorage::Standard(entry.base);
        if (base && base->ChildCount() > 0)
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
    AllocTracker* tracker = gPathTracker.load();
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
    DestroyAllocTracker(gPathTracker.exchange(nullptr));
}

}  // namespace

// ---- start and stop -------------------------------------------------------------------------------------------------

void PathRef::Init() {
    if (gStarted) return;
    gPathTracker = CreateAllocTracker();
    try {
        MgErr err = PathLock::CreateMutex();
        if (!err) err = PathItemStorage::Start();
        if (err) TESSEL_THROW(err, "PathRef Init");
        MakeBases();
    } catch (...) {
        TearDown();
        throw;
    }
    gStarted = true;
}

void PathRef::UnInit() {
    if (!gStarted) return;
    ReportPathLeaks();
    gStarted = false;
    TearDown();
}

MgErr PathManagerStart() {
    return Guarded([]() -> MgErr {
        PathRef::Init();
        return kNoErr;
    });
}

MgErr PathManagerStop() {
    return Guarded([]() -> MgErr {
        PathRef::UnInit();
        return kNoErr;
    });
}

void TrackPathObject(const void* frame, const void* object, size_t size) {
    if (AllocTracker* tracker = gPathTracker.load(std::memory_order_acquire))
        tracker->AddRecordFrom(frame, object, static_cast<uint32>(size), __FILE__, __LINE__);
}

void UntrackPathObject(const void* object) {
    if (AllocTracker* tracker = gPathTracker.load(std::memory_order_acquire)) tracker->RemoveRecord(object);
}

const PathRef& PathRef::NotAPath() {
    static const PathRef notAPath;
    if (!gStarted)
        TESSEL_REPORT(kDebugWarning, 0x8E2D6C53u)
            << "Call to GetNotAPath before PathRef::Init() or after PathRef::Uninit()?";
    return notAPath;
}

// ---- settings -------------------------------------------------------------------------------------------------------

void PathRef::Setting(const char* setting) {
    if (!setting) return;
    if (std::strcmp(setting, "debug") == 0) gDebugMode = true;
    if (std::strcmp(setting, "nodebug") == 0) gDebugMode = false;
    if (std::strcmp(setting, "utf8") == 0) gAlwaysUtf8 = true;
    if (std::strcmp(setting, "sysenc") == 0) gAlwaysUtf8 = false;
}

bool& PathRef::DebugModeEnabled() {
    return gDebugMode;
}

bool FlattensAlwaysAsUtf8() {
    return gAlwaysUtf8;
}

bool StepsByCharacters() {
    return gStarted.load(std::memory_order_relaxed);
}

uint32 PathRef::GarbageCollect(OptimizationMethod method) {
    return PathItemStorage::GarbageCollect(method);
}

const PathRef::StringType& PathRef::GetNotAPathString() {
    return gNotAPathString;
}

void PathRef::SetNotAPathString(const StringType& text) {
    gNotAPathString = text;
}

const PathRef::StringType& PathRef::GetPathTooLongString() {
    return gPathTooLongString;
}

void PathRef::SetPathTooLongString(const StringType& text) {
    gPathTooLongString = text;
}

}  // namespace tessel
