#ifndef KERNCTL_NETWORK_H
#define KERNCTL_NETWORK_H

// Everything of KernCtl::Network.
#include "kernctl/dns_config.h"
#include "kernctl/hosts_file.h"
#include "kernctl/network_info.h"

#endif
