// Names of enumerations, in string resources.
#include "config/ConfigText.h"
#include "diagnostics/Guarded.h"
#include <tessel/base/MGAppInterface.h>
#include <tessel/config/ConfigEnum.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/strings/StringLStr.h>

namespace tessel {
namespace {

constexpr ResType kStringListType = TESSEL_FOURCC('S', 'T', 'R', '#');

RsrcFile FileOf(RsrcFile refnum) {
    if (refnum) return refnum;
    MGAppInterface* app = MGApp();
    return app ? app->AppResourceFile() : 0;
}

}  // namespace
}  // namespace tessel

using namespace tessel;

MgErr CfgEnumTypeInit(int32 type, ConfigFromTextProc fromText, ConfigToTextProc toText, int32 listID,
                      int32* storedListID) {
    if (!storedListID) return kArgErr;
    MgErr err = RegisterConfigType(type, fromText, toText);
    if (!err) *storedListID = listID;
    return err;
}

MgErr CfgEnumTypeUninit(int32 type, int32* storedListID) {
    if (!storedListID) return kArgErr;
    *storedListID = 0;
    return UnregisterConfigType(type);
}

MgErr ConfigParseGetPStrRsrcIndex(RsrcFile refnum, int32* index, const char* text, int32 length, int32 listID,
                                  bool caseInsensitive) {
    if (!index) return kArgErr;
    *index = -1;
    if (!text || length <= 0) return kArgErr;
    int32 exists = 0;
    refnum = FileOf(refnum);
    if (MgErr err = RExists(refnum, kStringListType, listID, &exists)) return err;
    for (int32 i = 1;; ++i) {
        Str255 name;
        MgErr err = RGetIndString(refnum, name, listID, i);
        if (err) return err == kResNotFoundErr ? kConfigKeyErr : err;  // behind the last one
        auto compare = caseInsensitive ? PtrLenStrCaseCmp : PtrLenStrCmp;
        if (compare(name + 1, name[0], text, length) != 0) continue;
        *index = i;
        return kNoErr;
    }
}

MgErr ConfigWriteEnumPStr(RsrcFile refnum, int32 listID, int32 index, LStrHandle* text) {
    if (!text) return kArgErr;
    Str255 name;
    MgErr err = RGetIndString(FileOf(refnum), name, listID, index);
    if (!err) err = StoreText({reinterpret_cast<char*>(name + 1), name[0]}, text);
    if (err) TESSEL_REPORT(kDebugWarning, 0x7D20E1B5u) << "Failed to find correct value for enumeration string.";
    return err;
}
