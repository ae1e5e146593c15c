/* Hands every operation on to the test; see scripted_cam_plugin.h. A build with WITHOUT_... has that slot
 * null. */
#include "authentication/plugin/cam_proxy_client.h"

extern __attribute__((visibility("default"))) struct CAMProxyClientOperations scriptedCamAnswers;
struct CAMProxyClientOperations scriptedCamAnswers;

#ifndef WITHOUT_DOMAIN_INFO
static uint32_t getDomainInfo(const char* server, int verifyCertificate, const char* thumbprint,
                              char** netbiosDomainName, char** dnsDomainName, char** domainSid) {
  return scriptedCamAnswers.getDomainInfo(server, verifyCertificate, thumbprint, netbiosDomainName,
                                          dnsDomainName, domainSid);
}
#else
#define getDomainInfo 0
#endif

#ifndef WITHOUT_CREATE
static uint32_t createMachineAccount(const char* server, const char* hostName, const char* container,
                                     int verifyCertificate, const char* thumbprint, char** accountName,
                                     char** joinBlob) {
  return scriptedCamAnswers.createMachineAccount(server, hostName, container, verifyCertificate, thumbprint,
                                                 accountName, joinBlob);
}
#else
#define createMachineAccount 0
#endif

#ifndef WITHOUT_RELEASE
static void releaseString(char* text) {
  scriptedCamAnswers.releaseString(text);
}
#else
#define releaseString 0
#endif

const struct CAMProxyClientOperations CAMProxyClientOperations = {0, getDomainInfo, createMachineAccount,
                                                                  releaseString};
