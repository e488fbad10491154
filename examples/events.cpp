// A host with an event loop: work that a second thread hands in goes through a queue, a timer sets an occurrence, and a
// signal handler posts one without taking a lock. All of it runs on the main thread, which sleeps until it is told.
#include <tessel/tessel.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>

namespace {

using namespace tessel;

void Must(bool good, const char* what) {
    if (good) return;
    std::fprintf(stderr, "events: %s failed\n", what);
    std::exit(1);
}

// ---- what the loop waits for ----------------------------------------------------------------------------------------

ThEvent wakeUp = nullptr;         // signaled when there is something to do
Occurrence interrupted = 0;       // set for the signal handler
volatile sig_atomic_t noted = 0;  // the signal came: a handler cannot signal an event, so the loop looks now and then
int ticks = 0;
bool finished = false;

void WakeLoop(void*) {
    ThEventSignal(wakeUp);
}

void OnSignal(int) {
    InterruptSafeOccur(interrupted);
    noted = 1;
}

// ---- the queue ------------------------------------------------------------------------------------------------------

struct Line : MGRefCounted<MGEvent> {
    explicit Line(int32 lineNumber) : number(lineNumber) {}
    int32 GetKind() override { return 1; }
    bool IsEquivalent(MGEvent* other) override { return static_cast<Line*>(other)->number == number; }
    void WriteToDebugStream(DebugStream& stream) override { ToDebugStream(stream, number); }
    const int32 number;
};

struct Printer : MGRefCounted<MGEventTarget> {
    int32 CheckEvent(MGEvent*) override { return kDeliver; }
    void HandleEvent(MGEvent* event) override {
        std::printf("line %d%s\n", static_cast<Line*>(event)->number, IsStartUpThread() ? ", on the main thread" : "");
    }
    void WriteToDebugStream(DebugStream& stream) override { ToDebugStream(stream, "the printer"); }
};

struct Work {
    MGEventQueue* queue;
    Printer* printer;
    Occurrence handedIn;
};

// The second thread. Line 2 is posted twice: the queue keeps one.
int32 HandIn(void* argument) {
    const Work& work = *static_cast<Work*>(argument);
    for (int32 number : {1, 2, 2, 3}) work.queue->PostEvent(work.printer, new Line(number), false, nullptr);
    return Occur(work.handedIn);
}

// ---- handlers, on the main thread -----------------------------------------------------------------------------------

OccurHdlr lines = 0, timer = 0, signals = 0;
Occurrence tick = 0;

void PrintLines(void* queue) {
    static_cast<MGEventQueue*>(queue)->ProcessEvents(0, nullptr, 0);
    OccurAtTime(tick, MilliSecs() + 10);
}

void Tick(void*) {
    std::printf("tick %d\n", ++ticks);
    if (ticks == 3) std::raise(SIGINT);
    if (ticks == 3) return;
    OnOccurrence(timer, false);
    OccurAtTime(tick, MilliSecs() + 10);
}

void End(void*) {
    std::puts("interrupted: the end");
    finished = true;
}

OccurHdlr Armed(Occurrence occurrence, OccurHdlrProc callback, void* argument) {
    const OccurHdlr handler = AllocOccurHdlr(occurrence, callback, argument);
    Must(handler && OnOccurrence(handler, false) == kNoErr, "OnOccurrence");
    return handler;
}

void RunLoop() {
    constexpr int32 kLookMilliseconds = 20;
    while (!finished) {
        if (!noted) ThEventWaitWithTimeout(wakeUp, kLookMilliseconds);
        noted = 0;
        ChkOccurrences();
    }
}

}  // namespace

int main() {
    Must(InitTesselBase() == kNoErr && InitTesselAppSupport() == kNoErr, "the start");
    Must(AssimilateStartUpThread() == 1 && HardWaitBehaviorService()->Init() == kNoErr, "HardWaitBehavior");
    Must(OccurrenceManagerService()->Init() == kNoErr, "OccurrenceManager");
    Must(ThEventCreate(&wakeUp, 0, false) == kNoErr, "ThEventCreate");
    SetOccThreadGroupProc(ThThreadGetIndex(nullptr), WakeLoop, nullptr);

    Work work{CreateMGEventQueue("lines", 0), new Printer, AllocOccur()};
    Must(work.queue && work.queue->Init() == kNoErr, "CreateMGEventQueue");
    tick = AllocOccur();
    interrupted = AllocOccur();
    lines = Armed(work.handedIn, PrintLines, work.queue);
    timer = Armed(tick, Tick, nullptr);
    signals = Armed(interrupted, End, nullptr);
    std::signal(SIGINT, OnSignal);

    ThThread thread = nullptr;
    Must(ThThreadCreate(&thread, HandIn, &work, "second") == kNoErr, "ThThreadCreate");
    RunLoop();

    ThThreadDestroy(thread);
    std::signal(SIGINT, SIG_DFL);
    for (OccurHdlr handler : {lines, timer, signals}) DeallocOccurHdlr(handler);
    for (Occurrence occurrence : {work.handedIn, tick, interrupted}) DeallocOccur(occurrence);
    work.queue->Uninit();
    work.queue->Destroy();
    work.printer->Release();
    ThEventDestroy(wakeUp);
    OccurrenceManagerService()->Uninit();
    HardWaitBehaviorService()->Uninit();
    UninitTesselAppSupport();
    return UninitTesselBase();
}
