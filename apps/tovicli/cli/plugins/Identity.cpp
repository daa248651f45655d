// SPDX-License-Identifier: Apache-2.0
#include "plugins/Identity.h"

#include <cstring>
#include <elf.h>
#include <link.h>
#include <sys/stat.h>
#include <unistd.h>

// The header of this library itself, placed by the linker: it says what this machine's files look like.
extern "C" ElfW(Ehdr) const __ehdr_start __attribute__((visibility("hidden")));

namespace Tovicli::Cli {

namespace {

using Header = ElfW(Ehdr);
using Section = ElfW(Shdr);
using Entry = ElfW(Sym);

constexpr uint64_t mostSections = 4096;
constexpr uint64_t mostBytes = uint64_t{64} << 20;

bool readAt(int descriptor, void *to, uint64_t offset, uint64_t length) {
    return pread(descriptor, to, length, static_cast<off_t>(offset)) == static_cast<ssize_t>(length);
}

template <typename Record>
std::vector<Record> recordsAt(int descriptor, uint64_t offset, uint64_t bytes) {
    struct stat status {};
    bool const fits = fstat(descriptor, &status) == 0 && bytes <= mostBytes &&
                      offset <= static_cast<uint64_t>(status.st_size) &&
                      bytes <= static_cast<uint64_t>(status.st_size) - offset;
    std::vector<Record> records(fits ? bytes / sizeof(Record) : 0);
    if (!records.empty() && !readAt(descriptor, records.data(), offset, records.size() * sizeof(Record))) {
        records.clear();
    }
    return records;
}

char const *className(unsigned char elfClass) {
    return elfClass == ELFCLASS64 ? "64 bits" : elfClass == ELFCLASS32 ? "32 bits" : "an unknown class";
}

} // namespace

Identity identityOf(int descriptor) {
    unsigned char ident[EI_NIDENT] = {};
    if (!readAt(descriptor, ident, 0, sizeof(ident)) || std::memcmp(ident, ELFMAG, SELFMAG) != 0) {
        return {{{"elf", "it is no ELF file"}}};
    }
    Identity identity;
    if (ident[EI_CLASS] != __ehdr_start.e_ident[EI_CLASS]) {
        identity.differences.push_back({"class", std::string("it was built for ") + className(ident[EI_CLASS]) +
                                                     ", this tool for " + className(__ehdr_start.e_ident[EI_CLASS])});
        return identity; // the rest of its header is laid out otherwise
    }
    if (ident[EI_DATA] != __ehdr_start.e_ident[EI_DATA]) {
        identity.differences.push_back({"machine", "its byte order is another machine's"});
        return identity;
    }
    Header header{};
    if (!readAt(descriptor, &header, 0, sizeof(header))) {
        return {{{"elf", "it is truncated"}}};
    }
    if (header.e_machine != __ehdr_start.e_machine) {
        identity.differences.push_back({"machine", "it was built for machine " + std::to_string(header.e_machine) +
                                                       ", this tool for machine " +
                                                       std::to_string(__ehdr_start.e_machine)});
    }
    if (header.e_type != ET_DYN) {
        identity.differences.push_back({"elf", "it is no shared library"});
    }
    return identity;
}

std::vector<Symbol> dynamicSymbols(int descriptor) {
    std::vector<Symbol> symbols;
    Header header{};
    if (!readAt(descriptor, &header, 0, sizeof(header)) || header.e_shentsize != sizeof(Section) ||
        header.e_shnum > mostSections) {
        return symbols;
    }
    auto const sections = recordsAt<Section>(descriptor, header.e_shoff, uint64_t{header.e_shnum} * sizeof(Section));
    for (Section const &section : sections) {
        if (section.sh_type != SHT_DYNSYM || section.sh_link >= sections.size()) {
            continue;
        }
        Section const &texts = sections[section.sh_link];
        std::vector<char> names = recordsAt<char>(descriptor, texts.sh_offset, texts.sh_size);
        names.push_back('\0');
        for (Entry const &entry : recordsAt<Entry>(descriptor, section.sh_offset, section.sh_size)) {
            unsigned const binding = entry.st_info >> 4U; // the same in both classes
            if (entry.st_name != 0 && entry.st_name < names.size() && binding != STB_LOCAL) {
                symbols.push_back({&names[entry.st_name], entry.st_shndx != SHN_UNDEF, binding == STB_WEAK});
            }
        }
    }
    return symbols;
}

} // namespace Tovicli::Cli
