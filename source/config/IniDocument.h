// A preference file in memory: sections of keys, and the comment lines between them, in the order of the file.
//
//     IniDocument.cpp   what is looked up and changed
//     IniReader.cpp     from the bytes of a file
//     IniWriter.cpp     to them
//
// Sections, keys and comment lines are records that refer to each other by number, their texts are views into bytes
// that the document owns: reading a large file costs a handful of allocations. One table finds a key by its name and
// its section. What is removed is used again, and texts that were replaced are left behind when they are too many.
//
// Names are kept without the white space around them. std::bad_alloc leaves a document as it was.
#ifndef TESSEL_SOURCE_CONFIG_INIDOCUMENT_H
#define TESSEL_SOURCE_CONFIG_INIDOCUMENT_H

#include "config/IniTable.h"
#include "config/IniTexts.h"
#include <tessel/base/MgErr.h>
#include <tessel/memory/TrackedMallocFree.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tessel {

class IniDocument {
public:
    // Replaces the document by what the bytes of a file spell. They lie in `texts`, which goes to the document, with a
    // zero byte behind them. kUnsupportedErr for UTF-16 and UTF-32.
    MgErr Read(IniTexts&& texts, std::string_view bytes);

    // Takes the bytes of a file, piece by piece.
    class Output {
    public:
        virtual bool Write(const char* data, std::size_t size) = 0;  // false: no more

    protected:
        ~Output() = default;
    };
    // False when the output did not take all.
    bool Write(Output& output) const;

    // Null when there is no such key.
    const std::string_view* Find(std::string_view section, std::string_view key) const;
    // kConfigTypeErr for a name that is nothing but white space.
    MgErr Set(std::string_view section, std::string_view key, std::string_view value);
    // `removed`: there was such a key. Comment lines before it go before what follows it. kConfigTypeErr as above.
    MgErr Remove(std::string_view section, std::string_view key, bool& removed);

    // When the one section is that of the keys without one, gives it a name. False when nothing changed.
    bool NameOnlySection(std::string_view name);

    void ListSections(std::vector<std::string>& names) const;
    void ListKeys(std::string_view section, std::vector<std::string>& names) const;

    // Of what was read: the number, from 1, of the line of a key (-1 for one that was added, 0 for none) and of the
    // first line that means nothing (0 for none).
    int32 LineOf(std::string_view section, std::string_view key) const;
    int32 FirstUnparsableLine() const { return firstUnparsable_; }

    // What the texts take, those that were replaced and not left yet among them.
    std::size_t TextBytes() const { return texts_.Used(); }

private:
    friend class IniReader;
    friend class IniWriter;

    using Index = IniTable::Index;
    static constexpr Index kNone = IniTable::kNone;
    template <class T>
    using Records = std::vector<T, TrackedAllocator<T>>;

    // A comment line, or one that means nothing, as it stood in the file.
    struct Line {
        std::string_view text;
        Index next;
    };
    struct Lines {
        Index first = kNone, last = kNone;
    };

    struct Key {
        std::string_view name, value;
        Index section;
        Index next;  // in the section; of a record that is not used: the next of those
        Lines comments;
        int32 line;
        bool quoted;       // written within double quotes
        bool linesWithin;  // a text of it holds a line feed
    };

    struct Section {
        std::string_view name;
        Index next;
        Index firstKey = kNone, lastKey = kNone;
        Lines comments;
        bool added;        // in memory
        bool linesWithin;  // its name holds a line feed
    };

    // What a key is found by.
    struct KeyName {
        KeyName(Index inSection, std::string_view trimmed);

        Index section;
        std::string_view text;
        std::uint32_t hash;
    };

    Index FindSection(std::string_view trimmed) const;
    Index FindKey(const KeyName& name) const;
    KeyName NameOf(Index key) const { return {keys_[key].section, keys_[key].name}; }
    Index FindKey(std::string_view section, std::string_view key) const;
    // Room for one more: AddSection and AddKey, which come after it, do not raise. Their texts are the document's.
    void MakeRoom();
    // Doubles the room when there is none left.
    template <class T>
    static void MakeRoomInRecords(Records<T>& records) {
        if (records.size() == records.capacity()) records.reserve(records.size() * 2 + 16);
    }
    Index AddSection(std::string_view name, bool added);
    Index AddKey(const KeyName& name, std::string_view value, int32 line);
    void LinkLast(Index key, std::uint32_t hash);
    // Takes a key out of the table and of its section, where it follows `before` (kNone: it is the first).
    void Unlink(Index key, Index before);
    // `from` behind `to`, in `to`.
    void Append(Lines& to, Lines from);
    Lines& LinesBehind(const Key& key);
    void LeaveReplacedTexts();
    template <class Visit>
    void ForEachText(Visit visit);

    IniTexts texts_;
    std::size_t textsKept_ = 0;  // bytes of texts_ when none was replaced yet
    Records<Section> sections_;
    Records<Key> keys_;
    Records<Line> lines_;
    IniTable sectionTable_, keyTable_;
    Index firstSection_ = kNone, lastSection_ = kNone;
    Index unusedKeys_ = kNone;
    Lines trailing_;
    int32 firstUnparsable_ = 0;
};

}  // namespace tessel

#endif
