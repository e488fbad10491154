// Settings that hold one of a list of names: the names are the strings of a "STR#" resource, the value is the index of
// one, from 1. The two procedures that a host registers for such a type call the two functions at the end.
//
// A refnum of 0 stands for the application's resource file (MGAppInterface::AppResourceFile). Any thread.
#ifndef TESSEL_CONFIG_CONFIGENUM_H
#define TESSEL_CONFIG_CONFIGENUM_H

#include <tessel/config/ConfigTypeRegistry.h>

TESSEL_BEGIN_C

// Registers the procedures of the type, and stores the ID of its list of names in *storedListID, where they find it.
// kArgErr without the output; else the result of RegisterConfigType, and nothing is stored when it is not kNoErr.
TESSEL_API MgErr CfgEnumTypeInit(int32 type, ConfigFromTextProc fromText, ConfigToTextProc toText, int32 listID,
                                 int32* storedListID);

// Takes the type out and stores 0. kArgErr without the output; else the result of UnregisterConfigType.
TESSEL_API MgErr CfgEnumTypeUninit(int32 type, int32* storedListID);

// The index of the text among the names. kArgErr for an empty text, kConfigKeyErr when it is not among them; *index is
// -1 then. kResNotFoundErr: there is no such list.
TESSEL_API MgErr ConfigParseGetPStrRsrcIndex(RsrcFile refnum, int32* index, const char* text, int32 length,
                                             int32 listID, bool caseInsensitive);

// The name of an index, in *text, which is made when it is null. A failure is reported.
TESSEL_API MgErr ConfigWriteEnumPStr(RsrcFile refnum, int32 listID, int32 index, LStrHandle* text);

TESSEL_END_C

#endif
