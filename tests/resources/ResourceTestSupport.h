// Resource files for the tests: bytes put together by hand, and short forms of the calls.
#ifndef TESSEL_TESTS_RESOURCES_RESOURCETESTSUPPORT_H
#define TESSEL_TESTS_RESOURCES_RESOURCETESTSUPPORT_H

#include "support/StartedFiles.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/resources/ResourceManager.h>

#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <string>
#include <vector>

namespace tessel::test {

constexpr ResType kStr = TESSEL_FOURCC('S', 'T', 'R', ' ');
constexpr ResType kStrList = TESSEL_FOURCC('S', 'T', 'R', '#');
constexpr ResType kData = TESSEL_FOURCC('D', 'A', 'T', 'A');
constexpr _FMFileType kType = TESSEL_FOURCC('O', 'V', 'R', 'S');
constexpr _FMFileCreator kCreator = TESSEL_FOURCC('O', 'R', 'V', 'N');

inline std::string Big32(uint32 value) {
    return {static_cast<char>(value >> 24), static_cast<char>(value >> 16), static_cast<char>(value >> 8),
            static_cast<char>(value)};
}

// Replaces the big-endian word at `at`.
inline std::string WithWord(std::string bytes, size_t at, uint32 value) {
    return bytes.replace(at, 4, Big32(value));
}

inline std::string Fixture(const std::string& name) {
    // Run from the tests folder or from the root of the repository.
    for (const char* folder : {"data/", "tests/data/"}) {
        std::ifstream in(folder + name, std::ios::binary);
        if (in) return std::string(std::istreambuf_iterator<char>(in), {});
    }
    ADD_FAILURE() << "no fixture " << name;
    return "";
}

inline std::string BytesOf(UHandle data) {
    return data ? std::string(reinterpret_cast<const char*>(*data), DSGetHandleSize(data)) : "<null>";
}

inline UHandle HandleOf(const std::string& bytes) {
    UHandle handle = nullptr;
    EXPECT_EQ(kNoErr, DSPtrToHand(bytes.data(), &handle, static_cast<uint32>(bytes.size())));
    return handle;
}

// A name as the library takes it.
inline std::string P(const std::string& text) {
    return static_cast<char>(text.size()) + text;
}
inline ConstPStr Name(const std::string& pstr) {
    return reinterpret_cast<ConstPStr>(pstr.data());
}

class ResourceTest : public testing::Test {
protected:
    // Files that a test leaves open are closed with it.
    ~ResourceTest() override {
        for (const RsrcFile file : opened_) {
            const MgErr err = RCloseFile(file);
            EXPECT_TRUE(err == kNoErr || err == kNotResFileErr) << err;
        }
    }
    MgErr TryOpen(const std::string& bytes, int32 mode, RsrcFile* file) {
        UHandle image = HandleOf(bytes);
        const MgErr err = ROpenUHandle(image, mode, file, nullptr, nullptr);
        if (err) DSDisposeHandle(image);
        return err;
    }
    MgErr OpenErr(const std::string& bytes, int32 mode) {
        RsrcFile file = 0;
        const MgErr err = TryOpen(bytes, mode, &file);
        EXPECT_EQ(err != kNoErr, file == 0);
        EXPECT_EQ(kNoErr, err ? kNoErr : RCloseFile(file));
        return err;
    }
    RsrcFile Opened(MgErr err, RsrcFile file) {
        EXPECT_EQ(kNoErr, err);
        return opened_.emplace_back(file);
    }
    RsrcFile Open(const std::string& bytes, int32 mode = kROpenReadWrite) {
        RsrcFile file = 0;
        const MgErr err = TryOpen(bytes, mode, &file);
        return Opened(err, file);
    }
    RsrcFile OpenDisk(std::string_view name, int32 mode = kROpenReadWrite) {
        RsrcFile file = 0;
        const MgErr err = ROpenFile(started.At(name), mode, &file, nullptr, nullptr);
        return Opened(err, file);
    }
    RsrcFile CreateDisk(std::string_view name) {
        EXPECT_EQ(kNoErr, RCreateFile(started.At(name), 1, kCreator, kType, 0));
        return OpenDisk(name);
    }
    RsrcFile NewMemFile() {
        RsrcFile file = 0;
        const MgErr err = RCreateMemFile(&file, kCreator, kType);
        return Opened(err, file);
    }
    MgErr Add(RsrcFile file, ResType type, int32 id, const std::string& bytes, const std::string& name = "") {
        UHandle data = HandleOf(bytes);
        const std::string pstr = P(name);
        const MgErr err = RAdd(data, file, type, id, Name(pstr));
        if (err) DSDisposeHandle(data);
        return err;
    }
    UHandle Loaded(RsrcFile file, ResType type, int32 id) {
        UHandle data = nullptr;
        EXPECT_EQ(kNoErr, RGet(file, type, id, &data));
        return data;
    }
    std::string Get(RsrcFile file, ResType type, int32 id) {
        UHandle data = nullptr;
        const MgErr err = RGet(file, type, id, &data);
        return err ? "error " + std::to_string(err) : BytesOf(data);
    }
    void Remove(RsrcFile file, ResType type, int32 id) {
        UHandle data = Loaded(file, type, id);
        ASSERT_EQ(kNoErr, RRemove(data, file));
        DSDisposeHandle(data);
    }

    StartedFiles started;

private:
    std::vector<RsrcFile> opened_;
};

}  // namespace tessel::test

#endif
