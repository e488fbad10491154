#include "config/IniFile.h"

#include "platform/File.h"
#include "platform/LastError.h"

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
    if (name.empty()) return kGenericErr;
    const platform::FileHandle file =
        platform::FileOpen(name.c_str(), platform::kRead | platform::kWrite, 0, platform::Disposition::kCreateAlways);
    if (file == platform::kNoFile) return kPermissionErr;
    FileOutput output(file);
    const bool written = document.Write(output) && platform::FileFlush(file) && platform::FileGetVersion(file, version);
    platform::FileClose(file);
    return written ? kNoErr : kDiskFullErr;
}

}  // namespace tessel
