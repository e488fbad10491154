// Handles, tracking, cookies and reports. Tracking is decided when the library starts, so the program runs itself for
// the figures with tracking on (`bench_memory tracked`), and for the memory kept, which wants a fresh process (`kept`).
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <map>
#include <numeric>
#include <random>
#include <semaphore>
#include <string>
#include <thread>
#include <unistd.h>
#include <unordered_map>

namespace {

using bench::Keep;
using bench::Loop;

constexpr int kDepth = 16;
constexpr std::uint32_t kLive = 100000;
constexpr std::uint32_t kFew = 1000;
constexpr std::uint32_t kMany = 1000000;

// ---- what is measured -----------------------------------------------------------------------------------------------

void CreateAndDispose(std::uint64_t operations) {
    for (std::uint64_t i = 0; i < operations; ++i) DSDisposeHandle(DSNewHandle(64));
}

[[gnu::noinline]] void AtDepth(int depth, std::uint64_t operations) {
    if (depth > 0) {
        AtDepth(depth - 1, operations);
        asm volatile("");
        return;
    }
    CreateAndDispose(operations);
}

void CreateAndDisposeDeep(std::uint64_t operations) {
    AtDepth(kDepth, operations);
}

void MallocAndFree(std::uint64_t operations) {
    for (std::uint64_t i = 0; i < operations; ++i) {
        void* block = std::malloc(64);
        Keep(block);
        std::free(block);
    }
}

// Registers only: what two threads of it gain is what the machine has to give.
void CountUp(std::uint64_t operations) {
    std::uint64_t sum = 0;
    for (std::uint64_t i = 0; i < operations; ++i) asm volatile("" : "+r"(sum));
    Keep(sum);
}

// Runs `operations` of the loop on each of two threads at once; the seconds from the start to the later end.
double OnTwoThreads(const Loop& loop, std::uint64_t operations) {
    std::atomic<int> ready{0};
    std::atomic<bool> go{false};
    auto body = [&] {
        ready.fetch_add(1);
        while (!go.load()) {
        }
        loop(operations);
    };
    std::thread first(body), second(body);
    while (ready.load() < 2) {
    }
    auto start = std::chrono::steady_clock::now();
    go.store(true);
    first.join();
    second.join();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// Time of one operation, by one thread and by two at once.
struct Scaling {
    double one;
    double two;
};

Scaling MeasureScaling(const Loop& loop) {
    std::uint64_t operations = bench::Calibrate(loop) * 2;
    std::vector<double> one, two;
    for (int turn = 0; turn < 9; ++turn) {
        one.push_back(bench::Seconds(loop, operations) / static_cast<double>(operations));
        two.push_back(OnTwoThreads(loop, operations) / static_cast<double>(operations) / 2);
    }
    return {bench::Median(one), bench::Median(two)};
}

std::vector<std::uint32_t> RandomOrder(std::uint32_t count) {
    std::vector<std::uint32_t> order(count);
    std::iota(order.begin(), order.end(), 0u);
    std::shuffle(order.begin(), order.end(), std::mt19937(20));
    return order;
}

// Live handles, visited in random order.
class Handles {
public:
    explicit Handles(std::uint32_t count) : handles_(count) {
        for (std::uint32_t index : RandomOrder(count)) handles_[index] = DSNewHandle(64);
    }
    ~Handles() {
        for (UHandle handle : handles_) DSDisposeHandle(handle);
    }
    Handles(const Handles&) = delete;
    Handles& operator=(const Handles&) = delete;

    Loop Check() const {
        return [this](std::uint64_t operations) {
            MgErr result = 0;
            for (std::uint64_t i = 0, at = 0; i < operations; ++i, at = at + 1 == handles_.size() ? 0 : at + 1) {
                result |= DSCheckHandle(handles_[at]);
            }
            Keep(result);
        };
    }
    Loop Size() const {
        return [this](std::uint64_t operations) {
            std::uint32_t sum = 0;
            for (std::uint64_t i = 0, at = 0; i < operations; ++i, at = at + 1 == handles_.size() ? 0 : at + 1) {
                sum += DSGetHandleSize(handles_[at]);
            }
            Keep(sum);
        };
    }

private:
    std::vector<UHandle> handles_;
};

// A walk through a random ring: each load gives the place of the next.
class DependentLoads {
public:
    explicit DependentLoads(std::uint32_t count) : next_(count) {
        std::vector<std::uint32_t> order = RandomOrder(count);
        for (std::uint32_t i = 0; i < count; ++i) next_[order[i]] = &next_[order[(i + 1) % count]];
    }
    Loop Walk() const {
        return [this](std::uint64_t operations) {
            const void* at = &next_[0];
            for (std::uint64_t i = 0; i < operations; ++i) at = *static_cast<const void* const*>(at);
            Keep(at);
        };
    }

private:
    std::vector<const void*> next_;
};

// The jar is filled before the map, so that neither lies scattered among the other's blocks.
class Cookies {
public:
    explicit Cookies(std::uint32_t count) : jar_(MCNewJar()), cookies_(count) {
        const std::vector<std::uint32_t> order = RandomOrder(count);
        for (std::uint32_t index : order) {
            void* info = &cookies_[index];
            cookies_[index] = MCNewCookie(jar_, &info);
        }
        for (std::uint32_t index : order) map_.emplace(cookies_[index], &cookies_[index]);
    }
    ~Cookies() { MCDisposeJar(jar_); }
    Cookies(const Cookies&) = delete;
    Cookies& operator=(const Cookies&) = delete;

    Loop Lookup() const {
        return [this](std::uint64_t operations) {
            void* info = nullptr;
            for (std::uint64_t i = 0, at = 0; i < operations; ++i, at = at + 1 == cookies_.size() ? 0 : at + 1) {
                MCGetCookieInfo(jar_, cookies_[at], &info);
                Keep(info);
            }
        };
    }
    Loop Find() const {
        return [this](std::uint64_t operations) {
            for (std::uint64_t i = 0, at = 0; i < operations; ++i, at = at + 1 == cookies_.size() ? 0 : at + 1) {
                Keep(map_.find(cookies_[at])->second);
            }
        };
    }

private:
    MagicCookieJar jar_;
    std::vector<MagicCookie> cookies_;
    std::unordered_map<std::uint32_t, void*> map_;
};

// Grows to 1 MiB by steps of so many bytes.
constexpr std::uint32_t kGrowTo = 1 << 20;

template <std::uint32_t step>
double GrowHandle() {
    return bench::Seconds(
        [](std::uint64_t) {
            UHandle handle = DSNewHandle(step);
            for (std::uint32_t size = 2 * step; size <= kGrowTo; size += step) {
                DSSetHandleSize(handle, size);
                (*handle)[size - 1] = 1;
            }
            DSDisposeHandle(handle);
        },
        1);
}

template <std::uint32_t step>
double GrowBlock() {
    return bench::Seconds(
        [](std::uint64_t) {
            auto* block = static_cast<unsigned char*>(std::malloc(step));
            for (std::uint32_t size = 2 * step; size <= kGrowTo; size += step) {
                block = static_cast<unsigned char*>(std::realloc(block, size));
                block[size - 1] = 1;
            }
            std::free(block);
        },
        1);
}

void TakeReport(CStr, int32, CStr, int32, uint32, CStr text) {
    Keep(text);
}

void Report(std::uint64_t operations) {
    for (std::uint64_t i = 0; i < operations; ++i) {
        TESSEL_REPORT(kDebugInfo, 0x7B3E91A4u) << "handle " << static_cast<int32>(i) << ", size " << 64u << " in "
                                               << "bench";
    }
}

void PrintIntoBuffer(std::uint64_t operations) {
    char text[256];
    for (std::uint64_t i = 0; i < operations; ++i) {
        std::snprintf(text, sizeof text, "handle %d, size %u in %s", static_cast<int>(i), 64u, "bench");
        Keep(text);
    }
}

// Bytes of memory that the process keeps for each of a million live 64-byte handles, beyond the 64: by its resident
// pages, whoever took them.
double MemoryKept() {
    auto resident = [] {
        long size = 0, pages = 0;
        if (FILE* file = std::fopen("/proc/self/statm", "r")) {
            if (std::fscanf(file, "%ld %ld", &size, &pages) != 2) pages = 0;
            std::fclose(file);
        }
        return static_cast<double>(pages) * static_cast<double>(sysconf(_SC_PAGESIZE));
    };
    std::vector<UHandle> handles(kMany, reinterpret_cast<UHandle>(1));  // its pages are there before
    CreateAndDisposeDeep(kFew);
    double before = resident();
    for (UHandle& handle : handles) handle = DSNewHandle(64);
    double kept = (resident() - before) / kMany - 64;
    for (UHandle handle : handles) DSDisposeHandle(handle);
    return kept;
}

// ---- the runs -------------------------------------------------------------------------------------------------------

class Library {
public:
    Library() {
        DebugOutputSetHandler(&TakeReport);
        if (InitTesselBase() != kNoErr) std::abort();
    }
    ~Library() { UninitTesselBase(); }
    Library(const Library&) = delete;
    Library& operator=(const Library&) = delete;
};

int RunTracked() {
    Library library;
    CreateAndDisposeDeep(1000);
    Scaling scaling = MeasureScaling(CreateAndDisposeDeep);
    std::printf("one %.4f\ntwo %.4f\n", scaling.one * 1e9, scaling.two * 1e9);
    for (std::uint32_t live : {kFew, kMany}) {
        Handles handles(live);
        std::vector<double> times;
        std::uint64_t operations = bench::Calibrate(CreateAndDisposeDeep);
        for (int turn = 0; turn < 9; ++turn) {
            times.push_back(bench::Seconds(CreateAndDisposeDeep, operations) / static_cast<double>(operations));
        }
        std::printf("live%u %.4f\n", live, bench::Median(times) * 1e9);
    }
    return 0;
}

int RunKept() {
    Library library;
    std::printf("kept %.1f\n", MemoryKept());
    return 0;
}

std::string OwnFolder() {
    char name[4096];
    ssize_t length = readlink("/proc/self/exe", name, sizeof name);
    std::string path(name, static_cast<size_t>(std::max<ssize_t>(length, 0)));
    return path.substr(0, path.rfind('/'));
}

// The figures that another program prints, "name value" a line.
std::map<std::string, double> Ask(const std::string& command) {
    std::map<std::string, double> answers;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return answers;
    char name[64];
    double value = 0;
    while (std::fscanf(pipe, "%63s %lf", name, &value) == 2) answers[name] = value;
    pclose(pipe);
    return answers;
}

void CompareSizes(bench::Table& table) {
    for (std::uint32_t live : {kLive, kFew, kMany}) {
        Handles handles(live);
        DependentLoads loads(live);
        std::string among = std::to_string(live) + " live handles";
        table.Compare("DSCheckHandle, " + among, handles.Check(), "one dependent load", loads.Walk(), 4.0);
        table.Compare("DSGetHandleSize, " + among, handles.Size(), "one dependent load", loads.Walk(), 4.0);
        table.Compare("create + dispose, " + among, CreateAndDispose, "malloc + free", MallocAndFree, 2.5);
    }
    for (std::uint32_t live : {kLive, kFew, kMany}) {
        Cookies cookies(live);
        table.Compare("cookie lookup, " + std::to_string(live) + " live, random", cookies.Lookup(),
                      "std::unordered_map::find", cookies.Find(), 0.5);
    }
}

int RunAll() {
    setenv("OV_ALLOC_TRACKER", "off", 1);
    Library library;
    std::binary_semaphore end(0);
    std::thread second([&] { end.acquire(); });  // so that nobody takes a single-threaded short cut

    bench::Table table("memory");
    table.Compare("create + dispose a 64-byte handle, tracking off", CreateAndDispose, "malloc + free", MallocAndFree,
                  2.5);

    std::string folder = OwnFolder();
    std::map<std::string, double> tracked = Ask("env -u OV_ALLOC_TRACKER " + folder + "/bench_memory tracked");
    double sanitizer = Ask(folder + "/peer_leak_sanitizer " + std::to_string(kDepth))["pair"] * 1e-9;
    table.Row("the same, tracking on, call depth 16", tracked["one"] * 1e-9, "LeakSanitizer, same depth", sanitizer,
              1.0);
    table.Row("the same, 1,000 live handles", tracked["live1000"] * 1e-9, "LeakSanitizer, same depth", sanitizer, 1.0);
    table.Row("the same, 1,000,000 live handles", tracked["live1000000"] * 1e-9, "LeakSanitizer, same depth", sanitizer,
              1.0);
    table.Row("the same, 2 threads (time / 2)", tracked["two"] * 1e-9, "its own single thread", tracked["one"] * 1e-9,
              1 / 1.7);
    Scaling machine = MeasureScaling(CountUp);
    table.Row("2 threads that share nothing, on this machine", machine.two, "their own single thread", machine.one,
              1 / 1.7);

    CompareSizes(table);
    table.CompareTimed("grow a handle 16 B to 1 MiB by 16 bytes", GrowHandle<16>, "realloc", GrowBlock<16>, 1.3);
    table.CompareTimed("grow a handle to 1 MiB by 4 bytes", GrowHandle<4>, "realloc", GrowBlock<4>, 20);
    table.CompareTimed("grow a handle to 1 MiB by 1 byte", GrowHandle<1>, "realloc", GrowBlock<1>, 20);
    table.Compare("level-0 report to a handler, three values", Report, "snprintf", PrintIntoBuffer, 1.0);
    table.Count("kept per live 64-byte handle, tracking off", Ask(folder + "/bench_memory kept")["kept"],
                "bytes beyond the 64", 32);
    table.Count("kept per live 64-byte handle, tracking on",
                Ask("env -u OV_ALLOC_TRACKER " + folder + "/bench_memory kept")["kept"], "bytes beyond the 64", 128);

    end.release();
    second.join();
    return 0;
}

}  // namespace

int main(int count, char** arguments) {
    std::string run = count > 1 ? arguments[1] : "";
    return run == "tracked" ? RunTracked() : run == "kept" ? RunKept() : RunAll();
}
