// Handles and pointer blocks.
//
// A handle is a pointer to a master pointer, which points to data that may move when it is resized: keep the handle,
// not the data address. A pointer block never moves. A handle of size 0 is valid and its master pointer is not null.
// The AZ operations at the end are the DS operations of the same ending under their second name.
//
// Sizes are in bytes. The caller owns what an operation creates and disposes of it with DSDisposeHandle or
// DSDisposePtr. Any thread may call any operation between start and stop of the library; resizing or disposing of one
// handle while another thread uses it is the callers' error. Out of memory is kMemFullErr (or null), and leaves what
// there was unchanged; a handle that is none, or whose guard bytes are damaged, is kHandleErr.
#ifndef TESSEL_MEMORY_MEMORYMANAGER_H
#define TESSEL_MEMORY_MEMORYMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// ---- Creation and disposal ------------------------------------------------------------------------------------------

// A new handle of `size` bytes, or null. Clr: zero-filled.
// Data is aligned to 8 bytes, to 16 from 1024 bytes on and to 4096 from 1 MiB on, such that its end is aligned to 4 or
// 8 when the size is a multiple of that.
TESSEL_API UHandle DSNewHandle(uint32 size);
// A new zero-filled handle of `size` bytes, or null; aligned as DSNewHandle does.
TESSEL_API UHandle DSNewHClr(uint32 size);

// The same, placed so that data address + `offset` is a multiple of `alignment`. The alignment is raised to 8, or else
// to a power of two from 16 to 32768; the offset is rounded up to a multiple of 4.
TESSEL_API UHandle DSNewAlignedHandle(uint32 size, uint32 alignment, uint32 offset);
// A new zero-filled handle whose data address + `offset` is a multiple of `alignment`, or null.
TESSEL_API UHandle DSNewAlignedHClr(uint32 size, uint32 alignment, uint32 offset);

// A new pointer block of `size` bytes, aligned to 8, or null. Clr: zero-filled.
TESSEL_API UPtr DSNewPtr(uint32 size);
// A new zero-filled pointer block of `size` bytes, aligned to 8, or null.
TESSEL_API UPtr DSNewPClr(uint32 size);

// Frees a handle. Null is fine. kHandleErr: not a handle, or damaged; then nothing is freed.
TESSEL_API MgErr DSDisposeHandle(UHandle h);

// Frees *h and stores null there. A null address or a null handle is fine.
TESSEL_API MgErr DSDisposeHandleAndNull(UHandle* h);

// Frees a pointer block. kArgErr for null; kHandleErr, and nothing is freed, when its guard bytes are damaged or the
// heap sees that it is no block (most blocks that were disposed of before).
TESSEL_API MgErr DSDisposePtr(void* p);

// ---- Size -----------------------------------------------------------------------------------------------------------

// Size of the data; 0 and a fatal report for what is no handle.
TESSEL_API uint32 DSGetHandleSize(UHandle h);

// Resizes, keeping the first min(old, new) bytes; the data may move. Clr: bytes beyond the old size are zero.
// The alignment is chosen by the new size (DSNewHandle); data of 4 KiB and more that change by less than a 256th of
// their size keep the offset that they have, so that growing in small steps does not move them each time.
TESSEL_API MgErr DSSetHandleSize(UHandle h, uint32 size);
// Resizes; bytes beyond the old size are zero.
TESSEL_API MgErr DSSetHSzClr(UHandle h, uint32 size);

// The same with the caller's alignment (DSNewAlignedHandle).
TESSEL_API MgErr DSSetAlignedHandleSize(UHandle h, uint32 size, uint32 alignment, uint32 offset);
// Resizes with the caller's alignment; bytes beyond the old size are zero.
TESSEL_API MgErr DSSetAlignedHSzClr(UHandle h, uint32 size, uint32 alignment, uint32 offset);

// Resizes *h, or makes it when it is null.
TESSEL_API MgErr DSSetHandleSizeOrNewHandle(UHandle* h, uint32 size);
// Resizes *h, or makes it when it is null; bytes beyond the old size are zero.
TESSEL_API MgErr DSSetHSzOrNewHClr(UHandle* h, uint32 size);

// The same, except that size 0 disposes of *h and stores null: an empty datum is a null handle.
TESSEL_API MgErr DataSetHandleSizeOrNewHandle(UHandle* h, uint32 size);
// The same, bytes beyond the old size zero; size 0 disposes of *h and stores null.
TESSEL_API MgErr DataSetHSzOrNewHClr(UHandle* h, uint32 size);

