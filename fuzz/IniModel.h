// What preference files mean, told in the plainest way: lists that are searched from end to end.
#ifndef TESSEL_FUZZ_INIMODEL_H
#define TESSEL_FUZZ_INIMODEL_H

#include <list>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tessel::test {

class IniModel {
public:
    using Lines = std::vector<std::string>;
    struct Key {
        std::string name, value;
        bool quoted;
        Lines before;
    };
    struct Section {
        std::string name;
        bool added;
        Lines before;
        std::list<Key> keys;
    };
    std::list<Section> sections;
    Lines trailing;

    static std::string Trim(const std::string& text) {
        const char* const spaces = " \t\n\v\f\r";
        const auto first = text.find_first_not_of(spaces);
        return first == text.npos ? "" : text.substr(first, text.find_last_not_of(spaces) - first + 1);
    }

    bool Read(std::string bytes) {
        *this = {};
        for (const std::string& mark :
             {std::string("\0\0\xFE\xFF", 4), std::string("\xFF\xFE"), std::string("\xFE\xFF")})
            if (bytes.compare(0, mark.size(), mark) == 0) return false;
        if (bytes.compare(0, 3, "\xEF\xBB\xBF") == 0) bytes.erase(0, 3);
        Section* section = nullptr;
        for (std::string line; TakeLine(bytes, line);) {
            const std::string text = Trim(line);
            const auto separator = text.find_first_of("=:"), close = text.find(']');
            if (text[0] == '[' && close != text.npos && Trim(text.substr(1, close - 1)) != "") {
                section = &Put(Trim(text.substr(1, close - 1)), false);
                if (fresh_ && !Same(section->name, "(null)")) section->before.swap(trailing);
                continue;
            }
            if (text[0] != '[' && text[0] != ';' && separator != text.npos) {
                const bool both = text.compare(separator, 2, ":=") == 0;
                const std::string name = Trim(text.substr(0, separator)),
                                  value = Trim(text.substr(separator + 1 + both));
                if (!name.empty() && !value.empty()) {
                    if (!section) section = &Put("(null)", false);
                    Put(*section, Unquoted({name, value, false, std::exchange(trailing, {})}));
                    continue;
                }
            }
            trailing.push_back(line);
        }
        for (Section& joined : sections) Join(joined);
        return true;
    }

    std::string Write() const {
        std::string bytes;
        const Section* last = nullptr;
        const auto put = [&](const Lines& lines) {
            for (const std::string& line : lines) bytes += line + "\r\n";
        };
        for (const Section& section : sections) {
            const bool null = Same(section.name, "(null)");
            if (last && section.added && !last->added) bytes += "\r\n";
            if (!null) put(section.before);
            if (!null) put({WithLines("[" + section.name + "]")});
            for (const Key& key : section.keys) {
                const std::string quote(key.quoted, '"');
                put(key.before);
                put({WithLines(key.name + "=" + quote + key.value + quote)});
            }
            if (section.added && !null) bytes += "\r\n";
            last = &section;
        }
        put(trailing);
        return bytes;
    }

    std::optional<std::string> Get(const std::string& section, const std::string& key) const {
        for (const Section& s : sections)
            for (const Key& k : s.keys)
                if (Same(s.name, Trim(section)) && Same(k.name, Trim(key))) return k.value;
        return std::nullopt;
    }
    void Set(const std::string& section, const std::string& key, const std::string& value) {
        Put(Put(Trim(section), true), Unquoted({Trim(key), Trim(value), false, {}}));
    }
    void Remove(const std::string& section, const std::string& key) {
        for (auto s = sections.begin(); s != sections.end(); ++s) {
            for (auto k = s->keys.begin(); k != s->keys.end(); ++k) {
                if (!Same(s->name, Trim(section)) || !Same(k->name, Trim(key))) continue;
                Lines& behind = std::next(k) != s->keys.end()    ? std::next(k)->before
                                : std::next(s) != sections.end() ? std::next(s)->before
                                                                 : trailing;
                behind.insert(behind.begin(), k->before.begin(), k->before.end());
                s->keys.erase(k);
                return;
            }
        }
    }

private:
    static bool Same(std::string a, std::string b) {
        for (std::string* text : {&a, &b})
            for (char& c : *text)
                if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
        return a == b;
    }
    static bool TakeLine(std::string& bytes, std::string& line) {
        const auto end = bytes.find_first_of(std::string("\r\n\0", 3));
        line = bytes.substr(0, end);
        const bool pair =
            end != bytes.npos && (bytes.compare(end, 2, "\r\n") == 0 || bytes.compare(end, 2, "\n\r") == 0);
        const bool any = !bytes.empty();
        bytes.erase(0, end == bytes.npos ? end : end + 1 + pair);
        return any;
    }
    static std::string WithLines(std::string text) {
        for (std::size_t at = 0; (at = text.find('\n', at)) != text.npos; at += 2) text.insert(at, 1, '\r');
        return text;
    }
    static Key Unquoted(Key key) {
        key.quoted = key.value.size() >= 2 && key.value.front() == '"' && key.value.back() == '"';
        if (key.quoted) key.value = key.value.substr(1, key.value.size() - 2);
        return key;
    }
    Section& Put(const std::string& name, bool added) {
        fresh_ = false;
        for (Section& section : sections)
            if (Same(section.name, name)) return section;
        fresh_ = true;
        return *sections.insert(Same(name, "(null)") ? sections.begin() : sections.end(), {name, added, {}, {}});
    }
    static void Put(Section& section, Key key) {
        for (Key& there : section.keys) {
            if (!Same(there.name, key.name)) continue;
            there.value = key.value;
            there.quoted = key.quoted;
            there.before.insert(there.before.end(), key.before.begin(), key.before.end());
            return;
        }
        section.keys.push_back(std::move(key));
    }
    // 0: the name continues nothing.
    static int Number(const std::string& name, std::string* base) {
        const auto mark = name.rfind(" Line");
        if (mark == name.npos) return 0;
        const std::string digits = name.substr(mark + 5);
        if (digits.empty() || digits.find_first_not_of("0123456789") != digits.npos) return 0;
        *base = Trim(name.substr(0, mark));
        return digits.back() == '1' && digits.find_first_not_of('0') == digits.size() - 1 ? 1 : 2;
    }
    static void Join(Section& section) {
        std::list<Key> keys;
        keys.swap(section.keys);
        std::string base;
        bool run = false;
        std::list<Key> joined;
        for (Key& key : keys) {
            const int number = Number(key.name, &base);
            if (number == 2 && run) {
                joined.back().value += key.value;
                joined.back().before.insert(joined.back().before.end(), key.before.begin(), key.before.end());
                continue;
            }
            run = number == 1;
            if (run) key.name = base;
            joined.push_back(key);
        }
        for (Key& key : joined) Put(section, std::move(key));
    }

    bool fresh_ = false;  // the section that was put last is a new one
};

}  // namespace tessel::test

#endif
