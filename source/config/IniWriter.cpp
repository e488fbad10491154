#include "config/IniDocument.h"
#include "config/IniNames.h"

#include <memory>

namespace tessel {

namespace {
constexpr std::size_t kBufferSize = 1 << 16;
constexpr std::string_view kLineEnd = "\r\n";
}  // namespace

// Gathers what it writes. After the first failure it writes no more.
class IniWriter {
public:
    IniWriter(const IniDocument& document, IniDocument::Output& output)
        : document_(document), output_(output), buffer_(static_cast<char*>(TrackedNew(kBufferSize))) {}

    bool Write();

private:
    using Index = IniDocument::Index;
    static constexpr Index kNone = IniDocument::kNone;

    void WriteSection(const IniDocument::Section& section);
    void WriteKey(const IniDocument::Key& key);
    void WriteLines(IniDocument::Lines lines);
    // A line feed within the text ends its line as every line is ended.
    void PutText(std::string_view text, bool linesWithin);
    void Put(std::string_view text);
    void Put(char c) { Put({&c, 1}); }
    void Flush();

    struct Freer {
        void operator()(void* block) const { TrackedFree(block); }
    };

    const IniDocument& document_;
    IniDocument::Output& output_;
    const std::unique_ptr<char, Freer> buffer_;
    std::size_t used_ = 0;
    bool taken_ = true;
};

void IniWriter::Flush() {
    taken_ = taken_ && (used_ == 0 || output_.Write(buffer_.get(), used_));
    used_ = 0;
}

void IniWriter::Put(std::string_view text) {
    if (text.size() > kBufferSize - used_) Flush();
    if (text.size() > kBufferSize) {
        taken_ = taken_ && output_.Write(text.data(), text.size());
    } else if (!text.empty()) {
        std::memcpy(buffer_.get() + used_, text.data(), text.size());
        used_ += text.size();
    }
}

void IniWriter::PutText(std::string_view text, bool linesWithin) {
    while (linesWithin) {
        const std::size_t lineFeed = text.find('\n');
        if (lineFeed == std::string_view::npos) break;
        Put(text.substr(0, lineFeed));
        Put(kLineEnd);
        text.remove_prefix(lineFeed + 1);
    }
    Put(text);
}

void IniWriter::WriteLines(IniDocument::Lines lines) {
    for (Index at = lines.first; at != kNone; at = document_.lines_[at].next) {
        Put(document_.lines_[at].text);
        Put(kLineEnd);
    }
}

void IniWriter::WriteKey(const IniDocument::Key& key) {
    WriteLines(key.comments);
    PutText(key.name, key.linesWithin);
    Put('=');
    if (key.quoted) Put('"');
    PutText(key.value, key.linesWithin);
    if (key.quoted) Put('"');
    Put(kLineEnd);
}

void IniWriter::WriteSection(const IniDocument::Section& section) {
    const bool hasHeader = !IsNullSection(section.name);
    if (hasHeader) {
        WriteLines(section.comments);
        Put('[');
        PutText(section.name, section.linesWithin);
        Put(']');
        Put(kLineEnd);
    }
    for (Index at = section.firstKey; at != kNone; at = document_.keys_[at].next) WriteKey(document_.keys_[at]);
    if (hasHeader && section.added) Put(kLineEnd);
}

// A section that was read brings its empty lines along, among its comments; one that was added gets them here.
bool IniWriter::Write() {
    const IniDocument::Section* before = nullptr;
    for (Index at = document_.firstSection_; at != kNone; at = document_.sections_[at].next) {
        const IniDocument::Section& section = document_.sections_[at];
        if (section.added && before && !before->added) Put(kLineEnd);
        WriteSection(section);
        before = &section;
    }
    WriteLines(document_.trailing_);
    Flush();
    return taken_;
}

bool IniDocument::Write(Output& output) const {
    return IniWriter(*this, output).Write();
}

}  // namespace tessel
