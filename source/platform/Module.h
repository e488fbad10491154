// The executable and the libraries loaded with it.
//
// A ModuleHandle is the address a module is loaded at; kExecutable (0) stands for the executable too.
#ifndef TESSEL_PLATFORM_MODULE_H
#define TESSEL_PLATFORM_MODULE_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace tessel::platform {

using ModuleHandle = std::uintptr_t;
constexpr ModuleHandle kExecutable = 0;

// The module that holds this library.
ModuleHandle OwnModule() noexcept;

// The full name of the module's file (as in DriveTable.h). 126 when no module is loaded at the handle.
bool ModuleFileName(ModuleHandle module, std::string& name);

struct AddressEntry {
    std::string module;  // name of its file, without folders; empty when unknown
    std::string symbol;  // the function's name, demangled; empty when unknown
    std::size_t offset;  // from the function's start, or from the module's when there is no symbol
};

// Whose code (or data) lies at an address. False when no module holds it.
bool DescribeAddress(const void* address, AddressEntry& entry);

// Whether a module that is loaded covers the address. No lock, no system call, no allocation, where the host can tell
// so; elsewhere always true.
bool IsInModule(const void* address) noexcept;

// Loads a library for run-time use. `name` is a plain file name (searched for as the host does) or a full name. Null
// with 126 when it cannot be loaded. A symbol that is not there gives null with 127.
using LibraryHandle = void*;
LibraryHandle LibraryLoad(const char* name);
void* LibrarySymbol(LibraryHandle library, const char* symbol) noexcept;
bool LibraryUnload(LibraryHandle library) noexcept;

}  // namespace tessel::platform

#endif
