#include "plugin_file.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <set>
#include <system_error>

#include "authentication/plugin/active_directory_client.h"
#include "elf_file.h"
#include "text.h"

namespace velmorctl {

namespace {

using nlohmann::json;

constexpr char camSymbol[] = "CAMProxyClientOperations";
constexpr std::chrono::seconds inspectionLimit{10};

std::string TextOf(const char* text) {
  return text == nullptr ? std::string() : std::string(text);
}

json Operations(const struct ActiveDirectoryClientOperations& table) {
  return {{"joinDomain", table.joinDomain != nullptr},
          {"partDomain", table.partDomain != nullptr},
          {"getActiveDomain", table.getActiveDomain != nullptr},
          {"setPreferredDomainControllers", table.setPreferredDomainControllers != nullptr},
          {"getPreferredDomainControllers", table.getPreferredDomainControllers != nullptr},
          {"getDomainTrustState", table.getDomainTrustState != nullptr},
          {"getTrustedDomains", table.getTrustedDomains != nullptr},
          {"getMachineAccountDN", table.getMachineAccountDN != nullptr},
          {"getAnyDomainController", table.getAnyDomainController != nullptr},
          {"convertCanonicalUsername", table.convertCanonicalUsername != nullptr},
          {"joinDomainWithMachineAccount",
           table.apiVersion >= 2 && table.joinDomainWithMachineAccount != nullptr},
          {"getHostPrincipalForDomain", table.apiVersion >= 2 && table.getHostPrincipalForDomain != nullptr},
          {"getDomainTrustRelationship", table.getDomainTrustRelationship != nullptr},
          {"setSmartCardEnabledServices", table.setSmartCardEnabledServices != nullptr},
          {"getSmartCardEnabledServices", table.getSmartCardEnabledServices != nullptr}};
}

json Describe(void* handle) {
  const void* metadataSymbol = dlsym(handle, ACTIVE_DIRECTORY_CLIENT_METADATA_SYMBOL);
  const void* operationsSymbol = dlsym(handle, ACTIVE_DIRECTORY_CLIENT_OPERATIONS_SYMBOL);
  if (metadataSymbol == nullptr && dlsym(handle, camSymbol) != nullptr) {
    return {{"kind", "cam"}};
  }
  if (metadataSymbol == nullptr) {
    return {{"problem", "it lacks the symbol " ACTIVE_DIRECTORY_CLIENT_METADATA_SYMBOL}};
  }
  const auto& metadata = *static_cast<const struct ActiveDirectoryClientMetadata*>(metadataSymbol);
  json description = {{"kind", "directory"}, {"apiVersion", metadata.apiVersion}};
  if (metadata.apiVersion > ACTIVE_DIRECTORY_CLIENT_API_VERSION) {
    description["problem"] = "its interface version " + std::to_string(metadata.apiVersion) +
                             " is newer than the library's, " +
                             std::to_string(ACTIVE_DIRECTORY_CLIENT_API_VERSION);
    return description;
  }
  if (operationsSymbol == nullptr) {
    description["problem"] = "it lacks the symbol " ACTIVE_DIRECTORY_CLIENT_OPERATIONS_SYMBOL;
    return description;
  }
  if (metadata.pamModule == nullptr || metadata.nssModule == nullptr) {
    description["problem"] = "it names no PAM module or no name-service module";
    return description;
  }
  description["pamModule"] = TextOf(metadata.pamModule);
  description["pamModuleParameters"] = TextOf(metadata.pamModuleParameters);
  description["nssModule"] = TextOf(metadata.nssModule);
  description["nssModuleParameters"] = TextOf(metadata.nssModuleParameters);
  description["operations"] =
      Operations(*static_cast<const struct ActiveDirectoryClientOperations*>(operationsSymbol));
  return description;
}

/// Runs in the child: loads the plug-in and says what it is.
json LoadAndDescribe(const std::string& path) {
  dlerror();
  void* handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_GLOBAL);
  if (handle == nullptr) {
    return {{"problem", "it cannot be loaded: " + TextOf(dlerror())}};
  }
  json description = Describe(handle);
  description["loads"] = true;
  return description;
}
[[noreturn]] void InspectInChild(const std::string& path, int output) {
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  rlimit noCore = {0, 0};
  setrlimit(RLIMIT_CORE, &noCore);
  int nothing = open("/dev/null", O_RDWR);
  for (int standard : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    dup2(nothing, standard);
  }
  std::string text = LoadAndDescribe(path).dump(-1, ' ', false, json::error_handler_t::replace);
  ssize_t written = write(output, text.data(), text.size());
  _exit(written == static_cast<ssize_t>(text.size()) ? 0 : 1);
}

/// Reads until the end or the deadline; false at the deadline.
bool ReadUntil(std::chrono::steady_clock::time_point deadline, int descriptor, std::string& text) {
  char buffer[4096];
  for (;;) {
    auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    pollfd wait = {descriptor, POLLIN, 0};
    int ready = poll(&wait, 1, static_cast<int>(std::max<std::int64_t>(left.count(), 0)));
    if (ready == 0) {
      return false;
    }
    ssize_t count = read(descriptor, buffer, sizeof(buffer));
    if (count == 0) {
      return true;
    }
    if (count > 0) {
      text.append(buffer, static_cast<std::size_t>(count));
    }
  }
}

/// The child's account of the plug-in, or one with only a problem in it.
json DescribeSafely(const std::string& path) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC) != 0) {
    throw std::system_error(errno, std::generic_category(), "pipe2");
  }
  pid_t child = fork();
  if (child < 0) {
    close(ends[0]);
    close(ends[1]);
    throw std::system_error(errno, std::generic_category(), "fork");
  }
  if (child == 0) {
    InspectInChild(path, ends[1]);
  }
  close(ends[1]);
  std::string text;
  bool inTime = ReadUntil(std::chrono::steady_clock::now() + inspectionLimit, ends[0], text);
  close(ends[0]);
  if (!inTime) {
    kill(child, SIGKILL);
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  if (!inTime) {
    return {{"problem", "loading it does not end"}};
  }
  if (WIFSIGNALED(status)) {
    return {{"problem", std::string("loading it crashes: ") + strsignal(WTERMSIG(status))}};
  }
  json description = json::parse(text, nullptr, false);
  if (description.is_discarded() || !description.is_object()) {
    return {{"problem", "loading it ends the process"}};
  }
  return description;
}

