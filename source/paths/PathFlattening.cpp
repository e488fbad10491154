// "PTH0" and "PTH1": a magic, the size of what follows, the base, and the names from the first to the last.
#include "paths/PathFlattening.h"

#include "diagnostics/Guarded.h"
#include "paths/PathItemList.h"
#include "paths/PathItemStorage.h"
#include "paths/PathProcess.h"
#include "paths/PathRefAccess.h"
#include "platform/CodePage.h"
#include <tessel/base/OVExcept.h>
#include <tessel/paths/PathManager.h>
#include <tessel/streams/Endianizer.h>
#include <tessel/streams/InputBuf.h>
#include <tessel/streams/OutputBuf.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <string_view>

namespace tessel {
namespace {

constexpr std::string_view kMagicPTH0 = "PTH0";
constexpr std::string_view kMagicPTH1 = "PTH1";
constexpr uint32 kHeaderSize = 8;     // the magic and the size of the body
constexpr uint32 kFixedBodySize = 4;  // what the body has before the names
constexpr size_t kLongestByteName = 255;
constexpr size_t kLongestWordName = 0x7FFF;  // longer lengths read as negative
constexpr int32 kMostNamesOfPTH0 = 16736;    // more names are written as PTH1
constexpr int32 kMostCountableNames = 0xFFFF;

struct BaseCode {
    PathRef::PathBase base;
    int16 type;            // in PTH0
    std::string_view tag;  // in PTH1
};
constexpr BaseCode kBaseCodes[] = {
    {PathRef::kAbsolute, kPathAbsolute, "abs "},
    {PathRef::kRelative, kPathRelative, "rel "},
    {PathRef::kUNC, kPathUNC, "unc "},
    {PathRef::kNotAPath, kPathNotAPath, "!pth"},
};

// The codes of a path's base; those of not-a-path for a base that has none.
const BaseCode& BaseCodeOf(const PathRef& path) {
    const BaseCode* last = std::end(kBaseCodes) - 1;
    return *std::find_if(std::begin(kBaseCodes), last,
                         [&](const BaseCode& code) { return path.StartsWith(code.base); });
}

// ---- writing --------------------------------------------------------------------------------------------------------

bool FitsPTH0(const PathItemList& names) {
    if (names.Count() > kMostNamesOfPTH0) return false;
    for (int32 i = 0; i < names.Count(); ++i) {
        const std::string& name = names[i].Name();
        if (name.size() > kLongestByteName) return false;
        for (char byte : name)
            if (static_cast<uint8>(byte) > 127) return false;
    }
    return true;
}

void AppendWord(std::string& out, int32 value, const Endianizer& endianizer) {
    char bytes[2];
    endianizer.FromNative16(static_cast<int16>(value), bytes);
    out.append(bytes, sizeof bytes);
}

// Where names are UTF-8 already they are taken as they are, so that also one that is no good UTF-8 comes back the same.
void ConvertToUtf8(std::string_view name, std::string& utf8) {
    if (platform::ActiveCodePage().utf8)
        utf8 = name;
    else
        platform::ToUtf8(name, utf8);
}

void ConvertFromUtf8(std::string_view utf8, std::string& name) {
    if (platform::ActiveCodePage().utf8)
        name = utf8;
    else
        platform::FromUtf8(utf8, name);
}

MgErr AppendByteNames(std::string& out, const PathItemList& names) {
    for (int32 i = 0; i < names.Count(); ++i) {
        const std::string& name = names[i].Name();
        if (name.size() > kLongestByteName) return kArgErr;
        out.append(1, static_cast<char>(name.size())).append(name);
    }
    return kNoErr;
}

MgErr AppendWordNames(std::string& out, const PathItemList& names, const Endianizer& endianizer) {
    std::string utf8;
    for (int32 i = 0; i < names.Count(); ++i) {
        ConvertToUtf8(names[i].Name(), utf8);
        if (utf8.size() > kLongestWordName) return kArgErr;
        AppendWord(out, static_cast<int32>(utf8.size()), endianizer);
        out.append(utf8);
    }
    return kNoErr;
}

// The null path, and no path at all: a magic, a size of 0, and four bytes that say nothing.
void MakeFlattenedNull(std::string& out) {
    out.assign(kMagicPTH0).append(4 + kFixedBodySize, 0);
}

// The whole flattened form.
MgErr MakeFlattened(std::string& out, const PathRef& path, PathRef::FlattenFormat format,
                    const Endianizer& endianizer) {
    if (format != PathRef::kPTH0 && format != PathRef::kPTH1) return kUnsupportedErr;
    if (!path.IsSane(true)) TESSEL_THROW(kCorruptErr, "Corrupt Path");
    if (path.StartsWith(PathRef::kNullPath)) {
        MakeFlattenedNull(out);
        return kNoErr;
    }
    const PathItemList names(PathRefAccess::Element(path));
    const BaseCode& base = BaseCodeOf(path);
    MgErr err;
    out.assign(format == PathRef::kPTH0 ? kMagicPTH0 : kMagicPTH1).append(4, 0);
    if (format == PathRef::kPTH0) {
        if (names.Count() > kMostCountableNames) return kArgErr;
        AppendWord(out, base.type, endianizer);
        AppendWord(out, names.Count(), endianizer);
        err = AppendByteNames(out, names);
    } else {
        out.append(base.tag);
        err = AppendWordNames(out, names, endianizer);
    }
    if (!err && out.size() - kHeaderSize > INT32_MAX - kHeaderSize) err = kArgErr;
    if (!err) endianizer.FromNative32(static_cast<int32>(out.size() - kHeaderSize), out.data() + 4);
    return err;
}

MgErr Write(const std::string& bytes, OutputBuf* buffer, uint32* size) {
    MgErr err = kNoErr;
    if (buffer) {
        void* room = buffer->GetDataPointer(static_cast<uint32>(bytes.size()), err);
        if (room) std::memcpy(room, bytes.data(), bytes.size());
    }
    if (size) *size = err ? 0 : static_cast<uint32>(bytes.size());
    return err;
}

// ---- reading --------------------------------------------------------------------------------------------------------

[[noreturn]] void Fail(MgErr err, const char* detail) {
    throw OVExcept(err, detail, __FILE__, __LINE__);
}

// The next n bytes, which there must be; n is not 0.
const char* Take(InputBuf& buffer, uint32 n, const char* detail) {
    MgErr err;
    const void* bytes = buffer.GetDataPointer(n, err);
    if (!bytes) Fail(err ? err : MgErr{kCorruptErr}, detail);
    return static_cast<const char*>(bytes);
}

PathRef ReadPTH1(InputBuf& buffer, uint32 bodySize, const Endianizer& endianizer) {
    const std::string_view tag(Take(buffer, kFixedBodySize, "PathRef unflatten constructor, subcode read"),
                               kFixedBodySize);
    const BaseCode* base = std::find_if(std::begin(kBaseCodes), std::end(kBaseCodes),
                                        [&](const BaseCode& code) { return code.tag == tag; });
    if (base == std::end(kBaseCodes)) Fail(kArgErr, "PathRef unflatten constructor, path type");
    PathRef path(base->base);
    uint64 consumed = kFixedBodySize;
    std::string name;
    while (consumed < bodySize) {
        const int16 length =
            endianizer.ToNative16(Take(buffer, 2, "PathRef unflatten constructor, name element length read"));
        if (length < 0) Fail(kCorruptErr, "PathRef unflatten constructor, name element length negative");
        consumed += 2u + static_cast<uint32>(length);
        if (consumed > bodySize) break;
        name.clear();
        if (length > 0) {
            const char* bytes =
                Take(buffer, static_cast<uint32>(length), "PathRef unflatten constructor, name element data read");
            ConvertFromUtf8(std::string_view(bytes, static_cast<size_t>(length)), name);
        }
        path.Append(name);
    }
    if (consumed > bodySize) Fail(kCorruptErr, "PathRef unflatten constructor, flattened size didn't match");
    return path;
}

PathRef ReadPTH0(InputBuf& buffer, uint32 bodySize, const Endianizer& endianizer) {
    if (bodySize < kFixedBodySize) {
        Take(buffer, kFixedBodySize, "error unflattening PTH0 data, small size");
        return PathRef(PathRef::kNullPath);
    }
    const char* body = Take(buffer, bodySize, "PathRef unflatten constructor, read header");
    const char* end = body + bodySize;
    const int16 type = endianizer.ToNative16(body);
    const uint16 count = static_cast<uint16>(endianizer.ToNative16(body + 2));
    const BaseCode* base = std::find_if(std::begin(kBaseCodes), std::end(kBaseCodes),
                                        [&](const BaseCode& code) { return code.type == type; });
    if (base == std::end(kBaseCodes) || base->base == PathRef::kNotAPath) return PathRef();
    PathRef path(base->base);
    const char* next = body + kFixedBodySize;
    for (uint16 i = 0; i < count; ++i) {
        const size_t length = next < end ? static_cast<uint8>(*next) : 0;
        if (next == end || length > static_cast<size_t>(end - next - 1))
            Fail(kCorruptErr, "PathRef unflatten constructor, flattened size didn't match");
        path.Append(std::string(next + 1, length));
        next += 1 + length;
    }
    return path;
}

}  // namespace

// ---- PathRef --------------------------------------------------------------------------------------------------------

PathRef::PathRef(InputBuf* buffer, const Endianizer* endianizer) {
    if (!buffer || !endianizer) TESSEL_THROW(kArgErr, "PathRef unflatten constructor, NULL parameter");
    const char* header = Take(*buffer, kHeaderSize, "PathRef unflatten constructor, header read");
    const std::string_view magic(header, 4);
    const uint32 bodySize = static_cast<uint32>(endianizer->ToNative32(header + 4));
    if (magic == kMagicPTH1)
        *this = ReadPTH1(*buffer, bodySize, *endianizer);
    else if (magic == kMagicPTH0)
        *this = ReadPTH0(*buffer, bodySize, *endianizer);
    else
        TESSEL_THROW(kCorruptErr, "PathRef unflatten constructor, corrupt flattened format");
}

MgErr PathRef::Flatten(OutputBuf* buffer, FlattenFormat format, uint32* size, const Endianizer* endianizer) const {
    if (size) *size = 0;
    if (!endianizer) return kArgErr;
    return Guarded([&] {
        std::string bytes;
        const MgErr err = MakeFlattened(bytes, *this, format, *endianizer);
        return err ? err : Write(bytes, buffer, size);
    });
}

uint32 PathRef::FlattenedSize(FlattenFormat format) const {
    uint32 size;
    const MgErr err = Flatten(nullptr, format, &size, BigEndianizer());
    if (err) TESSEL_THROW(err, "PathRef FlattenedSize");
    return size;
}

// ---- flat -----------------------------------------------------------------------------------------------------------

MgErr FlattenPath(Path path, OutputBuf* buffer, const Endianizer* endianizer, uint32* size) {
    if (size) *size = 0;
    if (!endianizer) return kArgErr;
    if (path && !path->StartsWith(PathRef::kNullPath)) {
        const PathItemList names(PathRefAccess::Element(*path));
        const bool utf8 = FlattensAlwaysAsUtf8() || !FitsPTH0(names);
        return path->Flatten(buffer, utf8 ? PathRef::kPTH1 : PathRef::kPTH0, size, endianizer);
    }
    return Guarded([&] {
        std::string bytes;
        MakeFlattenedNull(bytes);
        return Write(bytes, buffer, size);
    });
}

int32 FFlattenPath2(Path path, OutputBuf* buffer, const Endianizer* endianizer) {
    return GuardedOr<int32>(0, [&] {
        uint32 size;
        FlattenPath(path, buffer, endianizer, &size);
        return static_cast<int32>(size);
    });
}

MgErr FUnFlattenPath2(InputBuf* buffer, Path* path, const Endianizer* endianizer) {
    if (!path) return kArgErr;
    return Guarded([&] {
        const PathRef read(buffer, endianizer);
        if (read.StartsWith(PathRef::kNullPath)) return *path ? kArgErr : kNoErr;
        return read.ConvertToPath(path);
    });
}

}  // namespace tessel

