// Joining and leaving: all of it is the helper's work.
#include "common/status.h"
#include "plugin/guarded.h"
#include "plugin/helper_client.h"
#include "plugin/slots.h"

namespace sambaprovider::slots {
namespace {

std::string Text(const char* text) {
  return text == nullptr ? "" : text;
}

}  // namespace

uint32_t JoinDomain(const char* domain, const char* organizationalUnit, const Credentials* credentials) {
  return Guarded([&] {
    if (credentials == nullptr) throw Failure(kInvalidParameter, "there are no credentials");
    Request request;
    request.fields = {{"operation", "join"},
                      {"domain", Text(domain)},
                      {"organizationalUnit", Text(organizationalUnit)},
                      {"user", Text(credentials->username)}};
    request.secret =
        velmor::Secret(std::string_view(credentials->password == nullptr ? "" : credentials->password));
    RunHelper(std::move(request));
  });
}

uint32_t PartDomain(const Credentials* credentials) {
  return Guarded([&] {
    Request request;
    request.fields = {{"operation", "leave"}};
    if (credentials != nullptr) {
      request.fields["user"] = Text(credentials->username);
      request.secret =
          velmor::Secret(std::string_view(credentials->password == nullptr ? "" : credentials->password));
    }
    RunHelper(std::move(request));
  });
}

uint32_t JoinDomainWithMachineAccount(const ActiveDirectoryDomainInfo* domain,
                                      const ActiveDirectoryMachineAccountInfo* account) {
  return Guarded([&] {
    if (domain == nullptr || account == nullptr)
      throw Failure(kInvalidParameter, "there is no machine account");
    Request request;
    request.fields = {{"operation", "join-machine"},
                      {"dnsDomain", Text(domain->dnsDomainName)},
                      {"netbiosDomain", Text(domain->netbiosDomainName)},
                      {"accountName", Text(account->accountName)}};
    request.secret = velmor::Secret(std::string_view(account->joinBlob == nullptr ? "" : account->joinBlob));
    RunHelper(std::move(request));
  });
}

}  // namespace sambaprovider::slots
