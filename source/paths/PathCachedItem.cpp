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

}  // namespace tessel
