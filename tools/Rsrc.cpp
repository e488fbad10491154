#include "Rsrc.h"

#include "Json.h"
#include "Support.h"

#include <algorithm>
#include <cstdio>
#include <map>

namespace tool {

namespace {

using Words = std::vector<std::string>;

constexpr const char* kDefaultType = "OVRS";
constexpr const char* kDefaultCreator = "ORVN";
constexpr ResType kStringListType = TESSEL_FOURCC('S', 'T', 'R', '#');

struct Entry {
    ResType type;
    int32 id;
    std::string name;
    uint32 attrs;
    std::string bytes;
};

// A name as the library takes one.
struct PascalString {
    explicit PascalString(const std::string& text) {
        if (text.size() > 255) throw UsageError{"a name has at most 255 bytes"};
        bytes[0] = static_cast<uint8>(text.size());
        std::copy(text.begin(), text.end(), bytes + 1);
    }
    Str255 bytes;
};

std::string TextOf(ConstPStr string) {
    return std::string(reinterpret_cast<const char*>(string + 1), string[0]);
}

// Calls visit(type, index, data) for every resource; `data` is null and `err` set for one that does not load.
template <class Visit>
void ForEachResource(const OpenRsrc& file, const std::string& name, Visit visit) {
    int32 types = 0;
    Check(RCountTypes(file.get(), &types), name, "list");
    for (int32 t = 1; t <= types; ++t) {
        ResType type = 0;
        int32 count = 0;
        Check(RGetIndType(file.get(), &type, t), name, "list");
        Check(RCount(file.get(), type, &count), name, "list");
        for (int32 i = 1; i <= count; ++i) {
            UHandle data = nullptr;
            const MgErr err = RGetInd(file.get(), type, i, &data);
            visit(type, i, data, err);
            if (data) RRelease(data);
        }
    }
}

Entry Describe(UHandle data, const std::string& file) {
    Entry entry = {};
    Str255 name;
    Check(RGetInfo(data, &entry.id, &entry.type, name), file, "list");
    Check(RGetAttrs(data, &entry.attrs), file, "list");
    entry.name = TextOf(name);
    entry.bytes = BytesOf(data);
    return entry;
}

// A text as it can be shown: bytes outside printable ASCII as \xHH.
std::string Shown(const std::string& text) {
    std::string shown;
    for (const char c : text) {
        if (c >= 0x20 && c < 0x7F && c != '\\') {
            shown += c;
        } else {
            char escape[8];
            std::snprintf(escape, sizeof escape, "\\x%02X", static_cast<unsigned>(static_cast<uint8>(c)));
            shown += escape;
        }
    }
    return shown;
}

void ListHeaderJson(Json* json, const RFileHeader& header) {
    json->Key("header").Begin('{');
    json->Key("eol").String(std::string(reinterpret_cast<const char*>(header.eol), sizeof header.eol));
    json->Key("version").Number(header.version);
    json->Key("type").String(FourCCText(header.type));
    json->Key("creator").String(FourCCText(header.creator));
    json->Key("map_offset").Number(header.mapOffset);
    json->Key("map_length").Number(header.mapLength);
    json->Key("data_offset").Number(header.dataOffset);
    json->Key("data_length").Number(header.dataLength);
    json->Key("file_attrs").Number(header.fileAttrs);
    json->Key("type_list").Number(header.typeList);
    json->Key("name_list").Number(header.nameList);
    json->End('}');
}

void EntryJson(Json* json, const Entry& entry) {
    json->Begin('{');
    json->Key("type").String(FourCCText(entry.type));
    json->Key("id").Number(entry.id);
    json->Key("name").String(entry.name);
    json->Key("attrs").Number(entry.attrs);
    json->Key("size").Number(static_cast<long long>(entry.bytes.size()));
    json->Key("hex").Hex(entry.bytes);
    json->End('}');
}

RFileHeader HeaderOf(const std::string& file) {
    const OwnedPath path(file);
    RFileHeader header;
    Check(RGetFileHeader(path.get(), &header), file, "read the header");
    return header;
}

// ---- verbs ----------------------------------------------------------------------------------------------------------

void ListJson(const std::string& name, const OpenRsrc& file) {
    Json json;
    json.Begin('{');
    ListHeaderJson(&json, HeaderOf(name));
    json.Key("resources").Begin('[');
    ForEachResource(file, name, [&](ResType, int32, UHandle data, MgErr err) {
        Check(err, name, "get");
        EntryJson(&json, Describe(data, name));
    });
    json.End(']');
    json.End('}');
    WriteStandardOutput(json.Text() + "\n");
}

void ListText(const std::string& name, const OpenRsrc& file) {
    const RFileHeader header = HeaderOf(name);
    std::string text = "type " + Shown(FourCCText(header.type)) + ", creator " + Shown(FourCCText(header.creator)) +
                       ", version " + std::to_string(header.version) + "\n";
    ForEachResource(file, name, [&](ResType type, int32 index, UHandle data, MgErr err) {
        char line[64];
        if (err) {
            std::snprintf(line, sizeof line, "  number %d: ", index);
            text += Shown(FourCCText(type)) + line + MgErrMeaning(err) + "\n";
            return;
        }
        const Entry entry = Describe(data, name);
        std::snprintf(line, sizeof line, " %12d %10zu bytes  attributes 0x%02X", entry.id, entry.bytes.size(),
                      entry.attrs);
        text += Shown(FourCCText(type)) + line + (entry.name.empty() ? "" : "  " + Shown(entry.name)) + "\n";
    });
    WriteStandardOutput(text);
}

int List(const Words& words) {
    const Arguments arguments(words, {"--json"}, {});
    const std::string name = arguments.Expect({"FILE"})[0];
    const OpenRsrc file(name, kROpenReadOnly);
    if (arguments.Has("--json"))
        ListJson(name, file);
    else
        ListText(name, file);
    return 0;
}

int Get(const Words& words) {
    const Words names = Arguments(words, {}, {}).Expect({"FILE", "TYPE", "ID"});
    const ResType type = ParseFourCC(names[1], "TYPE");
    const int32 id = ParseID(names[2]);
    const OpenRsrc file(names[0], kROpenReadOnly);
    UHandle data = nullptr;
    Check(RGet(file.get(), type, id, &data), names[0], "get");
    WriteStandardOutput(BytesOf(data));
    return 0;
}

int Strings(const Words& words) {
    const Words names = Arguments(words, {}, {}).Expect({"FILE", "ID"});
    const int32 id = ParseID(names[1]);
    const OpenRsrc file(names[0], kROpenReadOnly);
    int32 exists = 0;
    Check(RExists(file.get(), kStringListType, id, &exists), names[0], "get");
    std::string text;
    for (int32 index = 1;; ++index) {
        Str255 string;
        const MgErr err = RGetIndString(file.get(), string, id, index);
        if (err == kResNotFoundErr) break;
        Check(err, names[0], "get");
        text += TextOf(string) + "\n";
    }
    WriteStandardOutput(text);
    return 0;
}

int Create(const Words& words) {
    const Arguments arguments(words, {"--replace"}, {"--type", "--creator"});
    const std::string name = arguments.Expect({"FILE"})[0];
    const FourCC type = ParseFourCC(arguments.Option("--type", kDefaultType), "--type");
    const FourCC creator = ParseFourCC(arguments.Option("--creator", kDefaultCreator), "--creator");
    const OwnedPath path(name);
    Check(RCreateFile(path.get(), arguments.Has("--replace") ? 1 : 0, creator, type, 0), name, "create");
    return 0;
}

int Add(const Words& words) {
    const Arguments arguments(words, {}, {"--name", "--attrs"});
    const Words names = arguments.Expect({"FILE", "TYPE", "ID"});
    const ResType type = ParseFourCC(names[1], "TYPE");
    const int32 id = ParseID(names[2]);
    const PascalString name(arguments.Option("--name", ""));
    const auto attrs = static_cast<uint32>(ParseNumber(arguments.Option("--attrs", "0"), "--attrs", 0, UINT32_MAX));
    const std::string bytes = ReadStandardInput();
    OpenRsrc file(names[0], kROpenReadWrite);
    UHandle data = nullptr;
    Check(DSPtrToHand(bytes.data(), &data, static_cast<uint32>(bytes.size())), names[0], "add");
    const MgErr err = RAdd(data, file.get(), type, id, name.bytes);
    if (err) DSDisposeHandle(data);
    Check(err, names[0], "add");
    Check(RSetAttrs(data, attrs), names[0], "add");
    file.Close();
    return 0;
}

int Replace(const Words& words) {
    const Words names = Arguments(words, {}, {}).Expect({"FILE", "TYPE", "ID"});
    const ResType type = ParseFourCC(names[1], "TYPE");
    const int32 id = ParseID(names[2]);
    const std::string bytes = ReadStandardInput();
    OpenRsrc file(names[0], kROpenReadWrite);
    int32 exists = 0;
    Check(RExists(file.get(), type, id, &exists), names[0], "replace");
    tessel::ResFile* object = tessel::RsrcFileToRMapResFile(file.get());
    Check(object->RReplacePtr(bytes.data(), static_cast<uint32>(bytes.size()), type, id), names[0], "replace");
    file.Close();
    return 0;
}

int Remove(const Words& words) {
    const Words names = Arguments(words, {}, {}).Expect({"FILE", "TYPE", "ID"});
    const ResType type = ParseFourCC(names[1], "TYPE");
    const int32 id = ParseID(names[2]);
    OpenRsrc file(names[0], kROpenReadWrite);
    UHandle data = nullptr;
    Check(RGet(file.get(), type, id, &data), names[0], "get");
    Check(RRemove(data, file.get()), names[0], "remove");
    DSDisposeHandle(data);
    file.Close();
    return 0;
}

// Writes a new file; one that is there already is replaced.
void WriteWholeFile(const std::string& name, const std::string& bytes) {
    const OwnedPath path(name);
    Check(FWriteWholeFile(path.get(), bytes.data(), bytes.size()), name, "write");
}

int Append(const Words& words) {
    const Arguments arguments(words, {}, {"-o"});
    const Words names = arguments.Expect({"HOST", "FILE"});
    const std::string out = arguments.Option("-o", "");
    if (out.empty()) throw UsageError{"-o OUT is missing"};
    const RFileHeader header = HeaderOf(names[1]);
    if (header.base != 0) throw Refusal(names[1], "append", kNotResFileErr);
    std::string bytes = ReadWholeFile(names[0]);
    const auto start = static_cast<uint32>(bytes.size());
    bytes += ReadWholeFile(names[1]);
    for (int32 shift = 24; shift >= 0; shift -= 8) bytes += static_cast<char>(start >> shift);
    if (bytes.size() > UINT32_MAX) throw Refusal(out, "write", kDiskFullErr);
    WriteWholeFile(out, bytes);
    return 0;
}

// Whether as many strings as the list counts lie in it.
MgErr CheckStringList(const OpenRsrc& file, const Entry& entry) {
    if (entry.bytes.size() < 2) return kEOFErr;
    const auto count = static_cast<uint8>(entry.bytes[0]) << 8 | static_cast<uint8>(entry.bytes[1]);
    ConstPStr last = nullptr;
    return count ? RGetIndStringPtr(file.get(), &last, entry.id, count, entry.type) : kNoErr;
}

int CheckFile(const Words& words) {
    const std::string name = Arguments(words, {}, {}).Expect({"FILE"})[0];
    const OpenRsrc file(name, kROpenReadOnly);
    int32 damaged = 0;
    size_t resources = 0, bytes = 0;
    std::map<ResType, int32> lastID;
    ForEachResource(file, name, [&](ResType type, int32 index, UHandle data, MgErr err) {
        const std::string place = name + ": " + Shown(FourCCText(type));
        if (err) {
            std::fprintf(stderr, "tessel: %s number %d: %s (%d)\n", place.c_str(), index, MgErrMeaning(err), err);
            ++damaged;
            return;
        }
        const Entry entry = Describe(data, name);
        const MgErr listErr = type == kStringListType ? CheckStringList(file, entry) : kNoErr;
        if (listErr) {
            std::fprintf(stderr, "tessel: %s %d: %s (%d)\n", place.c_str(), entry.id, MgErrMeaning(listErr), listErr);
            ++damaged;
        }
        const auto last = lastID.find(type);
        if (last != lastID.end() && last->second == entry.id) {
            std::fprintf(stderr, "tessel: %s %d: %s (%d)\n", place.c_str(), entry.id, MgErrMeaning(kResIDExistsErr),
                         kResIDExistsErr);
            ++damaged;
        }
        lastID[type] = entry.id;
        ++resources;
        bytes += entry.bytes.size();
    });
    if (damaged) return 1;
    std::printf("%s: %zu resources, %zu bytes, no damage\n", name.c_str(), resources, bytes);
    return 0;
}

// ---- help -----------------------------------------------------------------------------------------------------------

struct Verb {
    const char* name;
    int (*run)(const Words&);
    const char* usage;
    const char* summary;
    const char* details;
};

constexpr const char* kTypeHelp =
    "TYPE is one to four characters (padded with blanks), or 0x and eight digits: its bytes as they stand in the "
    "file.\n";

constexpr Verb kVerbs[] = {
    {"list", List, "FILE [--json]", "the resources of a file",
     "Lists type, ID, size, attributes and name of each resource, in the order of the file. With --json prints one\n"
     "document with the header and every resource with its bytes; types and names have one character U+0000 to U+00FF\n"
     "for each byte.\n"},
    {"get", Get, "FILE TYPE ID", "the bytes of a resource, on standard output", kTypeHelp},
    {"strings", Strings, "FILE ID", "the strings of a \"STR#\" resource, one a line", ""},
    {"create", Create, "FILE [--type T] [--creator C] [--replace]", "a new, empty resource file",
     "T and C are four characters, \"OVRS\" and \"ORVN\" by default. A file that exists is only replaced with "
     "--replace.\n"},
    {"add", Add, "FILE TYPE ID [--name N] [--attrs N] < BYTES", "a resource with the bytes of standard input",
     kTypeHelp},
    {"replace", Replace, "FILE TYPE ID < BYTES", "the bytes of a resource by those of standard input",
     "Name and attributes stay.\n"},
    {"remove", Remove, "FILE TYPE ID", "a resource", "A resource with attribute 0x08 is protected, and stays.\n"},
    {"append", Append, "HOST FILE -o OUT", "a resource file behind a host file",
     "OUT gets the bytes of HOST, those of FILE, and the 4-byte trailer by which readers find the resources.\n"},
    {"check", CheckFile, "FILE", "the whole file, every resource",
     "Exits with 1, and says where, when something is damaged.\n"},
};

void PrintHelp() {
    std::printf("usage: tessel rsrc VERB ARGUMENTS\n\nWorks on resource files.\n\n");
    for (const Verb& verb : kVerbs) std::printf("  %-8s %s\n", verb.name, verb.summary);
    std::printf("\n`tessel rsrc VERB --help` says more about a verb.\n");
}

void PrintHelp(const Verb& verb) {
    std::printf("usage: tessel rsrc %s %s\n\n%s: %s.\n%s%s", verb.name, verb.usage, verb.name, verb.summary,
                *verb.details ? "\n" : "", verb.details);
}

}  // namespace

int RunRsrc(const Words& words) {
    if (words.empty()) throw UsageError{"a verb is missing"};
    if (words[0] == "--help" || words[0] == "-h") {
        PrintHelp();
        return 0;
    }
    const auto verb = std::find_if(std::begin(kVerbs), std::end(kVerbs),
                                   [&](const Verb& candidate) { return words[0] == candidate.name; });
    if (verb == std::end(kVerbs)) throw UsageError{"there is no verb " + words[0]};
    const Words rest(words.begin() + 1, words.end());
    if (std::find(rest.begin(), rest.end(), "--help") != rest.end()) {
        PrintHelp(*verb);
        return 0;
    }
    const Session session;
    return verb->run(rest);
}

}  // namespace tool
