#ifndef SYSTEMCONFIGURATION_NSS_DATABASE_KEYWORDS_H
#define SYSTEMCONFIGURATION_NSS_DATABASE_KEYWORDS_H

#include "keyword_table.h"
#include "systemconfiguration/nss_database.h"

namespace SystemConfiguration {

/// Apart from the class, so that the reader can pass over unknown databases without throwing and catching.
inline constexpr KeywordTable<NSSDatabase::Database, 15> databaseKeywords = {
    {{NSSDatabase::Passwd, "passwd"},
     {NSSDatabase::Group, "group"},
     {NSSDatabase::Shadow, "shadow"},
     {NSSDatabase::Hosts, "hosts"},
     {NSSDatabase::Netmasks, "netmasks"},
     {NSSDatabase::Networks, "networks"},
     {NSSDatabase::Protocols, "protocols"},
     {NSSDatabase::Services, "services"},
     {NSSDatabase::Ethers, "ethers"},
     {NSSDatabase::Rpc, "rpc"},
     {NSSDatabase::Netgroup, "netgroup"},
     {NSSDatabase::Bootparams, "bootparams"},
     {NSSDatabase::Publickey, "publickey"},
     {NSSDatabase::Automount, "automount"},
     {NSSDatabase::Aliases, "aliases"}}};

}  // namespace SystemConfiguration

#endif
