// The environment variables that the library reads.
#ifndef TESSEL_SOURCE_FRAME_ENVIRONMENT_H
#define TESSEL_SOURCE_FRAME_ENVIRONMENT_H

namespace tessel {

// Reports every variable whose value is not understood, for which the default holds. They are read where they are
// needed, mostly under a lock or before reports can be made; so this is told once, at the start.
void ReportUnknownSettings();

}  // namespace tessel

#endif
