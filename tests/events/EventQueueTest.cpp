#include "EventsTestSupport.h"
#include "events/MGEventQueueImpl.h"
#include "memory/Heap.h"
#include "support/FailingAllocator.h"
#include "support/HandClock.h"

#include <deque>

namespace tessel::test {
namespace {

using Policy = MGEventQueue::DuplicatePostedEventPolicy;

std::atomic<int> live{0};

// Equivalent to the events of its kind.
struct TestEvent : MGRefCounted<MGEvent> {
    explicit TestEvent(int32 kindOf, int serialOf = 0) : kind(kindOf), serial(serialOf) { ++live; }
    ~TestEvent() override { --live; }
    int32 GetKind() override { return kind; }
    bool IsEquivalent(MGEvent* other) override { return other->GetKind() == kind; }
    void WriteToDebugStream(DebugStream& stream) override { ToDebugStream(stream, kind); }
    int32 kind;
    int serial;
};

// Answers for each kind as it is told, and notes what it handles.
struct TestTarget : MGRefCounted<MGEventTarget> {
    int32 CheckEvent(MGEvent* event) override { return answers[event->GetKind()]; }
    void HandleEvent(MGEvent* event) override {
        handled.push_back(static_cast<TestEvent*>(event)->serial);
        if (repost) queue->PostEvent(this, new TestEvent(event->GetKind(), 1000), true, nullptr);
    }
    void WriteToDebugStream(DebugStream&) override {}
    int32 answers[4] = {2, 2, 2, 2};
    std::vector<int> handled;
    MGEventQueue* queue = nullptr;
    bool repost = false;
};

struct FixedPolicy : Policy {
    int32 Decide(MGEventTarget*, MGEvent*) override { return answer; }
    int32 answer = 0;
};

class EventQueueTest : public testing::Test {
protected:
    EventQueueTest() {
        live = 0;
        reports.Clear();
    }
    ~EventQueueTest() override { EXPECT_EQ(0, live); }

    static MGEventQueueImpl* NewQueue(CStr name, uint32 maxSize) {
        auto* queue = static_cast<MGEventQueueImpl*>(CreateMGEventQueue(name, maxSize));
        EXPECT_EQ(kNoErr, queue->Init());
        return queue;
    }
    static void End(MGEventQueue* queue) {
        EXPECT_EACH(queue->Uninit() == kNoErr, live.load() == 0);  // what was queued ends here
        queue->Destroy();
    }

