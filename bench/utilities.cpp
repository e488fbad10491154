// Sorting, searching, random numbers and the registry.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <mutex>
#include <random>
#include <semaphore>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

namespace {

using bench::Keep;

constexpr int32 kCount = 100000;

struct Record {
    std::int64_t key;
    std::int64_t value[2];
};

int32_t MakeKey(std::mt19937& random, const std::string& shape, int32 i) {
    if (shape == "sorted") return i;
    if (shape == "reversed") return kCount - i;
    if (shape == "equal") return 7;
    if (shape == "sorted but for the last 1,000" && i < kCount - 1000) return i * 10000;
    return static_cast<int32>(random() % 1000000000);
}

std::vector<int32> Numbers(const std::string& shape) {
    std::mt19937 random(1);
    std::vector<int32> numbers;
    for (int32 i = 0; i < kCount; ++i) numbers.push_back(MakeKey(random, shape, i));
    return numbers;
}

std::vector<Record> Records(const std::string& shape) {
    std::vector<Record> records;
    for (int32 key : Numbers(shape)) records.push_back({key, {key, key}});
    return records;
}

// A host's own comparisons: both sorts call them through a pointer.
[[gnu::noinline]] int32 CompareNumbers(const void* a, const void* b) {
    int32 left = *static_cast<const int32*>(a), right = *static_cast<const int32*>(b);
    return (left > right) - (left < right);
}

[[gnu::noinline]] int32 CompareRecords(const void* a, const void* b) {
    std::int64_t left = static_cast<const Record*>(a)->key, right = static_cast<const Record*>(b)->key;
    return (left > right) - (left < right);
}

// Not inlined into the benchmark, as ours cannot be.
void (*volatile hostSort)(void*, size_t, size_t, int (*)(const void*, const void*)) = std::qsort;
void* (*volatile hostSearch)(const void*, const void*, size_t, size_t, int (*)(const void*, const void*)) = bsearch;

template <class T>
void CompareSorts(bench::Table& table, const std::string& what, const std::vector<T>& input, CompareProc compare,
                  double goal) {
    std::vector<T> work = input;
    auto timed = [&](auto sort) {
        return [&work, &input, sort] {
            work = input;
            return bench::Seconds([&](std::uint64_t) { sort(); }, 1);
        };
    };
    auto ours = timed([&] { QSort(work.data(), kCount, sizeof(T), compare); });
    auto theirs = timed([&] { hostSort(work.data(), kCount, sizeof(T), compare); });
    table.CompareTimed("QSort of 100,000 " + what, ours, "qsort", theirs, goal);
}

void CompareSearches(bench::Table& table, CompareProc compare, const char* what) {
    const std::vector<int32> numbers = Numbers("sorted");
    std::vector<int32> keys;
    std::mt19937 random(3);
    for (int i = 0; i < 4096; ++i) keys.push_back(static_cast<int32>(random() % (kCount + kCount / 10)));
    table.Compare(
        std::string("BinSearch among 100,000 int32, ") + what,
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i)
                Keep(BinSearch(numbers.data(), kCount, sizeof(int32), &keys[i % keys.size()], compare));
        },
        "bsearch",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i)
                Keep(hostSearch(&keys[i % keys.size()], numbers.data(), kCount, sizeof(int32), compare));
        },
        1.0);
}

void CompareRandom(bench::Table& table) {
    std::binary_semaphore end(0);
    std::thread second([&] { end.acquire(); });  // so that std::mutex takes no single-threaded short cut
    InitRandomGen();
    std::minstd_rand generator(1);
    std::mutex mutex;
    table.Compare(
        "RandomGen, program with a second thread",
        [](std::uint64_t operations) {
            double number = 0;
            for (std::uint64_t i = 0; i < operations; ++i) {
                RandomGen(&number);
                Keep(number);
            }
        },
        "minstd_rand, std::mutex",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                std::lock_guard<std::mutex> lock(mutex);
                Keep(generator());
            }
        },
        1.5);
    UninitRandomGen();
    end.release();
    second.join();
}

void CompareRegistry(bench::Table& table) {
    char folder[] = "/tmp/bench_utilities_XXXXXX";
    if (!mkdtemp(folder)) return;
    setenv("TESSEL_REGISTRY", folder, 1);
    const std::string file = std::string(folder) + "/small";
    const std::string text = "C:\\Program Files\\Maker\\Product\\settings.ini";
    tessel::AutoRelease<tessel::IWinRegistryKey> key;
    tessel::GetCurrentUserRegistryKey(0)->CreateSubKey("Software\\Maker\\Product", key.Out());
    key->SetStringValue("Path", text.c_str());
    int made = open(file.c_str(), O_CREAT | O_WRONLY, 0600);
    if (write(made, text.c_str(), text.size()) < 0) return;
    close(made);
    table.Compare(
        "read a string value of an open registry key",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) Keep(*key->GetStringValue("Path"));
        },
        "open, read, close a small file",
        [&](std::uint64_t operations) {
            char buffer[4096];
            for (std::uint64_t i = 0; i < operations; ++i) {
                int opened = open(file.c_str(), O_RDONLY | O_CLOEXEC);
                Keep(read(opened, buffer, sizeof buffer));
                close(opened);
            }
        },
        1.5);
    key.Reset(nullptr);
    std::filesystem::remove_all(folder);
}

}  // namespace

int main() {
    DebugOutputSetHandler([](CStr, int32, CStr, int32, uint32, CStr) {});
    if (InitTesselBase() != kNoErr) return 1;
    {
        bench::Table table("utilities");
        for (const char* shape : {"random", "sorted", "reversed", "equal"}) {
            const std::vector<int32> numbers = Numbers(shape);
            CompareSorts(table, std::string("int32, ") + shape, numbers, CompareNumbers, 0.9);
            CompareSorts(table, std::string("int32, CompareInt32s, ") + shape, numbers, CompareInt32s, 0.9);
            CompareSorts(table, std::string("24-byte records, ") + shape, Records(shape), CompareRecords, 0.9);
        }
        // A merge finds order where a partition by the middle of three cannot: to be watched, not to be won.
        const char* shape = "sorted but for the last 1,000";
        CompareSorts(table, std::string("int32, ") + shape, Numbers(shape), CompareNumbers, 2.5);
        CompareSorts(table, std::string("24-byte records, ") + shape, Records(shape), CompareRecords, 2.5);
        CompareSearches(table, CompareNumbers, "a host's comparison");
        CompareSearches(table, CompareInt32s, "CompareInt32s");
        CompareRandom(table);
        CompareRegistry(table);
    }
    UninitTesselBase();
    return 0;
}
