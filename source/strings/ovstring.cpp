// OVString and the views that edit a text where it lies.
#include "diagnostics/Guarded.h"
#include "platform/CodePage.h"
#include "strings/ByteOps.h"
#include "strings/CPStrWalk.h"
#include "strings/HandleOps.h"
#include "strings/LStrView.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringPStr.h>
#include <tessel/strings/ovstring.h>

#include <algorithm>
#include <cstring>
#include <string_view>
#include <vector>

namespace tessel {
namespace {

// Storage kinds.
enum : int32 {
    kText = 1,
    kText2 = 2,
    kText3 = 3,
    kPStrBuffer = 4,
    kCStrBuffer = 5,
    kConstLStr = 7,
    kLStrHandle = 10,
    kListElement = 11,
    kTemporary = 12,
};

constexpr int32 kMaxTerminatedPStr = 254;

int32 LengthOf(CStr text) {
    return text ? static_cast<int32>(std::strlen(text)) : 0;
}

bool IsEditable(int32 storageClass) {
    return storageClass == kPStrBuffer || storageClass == kCStrBuffer ||
           (storageClass >= kLStrHandle && storageClass <= kTemporary);
}

bool IsTrimmed(uint8 byte) {
    return byte == ' ' || byte == '\t' || byte == '\r' || byte == '\n';
}

// Brings an LStr handle to n bytes of text; n of 0 releases it.
MgErr ResizeOrRelease(LStrHandle* handle, int32 n) {
    if (n == 0) return DSDisposeHandleAndNull(AsHandlePtr(handle));
    const auto count = static_cast<uint32>(n);
    return *handle ? ResizeLStr(*handle, count, true) : MakeLStr(handle, count);
}

std::string_view CharactersOf(const uint8* bytes, int32 length) {
    return {reinterpret_cast<const char*>(bytes), static_cast<size_t>(length)};
}

// Looks for a pattern in bytes that come one after the other (Knuth, Morris, Pratt).
class PatternMatcher {
public:
    explicit PatternMatcher(std::string_view pattern) : pattern_(pattern), border_(pattern.size() + 1) {
        for (size_t i = 1; i < pattern.size(); ++i) {
            Take(pattern[i]);
            border_[i + 1] = matched_;
        }
        matched_ = 0;
    }

    // Whether the pattern ends with this byte.
    bool Take(char byte) {
        while (matched_ != 0 && (matched_ == pattern_.size() || pattern_[matched_] != byte))
            matched_ = border_[matched_];
        if (pattern_[matched_] == byte) ++matched_;
        return matched_ == pattern_.size();
    }

