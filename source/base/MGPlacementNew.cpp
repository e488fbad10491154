#include <tessel/base/MGPlacementNew.h>

#include <atomic>

namespace tessel {
namespace {

std::atomic<MGPlacementDeletor*> newestDeletor{nullptr};

}  // namespace

MGPlacementDeletor::~MGPlacementDeletor() = default;

void MGPlacementNewRegisterDeletor(MGPlacementDeletor* deletor) {
    if (!deletor) return;
    deletor->next_ = newestDeletor.load();
    while (!newestDeletor.compare_exchange_weak(deletor->next_, deletor)) {
    }
}

void MGPlacementNewRunCleanup() {
    for (MGPlacementDeletor* deletor = newestDeletor.exchange(nullptr); deletor;) {
        MGPlacementDeletor* const next = deletor->next_;
        delete deletor;
        deletor = next;
    }
}

}  // namespace tessel
