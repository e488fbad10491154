#include "Support.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace tool {

namespace {

// Results say what went wrong. Only what leaves no way on is shown.
void TakeReport(CStr, int32, CStr, int32 level, uint32, CStr text) {
    if (level < kDebugFatal) return;
    std::fprintf(stderr, "tessel: %s\n", *text ? text : "the library gave up");
    std::_Exit(1);
}

bool Contains(const std::vector<std::string>& names, const std::string& name) {
    return std::find(names.begin(), names.end(), name) != names.end();
}

}  // namespace

Arguments::Arguments(const std::vector<std::string>& words, const std::vector<std::string>& flags,
                     const std::vector<std::string>& options) {
    bool open = true;
    for (size_t i = 0; i < words.size(); ++i) {
        const std::string& word = words[i];
        if (open && word == "--") {
            open = false;
        } else if (open && Contains(flags, word)) {
            options_.push_back({word, ""});
        } else if (open && Contains(options, word)) {
            if (++i == words.size()) throw UsageError{word + " takes a value"};
            options_.push_back({word, words[i]});
        } else if (open && word.size() > 2 && word.compare(0, 2, "--") == 0) {
            throw UsageError{"there is no option " + word};
        } else {
            positional_.push_back(word);
        }
    }
}

bool Arguments::Has(const std::string& name) const {
    return std::any_of(options_.begin(), options_.end(), [&](const Option_& option) { return option.name == name; });
}

std::string Arguments::Option(const std::string& name, const std::string& otherwise) const {
    std::string value = otherwise;
    for (const Option_& option : options_) {
        if (option.name == name) value = option.value;
    }
    return value;
}

std::vector<std::string> Arguments::Expect(const std::vector<std::string>& names) const {
    if (positional_.size() < names.size()) throw UsageError{names[positional_.size()] + " is missing"};
    if (positional_.size() > names.size()) throw UsageError{"too many arguments: " + positional_[names.size()]};
    return positional_;
}

long long ParseNumber(const std::string& text, const char* what, long long least, long long most) {
    char* end = nullptr;
    errno = 0;
    const long long value = std::strtoll(text.c_str(), &end, 0);
    if (text.empty() || *end || errno || value < least || value > most)
        throw UsageError{std::string(what) + " must be a 32-bit number, not \"" + text + "\""};
    return value;
}

int32 ParseID(const std::string& text) {
    return static_cast<int32>(
        ParseNumber(text, "ID", std::numeric_limits<int32>::min(), std::numeric_limits<int32>::max()));
}

FourCC ParseFourCC(const std::string& text, const char* what) {
    std::string bytes = text;
    if (text.size() == 10 && text.compare(0, 2, "0x") == 0 &&
        text.find_first_not_of("0123456789abcdefABCDEF", 2) == std::string::npos) {
        bytes.clear();
        for (size_t at = 2; at < text.size(); at += 2)
            bytes += static_cast<char>(std::strtol(text.substr(at, 2).c_str(), nullptr, 16));
    }
    if (bytes.empty() || bytes.size() > 4)
        throw UsageError{std::string(what) + " must be one to four characters, not \"" + text + "\""};
    bytes.resize(4, ' ');
    FourCC code = 0;
    std::memcpy(&code, bytes.data(), sizeof code);
    return code;
}

std::string FourCCText(FourCC code) {
    char bytes[4];
    std::memcpy(bytes, &code, sizeof code);
    return std::string(bytes, sizeof bytes);
}

Session::Session() {
    DebugOutputSetHandler(TakeReport);
    Check(InitTesselBase(), "the library", "start");
    Check(InitTesselAppSupport(), "the library", "start");
}

Session::~Session() {
    UninitTesselAppSupport();
    UninitTesselBase();
}

OwnedPath::OwnedPath(const std::string& native) {
    Check(NativeToPath(native.c_str(), &path_), native, "look up");
}

OwnedPath::~OwnedPath() {
    FDestroyPath(&path_);
}

OpenRsrc::OpenRsrc(const std::string& file, int32 mode) : file_(file) {
    const OwnedPath path(file);
    Check(ROpenFile(path.get(), mode, &refnum_, nullptr, nullptr), file, "open");
}

OpenRsrc::~OpenRsrc() {
    if (!refnum_) return;
    // What was refused is not done behind the user's back.
    uint32 attrs = 0;
    RGetFileAttrs(refnum_, &attrs);
    if (attrs & kRFileChanged) RSetFileAttrs(refnum_, attrs & ~static_cast<uint32>(kRFileChanged));
    RCloseFile(refnum_);
}

void OpenRsrc::Close() {
    Check(RCloseFile(refnum_), file_, "write");
    refnum_ = 0;
}

std::string BytesOf(UHandle data) {
    return std::string(reinterpret_cast<const char*>(*data), DSGetHandleSize(data));
}

std::string ReadStandardInput() {
    std::string bytes;
    char block[65536];
    while (const size_t got = std::fread(block, 1, sizeof block, stdin)) bytes.append(block, got);
    if (std::ferror(stdin)) throw Refusal("standard input", "read", kIOErr);
    return bytes;
}

void WriteStandardOutput(const std::string& bytes) {
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), stdout) == bytes.size();
    if (!written || std::fflush(stdout) != 0) throw Refusal("standard output", "write", kIOErr);
}

std::string ReadWholeFile(const std::string& file) {
    const OwnedPath path(file);
    File_t* open = nullptr;
    Check(FMOpen(&open, path.get(), kFOpenRead, kFDenyWrite), file, "open");
    uint64 size = 0;
    MgErr err = FGetEOF64(open, &size);
    if (!err && size > std::numeric_limits<uint32>::max()) err = kMemFullErr;
    std::string bytes;
    if (!err) {
        bytes.resize(static_cast<size_t>(size));
        err = FMRead(open, static_cast<uint32>(size), nullptr, &bytes[0]);
    }
    FMClose(open);
    Check(err, file, "read");
    return bytes;
}

}  // namespace tool
