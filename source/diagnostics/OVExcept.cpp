// Here rather than in base, because an exception records its call stack.
#include "diagnostics/CallStackWalk.h"
#include "diagnostics/Guarded.h"
#include <tessel/base/OVExcept.h>
#include <tessel/diagnostics/DebugStream.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <cxxabi.h>
#include <new>
#include <typeinfo>

namespace tessel {
namespace {

constexpr size_t kMostShown = 80;  // leaves room for any detail

// The whole name, or as many of its last folders as can be shown.
const char* ShortName(const char* file) {
    if (!file) return "";
    const size_t length = std::strlen(file);
    if (length <= kMostShown) return file;
    const char* const end = file + length - kMostShown;
    const char* const cut = std::strpbrk(end, "/\\");
    return cut ? cut + 1 : end;
}

}  // namespace

OVExcept::OVExcept(MgErr code, const char* detail, const char* file, int32 line) noexcept : code_(code), line_(line) {
    std::snprintf(detail_, sizeof detail_, "%s", detail ? detail : "");
    const size_t length = file ? std::strlen(file) : 0;
    const size_t kept = std::min(length, sizeof file_ - 1);
    std::snprintf(file_, sizeof file_, "%s", file ? file + (length - kept) : "");
    std::snprintf(what_, sizeof what_, "OVExcept. Err=%d, File=%s, Line=%d, Detail='%s'", code_, ShortName(file), line_,
                  detail_);
    stack_.count = WalkCallStack(stack_.addresses, CallStack::kCapacity, __builtin_frame_address(0),
                                 __builtin_return_address(0), 0);
}

OVExcept GetExceptionInCatch_FileAndLine(const char* file, int32 line) {
    try {
        throw;
    } catch (const std::bad_alloc&) {
        return OVExcept(kMemFullErr, "converted from std::bad_alloc", file, line);
    } catch (const std::bad_cast&) {
        return OVExcept(kGenericErr, "converted from std::bad_cast", file, line);
    } catch (const OVExcept& caught) {
        return caught;
    } catch (const std::exception&) {
        return OVExcept(kGenericErr, "converted from std::exception", file, line);
    } catch (const abi::__forced_unwind&) {
        throw;  // a thread that is being ended
    } catch (...) {
        TESSEL_REPORT(kDebugError, 0x0FA68C31u)
            << "GetExceptionInCatch() called from inside catch(...) -- " << file << " Line " << line;
        throw;
    }
}

MgErr CaughtErr() {
    try {
        throw;
    } catch (const OVExcept& caught) {
        return caught.Code();
    } catch (const std::bad_alloc&) {
        return kMemFullErr;
    } catch (const abi::__forced_unwind&) {
        throw;
    } catch (...) {
        return kGenericErr;
    }
}

}  // namespace tessel
