#include <tessel/events/MGEvtQPurge.h>

namespace tessel {
namespace {

struct Specific {
    MGEventTarget* target;
    MGEvent* event;
};

bool IsForTarget(MGEventTarget* target, MGEvent*, void* wanted) {
    return target == static_cast<MGEventTarget*>(wanted);
}

bool IsOfKind(MGEventTarget*, MGEvent* event, void* kind) {
    return event->GetKind() == *static_cast<const int32*>(kind);
}

bool IsSpecific(MGEventTarget* target, MGEvent* event, void* wanted) {
    const Specific& specific = *static_cast<const Specific*>(wanted);
    return (!specific.target || specific.target == target) && event->IsEquivalent(specific.event);
}

}  // namespace

uint32 PurgeEventsForTarget(MGEventQueue* queue, MGEventTarget* target) {
    return queue ? queue->PurgeEvents(IsForTarget, target) : 0;
}

uint32 PurgeEventsOfKind(MGEventQueue* queue, int32 kind) {
    return queue ? queue->PurgeEvents(IsOfKind, &kind) : 0;
}

uint32 PurgeSpecificEvent(MGEventQueue* queue, MGEventTarget* target, MGEvent* event) {
    Specific wanted{target, event};
    return queue && event ? queue->PurgeEvents(IsSpecific, &wanted) : 0;
}

}  // namespace tessel
