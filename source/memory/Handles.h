// Handles as the other files of the memory manager use them.
#ifndef TESSEL_SOURCE_MEMORY_HANDLES_H
#define TESSEL_SOURCE_MEMORY_HANDLES_H

#include "base/Compiler.h"
#include "memory/GuardBytes.h"
#include "memory/MasterPointers.h"
#include "memory/MemorySettings.h"
#include <tessel/memory/MemoryManager.h>

namespace tessel {

// The level of handle checking from which an operation proves that a handle is one.
enum CheckFrom : int32 { kAlwaysProve = 0, kChangeProves = 1, kQueryProves = 2 };

inline bool IsLiveHandle(UHandle h, CheckFrom from) {
    if (memorySettings.checking.load(std::memory_order_relaxed) >= from ? !masterPointers.Contains(h) : !h)
        return false;
    return IsLiveContent(SlotContent(h));
}

// Live, and its guard bytes, when they are checked, intact.
inline bool IsGoodHandle(UHandle h, CheckFrom from) {
    return TESSEL_LIKELY(IsLiveHandle(h, from)) &&
           (TESSEL_LIKELY(!ChecksGuards(GuardKind::kHandle)) || CheckGuards(*h, GuardKind::kHandle));
}

// Creation for the caller of an operation of the interface, which gives its frame, TESSEL_THIS_FRAME: that caller is
// where the call stacks of leak reports begin.
#define TESSEL_THIS_FRAME __builtin_frame_address(0)
UHandle CreateHandle(uint32 size, bool clear, const void* frame);
UPtr CreatePtr(uint32 size, bool clear, const void* frame);
// For a null handle stored at `h`, else its size is set; reports under the operation's name.
MgErr ResizeOrCreate(UHandle* h, uint32 size, bool clear, const char* operation, const void* frame);

MgErr CopyHandle(UHandle* destination, UHandle source, const void* frame);
MgErr HandToHand(UHandle* h, const void* frame);
MgErr PtrToHand(const void* p, UHandle* h, uint32 size, const void* frame);
MgErr SetHandleFromPtr(UHandle* h, const void* p, uint32 size, const void* frame);

// Returns the error after reporting "Memory error 3 in DSDisposeHandle"; 0 is not reported.
MgErr ReportMemoryError(MgErr err, const char* operation);

// Frees a live handle, damaged or not, without asking or telling anybody.
void FreeHandle(UHandle h);

}  // namespace tessel

#endif
