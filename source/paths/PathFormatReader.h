// How text is split into a base and names: one reader for each kind of text.
#ifndef TESSEL_SOURCE_PATHS_PATHFORMATREADER_H
#define TESSEL_SOURCE_PATHS_PATHFORMATREADER_H

#include <tessel/paths/PathRef.h>

#include <string>
#include <string_view>

namespace tessel::WidePathFormat {

// A piece of the text, from `begin` to before `end`. It is valid when it begins inside the text.
struct Token {
    size_t begin;
    size_t end;
};

// A reader looks at the text, which must outlive it, and keeps nothing else.
class PathFormatReader {
public:
    virtual ~PathFormatReader() = default;
    virtual PathRef::PathBase Base() const = 0;
    virtual Token FirstToken() const;
    virtual Token NextToken(const Token& token) const;
    virtual bool IsValid(const Token& token) const;
    virtual std::string TokenText(const Token& token) const;

    // The path that the text stands for. Raises kArgErr when it is not valid.
    PathRef Read() const;

protected:
    PathFormatReader(std::string_view text, char separator) : text_(text), separator_(separator) {}

    virtual bool IsSeparator(size_t position) const;
    virtual size_t NextPosition(size_t position) const;
    virtual size_t FirstName() const;
    virtual size_t NextSeparator(size_t position) const;  // or the end of the text

    const std::string_view text_;
    const char separator_;
};

// Skips empty names and ".".
class PathFormatReaderDotted : public PathFormatReader {
public:
    Token FirstToken() const override;
    Token NextToken(const Token& token) const override;

protected:
    using PathFormatReader::PathFormatReader;
    virtual Token SkipUnnamed(Token token) const;
};

class PathFormatReaderUnix final : public PathFormatReaderDotted {
public:
    explicit PathFormatReaderUnix(std::string_view text) : PathFormatReaderDotted(text, '/') {}
    PathRef::PathBase Base() const override;

protected:
    size_t NextPosition(size_t position) const override;
};

class PathFormatReaderPlatformIndependent : public PathFormatReaderDotted {
public:
    explicit PathFormatReaderPlatformIndependent(std::string_view text) : PathFormatReaderDotted(text, '/') {}
    PathRef::PathBase Base() const override;
    Token FirstToken() const override;
    std::string TokenText(const Token& token) const override;

protected:
    using PathFormatReaderDotted::PathFormatReaderDotted;

private:
    Token ServerAndShare() const;
};

class PathFormatReaderWin final : public PathFormatReaderPlatformIndependent {
public:
    explicit PathFormatReaderWin(std::string_view text);
    PathRef::PathBase Base() const override { return base_; }
    Token FirstToken() const override;
    Token NextToken(const Token& token) const override;
    std::string TokenText(const Token& token) const override;

private:
    bool IsDrive(const Token& token) const;

    PathRef::PathBase base_;
};

class PathFormatReaderMac final : public PathFormatReader {
public:
    explicit PathFormatReaderMac(std::string_view text) : PathFormatReader(text, ':') {}
    PathRef::PathBase Base() const override;

protected:
    size_t FirstName() const override;
};

// The path that text of unknown origin most likely stands for. Raises the code of the first reader that refused it.
PathRef ReadByGuessing(std::string_view text);

}  // namespace tessel::WidePathFormat

#endif
