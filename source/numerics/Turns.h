// Powers of 2 and 10 with an imaginary exponent: how far they turn.
#pragma once

#include "numerics/Extended.h"

namespace tessel {

// An angle from -pi/4 to pi/4, and the quarter turns to add to it.
struct ReducedAngle {
    Extended rest;
    int quarters;
};

// The angle y ln 2 or y ln 10 of a finite y, |y| >= 1, reduced exactly: its error is that of rounding the result.
ReducedAngle AngleOfPowerOf2(Extended y);
ReducedAngle AngleOfPowerOf10(Extended y);

}  // namespace tessel
