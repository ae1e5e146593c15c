#include "sample_files.h"

#include <array>
#include <cstddef>
#include <sstream>

namespace {

const std::array<const char*, 10> policyLines = {
    "auth       required   pam_env.so readenv=1 envfile=/etc/default/locale\n",
    "auth       [success=1 default=ignore]  pam_unix.so nullok\n",
    "auth       requisite  pam_deny.so\n",
    "auth       required   pam_permit.so\n",
    "account    required   pam_nologin.so\n",
    "account    sufficient pam_localuser.so\n",
    "password   sufficient pam_unix.so sha512 shadow try_first_pass use_authtok\n",
    "session    optional   pam_motd.so motd=/run/motd.dynamic\n",
    "session    required   pam_limits.so\n",
    "session    include    postlogin\n"};

const std::array<const char*, 8> switchLines = {
    "passwd:         files systemd\n", "group:          files systemd\n",
    "shadow:         files\n",         "hosts:          files dns [NOTFOUND=return]\n",
    "networks:       files\n",         "protocols:      db files\n",
    "services:       db files\n",      "netgroup:       nis\n"};

template <std::size_t count>
std::string Repeat(const std::array<const char*, count>& samples, int lines) {
  std::string text;
  for (std::size_t line = 0; line < static_cast<std::size_t>(lines); ++line) text += samples[line % count];
  return text;
}

}  // namespace

std::string PolicyOf(int lines) {
  return Repeat(policyLines, lines);
}

std::string SwitchOf(int lines) {
  return Repeat(switchLines, lines);
}

std::vector<std::vector<std::string>> WordsOfLines(const std::string& text) {
  std::vector<std::vector<std::string>> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    std::vector<std::string>& words = lines.emplace_back();
    std::istringstream lineStream(line);
    for (std::string word; lineStream >> word;) {
      const bool continues = !words.empty() && words.back().front() == '[' && words.back().back() != ']';
      if (continues) {
        words.back() += " " + word;
      } else {
        words.push_back(word);
      }
    }
  }
  return lines;
}
