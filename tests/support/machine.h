/// The machine that the sandbox shows: its name, its interfaces, its powers.
#ifndef SUPPORT_MACHINE_H
#define SUPPORT_MACHINE_H

#include <cstdint>
#include <string>

namespace testsupport {

/// Whether this process runs in a sandbox, so that it may change files under /etc.
bool InSandbox();

/// Sets the name that gethostname() gives.
void SetHostName(const std::string& name);

/// Adds an interface that is up and has the IPv4 address, with a route to its neighbours.
void AddInterface(const std::string& name, const std::string& address);

/// While one exists, this thread has no right to pass over file permissions, as if it were not root.
class WithoutFilePowers {
 public:
  WithoutFilePowers();
  WithoutFilePowers(const WithoutFilePowers&) = delete;
  WithoutFilePowers& operator=(const WithoutFilePowers&) = delete;
  ~WithoutFilePowers();

 private:
  std::uint32_t effective_[2];
};

}  // namespace testsupport

#endif  // SUPPORT_MACHINE_H
