/*
 * The binary interface between libvelmor and an Active Directory provider plug-in.
 *
 * A provider named X is a shared object "libX.so" in "/usr/libexec/velmor/lib64" or "/usr/libexec/velmor". It
 * exports the two data symbols that are declared at the end of this header.
 *
 * The library loads it with lazy, global binding, so a plug-in should export these two symbols only and hide
 * all others. Every operation may be called from several threads at once, and must return sooner or later:
 * the library bounds how long its own callers wait, but it never ends a call.
 *
 * A status is 0 for success, else a code in the numbering of the Windows system, network-management and
 * socket errors; the library turns it into an exception. When an operation fails, nothing that it may have
 * stored in its out-parameters is read or released. Strings are zero-terminated UTF-8.
 *
 * This header builds as C11 and as C++17.
 */
#ifndef AUTHENTICATION_PLUGIN_ACTIVE_DIRECTORY_CLIENT_H
#define AUTHENTICATION_PLUGIN_ACTIVE_DIRECTORY_CLIENT_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#define VELMOR_PLUGIN_ENUM(name) enum name : uint32_t
#define VELMOR_PLUGIN_ASSERT(condition, text) static_assert(condition, text)
#else
/* C11 cannot fix an enumeration's type, so there the type is the integer and the enumeration only names
 * values. */
#define VELMOR_PLUGIN_ENUM(name) \
  typedef uint32_t name;         \
  enum name##Values
#define VELMOR_PLUGIN_ASSERT(condition, text) _Static_assert(condition, text)
#endif

/* The newest interface version that this header describes; a plug-in with a greater one is refused. */
#define ACTIVE_DIRECTORY_CLIENT_API_VERSION 3

/* Names of the two symbols, for dlsym. */
#define ACTIVE_DIRECTORY_CLIENT_METADATA_SYMBOL "ActiveDirectoryClientMetadata"
#define ACTIVE_DIRECTORY_CLIENT_OPERATIONS_SYMBOL "ActiveDirectoryClientOperations"

/*
 * The state of the trust between this host and the domain it has joined. The library stores and returns the
 * value unchanged, but it sets 0, 2 and 7 itself, so a plug-in must not give them another meaning. Value 6 is
 * left out because it says "unknown" in TrustRelationship.
 */
VELMOR_PLUGIN_ENUM(TrustState){
    TRUST_STATE_NOT_PROVIDED = 0,         /* the plug-in has no such operation (set by the library) */
    TRUST_STATE_HEALTHY = 1,              /* the domain accepted the machine account's password just now */
    TRUST_STATE_TIMED_OUT = 2,            /* no answer within the store's time-out (set by the library) */
    TRUST_STATE_ACCOUNT_UNUSABLE = 3,     /* the machine account is missing or disabled */
    TRUST_STATE_WRONG_PASSWORD = 4,       /* the machine account's password differs from the host's */
    TRUST_STATE_NO_DOMAIN_CONTROLLER = 5, /* no domain controller answers */
    TRUST_STATE_NOT_KNOWN = 7,    /* not asked yet, or a needed file is missing (set by the library) */
    TRUST_STATE_SERVICE_DOWN = 8, /* the host's own directory service does not run */
    TRUST_STATE_NOT_JOINED = 9,   /* the host has joined no domain */
    TRUST_STATE_BROKEN = 10       /* the trust does not work, for a reason that has no value here */
};

/*
 * How the joined domain and another one trust each other. The library sets 0 and 6 itself. Value 2 and 7 are
 * left out because they say "timed out" and "not known" in TrustState.
 */
VELMOR_PLUGIN_ENUM(TrustRelationship){
    TRUST_RELATIONSHIP_NOT_PROVIDED = 0, /* the plug-in has no such operation (set by the library) */
    TRUST_RELATIONSHIP_SAME_DOMAIN = 1,  /* the named domain is the joined domain itself */
    TRUST_RELATIONSHIP_TWO_WAY = 3,      /* each trusts the other */
    TRUST_RELATIONSHIP_INBOUND = 4,      /* the named domain trusts the joined one, not the reverse */
    TRUST_RELATIONSHIP_OUTBOUND = 5,     /* the joined domain trusts the named one, not the reverse */
    TRUST_RELATIONSHIP_UNKNOWN = 6,      /* nothing is known of that domain (set by the library) */
    TRUST_RELATIONSHIP_NONE = 8          /* the named domain is known and not trusted, or not known at all */
};

/* The account of a join or leave. The caller owns both strings; they are valid for the call only. */
typedef struct Credentials {
  const char* username; /* as the user gave it: "name", "DOMAIN\\name" or "name@domain"; may be null */
  const char* password; /* may be null */
} Credentials;

/* What the plug-in says of itself. All strings belong to the plug-in and live as long as it is loaded. */
struct ActiveDirectoryClientMetadata {
  int32_t apiVersion;              /* the interface version that the plug-in was built for */
  const char* pamModule;           /* name of the PAM module that the plug-in brings; not null */
  const char* pamModuleParameters; /* its parameters, separated by white space; may be null */
  const char* nssModule; /* name of the name-service switch module that the plug-in brings; not null */
  const char* nssModuleParameters; /* its parameters, separated by white space; may be null */
};

