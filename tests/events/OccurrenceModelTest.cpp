// Random operations on the occurrences of one thread, beside a model of the rules.
#include "EventsTestSupport.h"
#include "events/TimeList.h"

#include <deque>

namespace tessel::test {
namespace {

constexpr int kNone = -1, kThings = 6;

struct ModelOccurrence {
    Occurrence refnum = 0;  // 0: freed
    uint32 count = 2;
    std::deque<int> bound;  // newest first
};

struct ModelHandler {
    OccurHdlr refnum = 0;  // 0: freed
    bool strict = false, threadSafe = false, armsAgain = false, armed = false, fired = false, timedOut = false;
    int occurrence = kNone;
    uint32 seen = 2;
};

class Model {
public:
    ModelOccurrence occurrences[kThings];
    ModelHandler handlers[kThings];
    std::vector<int> ran;             // callbacks
    std::deque<int> fired[2], noted;  // of the group, of the thread-safe; noted without a lock

    static uint32 Next(uint32 count) { return count + 1 == 2 ? 3 : count + 1; }

    void Fire(int h, bool timedOut) {
        ModelHandler& handler = handlers[h];
        if (handler.occurrence == kNone || !handler.armed || handler.fired) return;
        handler.armed = false;
        handler.fired = true;
        handler.timedOut = timedOut;
        fired[handler.threadSafe].push_front(h);
    }
    void Call(int h) {
        ran.push_back(h);
        if (handlers[h].armsAgain && !handlers[h].timedOut) Arm(h, false, false);
    }
    void Account(ModelHandler& handler) {
        handler.seen = handler.strict ? Next(handler.seen) : occurrences[handler.occurrence].count;
    }
    void RunList(int list) {
        while (!fired[list].empty()) {
            const int h = fired[list].front();
            ModelHandler& handler = handlers[h];
            fired[list].pop_front();
            handler.fired = handler.armed = false;
            if (!handler.timedOut && handler.occurrence != kNone) Account(handler);
            Call(h);
        }
    }
    void Run(int list) {
        while (!noted.empty()) {
            const int o = noted.front();
            noted.pop_front();
            Set(o);
            RunList(1);
        }
        RunList(list);
    }
    void Set(int o) {
        if (!occurrences[o].refnum) return;
        occurrences[o].count = Next(occurrences[o].count);
        for (int h : occurrences[o].bound) Fire(h, false);
    }
    MgErr Arm(int h, bool reset, bool withTimeout) {
        ModelHandler& handler = handlers[h];
        if (handler.fired) return kNoErr;
        if (handler.occurrence == kNone) {
            handler.armed = false;
            handler.timedOut = true;
            Call(h);
            return kOccurrenceGoneErr;
        }
        if (withTimeout) handler.timedOut = false;
        if (reset) handler.seen = occurrences[handler.occurrence].count;
        handler.armed = handler.seen == occurrences[handler.occurrence].count;
        if (handler.armed) return kNoErr;
        handler.timedOut = false;
        Account(handler);
        Call(h);
        return kNoErr;
    }
    void Unbind(int h) {
        if (handlers[h].occurrence != kNone) std::erase(occurrences[handlers[h].occurrence].bound, h);
        handlers[h].occurrence = kNone;
    }
    void Bind(int h, int o) {
        if (handlers[h].occurrence == o) return;
        Unbind(h);
        if (o == kNone || !occurrences[o].refnum) return;
        handlers[h].occurrence = o;
        handlers[h].seen = 2;
        occurrences[o].bound.push_front(h);
    }
    void FreeOccurrence(int o) {
        while (!occurrences[o].bound.empty()) {
            const int h = occurrences[o].bound.front();
            Fire(h, true);
            Unbind(h);
        }
        occurrences[o] = {};
        Run(1);
    }
    MgErr Cancel(int h) {
        ModelHandler& handler = handlers[h];
        handler.armed = handler.fired = false;
        for (auto& list : fired) std::erase(list, h);
        if (handler.occurrence == kNone) return kArgErr;
        handler.seen = occurrences[handler.occurrence].count;
        return kNoErr;
    }
};

Model model;
std::vector<int> ran;

void Ran(void* argument) {
    const int h = static_cast<int>(reinterpret_cast<intptr_t>(argument));
    ran.push_back(h);
    const OccurHdlr refnum = model.handlers[h].refnum;
    if (model.handlers[h].armsAgain && !HandlerTimedOut(refnum)) OnOccurrence(refnum, false);
}

class OccurrenceModelTest : public EventsTest {
protected:
    std::mt19937 random{20};
    int Any(int below) { return static_cast<int>(random() % static_cast<unsigned>(below)); }

