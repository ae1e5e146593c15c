// The plug-in's table and what it shows to the rest of the process.

#include <dlfcn.h>
#include <elf.h>
#include <gtest/gtest.h>
#include <link.h>

#include <set>
#include <string>

#include "loaded_plugin.h"
#include "support/files.h"

namespace {

using sambatest::LoadedPlugin;

// The names that the shared object defines for others, from its dynamic symbol table.
std::set<std::string> ExportedNames(const std::string& path) {
  const std::string file = testsupport::ReadFile(path);
  const auto* header = reinterpret_cast<const Elf64_Ehdr*>(file.data());
  const auto* sections = reinterpret_cast<const Elf64_Shdr*>(file.data() + header->e_shoff);
  std::set<std::string> names;
  for (int index = 0; index < header->e_shnum; ++index) {
    const Elf64_Shdr& section = sections[index];
    if (section.sh_type != SHT_DYNSYM) continue;
    const char* const strings = file.data() + sections[section.sh_link].sh_offset;
    const auto* symbol = reinterpret_cast<const Elf64_Sym*>(file.data() + section.sh_offset);
    for (size_t left = section.sh_size / sizeof *symbol; left > 0; --left, ++symbol) {
      if (symbol->st_shndx != SHN_UNDEF && symbol->st_name != 0) names.insert(strings + symbol->st_name);
    }
  }
  return names;
}

TEST(SambaPluginTest, ItExportsItsTwoSymbolsOnly) {
  EXPECT_EQ(ExportedNames(SAMBA_PLUGIN),
            (std::set<std::string>{"ActiveDirectoryClientMetadata", "ActiveDirectoryClientOperations"}));
}

TEST(SambaPluginTest, ItIsOfVersionThree) {
  const LoadedPlugin plugin;
  EXPECT_EQ(plugin.Metadata().apiVersion, 3);
  EXPECT_EQ(plugin->apiVersion, 3);
}

TEST(SambaPluginTest, ItNamesTheModulesOfTheSystem) {
  const LoadedPlugin plugin;
  EXPECT_STREQ(plugin.Metadata().pamModule, "pam_winbind.so");
  EXPECT_STREQ(plugin.Metadata().nssModule, "winbind");
}

TEST(SambaPluginTest, EverySlotIsFilledButTheReservedOne) {
  const LoadedPlugin plugin;
  const auto* slot = reinterpret_cast<void* const*>(plugin.operator->());
  for (int number = 2; number <= 17; ++number) {
    EXPECT_EQ(slot[number - 1] == nullptr, number == 7) << number;
  }
}

TEST(SambaPluginTest, ItCanBeUnloadedWhole) {
  { const LoadedPlugin plugin; }
  EXPECT_EQ(testsupport::ReadFile("/proc/self/maps").find("libsamba.so"), std::string::npos);
}

TEST(SambaPluginTest, ItDoesNotBringTheLibrariesThatDoNotMix) {
  const LoadedPlugin plugin;
  const std::string maps = testsupport::ReadFile("/proc/self/maps");
  for (const char* library : {"libnetapi", "libkrb5", "libldap", "libtalloc"}) {
    EXPECT_EQ(maps.find(library), std::string::npos) << library;
  }
}

}  // namespace
