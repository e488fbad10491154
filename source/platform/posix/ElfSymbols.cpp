#include "platform/posix/ElfSymbols.h"

#include "platform/Mutex.h"
#include "platform/posix/Interrupted.h"

#include <algorithm>
#include <cstring>
#include <link.h>
#include <map>
#include <string>
#include <unistd.h>
#include <vector>

namespace tessel::platform {

namespace {

using Header = ElfW(Ehdr);
using Section = ElfW(Shdr);
using Symbol = ElfW(Sym);
using Segment = ElfW(Phdr);

struct Function {
    std::uintptr_t start, size;
    std::size_t name;  // where it stands in the texts
};

// What is kept of a file.
struct Names {
    std::vector<Function> functions;  // sorted by start
    std::string texts;
};

// A file read in pieces: of one with debugging information only a small part is wanted.
class ElfFile {
public:
    explicit ElfFile(const char* native) : file_(OpenRetrying(native, O_RDONLY | O_NONBLOCK)) {}
    ~ElfFile() {
        if (file_ >= 0) systemCalls.close(file_);
    }
    ElfFile(const ElfFile&) = delete;
    ElfFile& operator=(const ElfFile&) = delete;

    // False unless all of it is there.
    bool Read(std::uint64_t at, void* to, std::size_t count) const {
        if (file_ < 0 || systemCalls.lseek(file_, static_cast<off_t>(at), SEEK_SET) < 0) return false;
        std::size_t done = 0;
        return ReadAll(file_, to, count, done) && done == count;
    }

    template <typename Record>
    bool ReadRecords(std::uint64_t at, std::size_t count, std::vector<Record>& records) const {
        records.resize(count);
        return Read(at, records.data(), count * sizeof(Record));
    }

private:
    int file_;
};

// No table or text of a module is longer than this; a file that says so is damaged.
constexpr std::uint64_t kMostBytes = 256u << 20;

// The address that the file gives its first loaded byte: what offsets are measured from.
std::uintptr_t LoadAddress(const ElfFile& file, const Header& header) {
    std::vector<Segment> segments;
    if (header.e_phentsize != sizeof(Segment)) return 0;
    if (!file.ReadRecords(header.e_phoff, header.e_phnum, segments)) return 0;
    for (const Segment& segment : segments) {
        if (segment.p_type == PT_LOAD) return static_cast<std::uintptr_t>(segment.p_vaddr) & ~std::uintptr_t{0xFFF};
    }
    return 0;
}

void TakeFunctions(const std::vector<Symbol>& symbols, std::uintptr_t base, Names& names) {
    for (const Symbol& symbol : symbols) {
        bool isFunction = (symbol.st_info & 0xF) == STT_FUNC && symbol.st_shndx != SHN_UNDEF && symbol.st_size != 0;
        if (!isFunction || symbol.st_name >= names.texts.size()) continue;
        std::uintptr_t start = static_cast<std::uintptr_t>(symbol.st_value) - base;
        names.functions.push_back({start, static_cast<std::uintptr_t>(symbol.st_size), symbol.st_name});
    }
    std::sort(names.functions.begin(), names.functions.end(),
              [](const Function& a, const Function& b) { return a.start < b.start; });
}

Names ReadNames(const char* native) {
    Names names;
    ElfFile file(native);
    Header header;
    std::vector<Section> sections;
    if (!file.Read(0, &header, sizeof header) || std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0) return names;
    if (header.e_shentsize != sizeof(Section)) return names;
    if (!file.ReadRecords(header.e_shoff, header.e_shnum, sections)) return names;
    auto table =
        std::find_if(sections.begin(), sections.end(), [](const Section& s) { return s.sh_type == SHT_SYMTAB; });
    if (table == sections.end() || table->sh_link >= sections.size()) return names;
    const Section& texts = sections[table->sh_link];
    if (table->sh_size > kMostBytes || texts.sh_size > kMostBytes) return names;
    std::vector<Symbol> symbols;
    names.texts.resize(static_cast<std::size_t>(texts.sh_size));
    bool complete = file.Read(texts.sh_offset, names.texts.data(), names.texts.size()) &&
                    file.ReadRecords(table->sh_offset, table->sh_size / sizeof(Symbol), symbols);
    if (complete) TakeFunctions(symbols, LoadAddress(file, header), names);
    return names;
}

}  // namespace

bool FindElfSymbol(const std::string& native, std::uintptr_t offset, std::string& name, std::uintptr_t& start) {
    static Mutex mutex;  // guards `files`
    static auto* const files = new std::map<std::string, Names>;
    MutexHolder holder(mutex);
    auto [entry, isNew] = files->try_emplace(native);
    if (isNew) entry->second = ReadNames(native.c_str());
    const std::vector<Function>& functions = entry->second.functions;
    auto next = std::upper_bound(functions.begin(), functions.end(), offset,
                                 [](std::uintptr_t value, const Function& f) { return value < f.start; });
    if (next == functions.begin()) return false;
    const Function& found = *--next;
    if (offset - found.start >= found.size) return false;
    name = entry->second.texts.c_str() + found.name;
    start = found.start;
    return true;
}

}  // namespace tessel::platform
