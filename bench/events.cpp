// Occurrences and event queues.
#include "support/Compare.h"
#include <tessel/tessel.h>

#include <QCoreApplication>
#include <QEvent>
#include <QObject>
#include <algorithm>
#include <atomic>
#include <boost/signals2.hpp>
#include <chrono>
#include <glib.h>
#include <random>
#include <thread>
#include <vector>

namespace {

using namespace tessel;
using bench::Keep;
using Clock = std::chrono::steady_clock;

double SecondsSince(Clock::time_point start) {
    return std::chrono::duration<double>(Clock::now() - start).count();
}

// ---- setting and running --------------------------------------------------------------------------------------------

struct Counted {
    OccurHdlr handler = 0;
    std::uint64_t calls = 0;
    static void Call(void* counted) {
        auto* own = static_cast<Counted*>(counted);
        ++own->calls;
        OnOccurrence(own->handler, false);
    }
};

void CompareSetting(bench::Table& table) {
    Counted counted;
    const Occurrence occurrence = AllocOccur();
    counted.handler = AllocOccurHdlr(occurrence, Counted::Call, &counted);
    OnOccurrence(counted.handler, false);
    boost::signals2::signal<void()> signal;
    std::uint64_t calls = 0;
    signal.connect([&] { ++calls; });
    table.Compare(
        "Occur + ChkOccurrences + arming again, one handler",
        [=](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) {
                Occur(occurrence);
                ChkOccurrences();
            }
        },
        "boost::signals2, one slot",
        [&](std::uint64_t operations) {
            for (std::uint64_t i = 0; i < operations; ++i) signal();
        },
        1.0);
    Keep(calls);
    DeallocOccurHdlr(counted.handler);
    DeallocOccur(occurrence);
}

// ---- to another thread ----------------------------------------------------------------------------------------------

std::atomic<std::uint64_t> arrived{0};

void AwaitArrival(std::uint64_t count) {
    while (arrived.load(std::memory_order_acquire) < count) std::this_thread::yield();
}

// A thread that checks its group whenever it is told.
class CheckingThread {
public:
    CheckingThread() {
        ThEventCreate(&told_, 0, false);
        occurrence_ = AllocOccur();
        handler_ = AllocOccurHdlr(occurrence_, Arrive, this);
        thread_ = std::thread([this] { Run(); });
        while (!armed_) ThPause(1);
    }
    ~CheckingThread() {
        stop_ = true;
        ThEventSignal(told_);
        thread_.join();
        DeallocOccurHdlr(handler_);
        DeallocOccur(occurrence_);
        ThEventDestroy(told_);
    }
    void Set() { Occur(occurrence_); }

private:
    static void Arrive(void* self) {
        OnOccurrence(static_cast<CheckingThread*>(self)->handler_, false);
        arrived.fetch_add(1, std::memory_order_release);
    }
    void Run() {
        ThThread self = nullptr;
        ThPseudoThreadCreate(&self);
        SetOccThreadGroupProc(
            ThThreadGetIndex(self), [](void* told) { ThEventSignal(static_cast<ThEvent>(told)); }, told_);
        OnOccurrence(handler_, false);
        armed_ = true;
        while (!stop_) {
            ThEventWait(told_);
            ChkOccurrences();
        }
        ThThreadDestroy(self);
    }

    ThEvent told_ = nullptr;
    Occurrence occurrence_ = 0;
    OccurHdlr handler_ = 0;
    std::atomic<bool> armed_{false}, stop_{false};
    std::thread thread_;
};