/* A domain's two names. */
typedef struct ActiveDirectoryDomainPair {
  char* dnsName;
  char* netbiosName;
} ActiveDirectoryDomainPair;

/* The domain of a join with a machine account that exists already. */
typedef struct ActiveDirectoryDomainInfo {
  const char* domainController; /* a domain controller to prefer; the library always passes "" */
  const char* netbiosDomainName;
  const char* dnsDomainName;
  const char* domainSid; /* in its text form, "S-1-5-21-..." */
} ActiveDirectoryDomainInfo;

/* The machine account of such a join. */
typedef struct ActiveDirectoryMachineAccountInfo {
  const char* hostName; /* the host's short name */
  const char* dnsDomainName;
  const char* organizationalUnit; /* the library always passes "" */
  const char* accountName;        /* the account's name in the directory, "HOST$" */
  const char* joinBlob;           /* what the proxy returned to finish the join with; a secret */
} ActiveDirectoryMachineAccountInfo;

/*
 * Releases memory that an operation returned. The library calls it only with what came from the same call,
 * and never frees such memory in another way.
 */
typedef void (*ActiveDirectoryFree)(void* memory);

/*
 * Joins the domain. `organizationalUnit` is null for the directory's default place, else a full DN,
 * "Servers/Hosts" or "OU=Servers/OU=Hosts". The library repeats the call, up to four times 30 seconds apart,
 * when it returns 1326 or 0xFFFF0000; a definite refusal of the password must therefore be another code (86).
 */
typedef uint32_t (*ActiveDirectoryJoinDomain)(const char* domain, const char* organizationalUnit,
                                              const Credentials* credentials);

/* Leaves the domain; null credentials ask for a leave that needs no account. */
typedef uint32_t (*ActiveDirectoryPartDomain)(const Credentials* credentials);

/*
 * Reports the joined domain. The library sets both names to null first; each one that is not null afterwards
 * is passed to `*release` once. Success with null names says that the host has joined no domain.
 */
typedef uint32_t (*ActiveDirectoryGetActiveDomain)(ActiveDirectoryDomainPair* domain,
                                                   ActiveDirectoryFree* release);

/* Sets the domain controllers to use first; `names` ends with a null pointer and belongs to the caller. */
typedef uint32_t (*ActiveDirectorySetStrings)(const char* const* names);

/*
 * Returns an array that ends with a null pointer, or a null array for an empty list. `*release` is called
 * once, with the array even when it is null, and releases everything that the array points to.
 */
typedef uint32_t (*ActiveDirectoryGetStrings)(char*** names, ActiveDirectoryFree* release);

/* The state of the trust with the joined domain. Has no status: every outcome has a value. */
typedef TrustState (*ActiveDirectoryGetDomainTrustState)(void);

/*
 * Returns the trusted domains without the joined one, in an array that ends with a null pointer. No name in a
 * pair may be null. `*release` is called once, with the array even when it is null, and releases the pairs
 * too.
 */
typedef uint32_t (*ActiveDirectoryGetTrustedDomains)(ActiveDirectoryDomainPair*** domains,
                                                     ActiveDirectoryFree* release);

/* Returns one string; null stands for the empty string. `*release` is called once, also with null. */
typedef uint32_t (*ActiveDirectoryGetString)(char** text, ActiveDirectoryFree* release);

/* As ActiveDirectoryGetString, for `domain`; a `qualifier` narrows the choice and may be null. */
typedef uint32_t (*ActiveDirectoryGetAnyDomainController)(const char* qualifier, const char* domain,
                                                          char** text, ActiveDirectoryFree* release);

/* As ActiveDirectoryGetString, for `argument` (a user name, or a domain). */
typedef uint32_t (*ActiveDirectoryConvertString)(const char* argument, char** text,
                                                 ActiveDirectoryFree* release);

/* Joins the domain with a machine account that exists already. Since version 2. Repeated like the join. */
typedef uint32_t (*ActiveDirectoryJoinDomainWithMachineAccount)(
    const ActiveDirectoryDomainInfo* domain, const ActiveDirectoryMachineAccountInfo* account);

/* The relationship of the joined domain with `domain`. Has no status: every outcome has a value. */
typedef TrustRelationship (*ActiveDirectoryGetDomainTrustRelationship)(const char* domain);

/*
 * The table of operations. Any function may be null: the operation is then reported as not implemented. The
 * version guards joinDomainWithMachineAccount and getHostPrincipalForDomain only (2 or more); the last three
 * slots are read whatever the version, so every table must be laid out to its end.
 */
