// SPDX-License-Identifier: Apache-2.0
#include "ElfFile.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <elf.h>
#include <link.h>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

// The header of this program itself, placed by the linker: it says what this machine's files look like.
extern "C" ElfW(Ehdr) const __ehdr_start __attribute__((visibility("hidden")));

namespace Tovicli {

namespace {

using Header = ElfW(Ehdr);
using Segment = ElfW(Phdr);
using DynamicEntry = ElfW(Dyn);

constexpr uint64_t mostSegments = 256;
constexpr uint64_t mostDynamicBytes = 1024 * 1024;
constexpr std::size_t mostNameBytes = 256; // a file name's

/// A file's bytes, nothing outside its size.
class Bytes {
public:
    explicit Bytes(int descriptor)
        : descriptor_(descriptor) {
        struct stat status {};
        size_ = fstat(descriptor, &status) == 0 && status.st_size > 0 ? static_cast<uint64_t>(status.st_size) : 0;
    }

    bool holds(uint64_t offset, uint64_t length) const {
        return offset <= size_ && length <= size_ - offset;
    }

    bool read(void *to, uint64_t offset, uint64_t length) const {
        return holds(offset, length) &&
               pread(descriptor_, to, length, static_cast<off_t>(offset)) == static_cast<ssize_t>(length);
    }

    template <typename Record>
    std::optional<std::vector<Record>> records(uint64_t offset, uint64_t count) const {
        std::vector<Record> read(count);
        if (!this->read(read.data(), offset, count * sizeof(Record))) {
            return std::nullopt;
        }
        return read;
    }

private:
    int descriptor_;
    uint64_t size_ = 0;
};

std::string headerProblem(Header const &header) {
    if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0) {
        return "it is no ELF file";
    }
    bool const sameLayout = header.e_ident[EI_CLASS] == __ehdr_start.e_ident[EI_CLASS] &&
                            header.e_ident[EI_DATA] == __ehdr_start.e_ident[EI_DATA];
    if (!sameLayout || header.e_machine != __ehdr_start.e_machine) {
        return "it was built for another machine";
    }
    if (header.e_type != ET_DYN) {
        return "it is no shared library";
    }
    return {};
}

/// Where an address of the loaded library stands in the file.
std::optional<uint64_t> fileOffset(std::vector<Segment> const &segments, uint64_t address) {
    for (Segment const &segment : segments) {
        if (segment.p_type == PT_LOAD && address >= segment.p_vaddr && address - segment.p_vaddr < segment.p_filesz) {
            return segment.p_offset + (address - segment.p_vaddr);
        }
    }
    return std::nullopt;
}

/// The needed names out of the dynamic section; nothing when it is damaged.
std::optional<std::vector<std::string>> neededNames(Bytes const &bytes, std::vector<Segment> const &segments,
                                                    std::vector<DynamicEntry> const &entries) {
    std::vector<uint64_t> nameOffsets;
    uint64_t stringAddress = 0;
    uint64_t stringSize = 0;
    for (DynamicEntry const &entry : entries) {
        if (entry.d_tag == DT_NULL) {
            break;
        }
        if (entry.d_tag == DT_NEEDED) {
            nameOffsets.push_back(entry.d_un.d_val);
        } else if (entry.d_tag == DT_STRTAB) {
            stringAddress = entry.d_un.d_ptr;
        } else if (entry.d_tag == DT_STRSZ) {
            stringSize = entry.d_un.d_val;
        }
    }
    std::optional<uint64_t> const stringOffset = fileOffset(segments, stringAddress);
    if (!stringOffset || !bytes.holds(*stringOffset, stringSize)) {
        return std::nullopt;
    }
    std::vector<std::string> names;
    for (uint64_t const offset : nameOffsets) {
        if (offset >= stringSize) {
            return std::nullopt;
        }
        // One name at a time: the table holds every symbol's name, which only the loader needs.
        std::array<char, mostNameBytes> name{};
        uint64_t const length = std::min<uint64_t>(name.size(), stringSize - offset);
        if (!bytes.read(name.data(), *stringOffset + offset, length)) {
            return std::nullopt;
        }
        std::string_view const text(name.data(), length);
        if (text.find('\0') == std::string_view::npos) {
            return std::nullopt;
        }
        names.emplace_back(text.substr(0, text.find('\0')));
    }
    return names;
}

} // namespace

ElfFile readElfFile(int descriptor) {
    constexpr char const *truncated = "it is truncated";
    constexpr char const *damaged = "its headers are damaged";
    Bytes const bytes(descriptor);
    Header header{};
    if (!bytes.read(&header, 0, sizeof(header))) {
        return {"it is no ELF file", {}};
    }
    if (std::string const problem = headerProblem(header); !problem.empty()) {
        return {problem, {}};
    }
    if (header.e_phentsize != sizeof(Segment) || header.e_phnum == 0 || header.e_phnum > mostSegments) {
        return {damaged, {}};
    }
    auto const segments = bytes.records<Segment>(header.e_phoff, header.e_phnum);
    if (!segments || !bytes.holds(header.e_shoff, uint64_t{header.e_shnum} * header.e_shentsize)) {
        return {truncated, {}};
    }
    std::optional<Segment> dynamic;
    for (Segment const &segment : *segments) {
        if (segment.p_type == PT_LOAD && !bytes.holds(segment.p_offset, segment.p_filesz)) {
            return {truncated, {}};
        }
        if (segment.p_type == PT_DYNAMIC) {
            dynamic = segment;
        }
    }
    if (!dynamic || dynamic->p_filesz > mostDynamicBytes) {
        return {damaged, {}};
    }
    auto const entries = bytes.records<DynamicEntry>(dynamic->p_offset, dynamic->p_filesz / sizeof(DynamicEntry));
    if (!entries) {
        return {truncated, {}};
    }
    auto names = neededNames(bytes, *segments, *entries);
    return names ? ElfFile{{}, std::move(*names)} : ElfFile{damaged, {}};
}

} // namespace Tovicli