void CompareLatency(bench::Table& table) {
    CheckingThread checking;
    GMainContext* context = g_main_context_new();
    GMainLoop* loop = g_main_loop_new(context, FALSE);
    std::thread main([=] {
        g_main_context_push_thread_default(context);
        g_main_loop_run(loop);
    });
    while (!g_main_loop_is_running(loop)) ThPause(1);
    table.Compare(
        "Occur to the callback on another thread",
        [&](std::uint64_t operations) {
            const std::uint64_t start = arrived;
            for (std::uint64_t i = 1; i <= operations; ++i) {
                checking.Set();
                AwaitArrival(start + i);
            }
        },
        "g_main_context_invoke",
        [=](std::uint64_t operations) {
            const std::uint64_t start = arrived;
            for (std::uint64_t i = 1; i <= operations; ++i) {
                g_main_context_invoke(
                    context,
                    [](gpointer) -> gboolean { return arrived.fetch_add(1, std::memory_order_release), FALSE; },
                    nullptr);
                AwaitArrival(start + i);
            }
        },
        0.5);
    g_main_loop_quit(loop);
    main.join();
    g_main_loop_unref(loop);
    g_main_context_unref(context);
}

// ---- time-outs ------------------------------------------------------------------------------------------------------

constexpr int kTimeOut = 5, kTimeOuts = 300;  // milliseconds; how many

Clock::time_point startOfTimeOut;
std::vector<double> lateness;
bool over;

void NoteLateness() {
    lateness.push_back(std::max(1e-6, SecondsSince(startOfTimeOut) - kTimeOut * 1e-3));
    over = true;
}

std::vector<double> OurLateness() {
    ThEvent told = nullptr;
    ThEventCreate(&told, 0, false);
    SetOccThreadGroupProc(
        0, [](void* event) { ThEventSignal(static_cast<ThEvent>(event)); }, told);
    const Occurrence occurrence = AllocOccur();
    const OccurHdlr handler = AllocOccurHdlr(
        occurrence, [](void*) { NoteLateness(); }, nullptr);
    lateness.clear();
    for (int i = 0; i < kTimeOuts; ++i) {
        startOfTimeOut = Clock::now();
        OnOccurrenceWithTimeout(handler, true, kTimeOut);
        for (over = false; !over; ChkOccurrences()) ThEventWait(told);
    }
    SetOccThreadGroupProc(0, nullptr, nullptr);
    DeallocOccurHdlr(handler);
    DeallocOccur(occurrence);
    ThEventDestroy(told);
    std::sort(lateness.begin(), lateness.end());
    return lateness;
}

std::vector<double> TheirLateness() {
    lateness.clear();
    for (int i = 0; i < kTimeOuts; ++i) {
        startOfTimeOut = Clock::now();
        g_timeout_add(
            kTimeOut, [](gpointer) -> gboolean { return NoteLateness(), FALSE; }, nullptr);
        for (over = false; !over;) g_main_context_iteration(nullptr, TRUE);
    }
    std::sort(lateness.begin(), lateness.end());
    return lateness;
}

void CompareTimeOuts(bench::Table& table) {
    const std::vector<double> ours = OurLateness(), theirs = TheirLateness();
    const size_t median = kTimeOuts / 2, last = kTimeOuts * 99 / 100;
    table.Row("lateness of a time-out of 5 ms, median", ours[median], "g_timeout_add", theirs[median], 1.0);
    table.Row("the same, 99th percentile", ours[last], "g_timeout_add", theirs[last], 1.0);
}

// ---- the schedule ---------------------------------------------------------------------------------------------------

// Seconds for each of so many inserts in random order.
double InsertTime(size_t count) {
    std::mt19937 random(7);
    std::vector<Occurrence> occurrences(count);
    for (Occurrence& occurrence : occurrences) occurrence = AllocOccur();
    const uint32 base = MilliSecs() + 1000000;
    const auto start = Clock::now();
    for (Occurrence occurrence : occurrences) OccurAtTime(occurrence, base + random() % 1000000);
    const double taken = SecondsSince(start) / static_cast<double>(count);
    for (Occurrence occurrence : occurrences) DeallocOccur(occurrence);
    return taken;
}

void CompareSchedules(bench::Table& table) {
    std::vector<double> few, many;
    for (int turn = 0; turn < 15; ++turn) {
        few.push_back(InsertTime(100));
        many.push_back(InsertTime(10000));
    }
    table.Row("OccurAtTime, 10,000 in random order, each", bench::Median(many), "the same, 100", bench::Median(few),
              10);
}

