// Cached items, and storing and finding them on the elements of paths.
#include <tessel/paths/PathCachedItem.h>

#include <tessel/time/Millisecs.h>

#include <cstring>
#include <new>

#include "diagnostics/Guarded.h"
#include "paths/PathRefAccess.h"

namespace tessel {

// ---- CachedItem -----------------------------------------------------------------------------------------------------

PathRef::CachedItem::CachedItem(uint32 lifetime, RelationToMetaData relation)
    : expiry_(MilliSecs() + lifetime), invalidate_(relation == kDependsOnFile) {
}

PathRef::CachedItem::~CachedItem() = default;

const char* PathRef::CachedItem::ClassName() {
    return "CachedItem";
}

bool PathRef::CachedItem::IsA(const char* className) const {
    return std::strcmp(className, ClassName()) == 0;
}

bool PathRef::CachedItem::Expired() const {
    return MillisecCmp(MilliSecs(), expiry_) >= 0;
}

bool PathRef::CachedItem::Invalidate() const {
    return invalidate_ != 0;
}

void PathRef::CachedItem::Reset(uint32 lifetime) {
    expiry_ = MilliSecs() + lifetime;
}

uint32 PathRef::CachedItem::Size() const {
    return sizeof *this;
}

uint32 PathRef::CachedItem::Rotten() const {
    const int32 late = MillisecCmp(MilliSecs(), expiry_);
    return late > 0 ? static_cast<uint32>(late) : 0;
}

void PathRef::CachedItem::Attached() {
}

// ---- items with a value ---------------------------------------------------------------------------------------------

PathRef::CachedBool::CachedBool(uint32 lifetime, RelationToMetaData relation, bool value)
    : CachedItem(lifetime, relation), value_(value) {
}

PathRef::CachedBool::~CachedBool() = default;

const char* PathRef::CachedBool::ClassName() {
    return "CachedBool";
}

bool PathRef::CachedBool::IsA(const char* className) const {
    return std::strcmp(className, ClassName()) == 0 || CachedItem::IsA(className);
}

uint32 PathRef::CachedBool::Size() const {
    return sizeof *this;
}

void PathRef::CachedBool::ResetBool(uint32 lifetime, bool value) {
    Reset(lifetime);
    value_ = value;
}

PathRef::CachedInt32::CachedInt32(uint32 lifetime, RelationToMetaData relation, int32 value)
    : CachedItem(lifetime, relation), value_(value) {
}

PathRef::CachedInt32::~CachedInt32() = default;

const char* PathRef::CachedInt32::ClassName() {
    return "CachedInt32";
}

bool PathRef::CachedInt32::IsA(const char* className) const {
    return std::strcmp(className, ClassName()) == 0 || CachedItem::IsA(className);
}

uint32 PathRef::CachedInt32::Size() const {
    return sizeof *this;
}

void PathRef::CachedInt32::ResetInt32(uint32 lifetime, int32 value) {
    Reset(lifetime);
    value_ = value;
}

PathRef::CachedPathString::CachedPathString(uint32 lifetime, RelationToMetaData relation, const StringType& value)
    : CachedItem(lifetime, relation), value_(value) {
}

PathRef::CachedPathString::~CachedPathString() = default;

const char* PathRef::CachedPathString::ClassName() {
    return "CachedPathString";
}

bool PathRef::CachedPathString::IsA(const char* className) const {
    return std::strcmp(className, ClassName()) == 0 || CachedItem::IsA(className);
}

uint32 PathRef::CachedPathString::Size() const {
    return static_cast<uint32>(sizeof *this + value_.capacity());
}

void PathRef::CachedPathString::ResetString(uint32 lifetime, const StringType& value) {
    Reset(lifetime);
    value_ = value;
}

PathRef::CachedPath::CachedPath(uint32 lifetime, RelationToMetaData relation, const PathRef& value)
    : CachedItem(lifetime, relation), value_(value) {
}

PathRef::CachedPath::~CachedPath() = default;

const char* PathRef::CachedPath::ClassName() {
    return "CachedPath";
}

bool PathRef::CachedPath::IsA(const char* className) const {
    return std::strcmp(className, ClassName()) == 0 || CachedItem::IsA(className);
}

uint32 PathRef::CachedPath::Size() const {
    return sizeof *this;
}

void PathRef::CachedPath::ResetPath(uint32 lifetime, const PathRef& value) {
    Reset(lifetime);
    value_ = value;
}

// ---- on the elements ------------------------------------------------------------------------------------------------

namespace {

// The item of that key and class on one element, unless it has expired. With the path mutex held.
PathRef::CachedItem* FindItem(PathItemElement& element, const char* key, const char* className) {
    if (!element.Cache()) return nullptr;
    const auto found = element.Cache()->items.find(std::string_view(key));
    if (found == element.Cache()->items.end()) return nullptr;
    PathRef::CachedItem* item = found->second.get();
    return !item->Expired() && item->IsA(className) ? item : nullptr;
}

PathItemElement* FindUp(PathItemElement* element, const char* key, const char* className) {
    while (element && !FindItem(*element, key, className)) element = element->Parent();
    return element;
}

PathItemElement* FindDown(PathItemElement* element, const char* key, const char* className) {
    std::vector<PathItemElement*, TrackedAllocator<PathItemElement*>> waiting{element};
    while (!waiting.empty()) {
        element = waiting.back();
        waiting.pop_back();
        if (FindItem(*element, key, className)) return element;
        for (int32 i = element->ChildCount(); i-- > 0;) waiting.push_back(element->ChildAt(i));
    }
    return nullptr;
}

PathItemElement* FindAround(PathItemElement* element, const char* key, const char* className,
                            PathRef::SearchDirection direction) {
    if (direction == PathRef::kSearchUp) return FindUp(element, key, className);
    if (direction == PathRef::kSearchDown) return FindDown(element, key, className);
    return FindItem(*element, key, className) ? element : nullptr;
}

// Stores the item and gives back the one that was there.
std::unique_ptr<PathRef::CachedItem> Exchange(PathItemElement& element, const char* key,
                                              std::unique_ptr<PathRef::CachedItem> item) {
    PathLock lock;
    if (!element.Cache()) element.Cache() = std::make_unique<PathItemCache>();
    PathItemCache::Map& items = element.Cache()->items;
    PathRef::CachedItem* stored = item.get();
    auto [position, inserted] = items.try_emplace(key, nullptr);
    position->second.swap(item);
    stored->Attached();
    return item;
}

std::unique_ptr<PathRef::CachedItem> Remove(PathItemElement& element, const char* key) {
    PathLock lock;
    if (!element.Cache()) return nullptr;
    PathItemCache::Map& items = element.Cache()->items;
    const auto found = items.find(std::string_view(key));
    if (found == items.end()) return nullptr;
    std::unique_ptr<PathRef::CachedItem> item = std::move(found->second);
    items.erase(found);
    if (items.empty()) element.Cache().reset();
    return item;
}

}  // namespace

MgErr PathRef::Cache(const char* key, CachedItem* item) const {
    std::unique_ptr<CachedItem> owned(item);  // what it is swapped for is deleted without the lock
    if (!mPathElement || !key) return kArgErr;
    return Guarded([&]() -> MgErr {
        owned = owned ? Exchange(*mPathElement, key, std::move(owned)) : Remove(*mPathElement, key);
        return kNoErr;
    });
}

PathRef::CachedItem* PathRef::GetCachedProxy(const char* key, const char* className, SearchDirection direction,
                                             PathItemElement** foundAt) const {
    if (foundAt) *foundAt = nullptr;
    if (!mPathElement || !key || !className) return nullptr;
    PathLock lock;
    PathItemElement* element = FindAround(mPathElement, key, className, direction);
    CachedItem* item = element ? FindItem(*element, key, className) : nullptr;
    if (foundAt && item) *foundAt = element;
    return item;
}

uint32 PathRef::FlushCache() const {
    if (!mPathElement) return 0;
    uint32 bytes = 0;
    PathItemCache removed;  // destroyed without the lock: the items are the host's
    {
        PathLock lock;
        mPathElement->GiveBackUnusedRoom();
        std::unique_ptr<PathItemCache>& cache = mPathElement->Cache();
        if (!cache) return 0;
        PathItemCache::Map& items = cache->items;
        for (auto position = items.begin(); position != items.end();) {
            const auto next = std::next(position);
            const CachedItem& item = *position->second;
            if (item.Invalidate() || item.Expired()) {
                bytes += item.Size();
                removed.items.insert(items.extract(position));
            }
            position = next;
        }
        if (items.empty()) cache.reset();
    }
    return bytes;
}

ThMutex PathRef::GetCacheMutex() {
    return PathLock::Mutex();
}

PathRef::CacheLock::CacheLock() {
    PathLock::Acquire();
}

PathRef::CacheLock::~CacheLock() {
    PathLock::Release();
}

}  // namespace tessel
