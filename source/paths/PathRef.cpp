// PathRef: construction, names, relations, comparison and checks. Texts, the flattened form, extensions, cached
// attributes and the file system have files of their own.
#include "diagnostics/Guarded.h"
#include "paths/PathItemList.h"
#include "paths/PathItemStorage.h"
#include "paths/PathLock.h"
#include "paths/PathProcess.h"
#include "paths/PathRefAccess.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/memory/TrackedMallocFree.h>
#include <tessel/paths/PathRef.h>
#include <tessel/strings/StringUtils.h>

#include <new>
#include <utility>

namespace tessel {
namespace {

// A sanity check stops here, so that it ends even when elements are linked in a circle.
constexpr int32 kDeepestCheck = 512;

bool IsNullPathBase(const PathItemElement* element) {
    return element->Depth() == 0 && element == PathItemStorage::Standard(PathRef::kNullPath);
}

// The number of leading names that are the same in both; -1 on different bases.
int32 CommonCount(const PathItemElement* a, const PathItemElement* b, bool ignoreCase) {
    while (a->Depth() > b->Depth()) a = a->Parent();
    while (b->Depth() > a->Depth()) b = b->Parent();
    int32 common = a->Depth();
    for (; a != b && a->Depth() > 0; a = a->Parent(), b = b->Parent())
        if (!SameName(a->Name(), b->Name(), ignoreCase)) common = a->Depth() - 1;
    return a == b ? common : -1;
}

// Where a base comes in the order of paths.
int BaseRank(const PathItemElement* element) {
    const PathItemElement* base = element->Base();
    constexpr PathRef::PathBase kOrder[] = {PathRef::kUNC, PathRef::kAbsolute, PathRef::kRelative, PathRef::kNullPath};
    int rank = 0;
    for (PathRef::PathBase candidate : kOrder) {
        if (base == PathItemStorage::Standard(candidate)) break;
        ++rank;
    }
    return rank;
}

// The depth that an index of a name stands for; 0 when it is outside the names.
int32 DepthOfItem(int32 index, int32 count) {
    if (index < 0) index += count;
    return index >= 0 && index < count ? index + 1 : 0;
}

void ReportElementFault(PathItemElement::Fault fault, int32 parentDepth, int32 depth) {
    using Fault = PathItemElement::Fault;
    if (fault == Fault::kOwnParent)
        TESSEL_REPORT(kDebugError, 0x52CE0F31u) << "PathItemElement insane because parent is self";
    if (fault == Fault::kBaseDepth)
        TESSEL_REPORT(kDebugError, 0x52CE0F32u)
            << "PathItemElement insane because it is a base and has a non-zero count";
    if (fault == Fault::kDepth)
        TESSEL_REPORT(kDebugError, 0x52CE0F33u)
            << "PathItemElement insane because its parent has count of " << parentDepth << " but this is " << depth;
    TESSEL_REPORT(kDebugError, 0x52CE0F34u) << "mPathElement is Insane";
}

// Checks the elements from the last one up. What is wrong is reported without the lock.
bool ElementsAreSane(PathItemElement* element) {
    PathItemElement::Fault fault = PathItemElement::Fault::kNone;
    int32 depth = 0, parentDepth = 0;
    {
        PathLock lock;
        for (int32 steps = 0; element && steps < kDeepestCheck; element = element->Parent(), ++steps) {
            fault = element->Check();
            if (fault == PathItemElement::Fault::kNone) continue;
            depth = element->Depth();
            parentDepth = element->Parent() ? element->Parent()->Depth() : 0;
            break;
        }
    }
    if (fault != PathItemElement::Fault::kNone) {
        ReportElementFault(fault, parentDepth, depth);
        return false;
    }
    if (element)
        TESSEL_REPORT(kDebugWarning, 0x52CE0F35u) << "Stopped sanity check because of very deep path. This could "
                                                     "represent a recursive linkage of the elements.";
    return true;
}

}  // namespace

// ---- construction and assignment ------------------------------------------------------------------------------------

PathRef::PathRef(PathBase base) {
    if (base >= kAbsolute && base <= kNullPath) Assign(PathItemStorage::Standard(base));
}

PathRef::PathRef(const PathRef* other) {
    if (other) Assign(other->mPathElement);
}

PathRef::PathRef(const PathRef& other) noexcept {
    Assign(other.mPathElement);
}

PathRef::PathRef(PathRef&& other) noexcept
    : mPathElement(std::exchange(other.mPathElement, nullptr)), textCache_(std::exchange(other.textCache_, nullptr)) {
}

PathRef& PathRef::operator=(const PathRef& other) {
    if (this != &other) Assign(other.mPathElement);
    return *this;
}

PathRef& PathRef::operator=(const PathRef* other) {
    Assign(other ? other->mPathElement : nullptr);
    return *this;
}

PathRef& PathRef::operator=(PathRef&& other) noexcept {
    if (this != &other) TakeOver(std::exchange(other.mPathElement, nullptr));
    return *this;
}

PathRef::~PathRef() {
    if (mPathElement) mPathElement->Release();
    if (!textCache_) return;
    textCache_->~StringType();
    TrackedFree(textCache_);
}

PathRef::PathRef(const char* standardLocationName) {
    PathItemElement* element = standardLocationName ? PathItemStorage::FindLocation(standardLocationName) : nullptr;
    if (!element) TESSEL_THROW(kArgErr, "Unknown standardLocationName");
    TakeOver(element);
}

MgErr PathRef::AssignToName(const char* name) const {
    if (!name || !mPathElement) return kArgErr;
    return Guarded([&] { return PathItemStorage::AddLocation(name, mPathElement); });
}

MgErr PathRef::ConvertToPath(Path* path) const {
    if (!path) return kArgErr;
    if (*path)
        **path = *this;
    else
        *path = new (std::nothrow) PathRef(*this);
    return *path ? kNoErr : kMemFullErr;
}

void PathRef::DisposePath(Path& path) {
    delete path;
    path = nullptr;
}

void* PathRef::operator new(size_t size) {
    void* address = TrackedNew(size);
    TrackPathObject(__builtin_frame_address(0), address, size);
    return address;
}

void* PathRef::operator new(size_t size, const std::nothrow_t&) noexcept {
    void* address = TrackedNewNoThrow(size);
    if (address) TrackPathObject(__builtin_frame_address(0), address, size);
    return address;
}

void PathRef::operator delete(void* address) noexcept {
    if (address) UntrackPathObject(address);
    TrackedFree(address);
}

void PathRef::operator delete(void* address, const std::nothrow_t&) noexcept {
    PathRef::operator delete(address);
}

// The new element is retained before the old one is released: they may be the same.
void PathRef::Assign(PathItemElement* element) {
    if (element) element->Retain();
    TakeOver(element);
}

void PathRef::TakeOver(PathItemElement* element) noexcept {
    if (PathItemElement* previous = std::exchange(mPathElement, element)) previous->Release();
    if (DebugModeEnabled()) Guarded([&] { return ConvertToString(&TextCache(), StringDisplay()); });
}

PathRef::StringType& PathRef::TextCache() {
    if (!textCache_) textCache_ = ::new (TrackedNew(sizeof(StringType))) StringType;
    return *textCache_;
}

uint32 PathRef::MemorySize() {
    return sizeof(PathRef);
}

// ---- names ----------------------------------------------------------------------------------------------------------

int32 PathRef::ItemCount() const {
    return mPathElement ? mPathElement->Depth() : 0;
}

const PathRef::StringType& PathRef::ItemAt(int32 index) const {
    const int32 depth = DepthOfItem(index, ItemCount());
    if (depth == 0) TESSEL_THROW(kArgErr, "PathRef ItemAt, invalid index");
    return mPathElement->AtDepth(depth)->Name();
}

MgErr PathRef::CopyItemAt(int32 index, StringType* name) const {
    const int32 depth = DepthOfItem(index, ItemCount());
    if (depth == 0 || !name) return kArgErr;
    return StringUtils::AssignNoThrow(name, mPathElement->AtDepth(depth)->Name());
}

const PathRef::StringType& PathRef::Name() {
    StringType& text = TextCache();
    text = ItemCount() > 0 ? mPathElement->Name() : StringUtils::EmptyNarrowString();
    return text;
}

PathRef& PathRef::Append(const StringType& name) {
    if (name.empty() || name == "..") return AppendUpDir();
    if (!mPathElement || IsNullPathBase(mPathElement)) TESSEL_THROW(kArgErr, "Append(PathRef::StringType)");
    if (name == ".") return *this;
    PathItemElement* child = mPathElement->Child(name);
    if (!child) TESSEL_THROW(kMemFullErr, "Append(PathRef::StringType)");
    TakeOver(child);
    return *this;
}

PathRef& PathRef::Append(const char* name) {
    return Append(StringType(name ? name : ""));
}

PathRef& PathRef::AppendUpDir() {
    if (!mPathElement || IsNullPathBase(mPathElement)) TESSEL_THROW(kArgErr, "Append(PathRef::StringType)");
    if (mPathElement->Parent() && !mPathElement->IsUpDir()) {
        Assign(mPathElement->Parent());
        return *this;
    }
    PathItemElement* upDir = mPathElement->Child(StringType());
    if (!upDir) TESSEL_THROW(kMemFullErr, "Append(PathRef::StringType)");
    TakeOver(upDir);
    return *this;
}

PathRef& PathRef::Append(const PathRef& relativePath) {
    if (!relativePath.mPathElement || IsNullPathBase(relativePath.mPathElement))
        TESSEL_THROW(kArgErr, "Append(relativePath): NULL or NotAPath cannot be used");
    if (!relativePath.IsSane(true)) TESSEL_THROW(kCorruptErr, "Append(relativePath): Corrupt relative Path");
    if (!relativePath.StartsWith(kRelative))
        TESSEL_THROW(kArgErr, "Append(relativePath): Must be appending a relative path");
    const PathItemList names(relativePath.mPathElement);
    PathRef result(*this);
    for (int32 i = 0; i < names.Count(); ++i) result.Append(names[i].Name());
    return *this = std::move(result);
}

void PathRef::Replace(int32 index, const StringType& name) {
    const int32 depth = DepthOfItem(index, ItemCount());
    if (depth == 0) TESSEL_THROW(kArgErr, "PathRef replace, invalid element index (element)");
    if (!IsSane(true)) TESSEL_THROW(kCorruptErr, "PathRef replace, Corrupt Path");
    const PathItemList names(mPathElement);
    PathRef result = PathRefAccess::Share(mPathElement->AtDepth(depth - 1));
    result.Append(name);
    PathRefAccess::AppendNames(result, names, depth, "PathRef replace, unable to allocate child");
    *this = std::move(result);
}

void PathRef::Replace(int32 index, const char* name) {
    if (!name) TESSEL_THROW(kArgErr, "PathRef replace, NULL parameter");
    Replace(index, StringType(name));
}

void PathRefAccess::AppendNames(PathRef& path, const PathItemList& names, int32 first, const char* detail) {
    for (int32 i = first; i < names.Count(); ++i) {
        if (names[i].IsUpDir()) {
            path.AppendUpDir();
            continue;
        }
        PathItemElement* child = path.mPathElement->Child(names[i].Name());
        if (!child) TESSEL_THROW(kMemFullErr, detail);
        path.TakeOver(child);
    }
}

// ---- names by themselves --------------------------------------------------------------------------------------------

bool IgnoresCase(PathRef::ComparePolicy policy) {
    switch (policy) {
        case PathRef::kExact:
            return false;
        case PathRef::kIgnoreCase:
        case PathRef::kIgnoreCase2:
        case PathRef::kIgnoreCase3:
            return true;
    }
    TESSEL_REPORT(kDebugWarning, 0x0B6F37D2u) << "Unexpected PathRef::ComparePolicy";
    return true;
}

bool SameName(const std::string& a, const std::string& b, bool ignoreCase) {
    return ignoreCase ? StringUtils::CaseInsensitiveEqual(a, b) : a == b;
}

bool PathRef::NameEquals(const StringType& a, const StringType& b, ComparePolicy policy) {
    return SameName(a, b, IgnoresCase(policy));
}

int32 PathRef::NameCompare(const StringType& a, const StringType& b, ComparePolicy policy) {
    if (IgnoresCase(policy)) return StringUtils::CaseInsensitiveCompare(a, b);
    const int order = a.compare(b);
    return (order > 0) - (order < 0);
}

// ---- relations ------------------------------------------------------------------------------------------------------

PathRef PathRef::GetParentDirectory() const {
    return ItemCount() > 0 ? PathRefAccess::Share(mPathElement->Parent()) : PathRef();
}

PathRef PathRef::Volume() const {
    if (ItemCount() == 0) TESSEL_THROW(kArgErr, "PathRef::Volume: Unable to get volume path");
    return PathRefAccess::Share(mPathElement->AtDepth(1));
}

bool PathRef::StartsWith(PathBase base) const {
    if (!mPathElement) return base == kNotAPath;
    return base >= kAbsolute && base <= kNullPath && mPathElement->Base() == PathItemStorage::Standard(base);
}

bool PathRef::StartsWith(const PathRef& start, ComparePolicy policy) const {
    if (!mPathElement || !start.mPathElement) return mPathElement == start.mPathElement;
    return CommonCount(mPathElement, start.mPathElement, IgnoresCase(policy)) == start.ItemCount();
}

bool PathRef::IsParentDirectoryOf(const PathRef& other, ComparePolicy policy) const {
    return mPathElement && other.ItemCount() > ItemCount() && other.StartsWith(*this, policy);
}

int32 PathRef::CountUpDir() const {
    const PathItemList names(mPathElement);
    int32 count = 0;
    for (int32 i = 0; i < names.Count(); ++i) {
        if (!names[i].IsUpDir()) continue;
        if (i > 0 && !names[i - 1].IsUpDir()) {
            TESSEL_REPORT(kDebugError, 0x6A95C20Fu) << "There are not supposed to be 'up dirs' in the middle of paths";
            count = 0;
        }
        ++count;
    }
    return count;
}

PathRef PathRef::GetInCommonWith(const PathRef& other, ComparePolicy policy) const {
    if (!mPathElement || !other.mPathElement) return PathRef();
    const int32 common = CommonCount(mPathElement, other.mPathElement, IgnoresCase(policy));
    return common < 0 ? PathRef() : PathRefAccess::Share(mPathElement->AtDepth(common));
}

PathRef PathRef::GetRelativePathFromThisToThat(const PathRef& that, ComparePolicy policy) const {
    if (!mPathElement) TESSEL_THROW(kArgErr, "PathRef GetRelativePathFromThisToThat: this is NotAPath");
    if (!that.mPathElement) TESSEL_THROW(kArgErr, "PathRef GetRelativePathFromThisToThat: that is NotAPath");
    if (!IsSane(true) || !that.IsSane(true)) TESSEL_THROW(kCorruptErr, "PathRef GetRelativePathFromThisToThat");
    const int32 common = CommonCount(mPathElement, that.mPathElement, IgnoresCase(policy));
    if (common < 0) return PathRef();
    PathRef result(kRelative);
    for (int32 i = common; i < ItemCount(); ++i) result.AppendUpDir();
    PathRefAccess::AppendNames(result, PathItemList(that.mPathElement), common,
                               "PathRef GetRelativePathFromThisToThat");
    return result;
}

bool PathRef::Rebase(const PathRef& from, const PathRef& to, ComparePolicy policy) {
    if (ItemCount() == 0 || from.ItemCount() == 0 || to.ItemCount() == 0) return false;
    if (!IsSane(true) || !from.IsSane(true) || !to.IsSane(true)) TESSEL_THROW(kCorruptErr, "Rebase: Corrupt Path");
    if (!StartsWith(from, policy)) return false;
    PathRef result(to);
    PathRefAccess::AppendNames(result, PathItemList(mPathElement), from.ItemCount(), "Rebase: Corrupt Path");
    *this = std::move(result);
    return true;
}

// ---- splitting ------------------------------------------------------------------------------------------------------

PathRef::SplitCriteria::~SplitCriteria() = default;

bool PathRef::SplitOn(const SplitCriteria& criteria, PathRef* head, PathRef* tail, SplitDirection direction) const {
    if (!IsSane(true)) TESSEL_THROW(kCorruptErr, "PathRef SplitPathOn, invalid index");
    const PathRef whole(*this);  // head or tail may be this path
    const PathItemList names(mPathElement);
    int32 action = SplitCriteria::kContinue;
    int32 index = 0;
    for (int32 step = 0; step < names.Count() && action == SplitCriteria::kContinue; ++step) {
        index = direction == kFromFirst ? step : names.Count() - 1 - step;
        action = criteria.Decide(whole, step, names[index].Name());
    }
    PathRef first, second;
    if (action != SplitCriteria::kContinue) {
        if (action < SplitCriteria::kDropName || action > SplitCriteria::kNameStartsTail)
            TESSEL_REPORT(kDebugWarning, 0xD8342B61u) << "Illegal action";
        const int32 headCount = action == SplitCriteria::kNameEndsHead ? index + 1 : index;
        const int32 tailStart = action == SplitCriteria::kNameStartsTail ? index : index + 1;
        first = PathRefAccess::Share(whole.mPathElement->AtDepth(headCount));
        second = PathRef(kRelative);
        PathRefAccess::AppendNames(second, names, tailStart, "PathRef SplitPathOn, invalid index");
    }
    if (head) *head = std::move(first);
    if (tail) *tail = std::move(second);
    return action != SplitCriteria::kContinue;
}

// ---- comparison -----------------------------------------------------------------------------------------------------

bool PathRef::Equals(const PathRef& other, ComparePolicy policy) const {
    const bool ignoreCase = IgnoresCase(policy);
    const PathItemElement* a = mPathElement;
    const PathItemElement* b = other.mPathElement;
    if (a == b) return true;
    if (!a || !b || a->Depth() != b->Depth()) return false;
    for (; a != b; a = a->Parent(), b = b->Parent())
        if (a->Depth() == 0 || !SameName(a->Name(), b->Name(), ignoreCase)) return false;
    return true;
}

int32 PathRef::Compare(const PathRef& other, ComparePolicy policy) const {
    const PathItemElement* a = mPathElement;
    const PathItemElement* b = other.mPathElement;
    if (a == b) return 0;
    if (!a || !b) return a ? -1 : 1;
    const int32 common = CommonCount(a, b, IgnoresCase(policy));
    if (common < 0) {
        const bool ordered = policy == kExact || policy == kIgnoreCase3;
        return !ordered || BaseRank(a) < BaseRank(b) ? -1 : 1;
    }
    if (a->Depth() == 0 || b->Depth() == 0) return a->Depth() - b->Depth();
    if (a->Depth() == common && b->Depth() == common) return 0;
    if (a->Depth() == common) return -(common + 1);
    if (b->Depth() == common) return common + 1;
    const int32 order = NameCompare(a->AtDepth(common + 1)->Name(), b->AtDepth(common + 1)->Name(), policy);
    return order < 0 ? -(common + 1) : common + 1;
}

// ---- checks ---------------------------------------------------------------------------------------------------------

bool PathRef::IsValid() const {
    if (!mPathElement || !mPathElement->InUse()) return false;
    const PathItemElement* base = mPathElement->Base();
    if (base == PathItemStorage::Standard(kAbsolute) || base == PathItemStorage::Standard(kRelative)) return true;
    if (base == PathItemStorage::Standard(kUNC)) return mPathElement->Depth() > 0;
    if (base != PathItemStorage::Standard(kNullPath))
        TESSEL_REPORT(kDebugError, 0xE91D5A48u) << "Need to add sanity checking for other types";
    return false;
}

bool PathRef::IsSane(bool quick) const {
    if (!mPathElement) return true;
    if (!PathItemStorage::Owns(mPathElement)) {
        TESSEL_REPORT(kDebugError, 0x52CE0F36u) << "mPathElement not in storage";
        return false;
    }
    if (quick) return true;
    if (!ElementsAreSane(mPathElement)) return false;
    if (IsValid()) return true;
    TESSEL_REPORT(kDebugError, 0x52CE0F37u) << "PathRef is not valid";
    return false;
}

// ---- in reports -----------------------------------------------------------------------------------------------------

void ToDebugStream(DebugStream& stream, const PathRef& path) {
    const bool shown = GuardedOr(false, [&] {
        std::string text;
        path.ConvertToString(&text, PathRef::StringDisplay());
        ToDebugStream(stream, std::string_view(text));
        return true;
    });
    if (!shown) stream.Append("<path too long>");
}

void ToDebugStream(DebugStream& stream, PathRef* path) {
    if (path)
        ToDebugStream(stream, *path);
    else
        stream.Append("NULL");
}

}  // namespace tessel
