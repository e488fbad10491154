// Cookie jars: tables that give out 32-bit refnums (cookies) for small records of a fixed size.
//
// A cookie is a generation (bits 31-20, 1 to 4095) above a slot index (bits 19-0), so that a cookie whose record is
// gone is refused even when its slot is used again. 0 is never a cookie. A record never moves while its cookie lives. A
// jar holds up to 1,048,576 cookies and gives memory back only when it is disposed of.
//
// The flat functions work on a jar handle; tessel::BaseCookieJar holds one; tessel::CookieJar<T> keeps pointers.
// Any thread; lookups take no lock.
#ifndef TESSEL_MEMORY_COOKIEMANAGER_H
#define TESSEL_MEMORY_COOKIEMANAGER_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

// A refnum of a record; 0 is never one.
typedef uint32 MagicCookie;
// A jar for the flat functions.
typedef UHandle MagicCookieJar;

TESSEL_BEGIN_C

// A jar for one pointer (or any record of sizeof(void*) bytes) per cookie, or null when there is no memory.
TESSEL_API MagicCookieJar MCNewJar(void);

// A jar for `infoSize` bytes per cookie, or null. The bytes start at an address aligned for a pointer.
TESSEL_API MagicCookieJar MCNewBigJar(uint32 infoSize);

// Disposes of the jar and its records, with a report of its size. Nothing for null. Always kNoErr.
TESSEL_API MgErr MCDisposeJar(MagicCookieJar jar);

// *count = cookies alive. kArgErr when either argument is null.
TESSEL_API MgErr MCJarSize(MagicCookieJar jar, int32* count);

// A new cookie for a copy of the record at `info` (null: zeros); 0 for a null jar, no memory or a full jar.
TESSEL_API MagicCookie MCNewCookie(MagicCookieJar jar, const void* info);

// Ends the cookie; its record is copied to infoOut unless that is null. kArgErr when it is no cookie of the jar.
// Like MCSetCookieInfo and MCGetCookieList: kArgErr for a null jar.
TESSEL_API MgErr MCDisposeCookie(MagicCookieJar jar, MagicCookie cookie, void* infoOut);

// Replaces the record; null stores zeros. kArgErr when it is no cookie of the jar.
TESSEL_API MgErr MCSetCookieInfo(MagicCookieJar jar, MagicCookie cookie, const void* info);

// Copies the record out. kArgErr for a null jar or what is no cookie; infoOut is then untouched, except that a pointer
// whose cookie ended during the call reads as null.
TESSEL_API MgErr MCGetCookieInfo(MagicCookieJar jar, MagicCookie cookie, void* infoOut);

// *info = the record in place, good while the cookie lives; null and kArgErr on failure.
TESSEL_API MgErr MCGetCookieInfoPtr(MagicCookieJar jar, MagicCookie cookie, void** info);

// Fills *list, a handle of uint32 (made when null): [0] the count, then the live cookies by slot index.
TESSEL_API MgErr MCGetCookieList(MagicCookieJar jar, UHandle* list);

// False for a null jar.
TESSEL_API bool MCIsACookie(MagicCookieJar jar, MagicCookie cookie);

// The first live cookie, by slot index, whose record has the bytes of `info`; 0 when there is none, and for a null
// argument.
TESSEL_API MagicCookie MCGetCookieForInfo(MagicCookieJar jar, const void* info);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

// A list of cookies. Owns its handle.
class TESSEL_API CookieList : public TrackedObject {
public:
    CookieList() = default;
    ~CookieList();
    CookieList(const CookieList&) = delete;
    CookieList& operator=(const CookieList&) = delete;

    // How many cookies the list holds.
    int32 GetCount() const { return count_; }
    // 0 when i is out of range.
    MagicCookie GetCookie(int32 i) const;
    // kArgErr when i is out of range.
    MgErr SetCookie(int32 i, MagicCookie cookie);
    // New cookies are 0. kArgErr for a negative count; out of memory empties the list or leaves it empty.
    MgErr SetCount(int32 count);

private:
    int32 count_ = 0;
    UHandle cookies_ = nullptr;
};

