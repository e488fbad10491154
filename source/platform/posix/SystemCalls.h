// The calls that this backend makes of the kernel, by name, in one table that tests replace parts of: a short write, an
// interruption, a full disk, a clock moved by hand. No other file of the backend makes one, but for those that do not
// come back. What the C library asks of the kernel for its own functions (threads, memory, locales, accounts, realpath,
// loading) is its own affair.
#ifndef TESSEL_PLATFORM_POSIX_SYSTEMCALLS_H
#define TESSEL_PLATFORM_POSIX_SYSTEMCALLS_H

#include <cstddef>
#include <cstdint>
#include <dirent.h>
#include <fcntl.h>
#include <sched.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <sys/types.h>
#include <sys/uio.h>
#include <sys/utsname.h>
#include <time.h>

namespace tessel::platform {

// X(result, name, parameters): all return -1 (opendir, fdopendir, readdir and getcwd: null) and set errno on failure.
// Asking who one is, and umask, cannot fail.
#define TESSEL_SYSTEM_CALLS(X)                                                                                     \
    X(int, open, (const char* name, int flags, mode_t mode))                                                       \
    X(int, openat, (int folder, const char* name, int flags, mode_t mode))                                         \
    X(int, close, (int file))                                                                                      \
    X(ssize_t, read, (int file, void* buffer, std::size_t count))                                                  \
    X(ssize_t, write, (int file, const void* data, std::size_t count))                                             \
    X(off_t, lseek, (int file, off_t offset, int from))                                                            \
    X(int, ftruncate, (int file, off_t size))                                                                      \
    X(int, fallocate, (int file, int mode, off_t offset, off_t size))                                              \
    X(int, fsync, (int file))                                                                                      \
    X(int, syncfs, (int file))                                                                                     \
    X(int, lock, (int file, int command, struct flock* range))                                                     \
    X(int, fcntl, (int file, int command, int value))                                                              \
    X(int, statx, (int folder, const char* name, int flags, unsigned mask, struct statx* result))                  \
    X(int, futimens, (int file, const struct timespec* times))                                                     \
    X(int, fsetxattr, (int file, const char* name, const void* value, std::size_t size, int flags))                \
    X(int, fchown, (int file, uid_t owner, gid_t group))                                                           \
    X(ssize_t, flistxattr, (int file, char* names, std::size_t size))                                              \
    X(int, fremovexattr, (int file, const char* name))                                                             \
    X(ssize_t, getxattr, (const char* path, const char* name, void* value, std::size_t size))                      \
    X(ssize_t, fgetxattr, (int file, const char* name, void* value, std::size_t size))                             \
    X(int, renameat2, (int fromFolder, const char* from, int toFolder, const char* to, unsigned flags))            \
    X(int, link, (const char* from, const char* to))                                                               \
    X(int, linkat, (int fromFolder, const char* from, int toFolder, const char* to, int flags))                    \
    X(int, symlink, (const char* text, const char* name))                                                          \
    X(int, lchown, (const char* name, uid_t owner, gid_t group))                                                   \
    X(int, flock, (int file, int operation))                                                                       \
    X(int, unlink, (const char* name))                                                                             \
    X(int, unlinkat, (int folder, const char* name, int flags))                                                    \
    X(int, rmdir, (const char* name))                                                                              \
    X(int, mkdir, (const char* name, mode_t mode))                                                                 \
    X(int, mkdirat, (int folder, const char* name, mode_t mode))                                                   \
    X(int, chmod, (const char* name, mode_t mode))                                                                 \
    X(int, fchmod, (int file, mode_t mode))                                                                        \
    X(DIR*, opendir, (const char* name))                                                                           \
    X(DIR*, fdopendir, (int folder))                                                                               \
    X(dirent*, readdir, (DIR * listing))                                                                           \
    X(int, closedir, (DIR * listing))                                                                              \
    X(char*, getcwd, (char* buffer, std::size_t size))                                                             \
    X(ssize_t, readlink, (const char* name, char* buffer, std::size_t size))                                       \
    X(pid_t, getpid, ())                                                                                           \
    X(pid_t, gettid, ())                                                                                           \
    X(uid_t, getuid, ())                                                                                           \
    X(uid_t, geteuid, ())                                                                                          \
    X(mode_t, umask, (mode_t mask))                                                                                \
    X(int, raise, (int signal))                                                                                    \
    X(int, tgkill, (pid_t process, pid_t thread, int signal))                                                      \
    X(int, sigaction, (int signal, const struct sigaction* action, struct sigaction* before))                      \
    X(int, sigprocmask, (int how, const sigset_t* set, sigset_t* before))                                          \
    X(int, getpriority, (int which, id_t who))                                                                     \
    X(int, setpriority, (int which, id_t who, int priority))                                                       \
    X(int, sched_yield, ())                                                                                        \
    X(int, sched_getaffinity, (pid_t thread, std::size_t size, cpu_set_t * set))                                   \
    X(int, prctl, (int option, unsigned long value))                                                               \
    X(int, getrusage, (int who, struct rusage* usage))                                                             \
    X(long, sysconf, (int name))                                                                                   \
    X(int, uname, (struct utsname * host))                                                                         \
    X(int, chdir, (const char* name))                                                                              \
    X(int, statfs, (const char* name, struct statfs* result))                                                      \
    X(ssize_t, copy_file_range,                                                                                    \
      (int from, off64_t* fromOffset, int to, off64_t* toOffset, std::size_t count, unsigned flags))               \
    X(int, pipe2, (int* files, int flags))                                                                         \
    X(int, clock_gettime, (clockid_t clock, struct timespec * time))                                               \
    X(int, clock_nanosleep, (clockid_t clock, int flags, const struct timespec* time, struct timespec* remaining)) \
    X(long, futex, (std::uint32_t * word, int operation, std::uint32_t value, const struct timespec* timeout))     \
    X(ssize_t, process_vm_readv,                                                                                   \
      (pid_t process, const struct iovec* local, unsigned long locals, const struct iovec* remote,                 \
       unsigned long remotes, unsigned long flags))                                                                \
    X(ssize_t, getrandom, (void* buffer, std::size_t count, unsigned flags))                                       \
    X(int, membarrier, (int command, unsigned flags))

struct SystemCalls {
#define TESSEL_SYSTEM_CALL_MEMBER(result, name, parameters) result(*name) parameters;
    TESSEL_SYSTEM_CALLS(TESSEL_SYSTEM_CALL_MEMBER)
#undef TESSEL_SYSTEM_CALL_MEMBER
};

extern SystemCalls systemCalls;

}  // namespace tessel::platform

#endif
