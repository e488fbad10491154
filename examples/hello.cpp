#include <tessel/tessel.h>

#include <cstdio>

int main() {
    if (InitTesselBase() != kNoErr || InitTesselAppSupport() != kNoErr) return 1;

    UHandle list = DSNewHandle(0);  // data that may move: a handle keeps the reference good
    const uint8 strings[] = {0, 2, 5, 'H', 'e', 'l', 'l', 'o', 5, 'w', 'o', 'r', 'l', 'd'};
    DSPtrAndHand(strings, list, sizeof strings);

    RsrcFile file = 0;  // a resource file, in memory
    RCreateMemFile(&file, TESSEL_FOURCC('O', 'R', 'V', 'N'), TESSEL_FOURCC('O', 'V', 'R', 'S'));
    RAdd(list, file, TESSEL_FOURCC('S', 'T', 'R', '#'), 128, nullptr);

    Str255 first, second;
    RGetIndString(file, first, 128, 1);
    RGetIndString(file, second, 128, 2);
    char text[64];
    SNPrintf(text, sizeof text, "%p, %p: %5d|%x", first, second, -42, 255);  // %p takes counted strings
    std::puts(text);

    const MgErr err = RGetIndString(file, first, 128, 3);
    std::printf("the third: %s (%d)\n", MgErrMeaning(err), err);
    RCloseFile(file);
    UninitTesselAppSupport();
    return UninitTesselBase();
}
