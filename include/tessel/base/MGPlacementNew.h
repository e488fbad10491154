// Deferred deleters: the end of objects that were built in static storage.
#ifndef TESSEL_BASE_MGPLACEMENTNEW_H
#define TESSEL_BASE_MGPLACEMENTNEW_H

#include <tessel/base/Types.h>

#ifdef __cplusplus

namespace tessel {

// One deferred deletion. Made with new.
class TESSEL_API MGPlacementDeletor {
public:
    virtual ~MGPlacementDeletor();

private:
    friend TESSEL_API void MGPlacementNewRegisterDeletor(MGPlacementDeletor* deletor);
    friend TESSEL_API void MGPlacementNewRunCleanup();
    MGPlacementDeletor* next_ = nullptr;
};

// Destroys an object that was built with placement new.
template <class T>
class MGPlacementDelete final : public MGPlacementDeletor {
public:
    // Will destroy the object, which must live until then.
    explicit MGPlacementDelete(T* object) : object_(object) {}
    ~MGPlacementDelete() override { object_->~T(); }

private:
    T* object_;
};

// Hands a deleter over to the library, which runs it when the memory manager stops. Any thread.
TESSEL_API void MGPlacementNewRegisterDeletor(MGPlacementDeletor* deletor);

// Destroys the deleters registered, newest first, each of which destroys its object.
TESSEL_API void MGPlacementNewRunCleanup();

}  // namespace tessel

#endif
#endif
