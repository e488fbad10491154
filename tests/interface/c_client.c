// A host in plain C11: starts the library, uses flat functions of several families, stops it.
#include <tessel/tessel.h>

#include <stdio.h>
#include <string.h>

static int failures;

static void Expect(bool condition, const char* what) {
    if (!condition) {
        fprintf(stderr, "not so: %s\n", what);
        ++failures;
    }
}

static void UseHandles(void) {
    UHandle handle = DSNewHClr(10);
    Expect(handle != NULL && DSGetHandleSize(handle) == 10, "a cleared handle of 10 bytes");
    Expect(DSSetHandleSize(handle, 100) == kNoErr && DSCheckHandle(handle) == kNoErr, "it grows");
    Expect(DSDisposeHandle(handle) == kNoErr && !IsDSHandle(handle), "and is gone after disposal");
}

static void UsePrinting(void) {
    char text[32];
    Expect(SNPrintf(text, sizeof text, "%5d|%x", -42, 255) == 8 && strcmp(text, "  -42|FF") == 0, "formatted text");
}

static void UsePaths(void) {
    Path path = NULL;
    char name[300];
    static const char text[] = "C:\\dir\\..\\file";
    Expect(FTextToPath(text, (int32)sizeof text - 1, &path) == kNoErr && FDepth(path) == 2, "a path from text");
    Expect(MakeDOSPathName(path, name, 0) == kNoErr && strcmp(name, "C:\\file") == 0, "its file name");
    FDestroyPath(&path);
    Expect(path == NULL, "it is gone");
}

static void UseResources(void) {
    const ResType type = TESSEL_FOURCC('S', 'T', 'R', '#');
    static const uint8 list[] = {0, 2, 3, 'o', 'n', 'e', 3, 't', 'w', 'o'};
    RsrcFile file = 0;
    UHandle data = NULL;
    Str255 string;
    Expect(RCreateMemFile(&file, TESSEL_FOURCC('O', 'R', 'V', 'N'), TESSEL_FOURCC('O', 'V', 'R', 'S')) == kNoErr,
           "a file in memory");
    Expect(DSPtrToHand(list, &data, sizeof list) == kNoErr && RAdd(data, file, type, 128, NULL) == kNoErr,
           "a list in it");
    Expect(RGetIndString(file, string, 128, 2) == kNoErr && memcmp(string, "\3two", 4) == 0, "its second string");
    Expect(RGetIndString(file, string, 128, 3) == kResNotFoundErr, "and no third");
    Expect(RCloseFile(file) == kNoErr, "closed");
}

int main(void) {
    Expect(InitTesselBase() == kNoErr && InitTesselAppSupport() == kNoErr, "the library starts");
    UseHandles();
    UsePrinting();
    UsePaths();
    UseResources();
    Expect(UninitTesselAppSupport() == kNoErr && UninitTesselBase() == kNoErr, "and stops");
    if (failures == 0) puts("all as expected");
    return failures != 0;
}
