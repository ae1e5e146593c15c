#include "pam_edit/profile.h"

#include "pam_edit/local_guard.h"
#include "pam_edit/module_line.h"

namespace velmorctl::pam {

namespace {

/// A primary module lets in whom it knows, and else leaves the word to the next one.
constexpr char primaryControl[] = "[success=end default=ignore]";

std::string Line(const std::string& control, const std::string& module) {
  return "\t" + control + "\t" + module + "\n";
}

std::string Section(const std::string& facility, const std::string& control, const std::string& module) {
  return facility + ":\n" + Line(control, module);
}

std::string AuthSection(const std::string& facility, const std::string& module) {
  return Section(facility, guardControl, guardModule) + Line(primaryControl, module);
}

}  // namespace

std::string ProfileText(const DirectoryModule& module) {
  const std::string first = ModuleText(module);
  const std::string later = ModuleText(module, PasswordParameter(module));
  std::string text = "Name: Active Directory through the provider " + module.provider + "\n";
  // Behind pam_unix, whose priority is 256: a local administrator does not wait for the directory.
  text += "Default: no\nPriority: 128\n";
  text += "Auth-Type: Primary\n" + AuthSection("Auth", later) + AuthSection("Auth-Initial", first);
  // Not primary: where pam_unix takes a user of the name service for its own, it would not be asked.
  text += "Account-Type: Additional\n" + Section("Account", accountControl, first);
  text += "Password-Type: Primary\n" + Section("Password", primaryControl, later) +
          Section("Password-Initial", primaryControl, first);
  text += "Session-Type: Additional\n" + Section("Session", "optional", first);
  return text;
}

}  // namespace velmorctl::pam
