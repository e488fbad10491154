// The library's own types of settings: from text and to text.
#include "config/ConfigLists.h"
#include "config/ConfigNumbers.h"
#include "config/ConfigText.h"
#include "config/Service.h"
#include "diagnostics/Guarded.h"
#include <tessel/base/OVExcept.h>
#include <tessel/config/ConfigCoreTypes.h>
#include <tessel/config/ConfigTypeRegistry.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>
#include <tessel/paths/PathTextFormat.h>

#include <iterator>

namespace tessel {
namespace {

// ---- what all have in common ----------------------------------------------------------------------------------------

using Read = MgErr (*)(std::string_view text, void* value);
using Write = std::string (*)(const void* value);  // raises what is wrong with the value

MgErr ConversionErr(MgErr err) {
    return err == kMemFullErr ? kConfigMemErr : err;
}

template <Read read>
MgErr FromText(const char* text, int32 length, void* value) {
    if (!value || length < 0 || (!text && length)) return kArgErr;
    return ConversionErr(Guarded([&] { return read({text, static_cast<size_t>(length)}, value); }));
}

template <Write write>
MgErr ToText(const void* value, LStrHandle* text) {
    if (!value || !text) return kArgErr;
    return ConversionErr(Guarded([&] { return StoreText(write(value), text); }));
}

// A handle given by value.
template <class Handle>
Handle ByValue(const void* value) {
    return static_cast<Handle>(const_cast<void*>(value));
}

std::string Quoted(std::string_view text) {
    return '"' + std::string(text) + '"';
}

bool EqualWords(std::string_view a, std::string_view b) {
    auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; };
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), [&](char x, char y) { return lower(x) == lower(y); });
}

// ---- texts ----------------------------------------------------------------------------------------------------------

constexpr size_t kMaxPStr = 255;

void FillPStr(std::string_view text, uint8* string) {
    string[0] = static_cast<uint8>(text.size());
    std::copy(text.begin(), text.end(), string + 1);
}

MgErr ReadPStr(std::string_view text, void* value) {
    if (text.size() > kMaxPStr) return kConfigTextErr;
    UHandle handle = static_cast<UHandle>(value);
    if (MgErr err = DSSetHandleSize(handle, static_cast<uint32>(text.size()) + 1)) return err;
    FillPStr(text, *handle);
    return kNoErr;
}

std::string WritePStr(const void* value) {
    UHandle handle = ByValue<UHandle>(value);
    uint32 size = DSGetHandleSize(handle);
    return Quoted(size ? TextOf(*handle).substr(0, size - 1) : std::string_view());
}

MgErr ReadP255(std::string_view text, void* value) {
    if (text.size() > kMaxPStr) return kConfigTextErr;
    FillPStr(text, static_cast<uint8*>(value));
    return kNoErr;
}

std::string WriteP255(const void* value) {
    return Quoted(TextOf(static_cast<ConstPStr>(value)));
}

MgErr ReadLStr(std::string_view text, void* value) {
    auto handle = static_cast<LStrHandle>(value);
    return StoreText(text, &handle);
}

std::string WriteLStr(const void* value) {
    return Quoted(TextOf(ByValue<LStrHandle>(value)));
}

MgErr ReadNStr(std::string_view text, void* value) {
    static_cast<std::string*>(value)->assign(text);
    return kNoErr;
}

std::string WriteNStr(const void* value) {
    return Quoted(*static_cast<const std::string*>(value));
}

// ---- lists of texts -------------------------------------------------------------------------------------------------

using Texts = std::vector<std::string>;

template <Texts (*split)(std::string_view)>
MgErr ReadTexts(std::string_view text, void* value) {
    *static_cast<Texts*>(value) = split(text);
    return kNoErr;
}

template <std::string (*join)(const Texts&)>
std::string WriteTexts(const void* value) {
    return Quoted(join(*static_cast<const Texts*>(value)));
}

template <Texts (*split)(std::string_view)>
MgErr ReadCPStr(std::string_view text, void* value) {
    Texts elements = split(text);
    auto count = static_cast<int32>(elements.size());
    std::string bytes(reinterpret_cast<const char*>(&count), sizeof count);
    for (const std::string& element : elements) {
        if (element.size() > kMaxPStr) return kConfigTextErr;
        bytes += static_cast<char>(element.size());
        bytes += element;
    }
    return DSPtrToXHand(bytes.data(), static_cast<UHandle>(value), static_cast<uint32>(bytes.size()));
}

