#include "trust_names.h"

#include <cstdint>

namespace velmorctl {

namespace {

struct StateRow {
  TrustState state;
  const char* name;
  ExitCode code;
};

constexpr StateRow stateRows[] = {
    {TRUST_STATE_NOT_PROVIDED, "not-provided", ExitCode::Fine},
    {TRUST_STATE_HEALTHY, "healthy", ExitCode::Fine},
    {TRUST_STATE_TIMED_OUT, "timed-out", ExitCode::FromCache},
    {TRUST_STATE_ACCOUNT_UNUSABLE, "account-unusable", ExitCode::TrustBroken},
    {TRUST_STATE_WRONG_PASSWORD, "wrong-password", ExitCode::TrustBroken},
    {TRUST_STATE_NO_DOMAIN_CONTROLLER, "no-domain-controller", ExitCode::DomainNotReachable},
    {TRUST_STATE_NOT_KNOWN, "not-known", ExitCode::Other},
    {TRUST_STATE_SERVICE_DOWN, "service-down", ExitCode::HostNotReady},
    {TRUST_STATE_NOT_JOINED, "not-joined", ExitCode::NotJoined},
    {TRUST_STATE_BROKEN, "broken", ExitCode::TrustBroken},
};

struct RelationshipRow {
  TrustRelationship relationship;
  const char* name;
};

constexpr RelationshipRow relationshipRows[] = {
    {TRUST_RELATIONSHIP_NOT_PROVIDED, "not-provided"},
    {TRUST_RELATIONSHIP_SAME_DOMAIN, "same-domain"},
    {TRUST_RELATIONSHIP_TWO_WAY, "two-way"},
    {TRUST_RELATIONSHIP_INBOUND, "inbound"},
    {TRUST_RELATIONSHIP_OUTBOUND, "outbound"},
    {TRUST_RELATIONSHIP_UNKNOWN, "unknown"},
    {TRUST_RELATIONSHIP_NONE, "none"},
};

std::string Unnamed(std::uint32_t number) {
  return "unnamed (" + std::to_string(number) + ")";
}

}  // namespace

std::string TrustStateName(TrustState state) {
  for (const StateRow& row : stateRows) {
    if (row.state == state) {
      return row.name;
    }
  }
  return Unnamed(state);
}

ExitCode TrustStateExitCode(TrustState state) {
  for (const StateRow& row : stateRows) {
    if (row.state == state) {
      return row.code;
    }
  }
  return ExitCode::Other;
}

std::string TrustRelationshipName(TrustRelationship relationship) {
  for (const RelationshipRow& row : relationshipRows) {
    if (row.relationship == relationship) {
      return row.name;
    }
  }
  return Unnamed(relationship);
}

}  // namespace velmorctl