// ---- queues ---------------------------------------------------------------------------------------------------------

struct NumberedEvent : MGRefCounted<MGEvent> {
    explicit NumberedEvent(int32 numberOf) : number(numberOf) {}
    int32 GetKind() override { return number; }
    bool IsEquivalent(MGEvent* other) override { return static_cast<NumberedEvent*>(other)->number == number; }
    void WriteToDebugStream(DebugStream&) override {}
    const int32 number;
};

struct CountingTarget : MGRefCounted<MGEventTarget> {
    int32 CheckEvent(MGEvent*) override { return kDeliver; }
    void HandleEvent(MGEvent*) override { ++handled; }
    void WriteToDebugStream(DebugStream&) override {}
    std::uint64_t handled = 0;
};

struct CountingObject : QObject {
    bool event(QEvent*) override { return ++handled != 0; }
    std::uint64_t handled = 0;
};

constexpr std::uint64_t kBatch = 1000;

// So many, a batch at a time.
template <class Post, class Drain>
bench::Loop InBatches(Post post, Drain drain) {
    return [=](std::uint64_t operations) {
        for (std::uint64_t done = 0; done < operations; done += kBatch) {
            for (std::uint64_t i = 0; i < kBatch; ++i) post();
            drain();
        }
    };
}

void CompareQueues(bench::Table& table) {
    MGEventQueue* queue = CreateMGEventQueue("bench", 0);
    queue->Init();
    auto* target = new CountingTarget;
    auto* event = new NumberedEvent(0);
    const bench::Loop ours = InBatches(
        [=] {
            event->AddRef();
            queue->PostEvent(target, event, true, nullptr);
        },
        [=] { queue->ProcessEvents(0, nullptr, 0); });
    CountingObject object;
    table.Compare("PostEvent + ProcessEvents, an event", ours, "QCoreApplication, posted events",
                  InBatches([&] { QCoreApplication::postEvent(&object, new QEvent(QEvent::User)); },
                            [] { QCoreApplication::sendPostedEvents(); }),
                  0.1);
    GAsyncQueue* async = g_async_queue_new();
    table.Compare("the same", ours, "GAsyncQueue push + pop",
                  InBatches([=] { g_async_queue_push(async, event); },
                            [=] {
                                for (std::uint64_t i = 0; i < kBatch; ++i) Keep(g_async_queue_pop(async));
                            }),
                  1.5);
    g_async_queue_unref(async);

    constexpr int kQueued = 1000;
    for (int i = 1; i <= kQueued; ++i) queue->PostEvent(target, new NumberedEvent(i), true, nullptr);
    auto* last = new NumberedEvent(kQueued);
    const bench::Loop search = [=](std::uint64_t operations) {
        for (std::uint64_t i = 0; i < operations; ++i) {
            last->AddRef();
            queue->PostEvent(target, last, false, nullptr);
        }
    };
    const std::uint64_t count = bench::Calibrate(search);
    table.Row("look for a duplicate among 1,000, an element",
              bench::Seconds(search, count) / static_cast<double>(count * kQueued), "3 ns", 3e-9, 1.0);
    queue->Uninit();
    queue->Destroy();
    for (MGUnknown* own : std::initializer_list<MGUnknown*>{target, event, last}) own->Release();
}

}  // namespace

int main(int argc, char** argv) {
    if (InitTesselBase() != kNoErr || InitTesselAppSupport() != kNoErr) return 1;
    AssimilateStartUpThread();
    if (HardWaitBehaviorService()->Init() != kNoErr || OccurrenceManagerService()->Init() != kNoErr) return 1;
    QCoreApplication application(argc, argv);
    {
        bench::Table table("events");
        CompareSetting(table);
        CompareLatency(table);
        CompareTimeOuts(table);
        CompareSchedules(table);
        CompareQueues(table);
    }
    OccurrenceManagerService()->Uninit();
    HardWaitBehaviorService()->Uninit();
    UninitTesselAppSupport();
    return UninitTesselBase();
}
