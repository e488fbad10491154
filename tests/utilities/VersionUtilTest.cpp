#include "support/StartedLibrary.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/utilities/VersionUtil.h>
#include <tessel/utilities/pheventlog.h>

namespace {

// The texts of all levels.
std::string Levels(uint32 bits) {
    const auto version = static_cast<int32>(bits);
    std::string texts;
    for (int level = 0; level < 5; ++level) {
        const auto detail = static_cast<VersionStringDetailLevel>(level);
        const std::string text = tessel::BuildVersStdStr(version, detail);
        char buffer[kVersionStringSize];
        EXPECT_EACH(BuildVersionString(version, detail, buffer, sizeof buffer) == text.size(),
                    text == std::string(buffer));
        Str255 counted;
        BuildVersStr(version, counted);
        if (level == 0) texts = std::string(reinterpret_cast<char*>(counted + 1), counted[0]) + " =";
        texts += " " + text;
    }
    return texts;
}

TEST(VersionUtil, WritesEachLevel) {
    EXPECT_EACH(Levels(0x13008000) == "13.0 = 13.0 13.0 13.0.0 13.0.0r0 13.0.0",
                Levels(0x08526012) == "8.5.2b12 = 8.5.2b12 8.5 8.5.2 8.5.2b12 8.5.2",
                Levels(0x09802305) == "9.8d305 = 9.8d305 9.8 9.8.0 9.8.0d305 9.8.0",
                Levels(0x10014203) == "10.0.1a203 = 10.0.1a203 10.0 10.0.1 10.0.1a203 10.0.1",
                Levels(0x00005000) == "0.0?0 = 0.0?0 0.0 0.0.0 0.0.0?0 0.0.0",
                Levels(0xABCD8EFF) == ":;.<.= = :;.<.= :;.< :;.<.= :;.<.=r>\?\? :;.<.=");
}

TEST(VersionUtil, FillsABufferWholeOrNotAtAll) {
    char buffer[6] = "12345";
    EXPECT_EACH(BuildVersionString(0x13008000, kVersionStringShort, buffer, 4) == 4u,
                std::memcmp(buffer, "\0\0\0\0005", 6) == 0,
                BuildVersionString(0x13008000, kVersionStringShort, buffer, 5) == 4u, buffer == "13.0",
                BuildVersionString(0x13008000, kVersionStringShort, nullptr, 5) == 4u,
                BuildVersionString(0x13008000, kVersionStringShort, buffer, 0) == 4u);
}

TEST(EventLog, ReadsAsEmpty) {
    EventLoggingLogUserEvent(1, 2);
    EventLoggingLogUserBuffer(1, "x", 1);
    uint32 words[5] = {1, 2, 3, 4, 5};
    tessel::test::StartedLibrary library;
    UHandle text = DSNewHClr(5), tiny = DSNewHandle(0);
    LStrHandle string = reinterpret_cast<LStrHandle>(text);
    (*string)->count = 1;
    EXPECT_EACH(EventLoggingEnumLogEntry(0, &words[0], &words[1], &words[2], &words[3], &words[4], string) == 0,
                EventLoggingEnumLogEntry(0, nullptr, nullptr, nullptr, nullptr, nullptr, (LStrHandle)tiny) == 0);
    for (uint32 word : words) EXPECT_EQ(word, 0u);
    EXPECT_EQ((*string)->count, 0);
    DSDisposeHandle(text);
    DSDisposeHandle(tiny);
    EXPECT_EQ(EventLoggingEnumLogEntry(0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
    uint32 flags = 1, mask = 1;
    EventLoggingGetFlags(&flags, nullptr);
    EventLoggingGetFlags(nullptr, &mask);
    EXPECT_EQ(flags + mask, 0u);
}

}  // namespace
