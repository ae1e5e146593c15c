#ifndef SYSTEMCONFIGURATION_PAM_KEYWORDS_H
#define SYSTEMCONFIGURATION_PAM_KEYWORDS_H

#include "keyword_table.h"
#include "systemconfiguration/pam_control.h"
#include "systemconfiguration/pam_facility.h"

namespace SystemConfiguration {

inline constexpr KeywordTable<PAMControl::Control, 6> controlKeywords = {
    {{PAMControl::Required, "required"},
     {PAMControl::Requisite, "requisite"},
     {PAMControl::Sufficient, "sufficient"},
     {PAMControl::Optional, "optional"},
     {PAMControl::Include, "include"},
     {PAMControl::Substack, "substack"}}};

inline constexpr KeywordTable<PAMFacility::Facility, 4> facilityKeywords = {
    {{PAMFacility::Auth, "auth"},
     {PAMFacility::Account, "account"},
     {PAMFacility::Password, "password"},
     {PAMFacility::Session, "session"}}};

}  // namespace SystemConfiguration

#endif
