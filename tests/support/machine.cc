#include "support/machine.h"

#include <arpa/inet.h>
#include <linux/capability.h>
#include <linux/rtnetlink.h>
#include <linux/veth.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <system_error>

namespace testsupport {
namespace {

[[noreturn]] void Fail(const std::string& what) {
  throw std::system_error(errno, std::generic_category(), what);
}

ifreq RequestFor(const std::string& name) {
  ifreq request{};
  name.copy(request.ifr_name, IFNAMSIZ - 1);
  return request;
}

void Control(int descriptor, unsigned long operation, ifreq& request) {
  if (ioctl(descriptor, operation, &request) != 0) {
    Fail(request.ifr_name);
  }
}

/// A netlink message that grows by attributes.
class LinkMessage {
 public:
  explicit LinkMessage(std::uint16_t type) {
    Header()->nlmsg_type = type;
    Header()->nlmsg_flags = NLM_F_REQUEST | NLM_F_CREATE | NLM_F_EXCL | NLM_F_ACK;
    Reserve(NLMSG_LENGTH(sizeof(ifinfomsg)));
  }

  void AddText(std::uint16_t type, const std::string& text) {
    const std::size_t start = Begin(type);
    std::memcpy(buffer_ + length_, text.c_str(), text.size() + 1);
    Reserve(text.size() + 1);
    End(start);
  }

  /// Opens an attribute that holds others until End() is called with what Begin() returned.
  std::size_t Begin(std::uint16_t type) {
    const std::size_t start = length_;
    reinterpret_cast<rtattr*>(buffer_ + start)->rta_type = type;
    Reserve(RTA_LENGTH(0));
    return start;
  }
  void End(std::size_t start) {
    reinterpret_cast<rtattr*>(buffer_ + start)->rta_len = static_cast<std::uint16_t>(length_ - start);
  }

  /// Room for an ifinfomsg inside an attribute.
  void AddEmptyLink() { Reserve(sizeof(ifinfomsg)); }

  /// Sends the message and returns the kernel's answer, 0 or a negative error number.
  int Send() {
    const int descriptor = socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE);
    Header()->nlmsg_len = static_cast<std::uint32_t>(length_);
    char answer[1024];
    if (descriptor < 0 || send(descriptor, buffer_, length_, 0) < 0 ||
        recv(descriptor, answer, sizeof answer, 0) < 0) {
      Fail("netlink");
    }
    close(descriptor);
    nlmsgerr result{};
    std::memcpy(&result, answer + NLMSG_HDRLEN, sizeof result);
    return result.error;
  }

 private:
  nlmsghdr* Header() { return reinterpret_cast<nlmsghdr*>(buffer_); }
  void Reserve(std::size_t bytes) { length_ += RTA_ALIGN(bytes); }

  alignas(nlmsghdr) char buffer_[512] = {};
  std::size_t length_ = 0;
};

const std::string PEER_OF = "to-";

/// A pair of virtual Ethernet ends: the one kind of interface that needs no device file and that every kernel
/// with containers has.
void CreateInterface(const std::string& name) {
  LinkMessage message(RTM_NEWLINK);
  message.AddText(IFLA_IFNAME, name);
  const std::size_t information = message.Begin(IFLA_LINKINFO);
  message.AddText(IFLA_INFO_KIND, "veth");
  const std::size_t data = message.Begin(IFLA_INFO_DATA);
  const std::size_t peer = message.Begin(VETH_INFO_PEER);
  message.AddEmptyLink();
  message.AddText(IFLA_IFNAME, PEER_OF + name);
  message.End(peer);
  message.End(data);
  message.End(information);
  if (const int error = message.Send(); error != 0) {
    throw std::system_error(-error, std::generic_category(), name);
  }
}

void CallCapabilities(long number, __user_cap_data_struct (&data)[2]) {
  __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
  if (syscall(number, &header, data) != 0) {
    Fail("capabilities");
  }
}

}  // namespace

bool InSandbox() {
  return access("/run/velmor-sandbox", F_OK) == 0;
}

void SetHostName(const std::string& name) {
  if (sethostname(name.data(), name.size()) != 0) {
    Fail(name);
  }
}

void AddInterface(const std::string& name, const std::string& address) {
  CreateInterface(name);
  const int control = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  if (control < 0) {
    Fail("socket");
  }
  ifreq request = RequestFor(name);
  sockaddr_in socketAddress{};
  socketAddress.sin_family = AF_INET;
  if (inet_pton(AF_INET, address.c_str(), &socketAddress.sin_addr) != 1) {
    errno = EINVAL;
    Fail(address);
  }
  std::memcpy(&request.ifr_addr, &socketAddress, sizeof socketAddress);
  Control(control, SIOCSIFADDR, request);

  for (const std::string& end : {name, PEER_OF + name}) {
    request = RequestFor(end);
    request.ifr_flags = IFF_UP | IFF_RUNNING;
    Control(control, SIOCSIFFLAGS, request);
  }
  close(control);
}

WithoutFilePowers::WithoutFilePowers() {
  __user_cap_data_struct data[2] = {};
  CallCapabilities(SYS_capget, data);
  effective_[0] = data[0].effective;
  effective_[1] = data[1].effective;
  data[0].effective &= ~((1U << CAP_DAC_OVERRIDE) | (1U << CAP_DAC_READ_SEARCH) | (1U << CAP_FOWNER));
  CallCapabilities(SYS_capset, data);
}

WithoutFilePowers::~WithoutFilePowers() {
  __user_cap_data_struct data[2] = {};
  CallCapabilities(SYS_capget, data);
  data[0].effective = effective_[0];
  data[1].effective = effective_[1];
  CallCapabilities(SYS_capset, data);
}

}  // namespace testsupport
