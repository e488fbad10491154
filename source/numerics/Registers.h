/* The calling thread's register stack. */
#pragma once

#include "numerics/NumericAccess.h"

namespace tessel {

/* Pushes a value. `rest` tells on which side of it the exact value lies (-1 below, 1 above), so that a store into a
   narrower real can round as if it had the exact value. */
void PushRegister(Extended value, int32 rest = 0);

/* Pops the top value; a NaN from an empty stack. */
Extended PopRegister();

/* A complex value lies with its real part on top. */
void PushComplex(const ExtendedComplex& value);
ExtendedComplex PopComplex();

}  // namespace tessel
