#include "elf_file.h"

#include <elf.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <system_error>

#include "text.h"

namespace velmorctl {

namespace {

constexpr Elf64_Half thisMachine =
#if defined(__x86_64__)
    EM_X86_64;
#elif defined(__aarch64__)
    EM_AARCH64;
#else
#error "the machine's ELF number is needed here"
#endif

std::string CutOff(std::uintmax_t size, std::uint64_t needed) {
  return "it is cut off: it has " + std::to_string(size) + " bytes of at least " + std::to_string(needed);
}

template <class Record>
bool ReadAt(std::ifstream& stream, std::uint64_t position, Record& record) {
  char bytes[sizeof(Record)];
  stream.seekg(static_cast<std::streamoff>(position));
  if (!stream.read(bytes, sizeof(bytes))) {
    return false;
  }
  std::memcpy(&record, bytes, sizeof(bytes));
  return true;
}

}  // namespace

std::string ElfProblem(const std::string& path) {
  std::error_code error;
  std::uintmax_t size = std::filesystem::file_size(path, error);
  if (error) {
    return error.message();
  }
  std::ifstream stream(path, std::ios::binary);
  if (!stream) {
    return SystemErrorText(errno);
  }
  char magic[SELFMAG];
  if (!ReadAt(stream, 0, magic) || std::memcmp(magic, ELFMAG, SELFMAG) != 0) {
    return size == 0 ? "it is empty" : "it is not a shared object";
  }
  Elf64_Ehdr header = {};
  if (!ReadAt(stream, 0, header)) {
    return CutOff(size, sizeof(header));
  }
  if (header.e_ident[EI_CLASS] != ELFCLASS64 || header.e_machine != thisMachine || header.e_type != ET_DYN) {
    return "it is not a shared object of this machine";
  }
  std::uint64_t needed = header.e_phoff;
  for (Elf64_Half index = 0; index < header.e_phnum; ++index) {
    Elf64_Phdr segment = {};
    std::uint64_t position = header.e_phoff + std::uint64_t{index} * header.e_phentsize;
    if (!ReadAt(stream, position, segment)) {
      return CutOff(size, position + sizeof(segment));
    }
    if (segment.p_type == PT_LOAD) {
      needed = std::max(needed, segment.p_offset + segment.p_filesz);
    }
  }
  return needed > size ? CutOff(size, needed) : std::string();
}

}  // namespace velmorctl
