#include "platform/Module.h"

#include "platform/posix/ElfSymbols.h"
#include "platform/posix/Interrupted.h"
#include "platform/posix/NativeNames.h"

#include <cstdlib>
#include <cxxabi.h>
#include <dlfcn.h>
#include <link.h>
#include <memory>
#include <unistd.h>

namespace tessel::platform {

namespace {

// The host's full name of the executable; empty when it does not tell.
std::string ExecutableFile() {
    std::string name(256, 0);
    for (;;) {
        ssize_t length = systemCalls.readlink("/proc/self/exe", name.data(), name.size());
        if (length < 0) return {};
        if (static_cast<std::size_t>(length) < name.size()) {
            name.resize(static_cast<std::size_t>(length));
            return name;
        }
        name.resize(name.size() * 2);
    }
}

// Where the first segment lies: the bias alone is 0 for an executable that is not relocated.
ModuleHandle BaseOf(const dl_phdr_info& info) {
    for (int i = 0; i < info.dlpi_phnum; ++i) {
        const auto& segment = info.dlpi_phdr[i];
        if (segment.p_type == PT_LOAD) return static_cast<ModuleHandle>(info.dlpi_addr + (segment.p_vaddr & ~0xFFFul));
    }
    return static_cast<ModuleHandle>(info.dlpi_addr);
}

// Calls visit(base, host name) for each module, the executable first, until it returns false.
template <typename Visitor>
void ForEachModule(Visitor visit) {
    dl_iterate_phdr(
        [](dl_phdr_info* info, std::size_t, void* context) {
            // The executable's own name is empty here.
            return (*static_cast<Visitor*>(context))(BaseOf(*info), info->dlpi_name ? info->dlpi_name : "") ? 0 : 1;
        },
        &visit);
}

std::string FileOf(const char* moduleName) {
    return *moduleName ? moduleName : ExecutableFile();
}

std::string FullFile(const std::string& file) {
    std::unique_ptr<char, decltype(&std::free)> full(::realpath(file.c_str(), nullptr), std::free);
    return full ? full.get() : file;
}

ModuleHandle ExecutableBase() {
    ModuleHandle executable = kExecutable;
    ForEachModule([&](ModuleHandle base, const char*) {
        executable = base;
        return false;
    });
    return executable;
}

std::string Demangled(const char* symbol) {
    int status = 0;
    std::unique_ptr<char, decltype(&std::free)> text(abi::__cxa_demangle(symbol, nullptr, nullptr, &status), std::free);
    return status == 0 && text ? text.get() : symbol;
}

}  // namespace

ModuleHandle OwnModule() noexcept {
    Dl_info info{};
    if (dladdr(reinterpret_cast<const void*>(&OwnModule), &info) == 0) return kExecutable;
    return reinterpret_cast<ModuleHandle>(info.dli_fbase);
}

bool ModuleFileName(ModuleHandle module, std::string& name) {
    std::string file = module == kExecutable ? ExecutableFile() : "";
    if (module != kExecutable) {
        ForEachModule([&](ModuleHandle base, const char* moduleName) {
            if (base == module) file = FullFile(FileOf(moduleName));
            return base != module;
        });
    }
    return file.empty() ? FailWith(kErrorModuleNotFound) : NativeToName(file, name);
}

bool DescribeAddress(const void* address, AddressEntry& entry) {
    Dl_info info{};
    entry = {};
    if (dladdr(address, &info) == 0) return FailWith(kErrorModuleNotFound);
    std::string file = info.dli_fname ? info.dli_fname : "";
    std::uintptr_t base = reinterpret_cast<std::uintptr_t>(info.dli_fbase);
    if (base == ExecutableBase()) file = ExecutableFile();  // its name here is what it was called by
    entry.module = NameFromDisk(NativeLast(file));
    entry.offset = reinterpret_cast<std::uintptr_t>(address) - base;
    std::uintptr_t start = reinterpret_cast<std::uintptr_t>(info.dli_saddr) - base;
    std::string symbol = info.dli_sname ? info.dli_sname : "";
    if (symbol.empty() && !FindElfSymbol(file, entry.offset, symbol, start)) return true;
    entry.symbol = Demangled(symbol.c_str());
    entry.offset -= start;
    return true;
}

bool IsInModule(const void* address) noexcept {
#ifdef DLFO_STRUCT_HAS_EH_DBASE  // a C library that has _dl_find_object
    dl_find_object object;
    return _dl_find_object(const_cast<void*>(address), &object) == 0;
#else
    return address != nullptr;
#endif
}

LibraryHandle LibraryLoad(const char* name) {
    std::string file = name;
    bool plain = file.find_first_of("\\/:") == std::string::npos;
    if (!plain && !NameToNative(name, file)) return nullptr;
    // The loader would wait for a pipe.
    struct statx status;
    const bool isThere = !plain && StatusOf(file, Links::kFollowed, STATX_TYPE, status);
    if (isThere && !S_ISREG(status.stx_mode)) {
        FailWith(kErrorModuleNotFound);
        return nullptr;
    }
    void* library = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!library) FailWith(kErrorModuleNotFound);
    return library;
}

void* LibrarySymbol(LibraryHandle library, const char* symbol) noexcept {
    void* address = library ? dlsym(library, symbol) : nullptr;
    if (!address) FailWith(kErrorProcedureNotFound);
    return address;
}

bool LibraryUnload(LibraryHandle library) noexcept {
    return (library && dlclose(library) == 0) || FailWith(kErrorInvalidHandle);
}

}  // namespace tessel::platform
