#include "support/ScratchDrive.h"

#include "platform/DriveTable.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace tessel::test {

ScratchDrive::ScratchDrive() {
    const char* base = std::getenv("TMPDIR");
    folder_ = std::string(base ? base : "/tmp") + "/tessel-XXXXXX";
    if (!mkdtemp(folder_.data())) throw std::runtime_error("no scratch folder");
    setenv("TESSEL_DRIVES", ("C=/;T=" + folder_).c_str(), 1);
    platform::ReloadDrives();
}

ScratchDrive::~ScratchDrive() {
    unsetenv("TESSEL_DRIVES");
    platform::ReloadDrives();
    std::error_code ignored;
    std::filesystem::remove_all(folder_, ignored);
}

std::string ScratchDrive::Name(std::string_view inside) const {
    std::string name = "T:\\" + std::string(inside);
    std::replace(name.begin(), name.end(), '/', '\\');
    return name;
}

void ScratchDrive::Put(std::string_view inside, std::string_view bytes) const {
    std::ofstream(Native(inside), std::ios::binary) << bytes;
}

std::string ScratchDrive::Get(std::string_view inside) const {
    std::ifstream file(Native(inside), std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

}  // namespace tessel::test
