#include "pam_edit/placement.h"

#include <algorithm>
#include <utility>

#include "pam_edit/local_guard.h"
#include "pam_edit/module_line.h"

namespace velmorctl::pam {

namespace {

using Side = OwnLine::Side;
using Kind = Action::Kind;

constexpr char primerModule[] = "pam_permit.so";

/// Whether the stack goes on, none the wiser, when the local users' module does not let somebody in.
bool GoesOnAfterRefusal(const StackEntry& local) {
  constexpr ReturnCode refusals[] = {ReturnCode::AuthenticationError, ReturnCode::UserUnknown,
                                     ReturnCode::AuthenticationInformationUnavailable};
  return std::all_of(std::begin(refusals), std::end(refusals), [&local](ReturnCode refusal) {
    return ActionFor(local.actions, refusal).kind == Kind::Ignore;
  });
}

std::string JumpOver(std::int32_t count) {
  return "[success=" + std::to_string(count) + " default=ignore]";
}

/// The password comes from the module before it, and so does a new one where the local module takes it.
std::string PasswordModule(const StackEntry& local, Facility facility, const DirectoryModule& module) {
  std::string text = ModuleText(module, PasswordParameter(module));
  bool takesNewOne =
      facility == Facility::Password &&
      std::find(local.arguments.begin(), local.arguments.end(), "use_authtok") != local.arguments.end() &&
      std::find(module.parameters.begin(), module.parameters.end(), "use_authtok") == module.parameters.end();
  return takesNewOne ? text + " use_authtok" : text;
}

/// The last of the lines is the module's. It comes to stand behind the guard, whichever side they are on.
Placement Guarded(std::vector<OwnLine> lines) {
  const OwnLine& module = lines.back();
  if (module.facility == Facility::Auth) {
    lines.push_back({module.facility, module.side, guardControl, guardModule});
  }
  return {std::move(lines), ""};
}

/// Auth and password: who is let in by one of the two modules need not be known to the other. What success of
/// the local module leads to, success of the directory's leads to as well.
Placement PlaceAlternative(const StackEntry& local, Facility facility, const DirectoryModule& module) {
  std::string text = PasswordModule(local, facility, module);
  Side side = GoesOnAfterRefusal(local) ? Side::After : Side::Before;
  Action success = ActionFor(local.actions, ReturnCode::Success);
  if (success.kind == Kind::Done) {
    return Guarded({{facility, side, "sufficient", text}});
  }
  if (success.kind == Kind::Jump) {
    // In front, it also has the local module itself to pass over.
    std::int32_t count = side == Side::After ? success.jump : success.jump + 1;
    return Guarded({{facility, side, JumpOver(count), text}});
  }
  if (success.kind == Kind::Ok && side == Side::Before) {
    // The stack's yes came from the module that is passed over.
    return Guarded(
        {{facility, Side::After, "required", primerModule}, {facility, Side::Before, JumpOver(1), text}});
  }
  return {{}, "the control " + local.control + " of " + local.module + " leaves no place beside it"};
}

}  // namespace

Placement PlaceBeside(const StackEntry& local, Facility facility, const DirectoryModule& module) {
  switch (facility) {
    case Facility::Auth:
    case Facility::Password:
      return PlaceAlternative(local, facility, module);
    case Facility::Account:
      // In front, since success of the local module may end the stack.
      return {{{facility, Side::Before, accountControl, ModuleText(module)}}, ""};
    case Facility::Session:
      break;
  }
  bool goesOn = ActionFor(local.actions, ReturnCode::Success).kind == Kind::Ok;
  return {{{facility, goesOn ? Side::After : Side::Before, "optional", ModuleText(module)}}, ""};
}

}  // namespace velmorctl::pam
