// What paths keep once for the whole process.
#ifndef TESSEL_SOURCE_PATHS_PATHPROCESS_H
#define TESSEL_SOURCE_PATHS_PATHPROCESS_H

#include <tessel/base/Types.h>

namespace tessel {

// The tracker of path objects on the heap. Both do nothing while the path manager is stopped.
// The call stack of a record begins with the caller of the function whose frame is given.
void TrackPathObject(const void* frame, const void* object, size_t size);
void UntrackPathObject(const void* object);

// Set by PathRef::Setting("utf8"): every path is flattened as "PTH1".
bool FlattensAlwaysAsUtf8();

// Whether text is stepped through by whole characters; byte by byte before the path manager is started.
bool StepsByCharacters();

// Gives back the lists of extensions.
void ReleaseExtensionLists();

}  // namespace tessel

#endif
