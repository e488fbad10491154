// The calling thread's register stack.
#pragma once

#include "numerics/NumericAccess.h"

namespace tessel {

void PushRegister(Extended value);

// Pops the top value; a NaN from an empty stack.
Extended PopRegister();

// A complex value lies with its real part on top.
void PushComplex(const ExtendedComplex& value);
ExtendedComplex PopComplex();

}  // namespace tessel
