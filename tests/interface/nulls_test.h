// What the generated calls of nulls_test.py stand on.
#include <tessel/tessel.h>

#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

enum { kOther, kHandle, kPath, kProcedure };
typedef struct {
    const char* name;
    bool (*call)(int null);  // false when the function has no such pointer
} Function;

#define IS_POINTER(value) (__builtin_classify_type(value) == 5)
#define IGNORE(call) (call, 0)

static char g_buffers[16][65536];

// Reports are none of the matter, the fatal ones included.
static void TakeReport(CStr file, int32 line, CStr function, int32 level, uint32 code, CStr text) {
    (void)file, (void)line, (void)function, (void)level, (void)code, (void)text;
}

static intptr_t DoNothing(void) {
    return 0;
}

// Makes the next argument: null when it is pointer number `null`, else something plain.
static void MakeArgument(void* argument, size_t size, bool isPointer, int kind, int null, int* pointers) {
    memset(argument, 0, size);
    if (!isPointer) return;
    const int index = (*pointers)++;
    if (index == null) return;
    void* value = g_buffers[index & 15];
    if (kind == kProcedure) value = (void*)(intptr_t)DoNothing;
    if (kind == kHandle) value = (void*)DSNewHClr(64);
    if (kind == kPath) {
        Path path = NULL;
        (void)FTextToPath("C:\\nowhere", 10, &path);
        value = (void*)path;
    }
    memcpy(argument, &value, sizeof value);
}

// Whether the call comes back, in a process of its own. -1: the function has no pointer of that number.
static int ComesBack(const Function* function, int null) {
    fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        const struct rlimit noCore = {0, 0};
        setrlimit(RLIMIT_CORE, &noCore);
        (void)!freopen("/dev/null", "w", stdout);
        (void)!freopen("/dev/null", "w", stderr);
        alarm(10);
        _exit(function->call(null) ? 42 : 43);
    }
    int status = 0;
    waitpid(child, &status, 0);
    if (WIFEXITED(status) && WEXITSTATUS(status) == 43) return -1;
    return WIFEXITED(status) && WEXITSTATUS(status) == 42;
}

static int RunAll(const Function* functions, size_t count, int argumentCount, char** arguments) {
    int calls = 0, failures = 0, unjudged = 0;
    if (InitTesselBase() || InitTesselAppSupport()) return 2;
    DebugOutputSetHandler(TakeReport);
    for (size_t i = 0; i < count; ++i) {
        if (argumentCount > 1 && strcmp(arguments[1], functions[i].name) != 0) continue;
        for (int null = 0;; ++null) {
            const int back = ComesBack(&functions[i], null);
            if (back < 0) break;
            ++calls;
            if (back) continue;
            const bool plainArgumentsServe = ComesBack(&functions[i], -1) > 0;
            if (!plainArgumentsServe) ++unjudged;
            if (plainArgumentsServe) ++failures;
            printf("%s: %s with null for its pointer %d\n", plainArgumentsServe ? "ends its process" : "not judged",
                   functions[i].name, null + 1);
        }
    }
    printf("%zu functions, %d calls, %d not judged, %d failures\n", count, calls, unjudged, failures);
    return failures || calls == 0;
}
