/// What the host is called.
#ifndef STORES_HOST_NAME_H
#define STORES_HOST_NAME_H

#include <string>

namespace quenix::authentication {

/// The local host name. Throws InvalidHostNameException when the system does not give it.
std::string LocalHostName();

/// The canonical name that the resolver has for `hostName`. Throws InvalidHostNameException when it has none.
std::string CanonicalHostName(const std::string& hostName);

/// `name` up to, not including, its first "."; all of it when it has none.
std::string FirstLabel(const std::string& name);

}  // namespace quenix::authentication

#endif  // STORES_HOST_NAME_H
