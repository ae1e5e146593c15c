#include "service/configuration.h"

#include <toml++/toml.h>
#include <set>
#include <sstream>
#include <string_view>

namespace camd {
namespace {

// One table of the file, whose keys are taken one by one; what is left over is unknown.
class Section {
 public:
  Section(const std::string& path, const toml::table& whole, const char* name)
      : path_(path), name_(name), table_(whole.get_as<toml::table>(name)) {
    if (table_ == nullptr && whole.contains(name)) Refuse(*whole.get(name), "is no section");
  }

  void Take(const char* key, std::string& value) {
    if (const toml::node* node = Find(key)) {
      if (!node->is_string()) Refuse(*node, Named(key) + " is no text in quotation marks");
      value = node->as_string()->get();
      if (value.find('\0') != std::string::npos) Refuse(*node, Named(key) + " holds a zero byte");
    }
  }

  void TakeRequired(const char* key, std::string& value) {
    Take(key, value);
    if (value.empty()) throw ConfigurationError(path_ + ": " + Named(key) + " is missing");
  }

  // Refuses a text that was given and that `faultOf` finds a fault with; an empty one is none.
  template <typename Check>
  void Require(const char* key, const std::string& value, Check faultOf) {
    if (const toml::node* node = Find(key)) {
      const std::string fault = faultOf(value);
      if (!fault.empty()) Refuse(*node, fault);
    }
  }

  template <typename Number>
  void TakeNumber(const char* key, Number& value, int64_t smallest, int64_t largest) {
    if (const toml::node* node = Find(key)) {
      if (!node->is_integer()) Refuse(*node, Named(key) + " is no whole number");
      const int64_t number = node->as_integer()->get();
      if (number < smallest || number > largest) {
        Refuse(*node, Named(key) + " is not between " + std::to_string(smallest) + " and " +
                          std::to_string(largest));
      }
      value = static_cast<Number>(number);
    }
  }

  template <typename Duration>
  void TakeDuration(const char* key, Duration& value, int64_t smallest, int64_t largest) {
    int64_t count = value.count();
    TakeNumber(key, count, smallest, largest);
    value = Duration(count);
  }

  void Take(const char* key, bool& value) {
    if (const toml::node* node = Find(key)) {
      if (!node->is_boolean()) Refuse(*node, Named(key) + " is neither true nor false");
      value = node->as_boolean()->get();
    }
  }

  // Calls `take` with each text of a list.
  template <typename Taker>
  void TakeRequiredList(const char* key, Taker take) {
    const toml::node* list = Find(key);
    if (list == nullptr) throw ConfigurationError(path_ + ": " + Named(key) + " is missing");
    if (!list->is_array()) Refuse(*list, Named(key) + " is no list");
    for (const toml::node& element : *list->as_array()) {
      if (!element.is_string())
        Refuse(element, Named(key) + " holds something that is no text in quotation marks");
      const std::string fault = take(element.as_string()->get());
      if (!fault.empty()) Refuse(element, fault);
    }
  }

  template <typename Choice>
  void TakeChoice(const char* key, Choice& value,
                  const std::vector<std::pair<std::string, Choice>>& choices) {
    std::string text;
    Take(key, text);
    const toml::node* node = Find(key);
    if (node == nullptr) return;
    std::string known;
    for (const auto& [name, choice] : choices) {
      if (name == text) {
        value = choice;
        return;
      }
      known += (known.empty() ? "\"" : ", \"") + name + "\"";
    }
    Refuse(*node, Named(key) + " is none of " + known);
  }

  void CheckNothingLeft() const {
    if (table_ == nullptr) return;
    for (const auto& [key, node] : *table_) {
      if (!taken_.contains(std::string(key.str()))) {
        Refuse(key.source(), "unknown key \"" + std::string(key.str()) + "\" in section [" + name_ + "]");
      }
    }
  }

 private:
  const toml::node* Find(const char* key) {
    taken_.insert(key);
    return table_ == nullptr ? nullptr : table_->get(key);
  }

  std::string Named(const char* key) const {
    return "key \"" + std::string(key) + "\" of section [" + name_ + "]";
  }

  [[noreturn]] void Refuse(const toml::source_region& place, const std::string& fault) const {
    throw ConfigurationError(path_ + ":" + std::to_string(place.begin.line) + ": " + fault);
  }
  [[noreturn]] void Refuse(const toml::node& node, const std::string& fault) const {
    Refuse(node.source(), fault);
  }

