#include "support/Test.h"
#include <tessel/diagnostics/StackChain.h>

#include <exception>

namespace tessel::test {
namespace {

struct Frame {
    const void* caller;
    const void* returnAddress;
};

const void* Address(uintptr_t number) {
    return reinterpret_cast<const void*>(number);
}

std::vector<uintptr_t> Walk(const Frame* frame, const void* returnAddress, int32 skip) {
    StackChainFS<4> chain;
    chain.RecordFrom(frame, returnAddress, skip);
    std::vector<uintptr_t> addresses;
    for (int32 i = 0; i < chain.Count(); ++i) addresses.push_back(reinterpret_cast<uintptr_t>(chain.At(i)));
    return addresses;
}

using Addresses = std::vector<uintptr_t>;

// Frames made by hand in this function's own frame; `frames` rise with their index.
TEST(StackChain, FollowsTheFramesAndSkips) {
    Frame frames[6] = {};
    for (int i = 0; i < 6; ++i)
        frames[i] = {i < 5 ? &frames[i + 1] : nullptr, Address(0x100u + static_cast<unsigned>(i))};
    EXPECT_EQ((Addresses{0x99, 0x101, 0x102, 0x103}), Walk(frames, Address(0x99), 0)) << "no more than it holds";
    EXPECT_EACH(Walk(frames, Address(0x99), 2) == (Addresses{0x102, 0x103, 0x104, 0x105}),
                Walk(frames, Address(0x99), 5) == (Addresses{0x105}), Walk(frames, Address(0x99), 6) == Addresses{});
}

TEST(StackChain, EndsAtAFrameThatIsNone) {
    Frame frames[4] = {};
    const Frame good{nullptr, Address(0x102)};
    auto walkWith = [&](const void* caller) {
        frames[0] = {&frames[1], Address(0x100)};
        frames[1] = {caller, Address(0x101)};
        frames[2] = good;
        return Walk(frames, Address(0x99), 0);
    };
    const Addresses upToTheBadOne{0x99, 0x101};
    EXPECT_EACH(walkWith(&frames[2]) == (Addresses{0x99, 0x101, 0x102}), upToTheBadOne == walkWith(nullptr));
    EXPECT_EQ(upToTheBadOne, walkWith(Address(1))) << "garbage";
    EXPECT_EQ(upToTheBadOne, walkWith(Address(~uintptr_t{0}))) << "beyond the stack";
    EXPECT_EQ(upToTheBadOne, walkWith(reinterpret_cast<const char*>(&frames[2]) + 1)) << "not aligned";
    EXPECT_EQ(upToTheBadOne, walkWith(&frames[0])) << "a circle";
    EXPECT_EQ(upToTheBadOne, walkWith(Address(reinterpret_cast<uintptr_t>(frames) - (1u << 20))))
        << "below the stack that is in use";
    static const Frame elsewhere{nullptr, Address(0x5)};
    EXPECT_EQ(upToTheBadOne, walkWith(&elsewhere)) << "not on the stack";
    EXPECT_EACH(Walk(&elsewhere, Address(0x99), 0) == (Addresses{0x99}), Walk(frames, nullptr, 0) == Addresses{});
}

__attribute__((noinline)) void RecordHere(StackChainFS<16>& chain, int32 skip) {
    chain.Record(skip);
    asm volatile("");
}

TEST(StackChain, RecordsTheCallsOfEveryThread) {
    auto check = [] {
        StackChainFS<16> all, less;
        RecordHere(all, 0);
        RecordHere(less, 1);
        ASSERT_GE(all.Count(), 2);
        const auto at = reinterpret_cast<uintptr_t>(all.At(0));
        const auto begin = reinterpret_cast<uintptr_t>(&RecordHere);
        EXPECT_TRUE(at > begin && at < begin + 1024);
        ASSERT_GE(less.Count(), 1);
        EXPECT_EQ(all.Count() - 1, less.Count());
    };
    check();
    std::thread(check).join();
}

TEST(FrameDecoder, NamesAFunctionOfAModule) {
    const auto start = reinterpret_cast<uintptr_t>(&std::terminate);
    const FrameDecoder decoder(Address(start + 1));
    EXPECT_EACH(Address(start + 1) == decoder.Address(), decoder.Module() == "libstdc++.so.6",
                decoder.Symbol() == "std::terminate()", decoder.Name() == "libstdc++.so.6 std::terminate()",
                decoder.Offset() == 1u);

    const FrameDecoder nowhere(Address(16));
    EXPECT_EACH(nowhere.Name() == "<unknown> <unknown>", nowhere.Offset() == 0u);
}

}  // namespace
}  // namespace tessel::test