struct ActiveDirectoryClientOperations {
  int32_t apiVersion;
  ActiveDirectoryJoinDomain joinDomain;
  ActiveDirectoryPartDomain partDomain;
  ActiveDirectoryGetActiveDomain getActiveDomain;
  ActiveDirectorySetStrings setPreferredDomainControllers;
  ActiveDirectoryGetStrings getPreferredDomainControllers;
  void (*reserved)(void); /* never called */
  ActiveDirectoryGetDomainTrustState getDomainTrustState;
  ActiveDirectoryGetTrustedDomains getTrustedDomains;
  ActiveDirectoryGetString getMachineAccountDN;
  ActiveDirectoryGetAnyDomainController getAnyDomainController;
  ActiveDirectoryConvertString convertCanonicalUsername;
  ActiveDirectoryJoinDomainWithMachineAccount joinDomainWithMachineAccount; /* since version 2 */
  ActiveDirectoryConvertString getHostPrincipalForDomain;                   /* since version 2 */
  ActiveDirectoryGetDomainTrustRelationship getDomainTrustRelationship;
  ActiveDirectorySetStrings setSmartCardEnabledServices;
  ActiveDirectoryGetStrings getSmartCardEnabledServices;
};

#define VELMOR_PLUGIN_AT(record, field, position) \
  VELMOR_PLUGIN_ASSERT(offsetof(record, field) == (position), #record "." #field " has moved")
#define VELMOR_PLUGIN_SIZE(type, size) VELMOR_PLUGIN_ASSERT(sizeof(type) == (size), #type " has another size")

VELMOR_PLUGIN_SIZE(void*, 8);
VELMOR_PLUGIN_SIZE(ActiveDirectoryFree, 8);
VELMOR_PLUGIN_SIZE(TrustState, 4);
VELMOR_PLUGIN_SIZE(TrustRelationship, 4);

VELMOR_PLUGIN_AT(Credentials, username, 0);
VELMOR_PLUGIN_AT(Credentials, password, 8);
VELMOR_PLUGIN_SIZE(Credentials, 16);

VELMOR_PLUGIN_AT(struct ActiveDirectoryClientMetadata, apiVersion, 0);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientMetadata, pamModule, 8);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientMetadata, pamModuleParameters, 16);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientMetadata, nssModule, 24);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientMetadata, nssModuleParameters, 32);
VELMOR_PLUGIN_SIZE(struct ActiveDirectoryClientMetadata, 40);

VELMOR_PLUGIN_AT(ActiveDirectoryDomainPair, dnsName, 0);
VELMOR_PLUGIN_AT(ActiveDirectoryDomainPair, netbiosName, 8);
VELMOR_PLUGIN_SIZE(ActiveDirectoryDomainPair, 16);

VELMOR_PLUGIN_AT(ActiveDirectoryDomainInfo, domainController, 0);
VELMOR_PLUGIN_AT(ActiveDirectoryDomainInfo, netbiosDomainName, 8);
VELMOR_PLUGIN_AT(ActiveDirectoryDomainInfo, dnsDomainName, 16);
VELMOR_PLUGIN_AT(ActiveDirectoryDomainInfo, domainSid, 24);
VELMOR_PLUGIN_SIZE(ActiveDirectoryDomainInfo, 32);

VELMOR_PLUGIN_AT(ActiveDirectoryMachineAccountInfo, hostName, 0);
VELMOR_PLUGIN_AT(ActiveDirectoryMachineAccountInfo, dnsDomainName, 8);
VELMOR_PLUGIN_AT(ActiveDirectoryMachineAccountInfo, organizationalUnit, 16);
VELMOR_PLUGIN_AT(ActiveDirectoryMachineAccountInfo, accountName, 24);
VELMOR_PLUGIN_AT(ActiveDirectoryMachineAccountInfo, joinBlob, 32);
VELMOR_PLUGIN_SIZE(ActiveDirectoryMachineAccountInfo, 40);

VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, apiVersion, 0);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, joinDomain, 8);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, partDomain, 16);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getActiveDomain, 24);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, setPreferredDomainControllers, 32);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getPreferredDomainControllers, 40);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, reserved, 48);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getDomainTrustState, 56);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getTrustedDomains, 64);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getMachineAccountDN, 72);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getAnyDomainController, 80);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, convertCanonicalUsername, 88);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, joinDomainWithMachineAccount, 96);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getHostPrincipalForDomain, 104);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getDomainTrustRelationship, 112);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, setSmartCardEnabledServices, 120);
VELMOR_PLUGIN_AT(struct ActiveDirectoryClientOperations, getSmartCardEnabledServices, 128);
VELMOR_PLUGIN_SIZE(struct ActiveDirectoryClientOperations, 136);

/*
 * What a plug-in defines. The declarations give both symbols external linkage and default visibility, so that
 * a plug-in may hide everything else.
 */
#define VELMOR_PLUGIN_SYMBOL extern __attribute__((visibility("default")))
VELMOR_PLUGIN_SYMBOL const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata;
VELMOR_PLUGIN_SYMBOL const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations;

#undef VELMOR_PLUGIN_SYMBOL
#undef VELMOR_PLUGIN_AT
#undef VELMOR_PLUGIN_SIZE
#undef VELMOR_PLUGIN_ASSERT
#undef VELMOR_PLUGIN_ENUM

#ifdef __cplusplus
} /* extern "C" */
#endif

#endif /* AUTHENTICATION_PLUGIN_ACTIVE_DIRECTORY_CLIENT_H */
