// Paths from names, and names from paths, for the tests.
#pragma once

#include "support/ReportRecorder.h"
#include "support/StartedPaths.h"
#include <tessel/base/OVExcept.h>
#include <tessel/paths/PathManager.h>
#include <tessel/paths/PathRef.h>

#include <cstring>
#include <gtest/gtest.h>
#include <initializer_list>
#include <string>
#include <vector>

namespace tessel::test {

class PStrOf {
public:
    PStrOf(const std::string& text) {
        bytes_[0] = static_cast<uint8>(text.size());
        std::memcpy(bytes_ + 1, text.data(), text.size());
    }
    operator ConstPStr() const { return bytes_; }

private:
    Str255 bytes_;
};

inline std::string TextOf(ConstPStr text) {
    return std::string(reinterpret_cast<const char*>(text + 1), text[0]);
}

// Appends in order.
inline PathRef MakePath(PathRef::PathBase base, std::initializer_list<const char*> names) {
    PathRef path(base);
    for (const char* name : names) path.Append(name);
    return path;
}
inline PathRef Abs(std::initializer_list<const char*> names) {
    return MakePath(PathRef::kAbsolute, names);
}
inline PathRef Rel(std::initializer_list<const char*> names) {
    return MakePath(PathRef::kRelative, names);
}
inline PathRef Unc(std::initializer_list<const char*> names) {
    return MakePath(PathRef::kUNC, names);
}

// The names with "/" between them behind the base: "abs:C/dir". An up-directory element is "^".
inline std::string Show(const PathRef& path) {
    const char* const bases[] = {"abs:", "rel:", "unc:", "not", "null"};
    std::string text;
    for (int32 base = 0; base < 5; ++base)
        if (path.StartsWith(static_cast<PathRef::PathBase>(base))) text = bases[base];
    for (int32 i = 0; i < path.ItemCount(); ++i)
        text += (i ? "/" : "") + (path.ItemAt(i).empty() ? std::string("^") : path.ItemAt(i));
    return text;
}
inline std::string Show(Path path) {
    return path ? Show(*path) : "(null)";
}

// What a call has made, or its error.
inline std::string Show(MgErr err, const PathRef& made) {
    return err ? "error " + std::to_string(err) : Show(made);
}

template <class Body>
MgErr CodeOf(Body body) {
    try {
        body();
    } catch (const OVExcept& e) {
        return e.Code();
    }
    return kNoErr;
}

class PathTest : public ::testing::Test {
protected:
    StartedPaths started_;
    ReportRecorder reports_;
};

}  // namespace tessel::test

