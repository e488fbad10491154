// The process-wide decimal point, for those who read it on every call.
#ifndef TESSEL_STRINGS_DECIMALPOINT_H
#define TESSEL_STRINGS_DECIMALPOINT_H

#include <tessel/base/Types.h>

namespace tessel {

extern uint8 systemDecimalPoint;

}  // namespace tessel

#endif
