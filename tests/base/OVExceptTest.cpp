#include "diagnostics/Guarded.h"
#include "support/Test.h"
#include <tessel/base/OVExcept.h>

#include <new>
#include <stdexcept>
#include <typeinfo>

namespace tessel::test {
namespace {

TEST(OVExcept, SaysWhatWhereAndWhy) {
    const OVExcept e(7, "no such thing", "dir/file.cpp", 42);
    EXPECT_EACH(e.Code() == 7, e.Line() == 42,
                e.what() == "OVExcept. Err=7, File=dir/file.cpp, Line=42, Detail='no such thing'");

    const OVExcept nothing(-1, nullptr, nullptr, 0);
    EXPECT_STREQ("OVExcept. Err=-1, File=, Line=0, Detail=''", nothing.what());
}

TEST(OVExcept, LongTextsAreCut) {
    const OVExcept deep(1, nullptr, ("/" + std::string(70, 'f') + "/paths/text/Name.cpp").c_str(), 1);
    EXPECT_STREQ("OVExcept. Err=1, File=paths/text/Name.cpp, Line=1, Detail=''", deep.what()) << "whole folders";
    const std::string whole(80, 'w'), detail(127, 'd');
    EXPECT_NE(std::string::npos, std::string(OVExcept(1, "", whole.c_str(), 1).what()).find(whole));
    const std::string tail = "0123456789012345678901234567.cpp";  // 32 characters
    const OVExcept e(1, (detail + "xx").c_str(), ("/very/long/" + tail).c_str(), 1);
    EXPECT_EACH(detail == e.Detail(), tail.substr(1) == e.File(),
                "OVExcept. Err=1, File=/very/long/" + tail + ", Line=1, Detail='" + detail + "'" == e.what());
}

// Not inlined, so that each call has a frame.
__attribute__((noinline)) int ThrowAt(int depth) {
    if (depth > 0) return ThrowAt(depth - 1) + 1;
    TESSEL_THROW(kArgErr, "deep");
}

TEST(OVExcept, CarriesTheCallStackThatMadeIt) {
    try {
        ThrowAt(5);
        FAIL();
    } catch (const OVExcept& e) {
        const auto begin = reinterpret_cast<uintptr_t>(&ThrowAt);
        ASSERT_GE(e.Stack().count, 7);
        for (int32 i = 1; i < 6; ++i) {  // the throw itself may stand apart, among the cold code
            const auto address = reinterpret_cast<uintptr_t>(e.Stack().addresses[i]);
            EXPECT_TRUE(address > begin && address < begin + 4096) << i;
        }
        // All but the innermost call return to the same place.
        EXPECT_EACH(e.Stack().addresses[1] == e.Stack().addresses[5], e.Stack().addresses[5] != e.Stack().addresses[6]);
    }
}

template <class Thrower>
OVExcept Caught(Thrower thrower) {
    try {
        thrower();
    } catch (...) {
        return GetExceptionInCatch_FileAndLine("here.cpp", 12);
    }
    throw std::logic_error("nothing was thrown");
}

TEST(GetExceptionInCatch, TurnsEveryKindIntoOne) {
    const auto what = [](auto thrower) { return std::string(Caught(thrower).what()); };
    const std::string converted = "File=here.cpp, Line=12, Detail='converted from std::";
    EXPECT_EACH(what([] { throw std::bad_alloc(); }) == "OVExcept. Err=2, " + converted + "bad_alloc'",
                what([] { throw std::bad_cast(); }) == "OVExcept. Err=42, " + converted + "bad_cast'",
                what([] { throw std::length_error("long"); }) == "OVExcept. Err=42, " + converted + "exception'",
                what([] { throw OVExcept(9, "full", "there.cpp", 3); }) ==
                    "OVExcept. Err=9, File=there.cpp, Line=3, Detail='full'");
}

TEST(GetExceptionInCatch, AnythingElseIsReportedAndThrownOn) {
    test::ReportRecorder recorder;
    EXPECT_THROW(Caught([] { throw 5; }), int);
    EXPECT_EQ(std::vector<std::string>{"GetExceptionInCatch() called from inside catch(...) -- here.cpp Line 12"},
              recorder.Texts(kDebugError));
}

TEST(Guarded, GivesTheCodeOfWhatWasThrown) {
    EXPECT_EACH(Guarded([] { return 5; }) == 5, Guarded([]() -> MgErr { throw OVExcept(9, "", "", 0); }) == 9,
                Guarded([]() -> MgErr { throw std::bad_array_new_length(); }) == kMemFullErr,
                Guarded([]() -> MgErr { throw std::runtime_error(""); }) == kGenericErr,
                Guarded([]() -> MgErr { throw 1; }) == kGenericErr, GuardedOr(3.5, []() -> double { throw 1; }) == 3.5,
                GuardedOr(3.5, [] { return 4.5; }) == 4.5);
}

}  // namespace
}  // namespace tessel::test
