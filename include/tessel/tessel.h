/* The whole interface, for C11 and for C++17. */
#ifndef TESSEL_TESSEL_H
#define TESSEL_TESSEL_H

#include <tessel/base/Export.h>
#include <tessel/base/MgErr.h>
#include <tessel/base/NumericTypes.h>
#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>

#endif
