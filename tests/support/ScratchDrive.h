// A temporary folder mounted as drive T: while the object lives, and removed with all it holds. One at a time.
#pragma once

#include <string>
#include <string_view>

namespace tessel::test {

class ScratchDrive {
public:
    ScratchDrive();
    ~ScratchDrive();
    ScratchDrive(const ScratchDrive&) = delete;
    ScratchDrive& operator=(const ScratchDrive&) = delete;

    // The host's name of the folder, and of something in it ("sub/file").
    const std::string& Native() const { return folder_; }
    std::string Native(std::string_view inside) const { return folder_ + "/" + std::string(inside); }

    // The library's name: `T:\sub\file` for "sub/file".
    std::string Name(std::string_view inside) const;

    // Both go past the library.
    void Put(std::string_view inside, std::string_view bytes) const;
    std::string Get(std::string_view inside) const;

private:
    std::string folder_;
};

}  // namespace tessel::test