// A jar as an object. Its methods are the flat functions above, called with its jar. Infos are `infoSize` bytes.
// With a rights mode other than 0 each cookie carries a count, 1 when made, and ends when the count is released to 0.
// The destructor does not dispose of the jar: Uninit does.
class TESSEL_API BaseCookieJar : public TrackedObject {
public:
    BaseCookieJar() = default;
    virtual ~BaseCookieJar() = default;
    BaseCookieJar(const BaseCookieJar&) = delete;
    BaseCookieJar& operator=(const BaseCookieJar&) = delete;

    // kMemFullErr when the jar cannot be made.
    MgErr Init(uint32 infoSize, int32 rightsMode);
    // Disposes of the jar, if there is one.
    MgErr Uninit();

    // A new cookie for a copy of the record at `info`; as MCNewCookie.
    MagicCookie NewCookie(const void* info);
    // Ends a cookie, its record to infoOut unless that is null; as MCDisposeCookie.
    MgErr DisposeCookie(const MagicCookie& cookie, void* infoOut);
    // Replaces the record of a cookie; as MCSetCookieInfo.
    MgErr SetCookieInfo(const MagicCookie& cookie, const void* info);
    // Copies the record of a cookie out; as MCGetCookieInfo.
    MgErr GetCookieInfo(const MagicCookie& cookie, void* infoOut);
    // Whether it is a live cookie of the jar.
    bool IsACookie(const MagicCookie& cookie);
    // Fills the list with the live cookies, by slot index. kArgErr for a null list.
    MgErr GetCookieList(CookieList* list);
    // The first live cookie with these bytes as its record; 0: none.
    MagicCookie GetCookieForInfo(const void* info);

    // Raises the count, to 1,048,575 at most, and copies the record out: 1. A cookie that has ended, a count that can
    // take no more or a jar without rights: 0, and the first bytes of infoOut, those of a pointer or of an info that is
    // shorter, are 0. Without a jar the length of an info is not known, and infoOut is left alone.
    int32 AcquireCookieRights(const MagicCookie& cookie, void* infoOut);
    // Lowers the count and returns what it was: 1 when the cookie has ended now. 0: nothing to release.
    int32 ReleaseCookieRights(const MagicCookie& cookie);

    // Whether there is a jar: between Init and Uninit.
    bool IsAValidJar() const { return jar_ != nullptr; }
    // *count = cookies alive; as MCJarSize.
    MgErr GetNumCookies(int32* count);

private:
    MagicCookieJar jar_ = nullptr;
};

// A jar of pointers: T is a pointer type.
template <class T>
class CookieJar : public BaseCookieJar {
    static_assert(sizeof(T) == sizeof(void*), "a CookieJar keeps pointers; use BaseCookieJar for other records");

public:
    // Makes the jar. kMemFullErr when it cannot be made.
    MgErr Init(int32 rightsMode = 0) { return BaseCookieJar::Init(sizeof(T), rightsMode); }
    // A new cookie for the pointer; 0 on failure.
    MagicCookie NewCookie(T info) { return BaseCookieJar::NewCookie(&info); }
    // Ends a cookie; its pointer goes to *infoOut unless that is null.
    MgErr DisposeCookie(const MagicCookie& cookie, T* infoOut = nullptr) {
        return BaseCookieJar::DisposeCookie(cookie, infoOut);
    }
    // Replaces the pointer of a cookie.
    MgErr SetCookieInfo(const MagicCookie& cookie, T info) { return BaseCookieJar::SetCookieInfo(cookie, &info); }
    // *infoOut = the pointer of a cookie.
    MgErr GetCookieInfo(const MagicCookie& cookie, T* infoOut) { return BaseCookieJar::GetCookieInfo(cookie, infoOut); }
    // The first live cookie of the pointer; 0: none.
    MagicCookie GetCookieForInfo(T info) { return BaseCookieJar::GetCookieForInfo(&info); }
    // Raises the count of a cookie, its pointer to *infoOut, which is null when that fails.
    int32 AcquireCookieRights(const MagicCookie& cookie, T* infoOut) {
        if (infoOut) *infoOut = nullptr;
        return BaseCookieJar::AcquireCookieRights(cookie, infoOut);
    }
};

}  // namespace tessel
#endif

#endif
