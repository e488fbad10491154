#include "Prefs.h"

#include "ConfigValue.h"
#include "Json.h"
#include "Support.h"

#include <algorithm>
#include <cstdio>

namespace tool {

namespace {

using Words = std::vector<std::string>;
using tessel::BMINIConfigOperations;

// Where the library keeps the keys before the first section.
constexpr const char* kNoSection = "(null)";

// A preference file, its sections and their keys.
class PrefsFile {
public:
    explicit PrefsFile(const std::string& name) : name_(name), path_(name), store_(*path_.get(), kNoSection) {}

    void MustExist() const {
        if (FExists(path_.get()) != tessel::kCfgPathFile) throw Refusal(name_, "open", kNotFoundErr);
    }
    Words Sections() {
        Words names;
        Check(store_.GetSectionNames(&names), name_, "read");
        return names;
    }
    Words Keys(const std::string& section) {
        Words names;
        Check(store_.GetKeyNames(section, &names), name_, "read");
        return names;
    }
    std::string Get(const std::string& section, const std::string& key) {
        std::string value;
        Check(store_.GetValue(section, key, &value), name_ + ": " + key, "get");
        return value;
    }
    void Set(const std::string& section, const std::string& key, const std::string& value) {
        Check(store_.SetValue(section, key, value), name_, "set");
    }
    void Remove(const std::string& section, const std::string& key) {
        Get(section, key);  // one that is not there is refused
        Check(store_.RemoveKey(section, key), name_, "remove");
    }

private:
    std::string name_;
    OwnedPath path_;
    BMINIConfigOperations store_;
};

// The text as the type writes it, in its quotes when it has some.
std::string TypedText(const std::string& typeName, const std::string& text) {
    const auto type = static_cast<int32>(ParseFourCC(typeName, "--type"));
    ConfigValue value(type);
    const auto length = static_cast<int32>(text.size());
    Check(ConfigTypeFromString(type, text.data(), length, value.Pointer()), "\"" + text + "\"", "convert");
    LStrHandle written = nullptr;
    Check(ConfigTypeToString(type, value.Pointer(), &written), "\"" + text + "\"", "convert");
    const std::string result(reinterpret_cast<const char*>((*written)->bytes), static_cast<size_t>((*written)->count));
    DSDisposeHandle(reinterpret_cast<UHandle>(written));
    return result;
}

std::string WithoutQuotes(const std::string& text) {
    return text.size() > 1 && text.front() == '"' && text.back() == '"' ? text.substr(1, text.size() - 2) : text;
}

// ---- verbs ----------------------------------------------------------------------------------------------------------

int List(const std::string& name, const Words& words) {
    const Arguments arguments(words, {"--json"}, {});
    arguments.Expect({});
    PrefsFile file(name);
    file.MustExist();
    Json json;
    std::string text;
    json.Begin('{');
    json.Key("sections").Begin('[');
    for (const std::string& section : file.Sections()) {
        if (section != kNoSection) text += "[" + section + "]\n";
        json.Begin('{');
        json.Key("name").String(section);
        json.Key("keys").Begin('[');
        for (const std::string& key : file.Keys(section)) {
            const std::string value = file.Get(section, key);
            text += key + "=" + value + "\n";
            json.Begin('{');
            json.Key("key").String(key);
            json.Key("value").String(value);
            json.End('}');
        }
        json.End(']');
        json.End('}');
    }
    json.End(']');
    json.End('}');
    WriteStandardOutput(arguments.Has("--json") ? json.Text() + "\n" : text);
    return 0;
}

int Get(const std::string& name, const Words& words) {
    const Arguments arguments(words, {}, {"-s", "--type"});
    const std::string key = arguments.Expect({"KEY"})[0];
    const std::string type = arguments.Option("--type", "");
    PrefsFile file(name);
    file.MustExist();
    const std::string value = file.Get(arguments.Option("-s", kNoSection), key);
    WriteStandardOutput((type.empty() ? value : WithoutQuotes(TypedText(type, value))) + "\n");
    return 0;
}

int Set(const std::string& name, const Words& words) {
    const Arguments arguments(words, {}, {"-s", "--type"});
    const Words names = arguments.Expect({"KEY", "VALUE"});
    const std::string type = arguments.Option("--type", "");
    PrefsFile file(name);
    const std::string value = type.empty() ? names[1] : TypedText(type, names[1]);
    file.Set(arguments.Option("-s", kNoSection), names[0], value);
    return 0;
}

int Remove(const std::string& name, const Words& words) {
    const Arguments arguments(words, {}, {"-s"});
    const std::string key = arguments.Expect({"KEY"})[0];
    PrefsFile file(name);
    file.MustExist();
    file.Remove(arguments.Option("-s", kNoSection), key);
    return 0;
}

int CheckFile(const std::string& name, const Words& words) {
    Arguments(words, {}, {}).Expect({});
    PrefsFile file(name);
    file.MustExist();
    size_t keys = 0;
    const Words sections = file.Sections();
    for (const std::string& section : sections) {
        for (const std::string& key : file.Keys(section)) {
            file.Get(section, key);
            ++keys;
        }
    }
    std::printf("%s: %zu sections, %zu keys\n", name.c_str(), sections.size(), keys);
    return 0;
}

// ---- help -----------------------------------------------------------------------------------------------------------

struct Verb {
    const char* name;
    int (*run)(const std::string&, const Words&);
    const char* usage;
    const char* summary;
    const char* details;
};

constexpr const char* kKeyHelp = "Without -s SECTION the key is one of those before the first section.\n";
constexpr const char* kTypeHelp =
    "Without -s SECTION the key is one of those before the first section. With --type the value must be one of the\n"
    "type, and is given as the type writes it. T is PStr, P255, LStr, NStr, NStV, ENSV, CPSt, ECPS, Bool, I32, F32,\n"
    "I32L, Path, Pthp, PLst or PRfL.\n";

constexpr Verb kVerbs[] = {
    {"list", List, "[--json]", "the sections, their keys and values",
     "In the order of the file, the keys before the first section first; their section is \"(null)\" with --json, "
     "where\n"
     "names and values have one character U+0000 to U+00FF for each byte.\n"},
    {"get", Get, "[-s SECTION] KEY [--type T]", "the value of a key", kTypeHelp},
    {"set", Set, "[-s SECTION] KEY VALUE [--type T]", "the value of a key, which is made when it is not there",
     kTypeHelp},
    {"remove", Remove, "[-s SECTION] KEY", "a key", kKeyHelp},
    {"check", CheckFile, "", "whether the file can be read, and how much is in it", ""},
};

void PrintHelp() {
    std::printf("usage: tessel prefs FILE VERB ARGUMENTS\n\nWorks on preference files.\n\n");
    for (const Verb& verb : kVerbs) std::printf("  %-8s %s\n", verb.name, verb.summary);
    std::printf("\n`tessel prefs FILE VERB --help` says more about a verb.\n");
}

void PrintHelp(const Verb& verb) {
    std::printf("usage: tessel prefs FILE %s %s\n\n%s: %s.\n%s%s", verb.name, verb.usage, verb.name, verb.summary,
                *verb.details ? "\n" : "", verb.details);
}

}  // namespace

int RunPrefs(const Words& words) {
    if (words.empty()) throw UsageError{"FILE is missing"};
    if (words[0] == "--help" || words[0] == "-h") {
        PrintHelp();
        return 0;
    }
    if (words.size() < 2) throw UsageError{"a verb is missing"};
    const auto verb = std::find_if(std::begin(kVerbs), std::end(kVerbs),
                                   [&](const Verb& candidate) { return words[1] == candidate.name; });
    if (verb == std::end(kVerbs)) throw UsageError{"there is no verb " + words[1]};
    const Words rest(words.begin() + 2, words.end());
    if (std::find(rest.begin(), rest.end(), "--help") != rest.end()) {
        PrintHelp(*verb);
        return 0;
    }
    const Session session;
    try {
        return verb->run(words[0], rest);
    } catch (const tessel::OVExcept& exception) {
        throw Refusal(words[0], verb->name, exception.Code());
    }
}

}  // namespace tool
