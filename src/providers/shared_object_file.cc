#include "providers/shared_object_file.h"

#include <elf.h>
#include <link.h>

#include <cstdint>
#include <cstring>
#include <fstream>
#include <vector>

namespace quenix::authentication {

namespace {

bool EndsWithin(std::uint64_t offset, std::uint64_t length, std::uint64_t fileSize) {
  return offset <= fileSize && length <= fileSize - offset;
}

bool Read(std::ifstream& file, std::uint64_t offset, void* to, std::size_t length) {
  file.seekg(static_cast<std::streamoff>(offset));
  return static_cast<bool>(file.read(static_cast<char*>(to), static_cast<std::streamsize>(length)));
}

}  // namespace

bool IsCutOff(const std::string& path) {
  std::ifstream file(path, std::ios_base::binary | std::ios_base::ate);
  if (!file) return false;
  const auto fileSize = static_cast<std::uint64_t>(file.tellg());

  ElfW(Ehdr) header{};
  if (!Read(file, 0, &header, sizeof header)) return false;
  if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0) return false;
  if (header.e_phentsize != sizeof(ElfW(Phdr))) return false;

  std::vector<ElfW(Phdr)> segments(header.e_phnum);
  const std::uint64_t tableSize = segments.size() * sizeof(ElfW(Phdr));
  if (!EndsWithin(header.e_phoff, tableSize, fileSize)) return true;
  if (!Read(file, header.e_phoff, segments.data(), tableSize)) return true;
  for (const auto& segment : segments) {
    if (segment.p_type == PT_LOAD && !EndsWithin(segment.p_offset, segment.p_filesz, fileSize)) return true;
  }
  return false;
}

}  // namespace quenix::authentication
