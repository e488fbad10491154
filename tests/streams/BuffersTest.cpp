#include "memory/Heap.h"
#include "support/StartedPaths.h"
#include "support/Test.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/streams/InputBuf.h>
#include <tessel/streams/OutputBuf.h>

namespace tessel::test {
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
    EXPECT_EACH(buffer.GetDataPointer(0, err_) == nullptr, err_ == kNoErr);
    uint32 available = 0;
    EXPECT_EACH(data == buffer.GetDataPointer(4, err_, &available, 1), available == 4u, buffer.GetBytesRead() == 0u,
                data == buffer.GetDataPointer(4, err_), data + 4 == buffer.GetDataPointer(9, err_, &available),
                available == 2u, buffer.GetBytesRead() == 6u, buffer.GetDataPointer(1, err_, &available) == nullptr,
                available == 0u, err_ == kNoErr, buffer.GetSize() == 6u);
}

TEST_F(Buffers, ReadingPastTheEndStaysAnError) {
    {
        MemInputBuf buffer("abc", 3);
        EXPECT_EACH(buffer.GetDataPointer(4, err_) == nullptr, err_ == kCorruptErr,
                    buffer.GetDataPointer(1, err_) == nullptr, err_ == kCorruptErr, buffer.GetSize() == 0u);
    }
    EXPECT_EACH(reports_.Has(0, "MemInputBuf finished with 74 error"), MemInputBuf(nullptr, 5).GetSize() == 0u);
}

TEST_F(Buffers, AStringHandleIsTakenOver) {
    LStrHandle text = Text("hello");
    LStrInputBuf buffer(text);
    EXPECT_EACH(text == nullptr, buffer.GetSize() == 5u, std::memcmp(buffer.GetDataPointer(5, err_), "hello", 5) == 0);
    LStrHandle back = buffer.ReleaseOwnership();
    EXPECT_EACH(buffer.GetDataPointer(1, err_) == nullptr, err_ == kArgErr);
    for (const auto& [count, size] : {std::pair{1000, 5u}, {-1, 0u}, {0, 0u}, {1, 1u}}) {  // 1000: more than it holds
        (*back)->count = count;
        LStrInputBuf damaged(back);
        EXPECT_EQ(size, damaged.GetSize());
        back = damaged.ReleaseOwnership();
    }
    DSDisposeHandle(reinterpret_cast<UHandle>(back));
    LStrHandle bare = reinterpret_cast<LStrHandle>(DSNewHClr(LStrSize(0)));
    EXPECT_EACH(std::unique_ptr<InputBuf>(CreateLStrInputBuf(bare))->GetSize() == 0u);
    LStrInputBuf empty(text);
    empty.GetDataPointer(0, err_);
    EXPECT_EQ(kArgErr, err_);
}

TEST_F(Buffers, AFixedBlockIsNotWrittenBeyond) {
    char block[6] = "#####";
    {
        StaticOutputBuf buffer(block, 3);
        std::memcpy(buffer.GetDataPointer(3, err_), "abc", 3);
        EXPECT_EACH(buffer.GetDataPointer(0, err_) == nullptr, err_ == kNoErr,
                    buffer.GetDataPointer(1, err_) == nullptr, err_ == kCorruptErr, buffer.GetBytesWritten() == 3u);
    }
    EXPECT_EACH(block == "abc##", reports_.Has(0, "StaticOutputBuf finished with 74 error"));
}

TEST_F(Buffers, AHandleGrowsByAQuarterWithinBounds) {
    HandleOutputBuf buffer(16);
    std::memset(buffer.GetDataPointer(100, err_), 'x', 100);
    UHandle handle = buffer.GetHandle(0);
    EXPECT_EACH(buffer.GetBytesWritten() == 100u, DSGetHandleSize(handle) == 100u);
    buffer.GetDataPointer(30000, err_);  // grows: 4096 more at most
    EXPECT_EQ(30100u + 4096u, DSGetHandleSize(handle));
    handle = buffer.GetHandle(1);
    EXPECT_EACH(DSGetHandleSize(handle) == 30100u, (*handle)[99] == 'x', buffer.GetHandle(1) == nullptr,
                buffer.GetDataPointer(1, err_) == nullptr, err_ == kArgErr);
    DSDisposeHandle(handle);
}

TEST_F(Buffers, AStringHandleGrowsBehindItsCount) {
    LStrHandle room = Text("room");
    LStrOutputBuf buffer(room, 0);
    std::memcpy(buffer.GetDataPointer(3, err_), "abc", 3);
    std::memset(buffer.GetDataPointer(2, err_), '!', 2);
    EXPECT_LE(9u, DSGetHandleSize(reinterpret_cast<UHandle>(room)));
    EXPECT_EQ(room, buffer.GetHandle(0));
    buffer.GetDataPointer(0, err_);
    std::memset(buffer.GetDataPointer(100, err_), '?', 100);  // grows anew
    EXPECT_LE(109u, DSGetHandleSize(reinterpret_cast<UHandle>(room)));
    LStrHandle text = buffer.GetHandle(1);
    EXPECT_EACH((*text)->count == 105, DSGetHandleSize(reinterpret_cast<UHandle>(text)) == 109u,
                std::memcmp((*text)->bytes, "abc!!", 5) == 0);
    LStrOutputBuf resized(text, 1000);
    EXPECT_EQ(1004u, DSGetHandleSize(reinterpret_cast<UHandle>(text)));
}

TEST_F(Buffers, FactoriesMakeObjectsThatTheLibraryFrees) {
    LStrHandle text = Text("x");
    EXPECT_EACH(std::unique_ptr<InputBuf>(CreateMemInputBuf("ab", 2))->GetSize() == 2u,
                std::unique_ptr<InputBuf>(CreateLStrInputBuf(text))->GetSize() == 1u);
    char block[4];
    const auto taken = [](auto make) {
        const uint64 before = heap::TotalAllocated();
        auto* made = make();
        const uint64 bytes = heap::TotalAllocated() - before;
        delete made;
        return bytes;
    };
    const uint64 plain = taken([] { return new HandleOutputBuf(4000); });
    EXPECT_EACH(plain >= 4000u, plain == taken([] { return new LStrOutputBuf(3996); }));
    for (OutputBuf* made : std::initializer_list<OutputBuf*>{CreatePreflightOutputBuf(),
                                                             CreateStaticOutputBuf(block, 4), CreateLStrOutputBuf(4)}) {
        const std::unique_ptr<OutputBuf> output(made);
        output->GetDataPointer(4, err_);
        EXPECT_EQ(4u, output->GetBytesWritten());
    }
}

}  // namespace
}  // namespace tessel::test