// ---- Copying: null bytes are kArgErr unless their number is 0 -------------------------------------------------------

// Makes *destination a copy of `source`, creating or resizing it. A null source disposes of *destination and stores
// null. Source and destination the same handle: a warning, and nothing is done.
TESSEL_API MgErr DSCopyHandle(UHandle* destination, UHandle source);

// Replaces *h by a new copy of it. The handle that stood there stays the caller's.
TESSEL_API MgErr DSHandToHand(UHandle* h);

// Stores in *h a new handle with a copy of `size` bytes at `p`; null when it cannot be made.
TESSEL_API MgErr DSPtrToHand(const void* p, UHandle* h, uint32 size);

// Resizes the existing handle to `size` and copies the bytes into it.
TESSEL_API MgErr DSPtrToXHand(const void* p, UHandle h, uint32 size);

// Resizes or makes *h and copies `size` bytes into it. NULLMeansEmpty: size 0 disposes of *h and stores null.
TESSEL_API MgErr DSSetHandleFromPtr(UHandle* h, const void* p, uint32 size);
// Resizes or makes *h and copies `size` bytes into it; size 0 disposes of *h and stores null.
TESSEL_API MgErr DSSetHandleFromPtrNULLMeansEmpty(UHandle* h, const void* p, uint32 size);

// Appends bytes, or a whole handle, to a handle. The two handles may be the same; the bytes at `p` must not be the
// handle's own, which may move first.
TESSEL_API MgErr DSPtrAndHand(const void* p, UHandle h, uint32 size);
// Appends all of `source` to `destination`, which may be the same handle.
TESSEL_API MgErr DSHandAndHand(UHandle source, UHandle destination);

// Exchanges what two handles hold. The same handle twice: a fatal report, and nothing changes.
TESSEL_API MgErr DSSwapHandles(UHandle a, UHandle b);

// The handle whose data starts at `data`; a fatal report and null when there is none. Looks at every handle.
TESSEL_API UHandle DSRecoverHandle(const void* data);

// ---- Checks and statistics ------------------------------------------------------------------------------------------

// 1 when `h` is a live handle, else 0. Never faults.
TESSEL_API int32 IsDSHandle(UHandle h);

// kNoErr for a live handle whose guard bytes (when they are checked) are intact, else kHandleErr.
TESSEL_API MgErr DSCheckHandle(UHandle h);
// kNoErr for a pointer block whose guard bytes (when they are checked) are intact; else kHandleErr.
TESSEL_API MgErr DSCheckPtr(const void* p);

// 1 when the guard bytes are intact or none are written, else 0.
TESSEL_API int32 DSCheckHandleGuardBytes(UHandle h);
// 1 when the block's guard bytes are intact or none are written, else 0.
TESSEL_API int32 DSCheckPtrGuardBytes(const void* p);

// Checks the free master pointers, the heap and the master-pointer blocks; kCorruptErr when a chain of free master
// pointers (looked at with memory debugging on) is damaged or the count of blocks is wrong. `report`: also reports
// statistics. Returns at once when a check is running.
TESSEL_API MgErr DSHeapCheck(int32 report);

// Twelve words of which only totalAllocated is filled. All totals stop at 0xFFFFFFFF.
typedef struct MemStatRec {
    uint32 reserved0[3];
    uint32 totalAllocated;  // bytes given out by the heap
    uint32 reserved4[8];
} MemStatRec;

// Checks as DSHeapCheck does; fills the record, which may be null. With OV_USE_MALLOC=1 in the environment pointer
// blocks come straight from malloc: totalAllocated, and the walk of DSMemStatsSlow, count handles only.
TESSEL_API MgErr DSMemStats(MemStatRec* stats);

// The same with an address (or null) for each word: out0 to out7, out10 and out11 get the words of their number, out8
// gets word 9 and out9 gets word 8.
TESSEL_API MgErr DSMemStats2(uint32* out0, uint32* out1, uint32* out2, uint32* out3, uint32* out4, uint32* out5,
                             uint32* out6, uint32* out7, uint32* out8, uint32* out9, uint32* out10, uint32* out11);

// Walks the heap: words[0] bytes in free blocks (always 0: free memory is the C allocator's), words[1] bytes in used
// blocks, words[2] total allocated.
TESSEL_API MgErr DSMemStatsSlow(uint32 words[3]);

// Always 0.
TESSEL_API int32 DSMaxMem(void);

