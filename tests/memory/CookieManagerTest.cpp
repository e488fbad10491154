#include "support/FailingAllocator.h"
#include "support/StartedMemory.h"
#include "support/Test.h"
#include <tessel/memory/CookieManager.h>
#include <tessel/memory/MemoryManager.h>

namespace tessel::test {
namespace {

struct Cookies : ::testing::Test {
    test::StartedMemory memory;
};

uint32 GenerationOf(MagicCookie cookie) {
    return cookie >> 20;
}
uint32 IndexOf(MagicCookie cookie) {
    return cookie & 0xFFFFF;
}
void* Info(uintptr_t n) {
    return reinterpret_cast<void*>(n);
}

std::vector<MagicCookie> ListOf(MagicCookieJar jar) {
    UHandle list = nullptr;
    EXPECT_EQ(kNoErr, MCGetCookieList(jar, &list));
    auto words = reinterpret_cast<uint32*>(*list);
    std::vector<MagicCookie> cookies(words + 1, words + 1 + words[0]);
    DSDisposeHandle(list);
    return cookies;
}

TEST_F(Cookies, AreRefusedOnceTheyAreStale) {
    MagicCookieJar jar = MCNewJar();
    ASSERT_NE(nullptr, jar);
    void* info = Info(0x1234);
    MagicCookie first = MCNewCookie(jar, &info), second = MCNewCookie(jar, &info);
    EXPECT_EACH(IndexOf(first) == 0u, IndexOf(second) == 1u, GenerationOf(first) % 4095 + 1 == GenerationOf(second));
    void* out = nullptr;
    EXPECT_EACH(MCDisposeCookie(jar, first, &out) == kNoErr, info == out);
    void* other = Info(0x5678);
    MagicCookie third = MCNewCookie(jar, &other);
    EXPECT_EQ(0u, IndexOf(third));

    void* untouched = Info(1);
    void** place = &untouched;
    for (MagicCookie stale : {first, 0u, IndexOf(second), third + 100, third ^ 0x00100000})
        EXPECT_EACH(!MCIsACookie(jar, stale), MCGetCookieInfo(jar, stale, &untouched) == kArgErr,
                    MCSetCookieInfo(jar, stale, &info) == kArgErr, MCDisposeCookie(jar, stale, &untouched) == kArgErr,
                    MCGetCookieInfoPtr(jar, stale, reinterpret_cast<void**>(&place)) == kArgErr, place == nullptr);
    EXPECT_EACH(Info(1) == untouched, MCGetCookieInfoPtr(jar, third, reinterpret_cast<void**>(&place)) == kNoErr,
                other == *place, third == MCGetCookieForInfo(jar, &other),
                MCSetCookieInfo(jar, third, &info) == kNoErr);
    EXPECT_EQ(third, MCGetCookieForInfo(jar, &info));  // the lower index
    EXPECT_EQ(0u, MCGetCookieForInfo(jar, &other));
    EXPECT_EACH(MCNewCookie(nullptr, &info) == 0u, MCJarSize(nullptr, nullptr) == kArgErr,
                MCDisposeCookie(nullptr, third, nullptr) == kArgErr, MCSetCookieInfo(nullptr, third, &info) == kArgErr,
                MCGetCookieForInfo(nullptr, &info) + MCGetCookieForInfo(jar, nullptr) == 0u,
                MCDisposeJar(jar) == kNoErr, MCDisposeJar(nullptr) == kNoErr,
                memory.reports.Has(kDebugInfo, "Disposing jar with 2 cookies remaining"));
}

// Indices over several pouches and arrays, and generations around their end.
TEST_F(Cookies, AreListedByIndex) {
    constexpr uint32 kCookies = 70000;
    MagicCookieJar jar = MCNewBigJar(5);
    std::vector<MagicCookie> cookies;
    for (uint32 i = 0; i < kCookies; ++i) {
        char info[5];
        std::memcpy(info, &i, 4);
        cookies.push_back(MCNewCookie(jar, info));
        ASSERT_EQ(i, IndexOf(cookies[i]));
        ASSERT_GE(GenerationOf(cookies[i]), 1u);
        ASSERT_EQ(GenerationOf(i > 0 ? cookies[i - 1] : cookies[i] - 0x100000) % 4095 + 1, GenerationOf(cookies[i]));
    }
    for (uint32 i : {5u, 64u, 69999u}) {
        uint32 n = 0;
        char info[5];
        EXPECT_EQ(kNoErr, MCGetCookieInfo(jar, cookies[i], info));
        std::memcpy(&n, info, 4);
        EXPECT_EACH(i == n, MCDisposeCookie(jar, cookies[i], nullptr) == kNoErr);
    }
    cookies[64] = 0;  // the last freed is the first reused
    cookies[69999] = MCNewCookie(jar, "abcd");
    EXPECT_EQ(69999u, IndexOf(cookies[69999]));
    cookies[64] = MCNewCookie(jar, "abcd");
    cookies.erase(cookies.begin() + 5);
    EXPECT_THAT(ListOf(jar), ElementsAreArray(cookies));
    int32 count = 0;
    EXPECT_EACH(MCJarSize(jar, &count) == kNoErr, count == 69999);
    MCDisposeJar(jar);
}

TEST_F(Cookies, JarsReportTheirSize) {
    constexpr uint32 kPointer = sizeof(void*), kRecord = kPointer == 4 ? 36 : 48, kEntry = kPointer == 4 ? 16 : 24;
    uint32 size = kRecord + (16 + 32 + 32) * kPointer + 64 * kEntry;
    EXPECT_EQ(kPointer == 4 ? 1380u : 2224u, size);
    for (uint32 n : {1u, 2u}) {
        MagicCookieJar jar = MCNewJar();
        void* info = nullptr;
        MagicCookie cookie = MCNewCookie(jar, &info);
        MCNewCookie(jar, &info);
        MCDisposeCookie(jar, cookie, nullptr);
        memory.reports.Clear();
        MCDisposeJar(jar);
        auto texts = memory.reports.Texts(kDebugInfo);
        ASSERT_EQ(2u, texts.size());
        EXPECT_THAT(texts[1], ::testing::HasSubstr("): highWater=2; nTreeNodes=3; nPouches=1; size=" +
                                                   std::to_string(size) + "; total="));
        static uint32 first = static_cast<uint32>(std::stoul(texts[1].substr(texts[1].rfind('=') + 1)));
        EXPECT_THAT(texts[1], EndsWith("; total=" + std::to_string(first + (n - 1) * size)));
    }
}

TEST_F(Cookies, CarryRights) {
    int target = 0;
    CookieJar<int*> jar;
    int* out = &target;
    EXPECT_EACH(jar.AcquireCookieRights(0x100000, &out) == 0, out == nullptr);
    int32 narrow[2] = {5, 6};  // without a jar nobody knows how long an info is
    EXPECT_EACH(jar.BaseCookieJar::AcquireCookieRights(0x100000, narrow) == 0, narrow[1] == 6);
    ASSERT_EQ(kNoErr, jar.Init(1));
    MagicCookie cookie = jar.NewCookie(&target);
    EXPECT_EACH(jar.AcquireCookieRights(cookie, &out) == 1, &target == out);
    constexpr int32 kMostRights = 1048575;
    for (int32 rights = 2; rights < kMostRights; ++rights) ASSERT_EQ(1, jar.AcquireCookieRights(cookie, nullptr));
    EXPECT_EQ(0, jar.AcquireCookieRights(cookie, nullptr));
    for (int32 rights = kMostRights; rights > 0; --rights) ASSERT_EQ(rights, jar.ReleaseCookieRights(cookie));
    EXPECT_EACH(jar.AcquireCookieRights(cookie, &out) == 0, out == nullptr, jar.ReleaseCookieRights(cookie) == 0,
                !jar.IsACookie(cookie));
    int32 count = -1;
    EXPECT_EACH(jar.GetNumCookies(&count) == kNoErr, count == 0, jar.Uninit() == kNoErr, !jar.IsAValidJar());

    ASSERT_EQ(kNoErr, jar.Init());  // without rights
    cookie = jar.NewCookie(&target);
    EXPECT_EACH(jar.AcquireCookieRights(cookie, &out) == 0, jar.ReleaseCookieRights(cookie) == 0,
                jar.IsACookie(cookie));
    jar.Uninit();
}

TEST_F(Cookies, FillLists) {
    CookieList list;
    EXPECT_EACH(list.SetCount(-1) == kArgErr, list.SetCookie(0, 5) == kArgErr, list.SetCount(2) == kNoErr,
                list.SetCookie(1, 7) == kNoErr, list.SetCount(3) == kNoErr, list.SetCookie(2, 9) == kNoErr,
                list.SetCount(2) == kNoErr, list.SetCount(3) == kNoErr);
    EXPECT_THAT(
        (std::vector{list.GetCookie(0), list.GetCookie(1), list.GetCookie(2), list.GetCookie(3), list.GetCookie(-1)}),
        ElementsAre(0, 7, 0, 0, 0));
    CookieJar<int*> jar;
    EXPECT_EACH(jar.GetCookieList(&list) == kNoErr, list.GetCount() == 0);
    ASSERT_EQ(kNoErr, jar.Init());
    MagicCookie first = jar.NewCookie(nullptr), second = jar.NewCookie(nullptr);
    EXPECT_EQ(kNoErr, jar.GetCookieList(&list));
    EXPECT_THAT(
        (std::vector{list.GetCount(), static_cast<int32>(list.GetCookie(0)), static_cast<int32>(list.GetCookie(1))}),
        ElementsAre(2, static_cast<int32>(first), static_cast<int32>(second)));
    for (int n : {1, 2}) {  // of the jar, of the list
        CookieList none;
        test::FailingAllocator failing(n);
        EXPECT_EACH(jar.GetCookieList(&none) == kMemFullErr, none.GetCount() == 0, failing.HasFailed());
    }
    // A size that would wrap is refused, and leaves nothing.
    EXPECT_EACH(jar.GetCookieList(nullptr) == kArgErr, list.SetCount(0x40000001) == kMemFullErr, list.GetCount() == 0,
                list.GetCookie(0) == 0u, list.SetCount(1) == kNoErr, list.GetCookie(0) == 0u,
                list.SetCount(0) == kNoErr, list.GetCount() == 0, jar.Uninit() == kNoErr);
    EXPECT_EACH(jar.GetCookieList(&list) == kNoErr, list.GetCookie(0) == 0u);
}

// A cookie lives until its maker ends it, however many take rights in the one that had its slot before.
TEST_F(Cookies, AreNotEndedByThoseWhoComeTooLate) {
    constexpr int kLate = 3, kRounds = 60000;
    CookieJar<int*> jar;
    ASSERT_EQ(kNoErr, jar.Init(1));
    std::atomic<MagicCookie> offered{0};
    std::atomic<bool> done{false};
    auto comeLate = [&] {
        while (!done)
            if (MagicCookie cookie = offered; jar.AcquireCookieRights(cookie, nullptr)) jar.ReleaseCookieRights(cookie);
    };
    int lost = 0;
    InThreads(kLate + 1, [&](int thread) {
        if (thread > 0) return comeLate();
        for (int i = 0; i < kRounds; ++i) {
            offered = jar.NewCookie(nullptr);
            lost += jar.DisposeCookie(offered) != kNoErr;
        }
        done = true;
    });
    EXPECT_EQ(0, lost);
    jar.Uninit();
}

// Threads make, look up and end cookies; one holds rights while another gives them back. Every object is ended once.
TEST_F(Cookies, AreSafeBetweenThreads) {
    constexpr int kThreads = 8, kRounds = 3000;
    CookieJar<std::atomic<int>*> jar;
    ASSERT_EQ(kNoErr, jar.Init(1));
    std::atomic<MagicCookie> offered{0};
    std::atomic<int> ended{0}, wrong{0};
    std::vector<std::atomic<int>> users(kThreads * kRounds);
    auto release = [&](MagicCookie cookie) {
        if (jar.ReleaseCookieRights(cookie) == 1) ++ended;
    };
    auto work = [&](int thread) {
        for (int i = 0; i < kRounds; ++i) {
            std::atomic<int>& mine = users[static_cast<size_t>(thread * kRounds + i)];
            MagicCookie cookie = jar.NewCookie(&mine);
            offered = cookie;
            MagicCookie other = offered;
            std::atomic<int>* object = nullptr;
            if (jar.AcquireCookieRights(other, &object)) {
                if (!object)
                    ++wrong;
                else
                    object->fetch_add(1);
                release(other);
            }
            if (jar.GetCookieInfo(cookie, &object) != kNoErr || object != &mine) ++wrong;
            release(cookie);
        }
    };
    InThreads(kThreads, work);
    EXPECT_EACH(wrong == 0, kThreads * kRounds == ended);
    int32 left = -1;
    jar.GetNumCookies(&left);
    EXPECT_EQ(0, left);
    jar.Uninit();
}

}  // namespace
}  // namespace tessel::test
