// Start and stop of the registry of collections of settings.
#ifndef TESSEL_SOURCE_CONFIG_SETTINGSTABLE_H
#define TESSEL_SOURCE_CONFIG_SETTINGSTABLE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// For the start-up thread.
MgErr CfgSettingsTableStart();
void CfgSettingsTableStop();

}  // namespace tessel

#endif
