// What clang's analysis of locks is told: what is a lock, what it guards, who holds it. `./dev clang` proves it; other
// compilers see nothing of it.
#ifndef TESSEL_PLATFORM_LOCKMARKS_H
#define TESSEL_PLATFORM_LOCKMARKS_H

#if defined(__clang__)
#    define TESSEL_LOCKS(...) __attribute__((__VA_ARGS__))
#else
#    define TESSEL_LOCKS(...)
#endif

// Of a variable: read and written under the lock only.
#define TESSEL_GUARDED_BY(lock) TESSEL_LOCKS(guarded_by(lock))

// Of a function: called with the locks held.
#define TESSEL_REQUIRES(...) TESSEL_LOCKS(requires_capability(__VA_ARGS__))

// Of a lock: taken inside the other.
#define TESSEL_ACQUIRED_AFTER(lock) TESSEL_LOCKS(acquired_after(lock))

// Of a function that clang cannot follow: it is alone, or it takes a lock that another function gives back. A comment
// says which.
#define TESSEL_LOCKS_UNPROVEN TESSEL_LOCKS(no_thread_safety_analysis)

#endif
