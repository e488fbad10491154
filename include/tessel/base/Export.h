// What is exported, and how C sees it.
#ifndef TESSEL_BASE_EXPORT_H
#define TESSEL_BASE_EXPORT_H

// Marks a function, object or class of the interface. Everything else in the library is hidden.
#define TESSEL_API __attribute__((visibility("default")))

// The flat interface is C: usable from C11, from C++, and from any foreign-function interface.
#ifdef __cplusplus
#    define TESSEL_BEGIN_C extern "C" {
#    define TESSEL_END_C }
#else
#    define TESSEL_BEGIN_C
#    define TESSEL_END_C
#endif

#endif