  std::string path_;
  std::string name_;
  const toml::table* table_;
  std::set<std::string> taken_;
};

std::string FaultOfListenAddress(const std::string& text) {
  return Address::Parse(text) ? "" : "\"" + text + "\" is no address to listen at";
}

std::string FaultOfDomain(const std::string& text) {
  return IsHostName(text) ? "" : "\"" + text + "\" is no domain's DNS name";
}

std::string FaultOfController(const std::string& text) {
  return text.empty() || IsHostName(text) ? "" : "\"" + text + "\" is no controller's DNS name";
}

std::string FaultOfUser(const std::string& text) {
  const bool plain = text.find_first_of("@\\/") == std::string::npos;
  return plain ? "" : "the user \"" + text + "\" must be named without its domain";
}

std::string FaultOfPath(const std::string& text) {
  return text.starts_with('/') ? "" : "\"" + text + "\" is no whole path, which begins with \"/\"";
}

// A name without a slash is that of a credential.
std::string FaultOfCredential(const std::string& text) {
  return text.find('/') == std::string::npos ? "" : FaultOfPath(text);
}

// An empty text stands for no file.
std::string FaultOfPathIfAny(const std::string& text) {
  return text.empty() ? "" : FaultOfPath(text);
}

void TakeServer(Section section, Configuration& result) {
  ServerSettings& server = result.server;
  section.Take("listen-address", server.listenAddress);
  section.Require("listen-address", server.listenAddress, FaultOfListenAddress);
  section.TakeNumber("port", server.port, 1, 65535);
  section.TakeRequired("certificate-file", server.certificateFile);
  section.Require("certificate-file", server.certificateFile, FaultOfCredential);
  section.TakeRequired("key-file", server.keyFile);
  section.Require("key-file", server.keyFile, FaultOfCredential);
  section.Take("ledger-file", server.ledgerFile);
  section.Require("ledger-file", server.ledgerFile, FaultOfPath);
  section.Take("audit-file", result.auditFile);
  section.Require("audit-file", result.auditFile, FaultOfPathIfAny);
  section.TakeNumber("connections", server.connections, 1, 100000);
  section.TakeNumber("connections-per-client", server.connectionsPerClient, 0, 100000);
  section.TakeDuration("request-timeout-seconds", server.requestTimeout, 1, 600);
  section.TakeNumber("helpers", server.helpers, 1, 64);
  section.TakeNumber("queue-length", server.queueLength, 0, 10000);
  section.CheckNothingLeft();
}

void TakeDirectory(Section section, DirectorySettings& directory) {
  section.TakeRequired("domain", directory.domain);
  section.Require("domain", directory.domain, FaultOfDomain);
  section.Take("controller", directory.controller);
  section.Require("controller", directory.controller, FaultOfController);
  section.TakeRequired("user", directory.user);
  section.Require("user", directory.user, FaultOfUser);
  section.TakeRequired("password-file", directory.passwordFile);
  section.Require("password-file", directory.passwordFile, FaultOfCredential);
  section.Take("default-container", directory.defaultContainer);
  section.TakeChoice<ExistingAccounts>("existing-accounts", directory.existingAccounts,
                                       {{"refuse", ExistingAccounts::kRefuse},
                                        {"own-unused", ExistingAccounts::kOwnUnused},
                                        {"any", ExistingAccounts::kAny}});
  section.TakeDuration("remove-unused-after-hours", directory.removeUnusedAfter, 0, 24 * 365);
  section.Take("helper", directory.helper);
  section.Require("helper", directory.helper, FaultOfPath);
  section.TakeDuration("helper-timeout-seconds", directory.helperTimeout, 1, 600);
  section.CheckNothingLeft();
}

void TakeAccess(Section section, AccessSettings& access) {
  section.TakeRequiredList("host-names", [&access](const std::string& pattern) {
    access.hostNames.push_back(pattern);
    return pattern.empty() ? std::string("an empty pattern fits no name") : std::string();
  });
  section.TakeRequiredList("client-addresses", [&access](const std::string& text) {
    const auto range = AddressRange::Parse(text);
    if (!range) return "\"" + text + "\" is neither an address nor a range of addresses";
    access.clientAddresses.push_back(*range);
    return std::string();
  });
  section.Take("token-required", access.tokenRequired);
  section.TakeNumber("requests-per-minute", access.requestsPerMinute, 0, 1000000);
  section.TakeNumber("accounts-per-day", access.accountsPerDay, 0, 1000000);
  section.CheckNothingLeft();
}

void CheckSections(const std::string& path, const toml::table& whole) {
  static const std::set<std::string> known = {"server", "directory", "access"};
  for (const auto& [key, node] : whole) {
    if (!known.contains(std::string(key.str()))) {
      throw ConfigurationError(path + ":" + std::to_string(key.source().begin.line) + ": unknown " +
                               (node.is_table() ? "section [" : "key \"") + std::string(key.str()) +
                               (node.is_table() ? "]" : "\""));
    }
  }
}

toml::table Parse(const std::string& path) {
  try {
    return toml::parse_file(path);
  } catch (const toml::parse_error& error) {
    const toml::source_position place = error.source().begin;
    std::string text = path;
    if (place.line > 0) text += ":" + std::to_string(place.line);
    throw ConfigurationError(text + ": " + std::string(error.description()));
  }
}

}  // namespace

Configuration ReadConfiguration(const std::string& path) {
  const toml::table whole = Parse(path);
  CheckSections(path, whole);
  Configuration configuration;
  TakeServer(Section(path, whole, "server"), configuration);
  TakeDirectory(Section(path, whole, "directory"), configuration.directory);
  TakeAccess(Section(path, whole, "access"), configuration.access);
  return configuration;
}

}  // namespace camd