    ReportRecorder reports;
    StartedLibrary library;
    TestTarget* target = new TestTarget;
    std::unique_ptr<TestTarget, uint32 (*)(TestTarget*)> owner{target, [](TestTarget* t) { return t->Release(); }};
};

TEST_F(EventQueueTest, TellsItsStatesAndClasses) {
    char text[kOVGuidTextSize];
    std::vector<std::string> ids;
    for (auto* id : {&MGUnknown::ClassID, &MGEvent::ClassID, &MGEventTargetBase::ClassID, &MGEventTarget::ClassID}) {
        OVGuidToCStr(&id(), text);
        ids.emplace_back(text);
    }
    EXPECT_THAT(ids, ElementsAre("04c7fa68-5a10-49d3-962c-fe1b5547f529", "44800ca1-9918-46e4-b56a-3a6477bd4713",
                                 "01cc1dc9-3c53-4c57-9339-dc06ad470d92", "4e4e9d55-2f55-42db-ae86-3d9af30bf513"));
    EXPECT_EACH(static_cast<MGEventTarget*>(target) == target->QueryClass(MGUnknown::ClassID()),
                target->QueryClass(MGEvent::ClassID()) == nullptr, target->Release() == 1u);

    MGEventQueue* queue = CreateMGEventQueue(nullptr, 2);
    auto* kept = new TestEvent(0, 7);
    EXPECT_EQ(67, queue->PostEvent(target, kept, false, nullptr));  // not running
    EXPECT_FALSE(queue->SetAcceptingEvents(true) || queue->IsAcceptingEvents());
    queue->Init();
    EXPECT_EACH(
        (queue->PostEvent(nullptr, kept, false, nullptr) | queue->PostEvent(target, nullptr, false, nullptr)) == 1,
        queue->PostEvent(target, kept, false, nullptr) == 0,
        queue->PostEvent(target, new TestEvent(3), false, nullptr) == 0);
    char expected[256];
    std::snprintf(expected, sizeof expected,
                  "-->> BEGIN EVENT QUEUE DUMP FOR QUEUE '0x%08llx' <<--\nElements in queue: 2\nMax size:2\n"
                  "[  0] k:0 t:0x%08llx\n[  1] k:3 t:0x%08llx\n<<-- END EVENT QUEUE DUMP -->>",
                  reinterpret_cast<unsigned long long>(queue),
                  reinterpret_cast<unsigned long long>(static_cast<MGEventTarget*>(target)),
                  reinterpret_cast<unsigned long long>(static_cast<MGEventTarget*>(target)));
    TESSEL_REPORT(kDebugInfo, 1) << queue;
    TESSEL_REPORT(kDebugInfo, 2) << kept << static_cast<MGUnknown*>(nullptr);
    EXPECT_THAT(reports.Texts(), ElementsAre(expected, "0<invalid MGUnknown object>"));
    reports.Clear();

    EXPECT_EACH(queue->SetAcceptingEvents(false), queue->HasDispatchableEvent(),
                queue->ProcessEvents(0, nullptr, 0) == 0u);
    EXPECT_EQ(2, queue->PostEvent(target, new TestEvent(0), false, nullptr));  // full as well as closed
    EXPECT_FALSE(queue->SetAcceptingEvents(true));
    EXPECT_EQ(1, queue->PostEvent(target, new TestEvent(0), false, nullptr));  // a duplicate, though full
    EXPECT_EQ(2, queue->PostEvent(target, new TestEvent(0), true, nullptr));
    queue->Destroy();
    EXPECT_EACH((Texts{"Assertion failed: Attempting to destroy a queue that has not been uninitialized!"}) ==
                    reports.Texts(kDebugError),
                PurgeEventsOfKind(nullptr, 1) == 0u);
}

// The events of a queue as the rules have it, of two targets.
struct QueueModel {
    struct Pair {
        int target, kind, serial;
    };
    std::deque<Pair> pairs;
    MGEventQueueImpl::Counters counters{0, 0, 0};
    static constexpr size_t kMax = 8;