// Nothing to compact. With memory debugging on, a consistency check with its report. Always kNoErr.
TESSEL_API MgErr DSCompact(void);

// A consistency check with its report and the heap's own check, memory debugging on meanwhile. The state of memory
// debugging as it was and is again.
TESSEL_API bool MemCheckHeaps(void);

// Turns memory debugging on or off, with a report. The new state.
TESSEL_API bool ToggleMemoryDebugging(void);

// True between start and stop of the memory manager.
TESSEL_API bool GetMemoryManagerInitialized(void);

// The report of every handle, and of every pointer block, that is live and was not reported yet; Reset marks those that
// are live now as reported.
TESSEL_API void MemDumpTracker(void);
// Marks what is live now as reported: later reports name only newer handles and pointer blocks.
TESSEL_API void MemResetTracker(void);

// ---- Settings: for start-up, before other threads use the library ---------------------------------------------------

// Called with the bytes wanted when a creation or a resize fails for lack of memory. Null: nothing is called. The
// procedure that was installed is returned. Stop of the library removes it.
typedef void (*MemFullProc)(uint32 size);
// Installs `proc` (null: none) for when memory runs out, and returns the one that was installed.
TESSEL_API MemFullProc SetMemFullProc(MemFullProc proc);
// Calls the procedure that is installed, if any, with `size`.
TESSEL_API void CallSetMemFullProc(uint32 size);

// Called after each handle operation. kind: 0 creation (oldSize 0), 1 resize, 2 disposal (newSize is the size it had).
// Null: none.
typedef void (*MemEventTraceProc)(int32 kind, MgErr err, UHandle h, uint32 newSize, uint32 oldSize);
// Installs `proc` (null: none), called after each handle operation.
TESSEL_API void SetMemEventTraceProc(MemEventTraceProc proc);

// Called for damaged guard bytes. kind: 0 underrun, 1 overrun, 2 a block of another version, whose two digits are
// `version` (null otherwise). The procedure that was installed is returned; the first one makes an error report.
typedef void (*GuardByteCheckFailedProc)(const void* data, int32 kind, const char* version);
// Installs `proc` for damaged guard bytes, and returns the one that was installed.
TESSEL_API GuardByteCheckFailedProc SetGuardByteCheckFailedProc(GuardByteCheckFailedProc proc);

// Called with 0 after every ClearMem and every non-empty MoveBlock. Null: none.
typedef void (*MemoryCheckCallback)(int32 zero);
// Installs `proc` (null: none), called after every ClearMem and every non-empty MoveBlock.
TESSEL_API void SetMemoryCheckCallback(MemoryCheckCallback proc);

// Stress mode: every resize that changes anything moves the data.
TESSEL_API void SetStressHandles(bool on);
// Whether stress mode is on.
TESSEL_API bool GetStressHandles(void);

// Memory debugging: the free master pointers are checked at every creation, and the heap at every pointer block.
TESSEL_API void SetMemoryDebugger(bool on);

// How carefully handles are recognised. 0: the master pointer looks live. 1: resizing and the like also prove that the
// handle is one. 2 (as it starts; also any higher value): size query and disposal do too. Environment: OVHandleCheck =
// "all" or "2", "resize" or "1", "off", "none", "0" or empty.
TESSEL_API void DSSetHandleChecking(int32 level);

// Turns checking of guard bytes on or off for those kinds of block that have them written. True when all three kinds
// (handles, pointer blocks, new/delete) have. Environment, read once on first need: OVGuardBytes, or
// OVGuardBytes_Handle, OVGuardBytes_Ptr, OVGuardBytes_NewDelete = "off", "alloc" (written) or "check" (also checked).
// A block keeps guard room only as it was when it was made, so the variables are the way to turn guard bytes on.
TESSEL_API bool ConfigGuardBytes(int32 enable);

// Counters, in this order: handles created, pointer blocks created, resize calls, resizes that moved the data (not
// counted in stress mode). Null is ignored.
TESSEL_API void DSSetCounters(const uint32 counters[4]);
// Stores the four counters, in the order of DSSetCounters. Null is ignored.
TESSEL_API void DSReadCounters(uint32 counters[4]);

// Kept for hosts that call them; nothing in the library reads what they store.
typedef void (*LogMemMutexAccessProc)(int32 acquired);
// Stores `proc`, which nothing calls.
TESSEL_API void SetLogMemMutexAccessProc(LogMemMutexAccessProc proc);
// Stores `check`, which nothing reads.
TESSEL_API void SetCheckHighWaterMarks(int32 check);

