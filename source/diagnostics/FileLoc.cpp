#include "platform/FileSystem.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/FileLoc.h>

#include <cstring>
#include <memory>
#include <new>
#include <string>

namespace tessel {
namespace {

constexpr char kTxt[] = ".txt";
constexpr size_t kMostBeforeTxt = 511;

bool IsInTempFolder(int32 code) {
    return code == FileLoc::kTempFolder0 || code == FileLoc::kTempFolder2 || code == FileLoc::kTempFolder;
}

std::string TempFolderText() {
    std::string folder;
    if (!platform::TemporaryFolder(folder)) TESSEL_THROW(kNotFoundErr, "no temporary folder");
    if (folder.empty() || folder.back() != '\\') folder += '\\';
    return folder;
}

}  // namespace

FileLoc::~FileLoc() = default;

Win32FileLoc::Win32FileLoc(int32 code, const char* name) {
    std::string text = IsInTempFolder(code) ? TempFolderText() : std::string();
    text += name ? name : "";
    if (text.size() > kMostText) TESSEL_THROW(kNotFoundErr, "Path too long");
    std::memcpy(text_, text.c_str(), text.size() + 1);
}

FileLoc* Win32FileLoc::Clone() const {
    FileLoc* const clone = new (std::nothrow) Win32FileLoc(*this);
    if (!clone) TESSEL_THROW(kMemFullErr, "no memory for a file location");
    return clone;
}

const char* Win32FileLoc::PathText() const {
    return text_;
}

void Win32FileLoc::AddTxt() {
    const size_t length = std::strlen(text_);
    if (length > kMostBeforeTxt) TESSEL_THROW(kNotFoundErr, "Path too long");
    std::memcpy(text_ + length, kTxt, sizeof kTxt);
}

FileLoc* CreateFileLoc(int32 code, const char* fileName, bool addTxt) {
    if (!fileName) TESSEL_THROW(kArgErr, "inFilename is NULL");
    std::unique_ptr<Win32FileLoc> location(new (std::nothrow) Win32FileLoc(code, fileName));
    if (!location) TESSEL_THROW(kMemFullErr, "no memory for a file location");
    if (addTxt) location->AddTxt();
    return location.release();
}

}  // namespace tessel