    MgErr Post(const Pair& pair, bool append, int policy) {
        auto same = std::find_if(pairs.begin(), pairs.end(), [&](const Pair& queued) {
            return queued.target == pair.target && queued.kind == pair.kind;
        });
        if (!append && same != pairs.end()) {
            if (policy == 1) *same = pair;
            if (policy == 2) pairs.erase(same), ++counters.dropped;
            return 1;
        }
        if (pairs.size() >= kMax) return 2;
        pairs.push_back(pair);
        return 0;
    }
    template <class Matches>
    uint32 Purge(Matches matches) {
        const auto purged = static_cast<uint32>(std::erase_if(pairs, matches));
        counters.purged += purged;
        return purged;
    }
    // Serials of what is delivered to each target.
    uint32 Process(int32 max, TestTarget* const* targets, bool filtered, std::vector<int>* delivered) {
        const size_t limit = max > 0 ? std::min(pairs.size(), static_cast<size_t>(max)) : pairs.size();
        size_t handled = 0;
        for (size_t i = 0; handled < limit && i < pairs.size(); ++handled) {
            i = 0;
            int32 answer = 1;
            for (; i < pairs.size(); i += answer == 1) {
                answer = targets[pairs[i].target]->answers[pairs[i].kind];
                if (answer == 2 && filtered) answer = pairs[i].kind % 3;
                if (answer == 2) break;
                if (answer == 0) pairs.erase(pairs.begin() + static_cast<long>(i)), ++handled, ++counters.dropped;
            }
            if (i >= pairs.size()) return static_cast<uint32>(handled);
            delivered[pairs[i].target].push_back(pairs[i].serial);
            pairs.erase(pairs.begin() + static_cast<long>(i));
            ++counters.delivered;
            i = 0;
        }
        return static_cast<uint32>(handled);
    }
};

TEST_F(EventQueueTest, DoesAsTheRulesSay) {
    std::mt19937 random(3);
    auto any = [&](unsigned below) { return static_cast<int>(random() % below); };
    TestTarget* targets[] = {target, new TestTarget};
    MGEventQueueImpl* queue = NewQueue("model", QueueModel::kMax);
    QueueModel model;
    FixedPolicy policy;
    struct ByKind : MGEventQueue::EventFilter {
        int32 Check(MGEventTarget*, MGEvent* event) override { return event->GetKind() % 3; }
    } filter;
    for (int step = 0; step < 100000 && !HasFailure(); ++step) {
        std::vector<int> delivered[2];
        const int t = any(2), kind = any(4), operation = any(12);
        if (operation < 7) {
            const bool append = any(3) == 0, given = any(2) == 0;
            policy.answer = any(3);
            const MgErr err =
                queue->PostEvent(targets[t], new TestEvent(kind, step), append, given ? &policy : nullptr);
            ASSERT_EQ(model.Post({t, kind, step}, append, given ? policy.answer : 0), err) << step;
        } else if (operation == 7) {
            const int which = any(10);
            TestEvent sample(kind);
            const auto forTarget = [=](const auto& pair) { return pair.target == t; };
            const auto ofKind = [=](const auto& pair) { return pair.kind == kind; };
            if (which == 0) {
                ASSERT_EQ(model.Purge(forTarget), PurgeEventsForTarget(queue, targets[t]));
            } else if (which < 3) {
                ASSERT_EQ(model.Purge(ofKind),
                          which == 1 ? PurgeEventsOfKind(queue, kind) : PurgeSpecificEvent(queue, nullptr, &sample));
            } else {
                ASSERT_EQ(model.Purge([&](const auto& pair) { return forTarget(pair) && ofKind(pair); }),
                          PurgeSpecificEvent(queue, targets[t], &sample));
            }
        } else if (operation == 8) {
            targets[t]->answers[kind] = any(3);
        } else {
            const int32 max = any(4);
            const bool filtered = any(4) == 0;
            const uint32 handled = queue->ProcessEvents(max, filtered ? &filter : nullptr, 0);
            ASSERT_EQ(model.Process(max, targets, filtered, delivered), handled) << step;
        }
        for (int i : {0, 1}) ASSERT_EQ(delivered[i], std::exchange(targets[i]->handled, {})) << step;
        ASSERT_EQ(model.pairs.size(), queue->GetNumEvents()) << step;
        ASSERT_EQ(static_cast<int>(model.pairs.size()), live) << step;  // each released once
        const bool deliverable = std::any_of(model.pairs.begin(), model.pairs.end(), [&](const auto& pair) {
            return targets[pair.target]->answers[pair.kind] == 2;
        });
        ASSERT_EQ(deliverable, queue->HasDispatchableEvent());
        const auto counters = queue->GetCounters();
        ASSERT_TRUE(counters.delivered == model.counters.delivered && counters.purged == model.counters.purged &&
                    counters.dropped == model.counters.dropped);
    }
    EXPECT_EACH(model.counters.delivered > 10000u, QueueModel::kMax == queue->GetMaxSize());
    End(queue);
    targets[1]->Release();
}

TEST_F(EventQueueTest, HandlesWhatWasQueuedWhenItBegan) {
    HandClock clock(1000);
    MGEventQueueImpl* queue = NewQueue("q", 0);
    target->queue = queue;
    target->repost = true;
    target->answers[1] = 0;
    for (int serial : {1, 2, 3}) queue->PostEvent(target, new TestEvent(serial % 2, serial), true, nullptr);
    EXPECT_EQ(3u, queue->ProcessEvents(0, nullptr, 0));
    EXPECT_THAT(target->handled, ElementsAre(2));
    EXPECT_EQ(1u, queue->GetNumEvents());  // for the next call
    target->repost = false;
    struct Slow : MGEventQueue::EventFilter {
        explicit Slow(HandClock& c) : hand(c) {}
        int32 Check(MGEventTarget*, MGEvent*) override { return hand.Advance(4), 2; }
        HandClock& hand;
    } slow(clock);
    for (int serial : {4, 5, 6}) queue->PostEvent(target, new TestEvent(0, serial), true, nullptr);
    EXPECT_EACH(queue->ProcessEvents(0, &slow, 8) == 2u, queue->GetNumEvents() == 2u);
    End(queue);
}

TEST_F(EventQueueTest, ManyPostersKeepTheirOrder) {
    const int each = Amount("TESSEL_TEST_EVENTS", 80000) / 8;
    const uint64 before = heap::TotalAllocated();
    MGEventQueueImpl* queue = NewQueue("q", 1000);
    struct Drain : MGRefCounted<MGEventTarget> {
        int32 CheckEvent(MGEvent*) override { return kDeliver; }
        void HandleEvent(MGEvent* event) override {
            const auto* own = static_cast<TestEvent*>(event);
            inOrder &= own->serial == next[own->kind]++;
        }
        void WriteToDebugStream(DebugStream&) override {}
        int next[8] = {};
        bool inOrder = true;
    }* drain = new Drain;
    std::atomic<uint64> full{0};
    std::vector<std::thread> posters;
    for (int kind = 0; kind < 8; ++kind)
        posters.emplace_back([&, kind] {
            for (int serial = 0; serial < each; ++serial)
                while (queue->PostEvent(drain, new TestEvent(kind, serial), true, nullptr) == 2) {
                    ++full;
                    std::this_thread::yield();
                }
        });
    uint64 handled = 0;
    while (handled < 8u * static_cast<unsigned>(each)) handled += queue->ProcessEvents(0, nullptr, 0);
    for (std::thread& poster : posters) poster.join();
    EXPECT_TRUE(drain->inOrder);
    EXPECT_THAT(drain->next, testing::Each(each));
    const auto counters = queue->GetCounters();
    EXPECT_EACH(counters.delivered == 8u * static_cast<unsigned>(each), counters.purged + counters.dropped == 0,
                queue->GetNumEvents() == 0u);
    EXPECT_LT(heap::TotalAllocated() - before, 1001u * 256);  // the places of a full queue
    RecordProperty("full", std::to_string(full));
    End(queue);
    EXPECT_EQ(before, heap::TotalAllocated());
    drain->Release();
}

TEST_F(EventQueueTest, SurvivesEveryAllocationThatFails) {
    int refused = 0;
    for (int n = 1, failed = 1; failed; ++n) {
        const uint64 before = heap::TotalAllocated();
        FailingAllocator failing(n);
        if (MGEventQueue* queue = CreateMGEventQueue("q", 0)) {
            EXPECT_EQ(kNoErr, queue->Init());
            int lost = 0;  // places that were used before need no memory: so post many
            for (int i = 0; i < 200; ++i) lost += queue->PostEvent(target, new TestEvent(0), true, nullptr) == 2;
            EXPECT_EACH(queue->GetNumEvents() + static_cast<unsigned>(lost) == 200u, lost <= 1);
            refused += lost;
            End(queue);
        } else {
            ++refused;
        }
        failed = failing.HasFailed();
        EXPECT_EQ(before, heap::TotalAllocated());
    }
    EXPECT_GE(refused, 2);
}

}  // namespace
}  // namespace tessel::test