// Heap tuning. The first has no effect on the C allocator beneath; the second returns free memory to the system.
TESSEL_API void SetMergeAdjVirtualAllocs(int32 merge);
// Returns free memory to the system.
TESSEL_API void FreeSmartHeapPool(void);

// ---- Lock and purge states: handles are never locked or purged; these only check the handle -------------------------

// kNoErr, or kHandleErr with a warning.
TESSEL_API MgErr AZHLock(UHandle h);
// kNoErr, or kHandleErr with a warning. Nothing is unlocked.
TESSEL_API MgErr AZHUnlock(UHandle h);

// Checks the handle only; nothing is ever purged.
TESSEL_API void AZHPurge(UHandle h);
// Checks the handle only; nothing is ever purged.
TESSEL_API void AZHNoPurge(UHandle h);
// Always 0.
TESSEL_API int32 AZHGetState(UHandle h);
// Checks the handle only; the state is ignored.
TESSEL_API void AZHSetState(UHandle h, int32 state);

// ---- The second names -----------------------------------------------------------------------------------------------

// As DSNewHandle: a new handle of `size` bytes, or null.
TESSEL_API UHandle AZNewHandle(uint32 size);
// As DSNewHClr: a new zero-filled handle, or null.
TESSEL_API UHandle AZNewHClr(uint32 size);
// As DSNewPtr: a new pointer block of `size` bytes, or null.
TESSEL_API UPtr AZNewPtr(uint32 size);
// As DSNewPClr: a new zero-filled pointer block, or null.
TESSEL_API UPtr AZNewPClr(uint32 size);
// As DSDisposeHandle: frees a handle; null is fine.
TESSEL_API MgErr AZDisposeHandle(UHandle h);
// As DSDisposePtr: frees a pointer block; kArgErr for null.
TESSEL_API MgErr AZDisposePtr(void* p);
// As DSGetHandleSize: bytes of the data; 0 and a fatal report for what is no handle.
TESSEL_API uint32 AZGetHandleSize(UHandle h);
// As DSSetHandleSize: resizes, the data may move.
TESSEL_API MgErr AZSetHandleSize(UHandle h, uint32 size);
// As DSSetHSzClr: resizes, new bytes are zero.
TESSEL_API MgErr AZSetHSzClr(UHandle h, uint32 size);
// As DSCopyHandle: makes *destination a copy; a null source disposes of it.
TESSEL_API MgErr AZCopyHandle(UHandle* destination, UHandle source);
// As DSHandToHand: replaces *h by a new copy; the old handle stays the caller's.
TESSEL_API MgErr AZHandToHand(UHandle* h);
// As DSPtrToHand: a new handle with a copy of the bytes in *h, null on failure.
TESSEL_API MgErr AZPtrToHand(const void* p, UHandle* h, uint32 size);
// As DSPtrToXHand: resizes the existing handle and copies the bytes into it.
TESSEL_API MgErr AZPtrToXHand(const void* p, UHandle h, uint32 size);
// As DSSetHandleFromPtr: resizes or makes *h and copies the bytes into it.
TESSEL_API MgErr AZSetHandleFromPtr(UHandle* h, const void* p, uint32 size);
// As DSPtrAndHand: appends bytes, which must not be the handle's own.
TESSEL_API MgErr AZPtrAndHand(const void* p, UHandle h, uint32 size);
// As DSHandAndHand: appends a whole handle.
TESSEL_API MgErr AZHandAndHand(UHandle source, UHandle destination);
// As DSRecoverHandle: the handle whose data starts at `data`, or null with a fatal report.
TESSEL_API UHandle AZRecoverHandle(const void* data);
// As DSCheckHandle: kNoErr for a live, intact handle, else kHandleErr.
TESSEL_API MgErr AZCheckHandle(UHandle h);
// As DSCheckPtr: kNoErr for an intact pointer block, else kHandleErr.
TESSEL_API MgErr AZCheckPtr(const void* p);
// As DSHeapCheck: kCorruptErr when the heap is damaged.
TESSEL_API MgErr AZHeapCheck(int32 report);
// As DSMemStats: checks, and fills the record, which may be null.
TESSEL_API MgErr AZMemStats(MemStatRec* stats);
// As DSMaxMem: always 0.
TESSEL_API int32 AZMaxMem(void);

TESSEL_END_C

#endif
