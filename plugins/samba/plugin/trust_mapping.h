/// What winbindd's answers mean in the terms of the plug-in interface.
#ifndef SAMBA_PLUGIN_TRUST_MAPPING_H
#define SAMBA_PLUGIN_TRUST_MAPPING_H

#include <cstdint>

#include "authentication/plugin/active_directory_client.h"
#include "plugin/winbind.h"

namespace sambaprovider {

/// `serviceRuns` tells winbindd that is down from one that has given a question up; it matters only for
/// WBC_ERR_WINBIND_NOT_AVAILABLE.
TrustState TrustStateOf(const winbind::TrustCheck& check, bool serviceRuns);

/// For a domain other than the joined one, from its WBC_DOMINFO_TRUST_ flags.
TrustRelationship RelationshipOf(uint32_t trustFlags);

}  // namespace sambaprovider

#endif  // SAMBA_PLUGIN_TRUST_MAPPING_H
