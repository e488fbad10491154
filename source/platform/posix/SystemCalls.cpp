#include "platform/posix/SystemCalls.h"

#include <errno.h>
#include <stdio.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/random.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace tessel::platform {

namespace {

// The C library's own declare variable arguments.
int Open(const char* name, int flags, mode_t mode) {
    return ::open(name, flags, mode);
}
int OpenAt(int folder, const char* name, int flags, mode_t mode) {
    return ::openat(folder, name, flags, mode);
}
int Fcntl(int file, int command, int value) {
    return ::fcntl(file, command, value);
}
int Lock(int file, int command, struct flock* range) {
    return ::fcntl(file, command, range);
}

// The C library has no futex. On 32-bit hosts the call with 64-bit times is another one.
long Futex(std::uint32_t* word, int operation, std::uint32_t value, const struct timespec* timeout) {
#if defined(SYS_futex_time64)
    return ::syscall(SYS_futex_time64, word, operation, value, timeout, nullptr, 0);
#else
    return ::syscall(SYS_futex, word, operation, value, timeout, nullptr, 0);
#endif
}

int Membarrier(int command, unsigned flags) {
    return static_cast<int>(::syscall(SYS_membarrier, command, flags, 0));
}

int TgKill(pid_t process, pid_t thread, int signal) {
    return static_cast<int>(::syscall(SYS_tgkill, process, thread, signal));
}
int Prctl(int option, unsigned long value) {
    return ::prctl(option, value);
}
int GetPriority(int which, id_t who) {
    return ::getpriority(static_cast<__priority_which_t>(which), who);
}
int SetPriority(int which, id_t who, int priority) {
    return ::setpriority(static_cast<__priority_which_t>(which), who, priority);
}

// These two report through their results, unlike all others.
int Result(int error) {
    if (error == 0) return 0;
    errno = error;
    return -1;
}
int SigProcMask(int how, const sigset_t* set, sigset_t* before) {
    return Result(::pthread_sigmask(how, set, before));
}
int ClockNanosleep(clockid_t clock, int flags, const struct timespec* time, struct timespec* remaining) {
    return Result(::clock_nanosleep(clock, flags, time, remaining));
}

}  // namespace

constinit SystemCalls systemCalls = {
    .open = Open,
    .openat = OpenAt,
    .close = ::close,
    .read = ::read,
    .write = ::write,
    .lseek = ::lseek,
    .ftruncate = ::ftruncate,
    .fallocate = ::fallocate,
    .fsync = ::fsync,
    .syncfs = ::syncfs,
    .lock = Lock,
    .fcntl = Fcntl,
    .statx = ::statx,
    .futimens = ::futimens,
    .fsetxattr = ::fsetxattr,
    .fchown = ::fchown,
    .flistxattr = ::flistxattr,
    .fremovexattr = ::fremovexattr,
    .getxattr = ::getxattr,
    .fgetxattr = ::fgetxattr,
    .renameat2 = ::renameat2,
    .link = ::link,
    .linkat = ::linkat,
    .symlink = ::symlink,
    .lchown = ::lchown,
    .flock = ::flock,
    .unlink = ::unlink,
    .unlinkat = ::unlinkat,
    .rmdir = ::rmdir,
    .mkdir = ::mkdir,
    .mkdirat = ::mkdirat,
    .chmod = ::chmod,
    .fchmod = ::fchmod,
    .opendir = ::opendir,
    .fdopendir = ::fdopendir,
    .readdir = ::readdir,
    .closedir = ::closedir,
    .getcwd = ::getcwd,
    .readlink = ::readlink,
    .getpid = ::getpid,
    .gettid = ::gettid,
    .getuid = ::getuid,
    .geteuid = ::geteuid,
    .umask = ::umask,
    .raise = ::raise,
    .tgkill = TgKill,
    .sigaction = ::sigaction,
    .sigprocmask = SigProcMask,
    .getpriority = GetPriority,
    .setpriority = SetPriority,
    .sched_yield = ::sched_yield,
    .sched_getaffinity = ::sched_getaffinity,
    .prctl = Prctl,
    .getrusage = ::getrusage,
    .sysconf = ::sysconf,
    .uname = ::uname,
    .chdir = ::chdir,
    .statfs = ::statfs,
    .copy_file_range = ::copy_file_range,
    .pipe2 = ::pipe2,
    .clock_gettime = ::clock_gettime,
    .clock_nanosleep = ClockNanosleep,
    .futex = Futex,
    .process_vm_readv = ::process_vm_readv,
    .getrandom = ::getrandom,
    .membarrier = Membarrier,
};

}  // namespace tessel::platform
