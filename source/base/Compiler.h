// What is said to the compiler alone: what is likely, what is inlined, how thread-local values are reached. Both
// compilers that build the library understand it; none of it changes what code does.
#ifndef TESSEL_SOURCE_BASE_COMPILER_H
#define TESSEL_SOURCE_BASE_COMPILER_H

#define TESSEL_LIKELY(condition) __builtin_expect(!!(condition), true)
#define TESSEL_UNLIKELY(condition) __builtin_expect(!!(condition), false)

#define TESSEL_ALWAYS_INLINE [[gnu::always_inline]] inline
#define TESSEL_NOT_INLINE [[gnu::noinline]]

// For thread-local values on hot paths: found without a call. There is little room for them, so they are few and small.
#define TESSEL_FAST_THREAD_LOCAL [[gnu::tls_model("initial-exec")]] thread_local

// For code that reads memory which others may own or write, as walks over stacks do.
#define TESSEL_NOT_SANITIZED __attribute__((no_sanitize("address", "thread")))

#endif
