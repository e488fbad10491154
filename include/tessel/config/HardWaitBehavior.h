// How the library's own waiting thread runs: the setting "HardWaitTimeCritical" of the main preference file, in the
// collection "HardWaitBehaviorSettings".
//
// The host starts HardWaitBehaviorService before the occurrences. When the setting is true their thread runs at level 3
// ("very high"), else at level 4 ("time critical"). The stop of the service saves the setting.
#ifndef TESSEL_CONFIG_HARDWAITBEHAVIOR_H
#define TESSEL_CONFIG_HARDWAITBEHAVIOR_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// The setting, 0 or 1; 0 while the service is not started. Any thread, while none changes the setting.
TESSEL_API int32 GetHardWaitTimeCritical(void);

TESSEL_END_C

#endif