using namespace tessel;

int32 FFlattenPath(Path path, uint8* bytes) {
    if (!bytes) return FFlattenPath2(path, nullptr, BigEndianizer());
    StaticOutputBuf buffer(bytes, UINT32_MAX);
    return FFlattenPath2(path, &buffer, BigEndianizer());
}

// Reads no more than the header says there is.
int32 FUnFlattenPath(const uint8* bytes, Path* path) {
    if (!bytes) return 0;
    const uint32 bodySize = static_cast<uint32>(BigEndianizer()->ToNative32(bytes + 4));
    const uint32 size = kHeaderSize + std::min(std::max(bodySize, kFixedBodySize), uint32{INT32_MAX} - kHeaderSize);
    MemInputBuf buffer(bytes, size);
    return tessel::FUnFlattenPath2(&buffer, path, BigEndianizer()) ? 0 : static_cast<int32>(buffer.GetBytesRead());
}

int32 FUnFlattenPath2(const uint8* bytes, Path* path, int32 length) {
    length = std::min(length, INT32_MAX - 1);  // leaves a value for failure
    MemInputBuf buffer(bytes, static_cast<uint32>(std::max(length, 0)));
    if (tessel::FUnFlattenPath2(&buffer, path, BigEndianizer())) return length + 1;
    return static_cast<int32>(buffer.GetBytesRead());
}
