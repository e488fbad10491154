// Functions of doubles for which the C library is off by more than one unit in the last place, and quotients of two
// functions: computed in two parts and rounded once, so that hardly more than half a unit is lost. All doubles are
// arguments, with the results of the C library where there is no finite one.
#pragma once

namespace tessel::precise {

double Log10(double x);
double Sin(double x);
double Cos(double x);
double Tan(double x);
double Sinh(double x);
double Cosh(double x);
double Tanh(double x);
double Asinh(double x);
double Acosh(double x);
double Atanh(double x);
double Sec(double x);
double Csc(double x);
double Cot(double x);
double Sinc(double x);

}  // namespace tessel::precise
