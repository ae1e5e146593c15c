#include "service/directory_client.h"

#include <algorithm>

#include "common/status.h"
#include "service/credential_file.h"

namespace camd {
namespace {

constexpr std::chrono::minutes kPauseAfterRefusal(5);

const char* TextOf(ExistingAccounts choice) {
  switch (choice) {
    case ExistingAccounts::kAny:
      return "any";
    case ExistingAccounts::kOwnUnused:
      return "own-unused";
    case ExistingAccounts::kRefuse:
      break;
  }
  return "none";
}

// What lets the helper tell whether an account is still as it was.
void AddRecord(Message& request, const GivenAccount& account) {
  request.fields["sid"] = account.sid;
  request.fields["recordedBy"] = account.controller;
  request.fields["passwordSet"] = account.passwordSet;
  request.fields["lastLogon"] = account.lastLogon;
  request.fields["logonCount"] = account.logonCount;
  request.fields["createdAfter"] = account.createdAfter;
}

// The blob goes into a text between quotation marks as it is.
bool IsBase64(std::string_view text) {
  return !text.empty() && std::all_of(text.begin(), text.end(), [](char byte) {
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') || (byte >= '0' && byte <= '9') ||
           byte == '+' || byte == '/' || byte == '=';
  });
}

}  // namespace

DomainInformation DirectoryClient::AskDomain(const DirectorySettings& settings) {
  const Message answer = AskHelper(settings, "domain", {});
  return {answer.Text("netbiosDomainName"), answer.Text("dnsDomainName"), answer.Text("domainSid")};
}

CreatedAccount DirectoryClient::CreateAccount(const DirectorySettings& settings, const std::string& computer,
                                              const std::string& container,
                                              const std::optional<LedgerEntry>& known) {
  Message request;
  request.fields = {
      {"computer", computer}, {"container", container}, {"takeOver", TextOf(settings.existingAccounts)}};
  if (known) AddRecord(request, known->account);
  Message answer = AskHelper(settings, "create", std::move(request));
  if (!IsBase64(answer.secret.View()))
    throw Failure(kHelperDied, "the helper's answer holds no text for the join");
  CreatedAccount created;
  created.account = {answer.Text("accountName"),   answer.Text("dn"),
                     answer.Text("sid"),           answer.Text("recordedBy"),
                     answer.Number("passwordSet"), answer.Number("lastLogon"),
                     answer.Number("logonCount"),  0};
  created.joinBlob = std::move(answer.secret);
  return created;
}

void DirectoryClient::RemoveUnusedAccount(const DirectorySettings& settings, const LedgerEntry& entry) {
  Message request;
  request.fields["computer"] = entry.computer;
  AddRecord(request, entry.account);
  AskHelper(settings, "remove-unused", std::move(request));
}

void DirectoryClient::ForgetRefusal() {
  const std::lock_guard lock(mutex_);
  refused_.reset();
  forgotten_ = std::chrono::steady_clock::now();
}

Message DirectoryClient::AskHelper(const DirectorySettings& settings, const char* operation,
                                   Message request) {
  RefuseWhileLocked();
  const auto begun = std::chrono::steady_clock::now();
  request.fields["operation"] = operation;
  request.fields["domain"] = settings.domain;
  request.fields["controller"] = settings.controller;
  request.fields["user"] = settings.user;
  request.secret = ReadCredentialFile(settings.passwordFile);
  try {
    return Ask(settings.helper, request, settings.helperTimeout);
  } catch (const Failure& failure) {
    if (failure.Code() == kServiceLogonFailed) {
      const std::lock_guard lock(mutex_);
      if (begun > forgotten_) refused_ = std::chrono::steady_clock::now();
    }
    throw;
  }
}

void DirectoryClient::RefuseWhileLocked() {
  const std::lock_guard lock(mutex_);
  if (refused_ && std::chrono::steady_clock::now() - *refused_ < kPauseAfterRefusal) {
    throw Failure(kServiceLogonFailed,
                  "the directory refused the service's account; it is not asked again for now");
  }
}

}  // namespace camd
