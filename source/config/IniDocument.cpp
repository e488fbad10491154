#include "config/IniDocument.h"

#include "config/IniNames.h"

#include <new>
#include <utility>

namespace tessel {

namespace {

constexpr std::uint32_t kSectionSeed = UINT32_MAX;

bool HoldsLineFeed(std::string_view text) {
    return text.find('\n') != std::string_view::npos;
}

}  // namespace

IniDocument::KeyName::KeyName(Index inSection, std::string_view trimmed)
    : section(inSection), text(trimmed), hash(IniNameHash(trimmed, inSection)) {
}

// ---- looking up -----------------------------------------------------------------------------------------------------

IniDocument::Index IniDocument::FindSection(std::string_view trimmed) const {
    return sectionTable_.Find(IniNameHash(trimmed, kSectionSeed),
                              [&](Index index) { return EqualIniNames(sections_[index].name, trimmed); });
}

IniDocument::Index IniDocument::FindKey(const KeyName& name) const {
    return keyTable_.Find(name.hash, [&](Index index) {
        return keys_[index].section == name.section && EqualIniNames(keys_[index].name, name.text);
    });
}

IniDocument::Index IniDocument::FindKey(std::string_view section, std::string_view key) const {
    const Index found = FindSection(TrimmedIni(section));
    return found == kNone ? kNone : FindKey({found, TrimmedIni(key)});
}

const std::string_view* IniDocument::Find(std::string_view section, std::string_view key) const {
    const Index found = FindKey(section, key);
    return found == kNone ? nullptr : &keys_[found].value;
}

int32 IniDocument::LineOf(std::string_view section, std::string_view key) const {
    const Index found = FindKey(section, key);
    return found == kNone ? 0 : keys_[found].line;
}

void IniDocument::ListSections(std::vector<std::string>& names) const {
    for (Index at = firstSection_; at != kNone; at = sections_[at].next) names.emplace_back(sections_[at].name);
}

void IniDocument::ListKeys(std::string_view section, std::vector<std::string>& names) const {
    const Index found = FindSection(TrimmedIni(section));
    if (found == kNone) return;
    for (Index at = sections_[found].firstKey; at != kNone; at = keys_[at].next) names.emplace_back(keys_[at].name);
}

// ---- changing -------------------------------------------------------------------------------------------------------

void IniDocument::MakeRoom() {
    MakeRoomInRecords(keys_);
    MakeRoomInRecords(sections_);
    keyTable_.MakeRoom(keys_.size() + 1);
    sectionTable_.MakeRoom(sections_.size() + 1);
}

// The keys without a section have no header in the file: they come first, whenever they are added.
IniDocument::Index IniDocument::AddSection(std::string_view name, bool added) {
    const Index index = static_cast<Index>(sections_.size());
    sections_.push_back({name, kNone, kNone, kNone, {}, added, added && HoldsLineFeed(name)});
    sectionTable_.Insert(IniNameHash(name, kSectionSeed), index);
    if (IsNullSection(name)) {
        sections_[index].next = firstSection_;
        firstSection_ = index;
    } else {
        (lastSection_ == kNone ? firstSection_ : sections_[lastSection_].next) = index;
    }
    if (lastSection_ == kNone || !IsNullSection(name)) lastSection_ = index;
    return index;
}

IniDocument::Index IniDocument::AddKey(const KeyName& name, std::string_view value, int32 line) {
    Index index = unusedKeys_;
    if (index == kNone) {
        index = static_cast<Index>(keys_.size());
        keys_.emplace_back();
    } else {
        unusedKeys_ = keys_[index].next;
    }
    keys_[index] = {name.text, value, name.section, kNone, {}, line, false, false};
    LinkLast(index, name.hash);
    return index;
}

void IniDocument::LinkLast(Index key, std::uint32_t hash) {
    Section& section = sections_[keys_[key].section];
    keys_[key].next = kNone;
    (section.lastKey == kNone ? section.firstKey : keys_[section.lastKey].next) = key;
    section.lastKey = key;
    keyTable_.Insert(hash, key);
}

MgErr IniDocument::Set(std::string_view section, std::string_view key, std::string_view value) {
    const std::string_view sectionName = TrimmedIni(section), keyName = TrimmedIni(key);
    if (sectionName.empty() || keyName.empty()) return kConfigTypeErr;
    std::string_view text = TrimmedIni(value);
    const bool quoted = StripQuotes(text);
    const std::string_view kept = texts_.Keep(text);
    Index inSection = FindSection(sectionName);
    Index index = inSection == kNone ? kNone : FindKey({inSection, keyName});
    if (index == kNone) {
        MakeRoom();
        const std::string_view newKey = texts_.Keep(keyName);
        if (inSection == kNone) inSection = AddSection(texts_.Keep(sectionName), true);
        index = AddKey({inSection, newKey}, kept, -1);
    }
    Key& changed = keys_[index];
    changed.value = kept;
    changed.quoted = quoted;
    changed.linesWithin = HoldsLineFeed(kept) || HoldsLineFeed(changed.name);
    LeaveReplacedTexts();
    return kNoErr;
}

void IniDocument::Unlink(Index key, Index before) {
    Section& section = sections_[keys_[key].section];
    (before == kNone ? section.firstKey : keys_[before].next) = keys_[key].next;
    if (section.lastKey == key) section.lastKey = before;
    keyTable_.Erase(NameOf(key).hash, key);
    keys_[key].next = unusedKeys_;
    unusedKeys_ = key;
}

void IniDocument::Append(Lines& to, Lines from) {
    if (from.first == kNone) return;
    (to.first == kNone ? to.first : lines_[to.last].next) = from.first;
    to.last = from.last;
}

// Before what follows a key: the next key, the next section, or the end.
IniDocument::Lines& IniDocument::LinesBehind(const Key& key) {
    if (key.next != kNone) return keys_[key.next].comments;
    const Index nextSection = sections_[key.section].next;
    return nextSection == kNone ? trailing_ : sections_[nextSection].comments;
}

MgErr IniDocument::Remove(std::string_view section, std::string_view key, bool& removed) {
    removed = false;
    const std::string_view sectionName = TrimmedIni(section), keyName = TrimmedIni(key);
    if (sectionName.empty() || keyName.empty()) return kConfigTypeErr;
    const Index inSection = FindSection(sectionName);
    const Index found = inSection == kNone ? kNone : FindKey({inSection, keyName});
    if (found == kNone) return kNoErr;
    removed = true;
    Lines& behind = LinesBehind(keys_[found]);
    Lines lines = keys_[found].comments;
    Append(lines, behind);
    behind = lines;
    Index before = kNone;
    for (Index at = sections_[inSection].firstKey; at != found; at = keys_[at].next) before = at;
    Unlink(found, before);
    return kNoErr;
}

bool IniDocument::NameOnlySection(std::string_view name) {
    const std::string_view trimmed = TrimmedIni(name);
    if (sections_.size() != 1 || !IsNullSection(sections_[0].name)) return false;
    if (trimmed.empty() || IsNullSection(trimmed)) return false;
    const std::string_view kept = texts_.Keep(trimmed);
    sectionTable_.Erase(IniNameHash(sections_[0].name, kSectionSeed), 0);
    sections_[0].name = kept;
    sections_[0].linesWithin = HoldsLineFeed(kept);
    sectionTable_.Insert(IniNameHash(kept, kSectionSeed), 0);
    return true;
}

// ---- texts that were replaced ---------------------------------------------------------------------------------------

template <class Visit>
void IniDocument::ForEachText(Visit visit) {
    for (Section& section : sections_) {
        visit(section.name);
        for (Index at = section.firstKey; at != kNone; at = keys_[at].next) {
            visit(keys_[at].name);
            visit(keys_[at].value);
        }
    }
    for (Line& line : lines_) visit(line.text);
}

// Once most bytes are of texts that nobody refers to, the others move together.
void IniDocument::LeaveReplacedTexts() {
    constexpr std::size_t kBearable = 1 << 16;
    if (texts_.Used() < 2 * textsKept_ + kBearable) return;
    std::size_t size = 0;
    ForEachText([&](std::string_view text) { size += text.size(); });
    try {
        IniTexts texts;
        char* to = texts.Allocate(size);
        ForEachText([&](std::string_view& text) {
            if (!text.empty()) std::memcpy(to, text.data(), text.size());
            text = {to, text.size()};
            to += text.size();
        });
        texts_ = std::move(texts);
        textsKept_ = size;
    } catch (const std::bad_alloc&) {
        textsKept_ = texts_.Used();  // it was well without: the next time
    }
}

}  // namespace tessel
