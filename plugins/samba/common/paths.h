/// The fixed places of the provider's files.
#ifndef SAMBA_COMMON_PATHS_H
#define SAMBA_COMMON_PATHS_H

namespace sambaprovider::paths {

inline constexpr const char* kHelper = "/usr/libexec/velmor/velmor-samba-helper";
inline constexpr const char* kPrecheck = "/usr/libexec/velmor/velmor-samba-precheck";

inline constexpr const char* kSettings = "/etc/quenix/velmor/samba.conf";

inline constexpr const char* kStateFolder = "/var/lib/quenix/samba";
inline constexpr const char* kState = "/var/lib/quenix/samba/state.json";
inline constexpr const char* kAttempts = "/var/lib/quenix/samba/attempts.log";
inline constexpr const char* kLock = "/var/lib/quenix/samba/lock";
inline constexpr const char* kJournal = "/var/lib/quenix/samba/journal.json";

/// What the host had before the join, kept until it leaves.
inline constexpr const char* kBeforeFolder = "/var/lib/quenix/samba/before";
/// Byte for byte what this provider wrote to smb.conf last; tells our file from one that somebody changed.
inline constexpr const char* kWrittenSmbConf = "/var/lib/quenix/samba/smb.conf.written";
/// What it is about to write there; only while it does so.
inline constexpr const char* kNextSmbConf = "/var/lib/quenix/samba/smb.conf.next";

inline constexpr const char* kSmbConf = "/etc/samba/smb.conf";
inline constexpr const char* kDistributionSmbConf = "/usr/share/samba/smb.conf";
inline constexpr const char* kKeytab = "/etc/krb5.keytab";
inline constexpr const char* kSecrets = "/var/lib/samba/private/secrets.tdb";

}  // namespace sambaprovider::paths

#endif  // SAMBA_COMMON_PATHS_H