    void Alloc(int o, int h) {
        if (!model.occurrences[o].refnum) model.occurrences[o].refnum = AllocOccur();
        if (model.handlers[h].refnum) return;
        const int kind = Any(3);
        auto* alloc = kind == 0 ? AllocOccurHdlr : kind == 1 ? AllocOccurHdlrStrict : AllocThreadSafeOccurHdlr;
        ModelHandler made;
        made.refnum = alloc(model.occurrences[o].refnum, Ran, reinterpret_cast<void*>(intptr_t{h}));
        made.strict = kind == 1;
        made.threadSafe = kind == 2;
        made.armsAgain = Any(2) == 0;
        model.handlers[h] = made;
        model.Bind(h, o);
    }
    void Free(int o, int h) {
        if (Any(2) == 0) {
            if (!model.occurrences[o].refnum) return;
            EXPECT_EQ(kNoErr, DeallocOccur(model.occurrences[o].refnum));
            model.FreeOccurrence(o);
            return;
        }
        EXPECT_EQ(model.handlers[h].refnum ? kNoErr : kArgErr, DeallocOccurHdlr(model.handlers[h].refnum));
        if (!model.handlers[h].refnum) return;
        model.Cancel(h);
        model.Unbind(h);
        model.handlers[h] = {};
    }
    void OnHandler(int operation, int h, int o) {
        const OccurHdlr refnum = model.handlers[h].refnum;
        const bool reset = Any(4) == 0;
        if (operation == 0) {
            EXPECT_EQ(kNoErr,
                      BindOccurHdlr(refnum, model.occurrences[o].refnum, Ran, reinterpret_cast<void*>(intptr_t{h})));
            model.Bind(h, o);
        } else if (operation == 1) {
            EXPECT_EQ(model.Cancel(h), CancelOnOccur(refnum));
        } else if (operation == 2) {
            EXPECT_EQ(kNoErr, FireOccurHdlr(refnum));
            model.Fire(h, true);
            model.Run(1);
        } else if (operation < 6) {
            const MgErr err = OnOccurrence(refnum, reset);
            EXPECT_EQ(model.Arm(h, reset, false), err);
        } else {
            const MgErr err = OnOccurrenceWithTimeout(refnum, reset, 1000000);
            EXPECT_EQ(model.Arm(h, reset, true), err);
        }
    }
    void Set(int o) {
        EXPECT_EQ(model.occurrences[o].refnum ? kNoErr : kArgErr, Occur(model.occurrences[o].refnum));
        model.Set(o);
        model.Run(1);
    }
    void Note(int o) {
        if (!model.occurrences[o].refnum) return;
        EXPECT_EQ(kNoErr, InterruptSafeOccur(model.occurrences[o].refnum));
        if (std::find(model.noted.begin(), model.noted.end(), o) == model.noted.end()) model.noted.push_back(o);
    }
    void Step() {
        const int o = Any(kThings), h = Any(kThings), operation = Any(20);
        if (operation == 0) return Alloc(o, h);
        if (operation == 1 && Any(4) == 0) return Free(o, h);
        if (operation < 5) return Set(o);
        if (operation == 5) return Note(o);
        if (operation < 9) {
            EXPECT_EACH((!model.fired[0].empty() || !model.noted.empty()) == QuickCheckGroupHandlersFired(0),
                        ChkOccurrences() == kNoErr);
            return model.Run(0);
        }
        if (model.handlers[h].refnum) OnHandler(operation % 8, h, o);
    }
};

TEST_F(OccurrenceModelTest, OneGroupDoesAsTheRulesSay) {
    size_t callbacks = 0;
    for (int step = 0; step < 100000 && !HasFailure(); ++step) {
        Step();
        ASSERT_EQ(model.ran, ran) << step;
        for (const ModelHandler& handler : model.handlers)
            ASSERT_EQ(handler.timedOut, HandlerTimedOut(handler.refnum)) << step;
        callbacks += ran.size();
        ran.clear();
        model.ran.clear();
    }
    EXPECT_GT(callbacks, 10000u);
    for (ModelHandler& handler : model.handlers) DeallocOccurHdlr(handler.refnum);
    for (ModelOccurrence& occurrence : model.occurrences) DeallocOccur(occurrence.refnum);
    EXPECT_EQ(0u, reports.CountAt(kDebugError));
}

// ---- the order of times ---------------------------------------------------------------------------------------------

TEST_F(OccurrenceModelTest, TimesKeepTheirOrderAcrossTheWrapOfTheClock) {
    using Among = TimeList::Among;
    constexpr uint32 kEntries = 12;
    std::deque<TimeList::Entry> entries;
    for (uint32 i = 0; i < kEntries; ++i) entries.emplace_back(i + 1);
    struct Listed {
        uint32 refnum;
        int64 time;
    };
    std::vector<Listed> expected;
    TimeList list;
    int64 now = 0xFFFFF000;
    auto find = [&](uint32 refnum) {
        return std::find_if(expected.begin(), expected.end(), [=](const Listed& l) { return l.refnum == refnum; });
    };
    auto insert = [&](const Listed& listed, Among among) {
        auto place = std::find_if(expected.begin(), expected.end(), [&](const Listed& other) {
            return among == Among::kBeforeEquals ? other.time >= listed.time : other.time > listed.time;
        });
        expected.insert(place, listed);
    };
    for (int step = 0; step < 50000 && !HasFailure(); ++step) {
        const uint32 refnum = random() % kEntries + 1;
        TimeList::Entry& entry = entries[refnum - 1];
        const int64 far = Any(10) == 0 ? 0x7FFFFFF0 : 0, time = now + (Any(2) ? far : -far) + Any(9) - 4;
        const uint32 now32 = static_cast<uint32>(now), time32 = static_cast<uint32>(time);
        const Among among = Any(2) ? Among::kBeforeEquals : Among::kAfterEquals;
        if (!entry.IsListed()) {
            list.Insert(entry, time32, now32, among);
            insert({refnum, time}, among);
        } else if (Any(2)) {
            list.Remove(entry);
            expected.erase(find(refnum));
        } else {
            auto place = find(refnum);
            const bool stays = place->time == time || (place != expected.begin() && place[-1].time <= time &&
                                                       (place + 1 == expected.end() || time < place[1].time));
            list.Move(entry, time32, now32);
            place->time = time;
            if (!stays) {
                expected.erase(place);
                insert({refnum, time}, Among::kBeforeEquals);
            }
        }
        now += Any(3);
        size_t due = 0;
        while (due < expected.size() && expected[due].time <= now) ++due;
        ASSERT_EQ(due, list.CountDue(static_cast<uint32>(now)));
        ASSERT_EQ(due ? expected[0].refnum : 0, list.FirstDue(static_cast<uint32>(now)));
        ASSERT_EQ(expected.empty() ? 0 : static_cast<uint32>(expected[0].time), list.FirstTime());
        for (size_t i = 0; i < expected.size(); ++i) ASSERT_EQ(i == 0, list.IsFirst(entries[expected[i].refnum - 1]));
        if (Any(500) == 0)  // all of them, in order
            for (; !expected.empty(); expected.erase(expected.begin())) {
                ASSERT_TRUE(list.IsFirst(entries[expected[0].refnum - 1]));
                list.Remove(entries[expected[0].refnum - 1]);
            }
    }
}

}  // namespace
}  // namespace tessel::test
