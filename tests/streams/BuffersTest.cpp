#include "support/ReportRecorder.h"
#include "support/StartedPaths.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/InputBuf.h>
#include <tessel/streams/OutputBuf.h>

#include <cstring>
#include <gtest/gtest.h>
#include <memory>
#include <string>

namespace tessel {
namespace {

class Buffers : public ::testing::Test {
protected:
    static LStrHandle Text(const std::string& text) {
        const auto handle = reinterpret_cast<LStrHandle>(DSNewHandle(LStrSize(text.size())));
        (*handle)->count = static_cast<int32>(text.size());
        std::memcpy((*handle)->bytes, text.data(), text.size());
        return handle;
    }

    test::StartedPaths started_;
    test::ReportRecorder reports_;
    MgErr err_ = 99;
};

TEST_F(Buffers, AMemoryBlockIsHandedOutPieceByPiece) {
    const char data[] = "abcdef";
    MemInputBuf buffer(data, 6);
    EXPECT_EQ(nullptr, buffer.GetDataPointer(0, err_));
    EXPECT_EQ(kNoErr, err_);
    uint32 available = 0;
    EXPECT_EQ(data, buffer.GetDataPointer(4, err_, &available, 1));
    EXPECT_EQ(4u, available);
    EXPECT_EQ(0u, buffer.GetBytesRead());
    EXPECT_EQ(data, buffer.GetDataPointer(4, err_));
    EXPECT_EQ(data + 4, buffer.GetDataPointer(9, err_, &available));
    EXPECT_EQ(2u, available);
    EXPECT_EQ(6u, buffer.GetBytesRead());
    EXPECT_EQ(nullptr, buffer.GetDataPointer(1, err_, &available));
    EXPECT_EQ(0u, available);
    EXPECT_EQ(kNoErr, err_);
    EXPECT_EQ(6u, buffer.GetSize());
}

TEST_F(Buffers, ReadingPastTheEndStaysAnError) {
    {
        MemInputBuf buffer("abc", 3);
        EXPECT_EQ(nullptr, buffer.GetDataPointer(4, err_));
        EXPECT_EQ(kCorruptErr, err_);
        EXPECT_EQ(nullptr, buffer.GetDataPointer(1, err_));
        EXPECT_EQ(kCorruptErr, err_);
        EXPECT_EQ(0u, buffer.GetSize());
    }
    EXPECT_TRUE(reports_.Has(0, "MemInputBuf finished with 74 error"));
    EXPECT_EQ(0u, MemInputBuf(nullptr, 5).GetSize());
}

TEST_F(Buffers, AStringHandleIsTakenOver) {
    LStrHandle text = Text("hello");
    LStrInputBuf buffer(text);
    EXPECT_EQ(nullptr, text);
    EXPECT_EQ(5u, buffer.GetSize());
    EXPECT_EQ(0, std::memcmp(buffer.GetDataPointer(5, err_), "hello", 5));
    LStrHandle back = buffer.ReleaseOwnership();
    EXPECT_EQ(nullptr, buffer.GetDataPointer(1, err_));
    EXPECT_EQ(kArgErr, err_);
    (*back)->count = 1000;  // more than the handle holds
    LStrInputBuf damaged(back);
    EXPECT_EQ(5u, damaged.GetSize());
    LStrInputBuf empty(text);
    empty.GetDataPointer(0, err_);
    EXPECT_EQ(kArgErr, err_);
}

TEST_F(Buffers, AFixedBlockIsNotWrittenBeyond) {
    char block[6] = "#####";
    {
        StaticOutputBuf buffer(block, 3);
        std::memcpy(buffer.GetDataPointer(3, err_), "abc", 3);
        EXPECT_EQ(nullptr, buffer.GetDataPointer(0, err_));
        EXPECT_EQ(kNoErr, err_);
        EXPECT_EQ(nullptr, buffer.GetDataPointer(1, err_));
        EXPECT_EQ(kCorruptErr, err_);
        EXPECT_EQ(3u, buffer.GetBytesWritten());
    }
    EXPECT_STREQ("abc##", block);
    EXPECT_TRUE(reports_.Has(0, "StaticOutputBuf finished with 74 error"));
}

TEST_F(Buffers, AHandleGrowsByAQuarterWithinBounds) {
    HandleOutputBuf buffer(16);
    std::memset(buffer.GetDataPointer(100, err_), 'x', 100);
    EXPECT_EQ(100u, buffer.GetBytesWritten());
    UHandle handle = buffer.GetHandle(0);
    EXPECT_EQ(100u, DSGetHandleSize(handle));
    buffer.GetDataPointer(30000, err_);  // grows: 4096 more at most
    EXPECT_EQ(30100u + 4096u, DSGetHandleSize(handle));
    handle = buffer.GetHandle(1);
    EXPECT_EQ(30100u, DSGetHandleSize(handle));
    EXPECT_EQ('x', (*handle)[99]);
    EXPECT_EQ(nullptr, buffer.GetHandle(1));
    EXPECT_EQ(nullptr, buffer.GetDataPointer(1, err_));
    EXPECT_EQ(kArgErr, err_);
    DSDisposeHandle(handle);
}

TEST_F(Buffers, AStringHandleGrowsBehindItsCount) {
    LStrHandle room = Text("room");
    LStrOutputBuf buffer(room, 0);
    std::memcpy(buffer.GetDataPointer(3, err_), "abc", 3);
    std::memset(buffer.GetDataPointer(2, err_), '!', 2);
    EXPECT_LE(9u, DSGetHandleSize(reinterpret_cast<UHandle>(room)));
    LStrHandle text = buffer.GetHandle(1);
    EXPECT_EQ(5, (*text)->count);
    EXPECT_EQ(9u, DSGetHandleSize(reinterpret_cast<UHandle>(text)));
    EXPECT_EQ(0, std::memcmp((*text)->bytes, "abc!!", 5));
    LStrOutputBuf resized(text, 1000);
    EXPECT_EQ(1004u, DSGetHandleSize(reinterpret_cast<UHandle>(text)));
}

TEST_F(Buffers, FactoriesMakeObjectsThatTheLibraryFrees) {
    LStrHandle text = Text("x");
    EXPECT_EQ(2u, std::unique_ptr<InputBuf>(CreateMemInputBuf("ab", 2))->GetSize());
    EXPECT_EQ(1u, std::unique_ptr<InputBuf>(CreateLStrInputBuf(text))->GetSize());
    char block[4];
    for (OutputBuf* made : std::initializer_list<OutputBuf*>{CreatePreflightOutputBuf(),
                                                             CreateStaticOutputBuf(block, 4), CreateLStrOutputBuf(4)}) {
        const std::unique_ptr<OutputBuf> output(made);
        output->GetDataPointer(4, err_);
        EXPECT_EQ(4u, output->GetBytesWritten());
    }
}

}  // namespace
}  // namespace tessel
