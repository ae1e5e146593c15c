// A module that links the library and is itself loaded with local binding: what the library throws must be
// caught by its class here.

#include <string>

#include "authentication/authentication.h"

extern "C" __attribute__((visibility("default"))) const char* CatchByClass(int which);

namespace {

using namespace quenix::authentication;

void Fail(int which) {
  switch (which) {
    case 0:
      Configuration("/nonexistent");
      break;
    case 1:
      ActiveDirectoryStore(60);
      break;
    case 2:
      ActiveDirectoryConfigStore().GetDomainName();
      break;
    default:
      NoRemoteAuthenticationStore().MakeInactive();
  }
}

}  // namespace

const char* CatchByClass(int which) {
  try {
    Fail(which);
  } catch (const IOError&) {
    return "IOError";
  } catch (const InvalidActiveDirectoryProviderException&) {
    return "InvalidActiveDirectoryProviderException";
  } catch (const Exception&) {
    return "Exception";
  } catch (const OrvConfigStore::ConfigStoreException&) {
    return "ConfigStoreException";
  } catch (const HostMgmt::Lib::HostMgmtException&) {
    return "HostMgmtException";
  } catch (const std::exception&) {
    return "std::exception";
  }
  return "nothing";
}
