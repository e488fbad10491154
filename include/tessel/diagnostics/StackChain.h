// Call stacks: recording the calls that led here, and naming them.
//
// Recording follows the frame pointers within the calling thread's stack. It makes no system call and no allocation and
// cannot fault, so that it can be done for every object made.
#ifndef TESSEL_DIAGNOSTICS_STACKCHAIN_H
#define TESSEL_DIAGNOSTICS_STACKCHAIN_H

#include <tessel/base/OVExcept.h>

#ifdef __cplusplus

namespace tessel {

// Records return addresses. Belongs to one thread while it records.
class TESSEL_API StackChain {
public:
    // Records from the caller's frame, leaving out the `skip` innermost frames. With 0 the first address recorded lies
    // in the function that calls Record.
    virtual void Record(int32 skip) = 0;
    // Records from a given frame: its return address first, then those of the frames that called it.
    virtual void RecordFrom(const void* framePointer, const void* returnAddress, int32 skip) = 0;

protected:
    ~StackChain() = default;

    // The walk: stores up to `capacity` addresses and returns how many. The frame must be one of the calling thread's;
    // the walk ends at the first frame that is not.
    static int32 RecordToBuf(const void** addresses, int32 capacity, const void* framePointer,
                             const void* returnAddress, int32 skip) noexcept;
};

// Holds at most N addresses.
template <int32 N>
class StackChainFS final : public StackChain {
public:
    __attribute__((noinline)) void Record(int32 skip) override {
        RecordFrom(__builtin_frame_address(0), __builtin_return_address(0), skip);
    }
    void RecordFrom(const void* framePointer, const void* returnAddress, int32 skip) override {
        count_ = RecordToBuf(addresses_, N, framePointer, returnAddress, skip);
    }
    // How many addresses were recorded.
    int32 Count() const { return count_; }
    // An address by its index from 0, innermost first; not checked.
    const void* At(int32 index) const { return addresses_[index]; }

private:
    int32 count_ = 0;
    const void* addresses_[N];
};

// The name of a code address. "<unknown>" stands for what is not known.
class TESSEL_API FrameDecoder {
public:
    // Looks the address up now; the texts are the object's own.
    explicit FrameDecoder(const void* address);

    // The address as it was given.
    const void* Address() const { return address_; }
    // The file name of the module that the address lies in.
    const char* Module() const { return module_; }
    // The function that the address lies in.
    const char* Symbol() const { return symbol_; }
    // Bytes from the start of the symbol to the address.
    uintptr_t Offset() const { return offset_; }

    // Module and symbol, "%s %s".
    const char* Name() const { return name_; }

private:
    const void* address_;
    uintptr_t offset_;
    char module_[128];
    char symbol_[512];
    char name_[128 + 512];
};

}  // namespace tessel

#endif
#endif
