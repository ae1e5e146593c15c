/// The policies of a draft, as libpam takes them and as they are written.
#ifndef VELMORCTL_PAM_EDIT_HOST_POLICIES_H
#define VELMORCTL_PAM_EDIT_HOST_POLICIES_H

#include <string>
#include <vector>

#include "pam/stack.h"
#include "pam_edit/draft.h"
#include "pam_edit/own_modules.h"
#include "pam_edit/written_policies.h"

namespace velmorctl::pam {

using Policies = std::vector<Policy>;

/// Those of all services, in the order of their names.
Policies ResolveAll(const Draft& draft);

/// The files of the service itself, there or not.
std::vector<std::string> FilesOfService(const std::string& service);

/// All policy files, since libpam may refuse a policy, or never come to a file, with own lines in it.
WrittenPolicies ReadAllWritten(const Draft& draft);

/// The draft without what was put in before, whatever libpam makes of it now.
Draft WithoutOwn(Draft draft, const WrittenPolicies& written);

/// Why the policies differ in more than entries of own modules; empty when they do not.
std::string UnexpectedDifference(const Policy& without, const Policy& with, const OwnModules& own);

/// Names the files of which nobody can tell what is in them, so that nothing can be put in or taken out.
std::vector<std::string> NotesOnUnreadable(const WrittenPolicies& written);

/// The place in words.
std::string Place(const Origin& origin);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_HOST_POLICIES_H
