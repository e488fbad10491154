#include "platform/Debugger.h"
#include "platform/LastError.h"
#include "platform/MemoryRead.h"
#include "platform/Module.h"
#include "platform/Process.h"
#include "platform/System.h"
#include "platform/Thread.h"
#include "platform/posix/Errors.h"
#include "support/FailingPlatform.h"
#include "support/Test.h"

#include <errno.h>
#include <fstream>
#include <iterator>
#include <sys/mman.h>
#include <sys/ptrace.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tessel::test {

// A function that the dynamic linker does not know: it is in the program's own symbols only.
__attribute__((noinline)) int Landmark(int value) {
    return value + 42;
}

}  // namespace tessel::test

namespace tessel::platform {
namespace {

using test::FailingPlatform;

TEST(LastError, NumbersAreTheDocumentedOnes) {
    const std::pair<int, ErrorNumber> rows[] = {
        {ENOENT, 2},         {EMFILE, 4},   {EACCES, 5},     {EPERM, 5},    {EISDIR, 5},    {EBADF, 6},
        {ENOMEM, 8},         {EXDEV, 17},   {EBUSY, 32},     {ETXTBSY, 32}, {EAGAIN, 33},   {EHOSTUNREACH, 53},
        {EINVAL, 87},        {ENOSPC, 112}, {EDQUOT, 112},   {EEXIST, 183}, {ENOTDIR, 267}, {ENOTEMPTY, 145},
        {ENAMETOOLONG, 123}, {EIO, 1117},   {ENOMEDIUM, 21}, {0, 0},        {99999, 31}};
    for (const auto& [error, number] : rows) EXPECT_EQ(number, ErrorOfErrno(error)) << error;
}

TEST(LastError, IsEachThreadsOwn) {
    SetLastError(5);
    std::thread([] {
        EXPECT_EQ(0u, LastError());
        SetLastError(7);
    }).join();
    EXPECT_EQ(5u, LastError());
}

TEST(MemoryRead, StopsAtWhatCannotBeRead) {
    const std::size_t page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
    char* pages =
        static_cast<char*>(mmap(nullptr, 3 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    std::memset(pages, 'x', 3 * page);
    ASSERT_EQ(0, mprotect(pages + 2 * page, page, PROT_NONE));
    std::string buffer(3 * page, 0);
    for (bool kernelReads : {true, false}) {
        FailingPlatform failing("process_vm_readv", 1, EPERM, kernelReads ? 0 : 100);
        EXPECT_EACH(2 * page == ReadMemory(pages, buffer.data(), 3 * page),
                    std::string(2 * page, 'x') == buffer.substr(0, 2 * page),
                    ReadMemory(pages + 2 * page - 5, buffer.data(), 10) == 5u,
                    ReadMemory(pages + 2 * page, buffer.data(), 10) == 0u, ReadMemory(nullptr, buffer.data(), 10) == 0u,
                    ReadMemory(reinterpret_cast<void*>(~std::uintptr_t{0} - 4), buffer.data(), 10) == 0u,
                    ReadMemory("abc", buffer.data(), 3) == 3u, buffer.substr(0, 3) == "abc");
    }
    munmap(pages, 3 * page);
}

TEST(MemoryRead, AForkedChildReadsItself) {
    static int value = 1;
    int seen = 0;
    ReadMemory(&value, &seen, sizeof seen);
    pid_t child = fork();
    if (child == 0) {
        value = 2;
        ReadMemory(&value, &seen, sizeof seen);
        _exit(seen);
    }
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EACH(WEXITSTATUS(status) == 2, seen == 1);
}

TEST(Process, EnvironmentIsExpanded) {
    setenv("TESSEL_TEST_A", "alpha", 1);
    EXPECT_EACH(EnvironmentExpand("%TESSEL_TEST_A%/%TESSEL_TEST_A%") == "alpha/alpha",
                EnvironmentExpand("100% %TESSEL_TEST_NONE%%TESSEL_TEST_A%") == "100% %TESSEL_TEST_NONE%alpha",
                EnvironmentExpand("%%TESSEL_TEST_A") == "%%TESSEL_TEST_A");
    unsetenv("TESSEL_TEST_A");
    EXPECT_EQ(nullptr, EnvironmentGet("TESSEL_TEST_A"));
}

TEST(Process, ArgumentsAreTheHosts) {
    std::ifstream file("/proc/self/cmdline", std::ios::binary);
    std::string expected{std::istreambuf_iterator<char>(file), {}}, joined;
    for (const std::string& argument : ProcessArguments()) joined += argument + '\0';
    EXPECT_EQ(expected, joined);
    EXPECT_EXIT(ProcessExit(3), ::testing::ExitedWithCode(3), "");
}

TEST(Debugger, OutputGoesToStandardError) {
    ::testing::internal::CaptureStderr();
    DebuggerOutput("to whom it may concern\n");
    DebuggerOutput(nullptr);
    EXPECT_EQ("to whom it may concern\n", ::testing::internal::GetCapturedStderr());
    ::testing::internal::CaptureStdout();
    ConsoleOutput("to the user", 6);
    EXPECT_EQ("to the", ::testing::internal::GetCapturedStdout());
}

TEST(Debugger, AttachedIsWhoTraces) {
    if (DebuggerAttached()) GTEST_SKIP() << "this test runs under a debugger";
    pid_t child = fork();
    if (child == 0) {
        if (ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0) _exit(2);
        _exit(DebuggerAttached() ? 1 : 0);
    }
    int status = 0;
    waitpid(child, &status, 0);
    if (WEXITSTATUS(status) == 2) GTEST_SKIP() << "this host does not trace";
    EXPECT_EQ(1, WEXITSTATUS(status));
}

TEST(Module, AddressesHaveNames) {
    AddressEntry entry;
    const char* landmark = reinterpret_cast<const char*>(&test::Landmark);
    ASSERT_TRUE(DescribeAddress(landmark + 1, entry));
    EXPECT_EACH(entry.symbol == "tessel::test::Landmark(int)", entry.module == "platform_tests", entry.offset == 1u);
    ASSERT_TRUE(DescribeAddress(reinterpret_cast<const void*>(&std::terminate), entry));
    EXPECT_EACH(entry.symbol == "std::terminate()", !DescribeAddress(nullptr, entry));
}

TEST(Module, ModulesHaveFiles) {
    std::string executable, own;
    ASSERT_TRUE(ModuleFileName(kExecutable, executable));
    EXPECT_THAT(executable, ::testing::AllOf(::testing::StartsWith("C:\\"), ::testing::EndsWith("\\platform_tests")));
    ASSERT_TRUE(ModuleFileName(OwnModule(), own));  // the library's objects are part of this program
    EXPECT_EACH(executable == own, !ModuleFileName(12345, own), LastError() == kErrorModuleNotFound);
}

TEST(Module, LibrariesAreLoadedByName) {
    LibraryHandle library = LibraryLoad("libm.so.6");
    ASSERT_NE(nullptr, library);
    auto cosine = reinterpret_cast<double (*)(double)>(LibrarySymbol(library, "cos"));
    ASSERT_NE(nullptr, cosine);
    EXPECT_EACH(cosine(0.0) == 1.0, LibrarySymbol(library, "TesselNoSuchThing") == nullptr,
                LastError() == kErrorProcedureNotFound, LibraryUnload(library),
                LibraryLoad("tessel-no-such-library.so") == nullptr, LastError() == kErrorModuleNotFound);
}

TEST(System, FactsAgreeWithTheHost) {
    SystemVersion version = GetSystemVersion();
    EXPECT_EACH(version.family == "Linux",
                version.version.find(std::to_string(version.major) + "." + std::to_string(version.minor)) == 0u,
                !version.name.empty());
    ProcessorFacts facts = GetProcessorFacts();
    EXPECT_EQ(NumberOfProcessors(), facts.logical);
    EXPECT_NE(0u, facts.features & kCompareExchange8);  // of every processor this builds for
    unsigned char first[16] = {}, second[16] = {};
    FailingPlatform failing("getrandom", 1, EINTR);
    EXPECT_EACH(RandomBytes(first, sizeof first), RandomBytes(second, sizeof second),
                std::memcmp(first, second, sizeof first) != 0);
}

struct Worker {
    std::atomic<bool> started{false}, stop{false};
    std::atomic<ThreadId> id{0};
};

std::int32_t WorkUntilStopped(void* argument) {
    Worker& worker = *static_cast<Worker*>(argument);
    worker.id = CurrentThreadId();
    worker.started = true;
    while (!worker.stop) YieldThread();
    return 17;
}

TEST(Thread, RunsAndReturnsItsCode) {
    Worker worker;
    ThreadId id = 0;
    ThreadHandle thread = ThreadStart(WorkUntilStopped, &worker, id);
    ASSERT_NE(nullptr, thread);
    bool running = false;
    std::int32_t code = 0;
    EXPECT_EACH(ThreadRunning(thread, running), running, ThreadExitCode(thread, code), code == 259,
                !ThreadJoin(thread, 5), LastError() == kErrorTimedOut);
    worker.stop = true;
    EXPECT_EACH(ThreadJoin(thread, -1), ThreadJoin(thread, 0), id == worker.id, id != CurrentThreadId(),
                ThreadRunning(thread, running), !running, ThreadExitCode(thread, code), code == 17, ThreadClose(thread),
                !ThreadRunning(nullptr, running), LastError() == kErrorInvalidHandle);
}

TEST(Thread, HandlesMayGoBeforeTheThread) {
    static Worker worker;  // the thread is not waited for
    ThreadId id = 0;
    ThreadClose(ThreadStart(WorkUntilStopped, &worker, id));
    while (!worker.started) YieldThread();
    worker.stop = true;
    ThreadHandle self = ThreadOpenCurrent();
    bool running = false;
    EXPECT_EACH(ThreadRunning(self, running), running);
    EXPECT_FALSE(ThreadEnd(self, 0));  // not started here
    EXPECT_EQ(kErrorAccessDenied, LastError());
    EXPECT_TRUE(ThreadClose(self));
}

TEST(Thread, StackAndSlotsAreItsOwn) {
    LocalKey key = LocalKeyAllocate();
    ASSERT_NE(kNoLocalKey, key);
    EXPECT_EQ(nullptr, LocalGet(key));
    int here = 0;
    EXPECT_TRUE(LocalSet(key, &here));
    StackBounds mine = CurrentStackBounds();
    std::thread([&] {
        int there = 0;
        EXPECT_EQ(nullptr, LocalGet(key));
        StackBounds bounds = CurrentStackBounds();
        std::uintptr_t frame = reinterpret_cast<std::uintptr_t>(__builtin_frame_address(0));
        EXPECT_EACH(bounds.low < frame, frame < bounds.high, mine.high != bounds.high, LocalSet(key, &there));
    }).join();
    EXPECT_EACH(&here == LocalGet(key), LocalKeyFree(key), !LocalSet(kNoLocalKey, &here));
}

}  // namespace
}  // namespace tessel::platform