template <std::string (*join)(const Texts&)>
std::string WriteCPStr(const void* value) {
    UHandle handle = ByValue<UHandle>(value);
    HandleView list(handle);
    Texts elements;
    for (int32 i = list.Count(); i > 0; --i) {
        auto length = static_cast<uint8>(list.Take(1)[0]);
        elements.emplace_back(list.Take(length));
    }
    return Quoted(join(elements));
}

// ---- numbers --------------------------------------------------------------------------------------------------------

MgErr ReadBool(std::string_view text, void* value) {
    for (std::string_view word : {"true", "yes", "on"})
        if (EqualWords(text, word)) return *static_cast<int32*>(value) = 1, kNoErr;
    for (std::string_view word : {"false", "no", "off"})
        if (EqualWords(text, word)) return *static_cast<int32*>(value) = 0, kNoErr;
    return kConfigTextErr;
}

std::string WriteBool(const void* value) {
    return *static_cast<const int32*>(value) ? "True" : "False";
}

MgErr ReadI32(std::string_view text, void* value) {
    return ParseInt32(&text, static_cast<int32*>(value)) ? kNoErr : kConfigTextErr;
}

std::string WriteI32(const void* value) {
    return std::to_string(*static_cast<const int32*>(value));
}

MgErr ReadF32(std::string_view text, void* value) {
    return ParseFloat32(text, static_cast<float*>(value)) ? kNoErr : kConfigTextErr;
}

std::string WriteF32(const void* value) {
    return Float32Text(*static_cast<const float*>(value));
}

MgErr ReadI32L(std::string_view text, void* value) {
    constexpr std::string_view kBetween = "; \t";
    std::vector<int32> list = {0};
    for (size_t at = 0; (at = text.find_first_not_of(kBetween, at)) != text.npos;) {
        std::string_view number = text.substr(at, text.find_first_of(kBetween, at) - at);
        at += number.size();
        if (!ParseInt32(&number, &list.emplace_back()) || !number.empty()) return kConfigTextErr;
    }
    list[0] = static_cast<int32>(list.size()) - 1;
    return DSPtrToXHand(list.data(), static_cast<UHandle>(value), static_cast<uint32>(list.size() * sizeof(int32)));
}

std::string WriteI32L(const void* value) {
    HandleView list(ByValue<UHandle>(value));
    std::string text;
    for (int32 i = list.Count(); i > 0; --i) {
        int32 number;
        std::memcpy(&number, list.Take(sizeof number).data(), sizeof number);
        text += std::to_string(number);
        if (i > 1) text += ';';
    }
    return text;
}

// ---- paths ----------------------------------------------------------------------------------------------------------

MgErr ReadPthp(std::string_view text, void* value) {
    if (text.size() > static_cast<size_t>(std::numeric_limits<int32>::max())) return kMemFullErr;
    MgErr err = FTextToPath(text.data(), static_cast<int32>(text.size()), static_cast<Path*>(value));
    return err == kNoErr || err == kMemFullErr ? err : kConfigTextErr;
}

MgErr ReadPath(std::string_view text, void* value) {
    auto path = static_cast<Path>(value);
    return ReadPthp(text, &path);
}

// Null is no path, and its text that of not-a-path.
std::string PathText(const PathRef* path, const char* format) {
    std::string text;
    if (MgErr err = PathRef(path).ConvertToString(&text, format)) TESSEL_THROW(err, "Path has no text");
    return text;
}

std::string WritePath(const void* value) {
    return PathText(static_cast<const PathRef*>(value), PathRef::StringDisplay());
}

std::string WritePthp(const void* value) {
    return WritePath(*static_cast<const Path*>(value));
}

// Paths that are destroyed with it.
struct OwnedPaths {
    std::vector<Path> paths;

    OwnedPaths() = default;
    ~OwnedPaths() {
        for (Path& path : paths) FDestroyPath(&path);
    }
    OwnedPaths(const OwnedPaths&) = delete;
    OwnedPaths& operator=(const OwnedPaths&) = delete;
};

std::vector<Path> PathsOf(UHandle handle) {
    HandleView list(handle, offsetof(ConfigPathList, paths));
    std::vector<Path> paths(static_cast<size_t>(list.Count()));
    for (Path& path : paths) std::memcpy(&path, list.Take(sizeof path).data(), sizeof path);
    return paths;
}

