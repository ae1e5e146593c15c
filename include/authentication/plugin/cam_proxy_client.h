/*
 * The binary interface between libvelmor and a CAM proxy plug-in: the client of a service that creates
 * computer accounts on behalf of hosts on which nobody has domain credentials.
 *
 * A plug-in named X is a shared object "libX.so" in "/usr/libexec/velmor/lib64" or "/usr/libexec/velmor". It
 * exports the one data symbol that is declared at the end of this header, and should hide all others, since
 * it is loaded with global binding.
 *
 * A status is 0 for success. The library knows 0x80090325 (the server's certificate is not the expected one),
 * 1225 (refused), 1229 (no route), 10060 (no answer in time) and 8 (out of memory); every other code reaches
 * the caller as it is. A call lasts as long as the plug-in lets it: the library applies no time-out of its
 * own. Strings are zero-terminated.
 *
 * This header builds as C11 and as C++17.
 */
#ifndef AUTHENTICATION_PLUGIN_CAM_PROXY_CLIENT_H
#define AUTHENTICATION_PLUGIN_CAM_PROXY_CLIENT_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#define VELMOR_PLUGIN_ASSERT(condition, text) static_assert(condition, text)
#else
#define VELMOR_PLUGIN_ASSERT(condition, text) _Static_assert(condition, text)
#endif

/* Name of the symbol, for dlsym. */
#define CAM_PROXY_CLIENT_OPERATIONS_SYMBOL "CAMProxyClientOperations"

/* The statuses that the library knows. */
#define CAM_PROXY_STATUS_OUT_OF_MEMORY 8u
#define CAM_PROXY_STATUS_CONNECTION_REFUSED 1225u
#define CAM_PROXY_STATUS_NO_ROUTE 1229u
#define CAM_PROXY_STATUS_TIMED_OUT 10060u
#define CAM_PROXY_STATUS_WRONG_CERTIFICATE 0x80090325u

/*
 * Asks the service at `server` (an IPv4 address) for its domain. When `verifyCertificate` is not 0, the
 * server's certificate must have the SHA-1 digest `thumbprint`: upper-case pairs of hexadecimal digits
 * separated by ":". Nothing may be sent to a server whose certificate differs. The library sets the three
 * results to null first, and releases each one that is not null after a success.
 */
typedef uint32_t (*CAMProxyGetDomainInfo)(const char* server, int verifyCertificate, const char* thumbprint,
                                          char** netbiosDomainName, char** dnsDomainName, char** domainSid);

/*
 * Lets the service create a computer account for `hostName` (the host's full name) in `container`, or in the
 * directory's default place when it is null. Returns the account's name ("HOST$") and what the provider needs
 * to finish the join with it, which is a secret. Results and certificate as above.
 */
typedef uint32_t (*CAMProxyCreateMachineAccount)(const char* server, const char* hostName,
                                                 const char* container, int verifyCertificate,
                                                 const char* thumbprint, char** accountName, char** joinBlob);

/* Releases a string that an operation returned; never called with null. Should wipe it first. */
typedef void (*CAMProxyReleaseString)(char* text);

/* The table of operations. The first place is not used by the library; the others must not be null. */
struct CAMProxyClientOperations {
  void (*reserved)(void);
  CAMProxyGetDomainInfo getDomainInfo;
  CAMProxyCreateMachineAccount createMachineAccount;
  CAMProxyReleaseString releaseString;
};

VELMOR_PLUGIN_ASSERT(sizeof(void (*)(void)) == 8, "a slot has another size");
VELMOR_PLUGIN_ASSERT(offsetof(struct CAMProxyClientOperations, reserved) == 0, "reserved has moved");
VELMOR_PLUGIN_ASSERT(offsetof(struct CAMProxyClientOperations, getDomainInfo) == 8,
                     "getDomainInfo has moved");
VELMOR_PLUGIN_ASSERT(offsetof(struct CAMProxyClientOperations, createMachineAccount) == 16,
                     "createMachineAccount has moved");
VELMOR_PLUGIN_ASSERT(offsetof(struct CAMProxyClientOperations, releaseString) == 24,
                     "releaseString has moved");
VELMOR_PLUGIN_ASSERT(sizeof(struct CAMProxyClientOperations) == 32, "the table has another size");

/* What a plug-in defines; external linkage and default visibility, so that it may hide everything else. */
extern __attribute__((visibility("default"))) const struct CAMProxyClientOperations CAMProxyClientOperations;

#undef VELMOR_PLUGIN_ASSERT

#ifdef __cplusplus
} /* extern "C" */
#endif

#endif /* AUTHENTICATION_PLUGIN_CAM_PROXY_CLIENT_H */
