#include "authentication/active_directory_config_store.h"

#include "authentication/library_exceptions.h"

namespace quenix::authentication {

namespace {

constexpr const char* domainNameField = "domain_name";
constexpr const char* proxyAddressField = "auth_proxy_address";
constexpr const char* organizationalUnitField = "organizational_unit";
constexpr const char* thumbprintField = "thumbprint";
constexpr const char* certificateField = "certificate";

}  // namespace

ActiveDirectoryConfigStore::ActiveDirectoryConfigStore()
    : store_(OrvConfigStore::ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace)) {}

std::string ActiveDirectoryConfigStore::GetDomainName() {
  return GetStringValue(AD_CSO_ID, domainNameField);
}

std::string ActiveDirectoryConfigStore::GetOrganizationalUnit() {
  return GetStringValue(AD_CSO_ID, organizationalUnitField);
}

std::string ActiveDirectoryConfigStore::GetAuthProxyAddr() {
  return GetStringValue(AD_CSO_ID, proxyAddressField);
}

std::string ActiveDirectoryConfigStore::GetCertificate() {
  return GetStringValue(AUTH_PROXY_CERT_CSO_ID, certificateField);
}

std::string ActiveDirectoryConfigStore::GetThumbprint() {
  return GetStringValue(AUTH_PROXY_CERT_CSO_ID, thumbprintField);
}

std::string ActiveDirectoryConfigStore::GetStringValue(const OrvConfigStore::ConfigStoreObjectId& id,
                                                       const std::string& field) {
  std::string value;
  const auto object = store_->GetObject(id);
  if (!object) throw ConfigurationError("Failed to get the requested object");
  object->GetValue(field.c_str(), &value);  // an absent field leaves the value empty
  return value;
}

void ActiveDirectoryConfigStore::StoreDomainInfo(const std::string& domainName,
                                                 const std::string& organizationalUnit,
                                                 const std::string& authProxyAddress) {
  const auto object = std::make_shared<OrvConfigStore::ConfigStoreObject>(AD_CSO_ID);
  object->SetValue(domainNameField, domainName);
  object->SetValue(proxyAddressField, authProxyAddress);
  if (!organizationalUnit.empty()) object->SetValue(organizationalUnitField, organizationalUnit);
  store_->PutObject(object, 0);
}

void ActiveDirectoryConfigStore::StoreAuthProxyCertInfo(const std::string& thumbprint,
                                                        const std::string& certificate) {
  const auto object = std::make_shared<OrvConfigStore::ConfigStoreObject>(AUTH_PROXY_CERT_CSO_ID);
  object->SetValue(thumbprintField, thumbprint);
  object->SetValue(certificateField, certificate);
  store_->PutObject(object, 0);
}

void ActiveDirectoryConfigStore::RemoveDomainInfo() {
  if (store_->GetObject(AD_CSO_ID)) store_->RemoveObject(AD_CSO_ID);
}

}  // namespace quenix::authentication