MgErr ReadPLst(std::string_view text, void* value) {
    auto handle = static_cast<ConfigPathListHandle>(value);
    auto bytes = static_cast<UHandle>(value);
    OwnedPaths made, old;
    for (const std::string& element : SplitTexts(text))
        if (MgErr err = ReadPthp(element, &made.paths.emplace_back())) return err;
    old.paths = PathsOf(bytes);
    size_t count = made.paths.size();
    auto size = static_cast<uint32>(offsetof(ConfigPathList, paths) + count * sizeof(Path));
    if (MgErr err = DSSetHandleSize(bytes, size)) return old.paths.clear(), err;
    (*handle)->count = static_cast<int32>(count);
    if (count) std::memcpy((*handle)->paths, made.paths.data(), count * sizeof(Path));
    made.paths.clear();
    return kNoErr;
}

std::string WritePLst(const void* value) {
    Texts texts;
    for (Path path : PathsOf(ByValue<UHandle>(value))) texts.push_back(PathText(path, PathRef::StringDOS()));
    return Quoted(JoinTexts(texts));
}

MgErr ReadPRfL(std::string_view text, void* value) {
    std::list<PathRef> paths;
    for (const std::string& element : SplitTexts(text)) {
        Path path = &paths.emplace_back();
        if (MgErr err = ReadPath(element, path)) return err;
    }
    static_cast<std::list<PathRef>*>(value)->swap(paths);
    return kNoErr;
}

std::string WritePRfL(const void* value) {
    Texts texts;
    for (const PathRef& path : *static_cast<const std::list<PathRef>*>(value)) texts.push_back(WritePath(&path));
    return JoinTexts(texts);
}

// ---- the types ------------------------------------------------------------------------------------------------------

constexpr int32 kNoAlias = 0;

struct CoreType {
    int32 type;
    int32 alias;
    ConfigFromTextProc fromText;
    ConfigToTextProc toText;
};

constexpr CoreType kCoreTypes[] = {
    {kConfigPStr, kConfigAliasPStr, FromText<ReadPStr>, ToText<WritePStr>},
    {kConfigP255, kConfigAliasP255, FromText<ReadP255>, ToText<WriteP255>},
    {kConfigLStr, kConfigAliasLStr, FromText<ReadLStr>, ToText<WriteLStr>},
    {kConfigNStr, kNoAlias, FromText<ReadNStr>, ToText<WriteNStr>},
    {kConfigNStV, kNoAlias, FromText<ReadTexts<SplitTexts>>, ToText<WriteTexts<JoinTexts>>},
    {kConfigENSV, kNoAlias, FromText<ReadTexts<SplitEscaped>>, ToText<WriteTexts<JoinEscaped>>},
    {kConfigCPSt, kConfigAliasCPSt, FromText<ReadCPStr<SplitTexts>>, ToText<WriteCPStr<JoinTexts>>},
    {kConfigECPS, kConfigAliasECPS, FromText<ReadCPStr<SplitEscaped>>, ToText<WriteCPStr<JoinEscaped>>},
    {kConfigBool, kConfigAliasBool, FromText<ReadBool>, ToText<WriteBool>},
    {kConfigI32, kConfigAliasI32, FromText<ReadI32>, ToText<WriteI32>},
    {kConfigF32, kConfigAliasF32, FromText<ReadF32>, ToText<WriteF32>},
    {kConfigI32L, kConfigAliasI32L, FromText<ReadI32L>, ToText<WriteI32L>},
    {kConfigPath, kConfigAliasPath, FromText<ReadPath>, ToText<WritePath>},
    {kConfigPthp, kConfigAliasPthp, FromText<ReadPthp>, ToText<WritePthp>},
    {kConfigPLst, kConfigAliasPLst, FromText<ReadPLst>, ToText<WritePLst>},
    {kConfigPRfL, kNoAlias, FromText<ReadPRfL>, ToText<WritePRfL>},
};

MgErr Register(const CoreType& core) {
    MgErr err = RegisterConfigType(core.type, core.fromText, core.toText);
    if (err || core.alias == kNoAlias) return err;
    err = RegisterConfigType(core.alias, core.fromText, core.toText);
    if (err) UnregisterConfigType(core.type);
    return err;
}

MgErr UnregisterFirst(size_t count) {
    MgErr first = kNoErr;
    while (count-- > 0) {
        for (int32 type : {kCoreTypes[count].alias, kCoreTypes[count].type}) {
            MgErr err = type == kNoAlias ? kNoErr : UnregisterConfigType(type);
            if (!first) first = err;
        }
    }
    return first;
}

}  // namespace

MgErr ConfigCoreTypesStart() {
    for (size_t i = 0; i < std::size(kCoreTypes); ++i) {
        if (MgErr err = Register(kCoreTypes[i])) return UnregisterFirst(i), err;
    }
    return kNoErr;
}

MgErr ConfigCoreTypesStop() {
    return UnregisterFirst(std::size(kCoreTypes));
}

}  // namespace tessel
