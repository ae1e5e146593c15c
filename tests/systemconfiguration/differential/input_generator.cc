#include "systemconfiguration/differential/input_generator.h"

#include <array>

namespace differential {
namespace {

using Choices = std::vector<std::string>;

const Choices facilities = {"auth", "account", "password", "session"};
const Choices controls = {"required", "requisite",    "sufficient",    "optional",
                          "include",  "substack",     "[default=die]", "[success=1 default=ignore]",
                          "[]",       "[a b c\td\ne]"};
const Choices modules = {"pam_unix.so", "pam_deny.so", "common-auth",
                         "/lib/security/pam_a_rather_long_name.so"};
const Choices parameters = {
    "nullok", "try_first_pass", "[a b]", "uid >= 1000", "#", "envfile=/etc/default/locale"};
const Choices databases = {"passwd",   "group",      "shadow",    "hosts",     "netmasks",
                           "networks", "protocols",  "services",  "ethers",    "rpc",
                           "netgroup", "bootparams", "publickey", "automount", "aliases"};
const Choices services = {"files", "dns", "nis", "compat", "systemd", "mdns4_minimal", "x"};
const Choices criteria = {
    "[NOTFOUND=return]", "[!UNAVAIL=return  SUCCESS=continue]", "[]", "[ ]", "[a", "b]"};
const Choices oddWords = {"",
                          "-session",
                          "Auth",
                          "Required",
                          "@include",
                          "[",
                          "]",
                          "[a",
                          "b]",
                          "#",
                          "#%PAM-1.0",
                          "passwd",
                          ":",
                          "passwd:files",
                          "Hosts:",
                          "foo:",
                          "\xc3\xa9",
                          "\xff",
                          "a,b",
                          "'q'",
                          std::string(1, '\0'),
                          "\\\n",
                          std::string(200, 'w')};
const Choices separators = {" ", " ", " ", "\t", "\t", "  ", " \t ", "\r", "\v", "\f", ",", "\n", "\r\n"};

}  // namespace

InputGenerator::InputGenerator(Format format, std::uint64_t seed) : format_(format), random_(seed) {}

std::size_t InputGenerator::Below(std::size_t limit) {
  return static_cast<std::size_t>(random_() % limit);
}

bool InputGenerator::OneIn(std::size_t chances) {
  return Below(chances) == 0;
}

const std::string& InputGenerator::Pick(const std::vector<std::string>& choices) {
  return OneIn(30) ? oddWords[Below(oddWords.size())] : choices[Below(choices.size())];
}

std::string InputGenerator::Separator() {
  return OneIn(4) ? separators[Below(separators.size())] : " ";
}

std::string InputGenerator::LineEnd() {
  static const std::array<std::string, 6> rareEnds = {"\r\n", " \n", "\t\n", " \t \n", "\n\n", ""};
  return OneIn(6) ? rareEnds[Below(rareEnds.size())] : "\n";
}

std::string InputGenerator::PamEntryLine() {
  std::string line = Pick(controls) + Separator() + Pick(modules);
  for (std::size_t count = Below(4); count > 0; --count) line += Separator() + Pick(parameters);
  return line + LineEnd();
}

std::string InputGenerator::PamLine() {
  return Pick(facilities) + Separator() + PamEntryLine();
}

std::string InputGenerator::NssLine() {
  std::string line = (OneIn(8) ? Separator() : "") + Pick(databases) + (OneIn(20) ? Separator() : "") + ":" +
                     (OneIn(20) ? "" : Separator());
  for (std::size_t count = Below(7); count > 0; --count) {
    line += Pick(services);
    if (OneIn(4)) line += Separator() + Pick(criteria);
    if (count > 1) line += Separator();
  }
  return line + LineEnd();
}

std::string InputGenerator::Line() {
  if (OneIn(10)) return (OneIn(3) ? Separator() : "") + "#" + Words();
  if (format_ == Format::PamPolicy) return PamLine();
  if (format_ == Format::PamEntry) return PamEntryLine();
  return NssLine();
}

std::string InputGenerator::Words() {
  static const std::array<const Choices*, 8> kinds = {&facilities, &controls, &modules,  &parameters,
                                                      &databases,  &services, &criteria, &oddWords};
  std::string words;
  for (std::size_t count = Below(8); count > 0; --count)
    words += Pick(*kinds[Below(kinds.size())]) + Separator();
  return words + LineEnd();
}

std::string InputGenerator::Bytes() {
  std::string bytes;
  for (std::size_t count = Below(40); count > 0; --count) bytes.push_back(static_cast<char>(random_()));
  return bytes;
}

InputCase InputGenerator::Next() {
  std::string text;
  const std::size_t kind = Below(10);
  for (std::size_t lines = Below(6); lines > 0; --lines) {
    text += kind == 0 ? Bytes() : kind == 1 ? Words() : Line();
  }
  std::array<std::uint8_t, 5> setUp{};
  if (OneIn(2)) {
    for (std::uint8_t& byte : setUp) byte = OneIn(3) ? static_cast<std::uint8_t>(random_()) : std::uint8_t{0};
    if (!OneIn(4)) setUp[0] &= 0x1f;  // mostly a stream that is good at first
  }
  std::string bytes;
  for (const std::uint8_t byte : setUp) bytes.push_back(static_cast<char>(byte + '0'));
  bytes += text;
  return FromBytes(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
}

}  // namespace differential
