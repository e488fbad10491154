#include "config/IniDocument.h"
#include "config/IniNames.h"

#include <array>
#include <utility>

namespace tessel {

namespace {

// What a scan for the end of a line or of a name stops at.
enum : unsigned char { kEndsLine = 1, kSeparates = 2 };
constexpr auto kKinds = [] {
    std::array<unsigned char, 256> kinds{};
    kinds['\r'] = kinds['\n'] = kinds['\0'] = kEndsLine;
    kinds['='] = kinds[':'] = kSeparates;
    return kinds;
}();

// There is always one: the texts end with a zero byte.
const char* FindKind(const char* at, unsigned char kinds) {
    while (!(kKinds[static_cast<unsigned char>(*at)] & kinds)) ++at;
    return at;
}

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// Long values are split over keys "name Line1", "name Line2" ... Whether a name is one of those; the text before the
// " Line", and whether its number is 1.
bool IsContinuation(std::string_view name, std::string_view& base, bool& first) {
    constexpr std::string_view kMark = " Line";
    std::size_t digits = name.size();
    while (digits > 0 && IsDigit(name[digits - 1])) --digits;
    if (digits == name.size() || digits < kMark.size() || name.substr(digits - kMark.size(), kMark.size()) != kMark) {
        return false;
    }
    std::string_view number = name.substr(digits);
    number.remove_prefix(std::min(number.find_first_not_of('0'), number.size()));
    first = number == "1";
    base = TrimmedIni(name.substr(0, digits - kMark.size()));
    return true;
}

}  // namespace

// Fills a document that is empty.
class IniReader {
public:
    IniReader(IniDocument& document, std::string_view bytes)
        : document_(document), at_(bytes.data()), end_(at_ + bytes.size()) {}

    MgErr Read();

private:
    using Index = IniDocument::Index;
    static constexpr Index kNone = IniDocument::kNone;

    void ReadLine();
    bool TakeHeader(const char* begin, const char* end);
    bool TakeKey(const char* begin, const char* separator, const char* end);
    void Keep(const char* begin, const char* end, bool comment);
    void PassLineEnd();
    IniDocument::Lines TakePending() { return std::exchange(pending_, {}); }

    void JoinContinuations(Index section);
    // The joined key takes the place of the first of its run; what follows the run.
    Index JoinRun(Index first, std::string_view base);
    // Puts a key that is in no list at the end of its section, or its value into the key that has its name already.
    void Merge(Index key);

