/// Samba's configuration file: what we write, and whose the present one is.
#ifndef SAMBA_COMMON_SMB_CONF_H
#define SAMBA_COMMON_SMB_CONF_H

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "common/settings.h"
#include "common/state.h"

namespace sambaprovider {

/// During the join libnetapi writes the secrets; it crashes there when it is told to keep a keytab too.
enum class KeytabUse { kDuringJoin, kKept };

/// The text of smb.conf for a member of the state's domain.
std::string FormatSmbConf(const State& state, const Settings& settings, KeytabUse keytab);

enum class SmbConfOwner { kNobody, kProvider, kDistribution, kAdministrator };

/// Decides whose a present smb.conf is from its text, the text that we wrote last and the distribution's
/// file. The workgroup line may differ from the distribution's, since its installation asks for it.
SmbConfOwner OwnerOfSmbConf(const std::optional<std::string>& present,
                            const std::optional<std::string>& written,
                            const std::optional<std::string>& distribution);

/// Decides it for the files that are there. Throws Failure (kInternalError) when one cannot be read.
SmbConfOwner OwnerOfPresentSmbConf();

/// Throws Failure (kHostConfigurationInTheWay) when smb.conf is an administrator's.
void RequireSmbConfIsReplaceable();

/// Writes smb.conf and remembers the text as ours. A kill at any moment leaves an smb.conf that is known as
/// ours, or the one from before the first write. Throws Failure (kInternalError).
void WriteSmbConf(const std::string& text);

/// Forgets what was written, as when smb.conf is somebody else's again. Throws Failure (kInternalError).
void ForgetWrittenSmbConf();

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_SMB_CONF_H
