/* The whole interface, for C11 and for C++17. */
#ifndef TESSEL_TESSEL_H
#define TESSEL_TESSEL_H

#include <tessel/base/Export.h>
#include <tessel/base/MgErr.h>
#include <tessel/base/NumericTypes.h>
#include <tessel/base/OVExcept.h>
#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>
#include <tessel/diagnostics/AllocTracker.h>
#include <tessel/diagnostics/DebugOutput.h>
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/diagnostics/DumpLeakInfo.h>
#include <tessel/diagnostics/FileLoc.h>
#include <tessel/diagnostics/StackChain.h>
#include <tessel/files/FileManager.h>
#include <tessel/files/shortcut.h>
#include <tessel/resources/RFReadWrite.h>
#include <tessel/resources/ResourceManager.h>
#include <tessel/resources/ovresfile.h>
#include <tessel/strings/BSTR.h>
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringCLStr.h>
#include <tessel/strings/StringCPStr.h>
#include <tessel/strings/StringCStr.h>
#include <tessel/strings/StringFmtPrint.h>
#include <tessel/strings/StringFmtScan.h>
#include <tessel/strings/StringLStr.h>
#include <tessel/strings/StringLStrArray.h>
#include <tessel/strings/StringPStr.h>
#include <tessel/strings/StringUtils.h>
#include <tessel/strings/ovhandle.h>
#include <tessel/strings/ovstring.h>

#endif
