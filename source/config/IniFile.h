// A document from and to the disk.
#ifndef TESSEL_SOURCE_CONFIG_INIFILE_H
#define TESSEL_SOURCE_CONFIG_INIFILE_H

#include "config/IniDocument.h"
#include "platform/FileSystem.h"

#include <string>

namespace tessel {

// Replaces the document by what the file of that name says, and tells which version it is; both are left alone on
// failure. kNotFoundErr when it cannot be opened; `missing`: because there is none. kIOErr when it cannot be read,
// kUnsupportedErr as IniDocument::Read. May raise std::bad_alloc.
MgErr LoadIni(const std::string& name, IniDocument& document, platform::FileVersion& version, bool& missing);

// Puts the document in the place of the file, or makes one, and tells which version it is. Atomic and durable.
// kPermissionErr when the file cannot be written or replaced, kIOErr when no temporary file can be made beside it,
// kDiskFullErr when what is written does not reach the disk: all leave the file as it was, but for a disk that fails
// when the folder is flushed. kGenericErr for an empty name. May raise std::bad_alloc.
MgErr SaveIni(const std::string& name, const IniDocument& document, platform::FileVersion& version);

}  // namespace tessel

#endif