FileProblem Unusable(const std::string& file, const std::string& reason) {
  FileProblem problem = {};
  problem.kind = FileProblem::Kind::Unusable;
  problem.file = file;
  problem.reason = reason;
  problem.remedy =
      "install the package that brings this plug-in again, or choose another provider with "
      "\"velmorctl provider use\"";
  return problem;
}

void Fill(PluginDescription& description, const json& account) {
  std::string kind = account.value("kind", "");
  description.loads = account.value("loads", false);
  description.kind = kind == "directory" ? PluginKind::Directory
                     : kind == "cam"     ? PluginKind::CamProxy
                                         : PluginKind::Unknown;
  description.apiVersion = account.value("apiVersion", 0);
  description.pamModule = account.value("pamModule", "");
  description.pamModuleParameters = account.value("pamModuleParameters", "");
  description.nssModule = account.value("nssModule", "");
  description.nssModuleParameters = account.value("nssModuleParameters", "");
  const json operations = account.value("operations", json::object());
  for (const auto& [name, present] : operations.items()) {
    description.operations.emplace_back(name, present.get<bool>());
  }
  if (account.contains("problem")) {
    description.problem = Unusable(description.file, account["problem"].get<std::string>());
  } else if (description.kind == PluginKind::CamProxy) {
    description.problem = Unusable(description.file, "it is a CAM proxy plug-in, not a directory provider");
  }
}

PluginDescription InspectFile(const std::string& name, const std::string& file) {
  PluginDescription description;
  description.name = name;
  description.file = file;
  std::string elfProblem = ElfProblem(file);
  if (elfProblem.empty()) {
    Fill(description, DescribeSafely(file));
  } else {
    description.problem = Unusable(file, elfProblem);
  }
  if (description.problem && geteuid() != 0 && access(file.c_str(), R_OK) != 0 && errno == EACCES) {
    description.problem->needsRoot = true;
    description.problem->remedy = "run the command as root";
  }
  return description;
}

/// The name of the provider whose plug-in is called so; empty when it is no plug-in's name.
std::string ProviderNameOf(const std::string& fileName) {
  constexpr std::string_view prefix = "lib";
  constexpr std::string_view suffix = ".so";
  if (fileName.size() <= prefix.size() + suffix.size() || !fileName.starts_with(prefix) ||
      !fileName.ends_with(suffix)) {
    return {};
  }
  return fileName.substr(prefix.size(), fileName.size() - prefix.size() - suffix.size());
}

}  // namespace

std::vector<std::string> MissingOperations(const PluginDescription& plugin) {
  std::vector<std::string> missing;
  for (const auto& [name, present] : plugin.operations) {
    if (!present) {
      missing.push_back(name);
    }
  }
  return missing;
}

bool IsProviderName(const std::string& name) {
  return !name.empty() && std::all_of(name.begin(), name.end(), [](unsigned char character) {
    return character > 0x20 && character < 0x7f && character != '/' && character != '"' && character != '\'';
  });
}

std::vector<std::string> PluginCandidates(const std::string& name) {
  std::string directory = pluginDirectory;
  std::string fileName = "/lib" + name + ".so";
  return {directory + "/lib64" + fileName, directory + fileName};
}

PluginDescription InspectProvider(const std::string& name) {
  std::vector<std::string> candidates = PluginCandidates(name);
  PluginDescription description;
  description.name = name;
  description.file = candidates.back();
  description.problem = Unusable(candidates.back(), "it does not exist");
  for (const std::string& candidate : candidates) {
    std::error_code error;
    if (std::filesystem::exists(candidate, error)) {
      description = InspectFile(name, candidate);
    }
    if (description.loads) {
      break;
    }
  }
  return description;
}

std::vector<PluginDescription> InspectAllProviders() {
  std::set<std::string> names;
  for (const char* directory : {"/lib64", ""}) {
    std::error_code error;
    for (const auto& entry :
         std::filesystem::directory_iterator(std::string(pluginDirectory) + directory, error)) {
      names.insert(ProviderNameOf(entry.path().filename()));
    }
  }
  names.erase("");
  std::vector<PluginDescription> descriptions;
  for (const std::string& name : names) {
    PluginDescription description = InspectProvider(name);
    if (description.kind != PluginKind::CamProxy) {
      descriptions.push_back(std::move(description));
    }
  }
  return descriptions;
}

}  // namespace velmorctl
