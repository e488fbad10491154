#include "config/IniFile.h"

#include "platform/File.h"
#include "platform/LastError.h"
#include "platform/Replacement.h"

#include <new>
#include <utility>

namespace tessel {

namespace {

// One open file for a scope.
class OpenIni {
public:
    OpenIni(const std::string& name, std::uint32_t access)
        : handle_(platform::FileOpen(name.c_str(), access, 0, platform::Disposition::kOpenExisting)) {}
    ~OpenIni() {
        if (handle_ != platform::kNoFile) platform::FileClose(handle_);
    }
    OpenIni(const OpenIni&) = delete;
    OpenIni& operator=(const OpenIni&) = delete;

    explicit operator bool() const { return handle_ != platform::kNoFile; }
    platform::FileHandle Get() const { return handle_; }

private:
    platform::FileHandle handle_;
};

bool IsMissing(platform::ErrorNumber error) {
    return error == platform::kErrorFileNotFound || error == platform::kErrorPathNotFound;
}

// The whole file, with a zero byte behind it. It may grow meanwhile.
bool ReadWhole(platform::FileHandle file, std::int64_t size, IniTexts& texts, std::string_view& bytes) {
    std::size_t room = static_cast<std::size_t>(size) + 1, read = 0;
    char* text = texts.Allocate(room + 1);
    for (;;) {
        std::size_t actual = 0;
        if (!platform::FileRead(file, text + read, room - read, actual)) return false;
        read += actual;
        if (read < room) break;
        room *= 2;
        char* const larger = texts.Allocate(room + 1);
        std::memcpy(larger, text, read);
        text = larger;
    }
    text[read] = '\0';
    bytes = {text, read};
    return true;
}

class FileOutput final : public IniDocument::Output {
public:
    explicit FileOutput(platform::FileHandle file) : file_(file) {}
    bool Write(const char* data, std::size_t size) override {
        std::size_t actual = 0;
        return platform::FileWrite(file_, data, size, actual);
    }

private:
    platform::FileHandle file_;
};

// How an attempt to save went.
enum class Saved {
    kYes,
    kNotWritable,  // the file, or where there is none its folder
    kCannotMake,   // a file beside it
    kCannotWrite,  // to the device
    kOvertaken,    // another file has the name now
    kCannotReplace,
    kNoMemory
};

Saved WhyNotBegun(platform::ReplaceFailure failure, bool newFile) {
    const platform::ErrorNumber error = platform::LastError();
    if (error == platform::kErrorNotEnoughMemory) return Saved::kNoMemory;
    if (failure == platform::ReplaceFailure::kCannotRename) return Saved::kOvertaken;
    return newFile && error == platform::kErrorAccessDenied ? Saved::kNotWritable : Saved::kCannotMake;
}

Saved WhyNotFinished(platform::ReplaceFailure failure) {
    if (failure == platform::ReplaceFailure::kCannotFlush) return Saved::kCannotWrite;
    if (failure == platform::ReplaceFailure::kCannotMake) return Saved::kCannotMake;
    const platform::ErrorNumber error = platform::LastError();
    const bool overtaken = error == platform::kErrorFileExists || IsMissing(error);
    return overtaken ? Saved::kOvertaken : Saved::kCannotReplace;
}

Saved SaveOnce(const std::string& name, const IniDocument& document, platform::FileVersion& version) {
    bool newFile = false;
    {
        const OpenIni target(name, platform::kRead | platform::kWrite);
        newFile = !target && IsMissing(platform::LastError());
        if (!target && !newFile) return Saved::kNotWritable;
    }
    platform::Replacement replacement;
    platform::ReplaceRequest request;
    request.name = name.c_str();
    request.pattern = "ini$$%d.TMP";
    request.limit = 1000;
    request.breaksLinks = true;
    request.ownerMayChange = true;
    if (!replacement.Begin(request)) return WhyNotBegun(replacement.Failure(), newFile);
    FileOutput output(replacement.File());
    platform::FileVersion written{};
    if (!document.Write(output)) return Saved::kCannotWrite;
    if (!platform::FileGetVersion(replacement.File(), written)) return Saved::kCannotWrite;
    const bool finished = replacement.Finish();
    // What has the name is ours, even where it is not known to be on the device.
    if (replacement.HasName()) version = written;
    return finished ? Saved::kYes : WhyNotFinished(replacement.Failure());
}

}  // namespace

MgErr LoadIni(const std::string& name, IniDocument& document, platform::FileVersion& version, bool& missing) {
    const OpenIni file(name, platform::kRead);
    missing = !file && IsMissing(platform::LastError());
    if (!file) return kNotFoundErr;
    platform::FileVersion opened{};
    IniTexts texts;
    std::string_view bytes;
    // The version first: what is written while it is read is another one.
    if (!platform::FileGetVersion(file.Get(), opened)) return kIOErr;
    if (!ReadWhole(file.Get(), opened.size, texts, bytes)) return kIOErr;
    if (const MgErr err = document.Read(std::move(texts), bytes)) return err;
    version = opened;
    return kNoErr;
}

MgErr SaveIni(const std::string& name, const IniDocument& document, platform::FileVersion& version) {
    // Another process may put its file there while this one is written: then that one is replaced.
    constexpr int kMostAttempts = 1000;
    if (name.empty()) return kGenericErr;
    Saved saved = Saved::kOvertaken;
    for (int attempt = 0; saved == Saved::kOvertaken && attempt < kMostAttempts; ++attempt) {
        saved = SaveOnce(name, document, version);
    }
    switch (saved) {
        case Saved::kYes:
            return kNoErr;
        case Saved::kCannotMake:
            return kIOErr;
        case Saved::kCannotWrite:
            return kDiskFullErr;
        case Saved::kNoMemory:
            return kConfigMemErr;
        default:
            return kPermissionErr;
    }
}

}  // namespace tessel
