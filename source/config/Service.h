// Start and stop of the configuration, for the service objects.
#ifndef TESSEL_SOURCE_CONFIG_SERVICE_H
#define TESSEL_SOURCE_CONFIG_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Makes the table of types and the registry of settings, chooses the main preference file, and makes the manager for
// it. kGenericErr when there is a main manager already.
MgErr ConfigManagerStart();
MgErr ConfigManagerStop();

// Registers the library's own types; stop takes them out in the reverse order.
MgErr ConfigCoreTypesStart();
MgErr ConfigCoreTypesStop();

// Reads the setting "HardWaitTimeCritical"; stop saves it.
MgErr HardWaitBehaviorStart();
MgErr HardWaitBehaviorStop();

}  // namespace tessel

#endif