    IniDocument& document_;
    const char* at_;
    const char* const end_;
    int32 line_ = 0;
    Index section_ = kNone;
    IniDocument::Lines pending_;  // lines that wait for the key or section that they stand before
    bool hasContinuations_ = false;
};

// ---- lines ----------------------------------------------------------------------------------------------------------

void IniReader::PassLineEnd() {
    const char ended = *at_;
    if (at_ < end_) ++at_;
    if ((ended == '\r' && *at_ == '\n') || (ended == '\n' && *at_ == '\r')) ++at_;
}

void IniReader::Keep(const char* begin, const char* end, bool comment) {
    if (!comment && document_.firstUnparsable_ == 0) document_.firstUnparsable_ = line_;
    const Index index = static_cast<Index>(document_.lines_.size());
    document_.lines_.push_back({{begin, static_cast<std::size_t>(end - begin)}, kNone});
    document_.Append(pending_, {index, index});
}

bool IniReader::TakeHeader(const char* begin, const char* end) {
    const std::string_view line(begin + 1, static_cast<std::size_t>(end - begin - 1));
    const std::size_t close = line.find(']');
    const std::string_view name = TrimmedIni(line.substr(0, close));
    if (close == std::string_view::npos || name.empty()) return false;
    section_ = document_.FindSection(name);
    if (section_ != kNone) return true;
    document_.MakeRoom();
    section_ = document_.AddSection(name, false);
    // Without a header in the file, this one has no place of its own for comments.
    if (!IsNullSection(name)) document_.sections_[section_].comments = TakePending();
    return true;
}

bool IniReader::TakeKey(const char* begin, const char* separator, const char* end) {
    const char* from = separator + 1;
    if (*separator == ':' && *from == '=') ++from;
    const std::string_view name = TrimmedIni(begin, separator);
    std::string_view value = TrimmedIni(from, end);
    if (name.empty() || value.empty()) return false;
    const bool quoted = StripQuotes(value);
    document_.MakeRoom();
    if (section_ == kNone) section_ = document_.FindSection(kNullSection);
    if (section_ == kNone) section_ = document_.AddSection(kNullSection, false);
    const IniDocument::KeyName keyName(section_, name);
    Index index = document_.FindKey(keyName);
    if (index == kNone) index = document_.AddKey(keyName, value, line_);
    IniDocument::Key& key = document_.keys_[index];
    key.value = value;
    key.quoted = quoted;
    document_.Append(key.comments, TakePending());
    if (IsDigit(name.back()) && !hasContinuations_) {
        std::string_view base;
        bool first = false;
        hasContinuations_ = IsContinuation(name, base, first);
    }
    return true;
}

void IniReader::ReadLine() {
    ++line_;
    const char* const begin = at_;
    const char* first = begin;
    while (IsIniSpace(*first) && kKinds[static_cast<unsigned char>(*first)] == 0) ++first;
    const char* const separator = FindKind(first, kSeparates | kEndsLine);
    at_ = FindKind(separator, kEndsLine);
    const bool comment = *first == ';';
    const bool taken =
        !comment && (*first == '[' ? TakeHeader(first, at_) : separator != at_ && TakeKey(first, separator, at_));
    if (!taken) Keep(begin, at_, comment);
    PassLineEnd();
}

MgErr IniReader::Read() {
    using namespace std::string_view_literals;
    const std::string_view bytes(at_, static_cast<std::size_t>(end_ - at_));
    for (const std::string_view mark : {"\0\0\xFE\xFF"sv, "\xFF\xFE"sv, "\xFE\xFF"sv}) {
        if (bytes.substr(0, mark.size()) == mark) return kUnsupportedErr;
    }
    if (bytes.substr(0, 3) == "\xEF\xBB\xBF"sv) at_ += 3;
    // About what there will be: nothing is copied while it grows.
    document_.keys_.reserve(bytes.size() / 24);
    document_.keyTable_.MakeRoom(bytes.size() / 32);
    while (at_ < end_) ReadLine();
    document_.trailing_ = TakePending();
    if (!hasContinuations_) return kNoErr;
    for (Index at = 0; at < document_.sections_.size(); ++at) JoinContinuations(at);
    return kNoErr;
}

// ---- continued values -----------------------------------------------------------------------------------------------

IniDocument::Index IniReader::JoinRun(Index first, std::string_view base) {
    auto& keys = document_.keys_;
    std::size_t size = keys[first].value.size();
    std::string_view name;
    bool starts = false;
    Index behind = keys[first].next;
    for (; behind != kNone && IsContinuation(keys[behind].name, name, starts) && !starts; behind = keys[behind].next) {
        size += keys[behind].value.size();
    }
    char* const value = document_.texts_.Allocate(size);
    char* to = value;
    for (Index at = first; at != behind;) {
        const std::string_view part = keys[at].value;
        to = std::copy(part.begin(), part.end(), to);
        const Index next = keys[at].next;
        if (at != first) {
            document_.Append(keys[first].comments, keys[at].comments);
            keys[at].next = std::exchange(document_.unusedKeys_, at);
        }
        at = next;
    }
    keys[first].name = base;
    keys[first].value = {value, size};
    return behind;
}

void IniReader::Merge(Index key) {
    auto& keys = document_.keys_;
    const IniDocument::KeyName name = document_.NameOf(key);
    const Index there = document_.FindKey(name);
    if (there == kNone) return document_.LinkLast(key, name.hash);
    keys[there].value = keys[key].value;
    keys[there].quoted = keys[key].quoted;
    document_.Append(keys[there].comments, keys[key].comments);
    keys[key].next = std::exchange(document_.unusedKeys_, key);
}

// The keys of the section go through once more as if they had been read joined.
void IniReader::JoinContinuations(Index section) {
    auto& keys = document_.keys_;
    IniDocument::Section& joined = document_.sections_[section];
    for (Index at = joined.firstKey; at != kNone; at = keys[at].next) {
        document_.keyTable_.Erase(document_.NameOf(at).hash, at);
    }
    Index next = std::exchange(joined.firstKey, kNone);
    joined.lastKey = kNone;
    while (next != kNone) {
        const Index key = next;
        std::string_view base;
        bool starts = false;
        const bool run = IsContinuation(keys[key].name, base, starts) && starts;
        next = run ? JoinRun(key, base) : keys[key].next;
        Merge(key);
    }
}

MgErr IniDocument::Read(IniTexts&& texts, std::string_view bytes) {
    IniDocument read;
    read.texts_ = std::move(texts);
    if (const MgErr err = IniReader(read, bytes).Read()) return err;
    read.textsKept_ = read.texts_.Used();
    *this = std::move(read);
    return kNoErr;
}

}  // namespace tessel
