// How the names of a path become text: one writer for each kind of text.
#ifndef TESSEL_SOURCE_PATHS_PATHTEXTFORMAT_H
#define TESSEL_SOURCE_PATHS_PATHTEXTFORMAT_H

#include <tessel/paths/PathRef.h>

#include <string>

namespace tessel {

// The operations are called in the order of the text: the beginning, then for each name what stands for it and, between
// two, a separator; then the end.
class PathTextFormat {
public:
    virtual ~PathTextFormat() = default;
    virtual void BeginAbsolute(std::string& text, int32 count) = 0;
    virtual void BeginRelative(std::string& text, int32 count) = 0;
    virtual void BeginUNC(std::string& text, std::string& scratch, int32 count);
    virtual void AppendName(std::string& text, const std::string& name, int32 index);
    virtual void AppendSeparator(std::string& text) = 0;
    virtual void AppendEllipsis(std::string& text);
    virtual void AppendUpDir(std::string& text);
    virtual void Finish(std::string& text, int32 count);

protected:
    bool absolute_ = false;
    bool unc_ = false;
};

class PathTextFormatWin final : public PathTextFormat {
public:
    void BeginAbsolute(std::string& text, int32 count) override;
    void BeginRelative(std::string& text, int32 count) override;
    void BeginUNC(std::string& text, std::string& scratch, int32 count) override;
    void AppendName(std::string& text, const std::string& name, int32 index) override;
    void AppendSeparator(std::string& text) override;
};

class PathTextFormatUNIX : public PathTextFormat {
public:
    void BeginAbsolute(std::string& text, int32 count) override;
    void BeginRelative(std::string& text, int32 count) override;
    void AppendSeparator(std::string& text) override;
    void Finish(std::string& text, int32 count) override;
};

class PathTextFormatPlatformIndependent final : public PathTextFormatUNIX {
public:
    void BeginAbsolute(std::string& text, int32 count) override;
    void BeginRelative(std::string& text, int32 count) override;
    void AppendName(std::string& text, const std::string& name, int32 index) override;
};

// Writes the path, the first `elided` names (not all of them) as one ellipsis. Without regard to the cached texts.
MgErr WritePathText(const PathRef& path, PathTextFormat& format, int32 elided, std::string& text);

}  // namespace tessel

#endif
