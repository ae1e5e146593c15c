#ifndef SYSTEMCONFIGURATION_SYSTEMCONFIGURATION_H
#define SYSTEMCONFIGURATION_SYSTEMCONFIGURATION_H

// The models of the two system files that decide how a host authenticates and resolves its users. They stand
// on the standard library alone.
#include "systemconfiguration/exceptions.h"
#include "systemconfiguration/nss_configuration.h"
#include "systemconfiguration/nss_database.h"
#include "systemconfiguration/nss_service.h"
#include "systemconfiguration/pam_control.h"
#include "systemconfiguration/pam_entry.h"
#include "systemconfiguration/pam_facility.h"
#include "systemconfiguration/pam_policy.h"
#include "systemconfiguration/pam_stack.h"

#endif
