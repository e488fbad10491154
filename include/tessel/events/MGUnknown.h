// Objects that count their references. Events and targets of a queue derive from it.
#ifndef TESSEL_EVENTS_MGUNKNOWN_H
#define TESSEL_EVENTS_MGUNKNOWN_H

#include <tessel/diagnostics/DebugStream.h>
#include <tessel/utilities/OVGuid.h>

#ifdef __cplusplus
#    include <atomic>

namespace tessel {

// The host implements it, by hand or with MGRefCounted. The slots and their order are fixed.
class TESSEL_API MGUnknown {
public:
    // The object as the class of that identifier, with a reference for the caller; null when it is none. Not called
    // here.
    virtual void* QueryClass(const OVGuidType& classID) = 0;
    // One reference more, or less: the last one ends the object. What is left, roughly. Any thread.
    virtual uint32 AddRef() = 0;
    // One reference less; the last one ends the object. What is left, roughly. Any thread.
    virtual uint32 Release() = 0;
    // Appends what tells the object from others.
    virtual void WriteToDebugStream(DebugStream& stream) = 0;

    // The identifier that QueryClass knows this interface by.
    static const OVGuidType& ClassID();

protected:
    ~MGUnknown() = default;
};

// Counts for a class that derives from MGEvent, MGEventTarget or the like. A new object has one reference, its maker's;
// the last Release deletes it. It is the class of the interface's identifier, and an MGUnknown.
template <class Interface>
class MGRefCounted : public Interface {
public:
    void* QueryClass(const OVGuidType& classID) override {
        const bool own = OVGuidsEqual(&classID, &Interface::ClassID());
        if (!own && !OVGuidsEqual(&classID, &MGUnknown::ClassID())) return nullptr;
        AddRef();
        return static_cast<Interface*>(this);
    }
    uint32 AddRef() override { return references_.fetch_add(1, std::memory_order_relaxed) + 1; }
    uint32 Release() override {
        const uint32 left = references_.fetch_sub(1, std::memory_order_acq_rel) - 1;
        if (left == 0) delete this;
        return left;
    }
    MGRefCounted(const MGRefCounted&) = delete;
    MGRefCounted& operator=(const MGRefCounted&) = delete;

protected:
    MGRefCounted() = default;
    virtual ~MGRefCounted() = default;

private:
    std::atomic<uint32> references_{1};
};

// Lets the object write itself; "<invalid MGUnknown object>" for null.
TESSEL_API void ToDebugStream(DebugStream& stream, MGUnknown* object);

}  // namespace tessel

#endif
#endif
