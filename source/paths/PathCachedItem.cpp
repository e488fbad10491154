// The cached items that paths offer: one with a lifetime, and those that hold a value.
#include <tessel/paths/PathCachedItem.h>
#include <tessel/time/Millisecs.h>

#include <algorithm>
#include <cstring>

namespace tessel {

namespace {

// Expiry is found by comparing ticks that wrap, which tells no more than this apart.
constexpr uint32 kLongestLifetime = INT32_MAX;

uint32 ExpiryAfter(uint32 lifetime) {
    return MilliSecs() + std::min(lifetime, kLongestLifetime);
}

}  // namespace

// ---- CachedItem -----------------------------------------------------------------------------------------------------

PathRef::CachedItem::CachedItem(uint32 lifetime, RelationToMetaData relation)
    : expiry_(ExpiryAfter(lifetime)), invalidate_(relation == kDependsOnFile) {
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
    expiry_ = ExpiryAfter(lifetime);
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

template <class Item, class Value>
PathRef::CachedValue<Item, Value>::CachedValue(uint32 lifetime, RelationToMetaData relation, Argument value)
    : CachedItem(lifetime, relation), value_(value) {
}

template <class Item, class Value>
bool PathRef::CachedValue<Item, Value>::IsA(const char* className) const {
    return std::strcmp(className, Item::ClassName()) == 0 || CachedItem::IsA(className);
}

template <class Item, class Value>
uint32 PathRef::CachedValue<Item, Value>::Size() const {
    return sizeof(Item);
}

template <class Item, class Value>
void PathRef::CachedValue<Item, Value>::ResetValue(uint32 lifetime, Argument value) {
    Reset(lifetime);
    value_ = value;
}

template class PathRef::CachedValue<PathRef::CachedBool, bool>;
template class PathRef::CachedValue<PathRef::CachedInt32, int32>;
template class PathRef::CachedValue<PathRef::CachedPathString, PathRef::StringType>;
template class PathRef::CachedValue<PathRef::CachedPath, PathRef>;

PathRef::CachedBool::CachedBool(uint32 lifetime, RelationToMetaData relation, bool value)
    : CachedValue(lifetime, relation, value) {
}

PathRef::CachedBool::~CachedBool() = default;

const char* PathRef::CachedBool::ClassName() {
    return "CachedBool";
}

void PathRef::CachedBool::ResetBool(uint32 lifetime, bool value) {
    ResetValue(lifetime, value);
}

PathRef::CachedInt32::CachedInt32(uint32 lifetime, RelationToMetaData relation, int32 value)
    : CachedValue(lifetime, relation, value) {
}

PathRef::CachedInt32::~CachedInt32() = default;

const char* PathRef::CachedInt32::ClassName() {
    return "CachedInt32";
}

void PathRef::CachedInt32::ResetInt32(uint32 lifetime, int32 value) {
    ResetValue(lifetime, value);
}

PathRef::CachedPathString::CachedPathString(uint32 lifetime, RelationToMetaData relation, const StringType& value)
    : CachedValue(lifetime, relation, value) {
}

PathRef::CachedPathString::~CachedPathString() = default;

const char* PathRef::CachedPathString::ClassName() {
    return "CachedPathString";
}

void PathRef::CachedPathString::ResetString(uint32 lifetime, const StringType& value) {
    ResetValue(lifetime, value);
}

uint32 PathRef::CachedPathString::Size() const {
    return static_cast<uint32>(sizeof *this + Get().capacity());
}

PathRef::CachedPath::CachedPath(uint32 lifetime, RelationToMetaData relation, const PathRef& value)
    : CachedValue(lifetime, relation, value) {
}

PathRef::CachedPath::~CachedPath() = default;

const char* PathRef::CachedPath::ClassName() {
    return "CachedPath";
}

void PathRef::CachedPath::ResetPath(uint32 lifetime, const PathRef& value) {
    ResetValue(lifetime, value);
}

}  // namespace tessel
