#include "common/state.h"

#include <nlohmann/json.hpp>

#include "common/files.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr int kFormat = 1;

}  // namespace

State ParseState(const std::string& text) {
  try {
    const nlohmann::json json = nlohmann::json::parse(text);
    if (json.at("format").get<int>() != kFormat) {
      throw Failure(kInternalError, std::string(paths::kState) + " was written by another version");
    }
    State state;
    json.at("joined").get_to(state.joined);
    json.at("dnsDomain").get_to(state.dnsDomain);
    json.at("netbiosDomain").get_to(state.netbiosDomain);
    json.at("hostName").get_to(state.hostName);
    json.at("machineAccountDn").get_to(state.machineAccountDn);
    json.at("preferredDomainControllers").get_to(state.preferredDomainControllers);
    json.at("smartCardEnabledServices").get_to(state.smartCardEnabledServices);
    return state;
  } catch (const nlohmann::json::exception& error) {
    throw Failure(kInternalError, std::string(paths::kState) + " is damaged: " + error.what());
  }
}

std::string FormatState(const State& state) {
  const nlohmann::json json = {{"format", kFormat},
                               {"joined", state.joined},
                               {"dnsDomain", state.dnsDomain},
                               {"netbiosDomain", state.netbiosDomain},
                               {"hostName", state.hostName},
                               {"machineAccountDn", state.machineAccountDn},
                               {"preferredDomainControllers", state.preferredDomainControllers},
                               {"smartCardEnabledServices", state.smartCardEnabledServices}};
  try {
    return json.dump(2) + "\n";
  } catch (const nlohmann::json::exception&) {
    throw Failure(kInvalidParameter, "a name is not valid UTF-8");
  }
}

State LoadState() {
  const auto text = ReadFile(paths::kState);
  return text ? ParseState(*text) : State{};
}

void SaveState(const State& state) {
  ReplaceFile(paths::kState, FormatState(state), 0644);
}

}  // namespace sambaprovider