    // Goes on behind this text.
    void Restart(std::string_view text) {
        matched_ = 0;
        for (const char byte : text.substr(text.size() - std::min(text.size(), pattern_.size() - 1))) Take(byte);
    }

private:
    std::string_view pattern_;
    std::vector<size_t> border_;  // how long a beginning of the pattern its first i bytes end with
    size_t matched_ = 0;
};

// Each occurrence that ends with a byte of the text is taken off the result and the replacement is put there.
int32 ReplaceEvery(std::string_view text, std::string_view find, std::string_view replacement, std::string& result) {
    PatternMatcher matcher(find);
    int32 found = 0;
    for (const char byte : text) {
        result += byte;
        if (!matcher.Take(byte)) continue;
        ++found;
        result.resize(result.size() - find.size());
        matcher.Restart(result);
        result += replacement;
        for (const char inserted : replacement) matcher.Take(inserted);
    }
    return found;
}

std::string NarrowText(const char16_t* text, int32 length) {
    std::string narrow;
    const size_t units = length < 1 ? BSTRLength(text) : static_cast<size_t>(length);
    if (text) platform::FromUtf16({text, units}, narrow);
    return narrow;
}

}  // namespace

// ---- OVString -------------------------------------------------------------------------------------------------------

int32 OVString::Length() const {
    return static_cast<int32>(LStrView(LHandle()).length);
}

const uint8* OVString::Bytes() const {
    return LStrView(LHandle()).bytes;
}

MgErr OVString::Resize(int32 n) {
    return OVSubString(this).Resize(n);
}

MgErr OVString::Assign(const void* bytes, int32 n) {
    return OVSubString(this).Assign(bytes, n);
}

void OVString::CopyToCStr(char* buffer, int32 size) const {
    OVSubString(*this).CopyToCStr(buffer, size);
}

void OVString::CopyToPStr(PStr buffer) const {
    OVSubString(*this).CopyToPStr(buffer);
}

MgErr OVString::CopyToNarrowString(std::string& out) const {
    return OVSubString(*this).CopyToNarrowString(out);
}

// ---- making a view --------------------------------------------------------------------------------------------------

OVSubString::OVSubString(const void* bytes, int32 length, int32 storageClass)
    : bytes_(static_cast<uint8*>(const_cast<void*>(bytes))),
      length_(bytes ? std::max(length, 0) : 0),
      m_class(storageClass),
      element_{nullptr, 0} {
}

OVSubString::OVSubString(CStr text) : OVSubString(text, LengthOf(text), kText) {
}

OVSubString::OVSubString(const void* bytes, int32 length) : OVSubString(bytes, length, kText) {
}

OVSubString::OVSubString(const OVString& string) : OVSubString(string.Bytes(), string.Length(), kText) {
}

OVSubString::OVSubString(LStrHandle handle)
    : OVSubString(LStrView(handle).bytes, static_cast<int32>(LStrView(handle).length), kText) {
}

OVSubString::OVSubString(const LStr* text)
    : OVSubString(LStrView(text).bytes, static_cast<int32>(LStrView(text).length), kConstLStr) {
}

OVSubString::OVSubString(int32 capacity, char* buffer) : OVSubString(buffer, 0, kCStrBuffer) {
    capacity_ = buffer ? std::max(capacity, 0) : 0;
    if (capacity_ == 0) return;
    const void* terminator = std::memchr(buffer, 0, static_cast<size_t>(capacity_));
    length_ = terminator ? static_cast<int32>(static_cast<CStr>(terminator) - buffer) : capacity_ - 1;
    buffer[length_] = 0;
}

OVSubString::OVSubString(int32 capacity, char* buffer, int32 length) : OVSubString(buffer, 0, kCStrBuffer) {
    capacity_ = buffer ? std::max(capacity, 0) : 0;
    if (capacity_ == 0) return;
    length_ = std::clamp(length, 0, capacity_ - 1);
    buffer[length_] = 0;
}

OVSubString::OVSubString(OVString* string) : OVSubString(string->Bytes(), string->Length(), kLStrHandle) {
    handle_ = reinterpret_cast<LStrHandle*>(&string->OVHandle::handle_);
}

OVSubString::OVSubString(LStrHandle* handle)
    : OVSubString(LStrView(*handle).bytes, static_cast<int32>(LStrView(*handle).length), kLStrHandle) {
    handle_ = handle;
}

OVSubString::OVSubString(CPStrHandle list, int32 index) : OVSubString(nullptr, 0, kListElement) {
    const int32 count = list ? ElementCount(*list) : 0;
    if (count == 0) return;
    element_ = {list, std::clamp(index, 0, count - 1)};
    PStr element = CPStrIndex(list, index);
    bytes_ = element + 1;
    length_ = element[0];
}

OVSubString OVSubString::OnPStr(PStr buffer) {
    OVSubString view(buffer ? buffer + 1 : nullptr, buffer ? buffer[0] : 0, kPStrBuffer);
    view.pstr_ = buffer;
    if (buffer) PStrTerminateIfPossible(buffer);
    return view;
}

OVTempString::OVTempString() : OVSubString(record_.room, 0, kTemporary) {
    temp_ = &record_;
}

// ---- resizing -------------------------------------------------------------------------------------------------------

MgErr OVSubString::Resize(int32 n) {
    if (n < 0) return kArgErr;
    switch (m_class) {
        case kText:
        case kText2:
        case kText3:
        case kConstLStr:
            return kArgErr;
        case kPStrBuffer:
            return ResizePStr(n);
        case kCStrBuffer:
            return ResizeBuffer(n);
        case kLStrHandle:
            return ResizeHandle(n);
        case kListElement:
            return ResizeElement(n);
        case kTemporary:
            return ResizeTemp(n);
        default:
            TESSEL_REPORT(kDebugWarning, 0x3B608FD4u) << "OVSubString::Resize: Unknown m_class (" << m_class << ")";
            return kNoErr;
    }
}

// Makes the view's text the first bytes of the storage, which starts there.
void OVSubString::MoveToStart(uint8* start) {
    if (skipped_ != 0) std::memmove(start, start + skipped_, static_cast<size_t>(length_));
    skipped_ = 0;
    bytes_ = start;
}

MgErr OVSubString::ResizePStr(int32 n) {
    if (n > kMaxTerminatedPStr || !pstr_) return kArgErr;
    MoveToStart(pstr_ + 1);
    pstr_[0] = static_cast<uint8>(n);
    bytes_[n] = 0;
    length_ = n;
    return kNoErr;
}

MgErr OVSubString::ResizeBuffer(int32 n) {
    if (n >= capacity_) return kArgErr;
    MoveToStart(bytes_ - skipped_);
    bytes_[n] = 0;
    length_ = n;
    return kNoErr;
}

// What grows grows first, and what shrinks shrinks last: a failure leaves the text as it was.
MgErr OVSubString::ResizeHandle(int32 n) {
    const auto stored = static_cast<int32>(LStrView(*handle_).length);
    if (n < stored) MoveToStart((**handle_)->bytes);
    if (MgErr err = ResizeOrRelease(handle_, n)) return err;
    if (*handle_) {
        MoveToStart((**handle_)->bytes);
    } else {
        bytes_ = nullptr;
    }
    length_ = n;
    return kNoErr;
}

MgErr OVSubString::ResizeElement(int32 n) {
    CPStrHandle list = element_.list;
    if (static_cast<uint32>(n) > kMaxPStr || !list || element_.index >= ElementCount(*list)) return kArgErr;
    PStr element = CPStrIndex(list, element_.index);
    const uint8 stored = element[0];
    if (n < stored) MoveToStart(element + 1);
    const auto offset = static_cast<uint32>(element + 1 - *AsHandle(list));
    const HandleRange text = {CPStrSize(*list), offset, stored};
    if (MgErr err = ResizeRange(AsHandle(list), text, static_cast<uint32>(n), true)) return err;
    MoveToStart(*AsHandle(list) + offset);
    bytes_[-1] = static_cast<uint8>(n);
    length_ = n;
    return kNoErr;
}

MgErr OVSubString::ResizeTemp(int32 n) {
    uint8* room = temp_->room;
    OVString& overflow = temp_->overflow;
    const bool wasInHandle = temp_->inHandle != 0;
    if (n < static_cast<int32>(sizeof temp_->room)) {
        if (wasInHandle) {
            std::memcpy(room, bytes_, static_cast<size_t>(std::min(n, length_)));
            overflow.Resize(0);
            skipped_ = 0;
        }
        temp_->inHandle = false;
        MoveToStart(room);
        length_ = n;
        return kNoErr;
    }
    if (wasInHandle && n < overflow.Length()) MoveToStart((*overflow.LHandle())->bytes);
    if (MgErr err = overflow.Resize(n)) return err;
    uint8* start = (*overflow.LHandle())->bytes;
    if (!wasInHandle) {
        std::memcpy(start, bytes_, static_cast<size_t>(length_));
        skipped_ = 0;
    }
    temp_->inHandle = true;
    MoveToStart(start);
    length_ = n;
    return kNoErr;
}

// ---- editing --------------------------------------------------------------------------------------------------------

MgErr OVSubString::Replace(const void* source, int32 length, int32 at, int32 count) {
    if (at < 0 || at > length_) at = length_;
    length = std::max(length, 0);
    if (count < 0 || count > length_ - at) {
        TESSEL_REPORT(kDebugError, 0x92D7E6A0u) << "BadParams";
        TESSEL_REPORT(kDebugInfo, 0x45FC138Bu)
            << "Bad Params:at:" << at << "\tdstLen:" << count << "\tSize:" << length_ << " \n";
        return kArgErr;
    }
    if (m_class == kText) {
        TESSEL_REPORT(kDebugInfo, 0xDE2049B6u) << "Can't Change Fixed Strings!";
        return kArgErr;
    }
    return WithoutOverlap(source, length, [&](const void* bytes) { return ReplaceRange(bytes, length, at, count); });
}

// Whether bytes lie in what an edit may move: the view, the block of its handle, or the whole list of its element.
bool OVSubString::IsInStorage(const void* bytes, int32 length) const {
    auto start = reinterpret_cast<uintptr_t>(bytes_) - static_cast<uint32>(skipped_);
    auto end = reinterpret_cast<uintptr_t>(bytes_) + static_cast<uint32>(length_);
    if (m_class == kLStrHandle && *handle_) {
        start = reinterpret_cast<uintptr_t>(**handle_);
        end = start + LStrSize(LStrView(*handle_).length);
    } else if (m_class == kListElement && element_.list) {
        start = reinterpret_cast<uintptr_t>(*element_.list);
        end = start + CPStrSize(*element_.list);
    }
    const auto at = reinterpret_cast<uintptr_t>(bytes);
    return at < end && at + static_cast<uint32>(length) > start;
}

// Runs an edit with the source, or with a copy of it when the edit may move it.
template <class Edit>
MgErr OVSubString::WithoutOverlap(const void* source, int32 length, Edit edit) {
    if (!source || length <= 0 || !IsInStorage(source, length)) return edit(source);
    return Guarded([&] {
        const std::string copy(static_cast<const char*>(source), static_cast<size_t>(length));
        return edit(copy.data());
    });
}

MgErr OVSubString::ReplaceRange(const void* source, int32 length, int32 at, int32 count) {
    if (length - count > INT32_MAX - length_) return kArgErr;
    const int32 newLength = length_ - count + length;
    const auto rest = static_cast<size_t>(length_ - at - count);
    if (length > count || !IsEditable(m_class)) {
        if (MgErr err = Resize(newLength)) return err;
        if (!IsEditable(m_class)) return kArgErr;
    }
    if (!bytes_ && newLength != 0) {
        TESSEL_REPORT(kDebugError, 0x1A85C7F3u) << "This shouldn't happen";
        return kArgErr;
    }
    if (rest != 0) std::memmove(bytes_ + at + length, bytes_ + at + count, rest);
    if (length < count) {
        if (MgErr err = Resize(newLength)) return err;
    }
    if (source && length > 0) std::memcpy(bytes_ + at, source, static_cast<size_t>(length));
    return kNoErr;
}

MgErr OVSubString::Assign(const void* bytes, int32 n) {
    return WithoutOverlap(bytes, std::max(n, 0), [&](const void* source) {
        const MgErr err = Resize(n);
        if (!err && source && n > 0 && length_ == n) std::memcpy(bytes_, source, static_cast<size_t>(n));
        return err;
    });
}

MgErr OVSubString::Assign(const LStr* text) {
    return Assign(OVSubString(text));
}

MgErr OVSubString::Assign(LStrHandle text) {
    return Assign(OVSubString(text));
}

MgErr OVSubString::Assign(const OVString& text) {
    return Assign(OVSubString(text));
}

MgErr OVSubString::Assign(const OVSubString& text) {
    return Assign(text.bytes_, text.length_);
}

MgErr OVSubString::AssignCStr(CStr text) {
    return Assign(text, LengthOf(text));
}

MgErr OVSubString::AssignPStr(ConstPStr text) {
    return text ? Assign(text + 1, text[0]) : Assign(nullptr, 0);
}

MgErr OVSubString::AssignBSTR(const char16_t* text, int32 length) {
    return Guarded([&] {
        const std::string narrow = NarrowText(text, length);
        return Assign(narrow.data(), static_cast<int32>(narrow.size()));
    });
}

MgErr OVSubString::Replace(const OVSubString& source, int32 at, int32 count) {
    return Replace(source.bytes_, source.length_, at, count);
}

MgErr OVSubString::ReplaceCStr(CStr source, int32 at, int32 count) {
    return Replace(source, LengthOf(source), at, count);
}

MgErr OVSubString::ReplaceBSTR(const char16_t* source, int32 length, int32 at, int32 count) {
    return Guarded([&] {
        const std::string narrow = NarrowText(source, length);
        return Replace(narrow.data(), static_cast<int32>(narrow.size()), at, count);
    });
}

MgErr OVSubString::Insert(const void* source, int32 length, int32 at) {
    return Replace(source, length, at, 0);
}

MgErr OVSubString::Insert(const OVSubString& source, int32 at) {
    return Replace(source, at, 0);
}

MgErr OVSubString::InsertCStr(CStr source, int32 at) {
    return ReplaceCStr(source, at, 0);
}

MgErr OVSubString::Append(const void* source, int32 length) {
    return Replace(source, length, length_, 0);
}

MgErr OVSubString::Append(const OVSubString& source) {
    return Replace(source, length_, 0);
}

MgErr OVSubString::AppendCStr(CStr source) {
    return ReplaceCStr(source, length_, 0);
}

MgErr OVSubString::AppendBSTR(const char16_t* source, int32 length) {
    return ReplaceBSTR(source, length, length_, 0);
}

MgErr OVSubString::SearchReplace(const OVSubString& find, const OVSubString& replacement, int32* count) {
    int32 found = 0;
    const MgErr err = Search(find, 0) < 0 ? kNoErr : Guarded([&] {
        std::string result;
        found = ReplaceEvery(CharactersOf(bytes_, length_), CharactersOf(find.bytes_, find.length_),
                             CharactersOf(replacement.bytes_, replacement.length_), result);
        if (result.size() > INT32_MAX) return kArgErr;
        return Replace(result.data(), static_cast<int32>(result.size()), 0, length_);
    });
    if (count) *count = err ? 0 : found;
    return err;
}

void OVSubString::TrimWhitespace() {
    while (length_ > 0 && IsTrimmed(bytes_[0])) {
        ++bytes_;
        ++skipped_;
        --length_;
    }
    while (length_ > 0 && IsTrimmed(bytes_[length_ - 1])) --length_;
}

// ---- comparing and searching ----------------------------------------------------------------------------------------

int32 OVSubString::Compare(const void* bytes, int32 length) const {
    if (length_ == 0) return length > 0 ? -1 : 0;
    if (length <= 0) return 1;
    return CompareBytes(bytes_, static_cast<size_t>(length_), static_cast<const uint8*>(bytes),
                        static_cast<size_t>(length));
}

int32 OVSubString::CompareNC(const void* bytes, int32 length) const {
    if (length_ == 0) return length > 0 ? -1 : 0;
    if (length <= 0) return 1;
    return CompareBytesNoCase(bytes_, static_cast<size_t>(length_), static_cast<const uint8*>(bytes),
                              static_cast<size_t>(length));
}

int32 OVSubString::Compare(const OVSubString& text) const {
    return Compare(text.bytes_, text.length_);
}

int32 OVSubString::CompareCStr(CStr text) const {
    return Compare(text, LengthOf(text));
}

int32 OVSubString::CompareNC(const OVSubString& text) const {
    return CompareNC(text.bytes_, text.length_);
}

int32 OVSubString::CompareNCCStr(CStr text) const {
    return CompareNC(text, LengthOf(text));
}

int32 OVSubString::FindFirstOf(const void* set, int32 length, int32 start) const {
    if (!set || length <= 0) return -1;
    for (int32 at = std::max(start, 0); at < length_; ++at) {
        if (std::memchr(set, bytes_[at], static_cast<size_t>(length))) return at;
    }
    return -1;
}

int32 OVSubString::FindFirstOf(const OVSubString& set, int32 start) const {
    return FindFirstOf(set.bytes_, set.length_, start);
}

int32 OVSubString::FindFirstOfCStr(CStr set, int32 start) const {
    return FindFirstOf(set, LengthOf(set), start);
}

int32 OVSubString::Search(const OVSubString& pattern, int32 start) const {
    if (pattern.length_ == 0 || length_ == 0) return -1;
    const std::string_view text(reinterpret_cast<const char*>(bytes_), static_cast<size_t>(length_));
    const std::string_view sought(reinterpret_cast<const char*>(pattern.bytes_), static_cast<size_t>(pattern.length_));
    const size_t at = text.find(sought, static_cast<size_t>(std::max(start, 0)));
    return at == std::string_view::npos ? -1 : static_cast<int32>(at);
}

int32 OVSubString::SearchCStr(CStr pattern, int32 start) const {
    return Search(pattern, start);
}

int32 OVSubString::SearchNC(const OVSubString& pattern, int32 start) const {
    if (pattern.length_ == 0) return -1;
    const auto n = static_cast<size_t>(pattern.length_);
    for (int32 at = std::max(start, 0); at <= length_ - pattern.length_; ++at) {
        if (FirstDifferenceNoCase(bytes_ + at, pattern.bytes_, n) == n) return at;
    }
    return -1;
}

int32 OVSubString::SearchNCCStr(CStr pattern, int32 start) const {
    return SearchNC(pattern, start);
}

// ---- copying out ----------------------------------------------------------------------------------------------------

void OVSubString::CopyToCStr(char* buffer, int32 size) const {
    if (size < 1) {
        TESSEL_REPORT(kDebugError, 0xF6093C5Eu) << "Bad Arg";
        return;
    }
    const auto n = static_cast<size_t>(std::min(length_, size - 1));
    if (n != 0) std::memmove(buffer, bytes_, n);
    buffer[n] = 0;
}

void OVSubString::CopyToPStr(PStr buffer) const {
    buffer[0] = static_cast<uint8>(std::min(length_, int32{kMaxPStr}));
    if (buffer[0] != 0) std::memmove(buffer + 1, bytes_, buffer[0]);
}

MgErr OVSubString::CopyToNarrowString(std::string& out) const {
    return Guarded([&] {
        out.assign(reinterpret_cast<const char*>(bytes_), static_cast<size_t>(length_));
        return kNoErr;
    });
}

}  // namespace tessel
