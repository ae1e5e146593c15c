#include "policy_generator.h"

#include <random>
#include <string>
#include <vector>

#include "pam/return_code.h"

namespace velmorctltest {

namespace {

constexpr std::uint32_t INCLUDED_FILES = 4;
const std::string MODULE = SCRIPTED_PAM_MODULE;

class Generator {
 public:
  explicit Generator(std::uint32_t number) : engine_(number) {}

  PolicySet Policy() {
    PolicySet files;
    files["svc"] = Lines(0, 2 + Below(9));
    for (std::uint32_t file = 1; file <= INCLUDED_FILES; ++file) {
      files["part" + std::to_string(file)] = Lines(file, 1 + Below(6));
    }
    if (Chance(50)) {
      files["other"] = Lines(INCLUDED_FILES, 1 + Below(5));
    }
    return files;
  }

  PolicySet OddText() {
    std::string text;
    for (std::uint32_t pieces = 5 + Below(40); pieces > 0; --pieces) {
      text += OddPiece();
    }
    return {{"svc", text}, {"part1", "auth required " + MODULE + " one\naccount required " + MODULE + "\n"}};
  }

 private:
  std::uint32_t Below(std::uint32_t bound) { return static_cast<std::uint32_t>(engine_() % bound); }
  bool Chance(std::uint32_t percent) { return Below(100) < percent; }

  template <class Item>
  Item OneOf(const std::vector<Item>& items) {
    return items[Below(static_cast<std::uint32_t>(items.size()))];
  }

  std::string Lines(std::uint32_t file, std::uint32_t count) {
    std::string lines;
    for (; count > 0; --count) {
      lines += Line(file);
    }
    return lines;
  }

  /// Only later files are included, so that there is no circle.
  std::string Line(std::uint32_t file) {
    const std::string facility = Chance(55) ? "auth" : OneOf<std::string>({"account", "password", "session"});
    const std::string start = (Chance(10) ? "-" : "") + facility + " ";
    if (file < INCLUDED_FILES && Chance(25)) {
      const std::string target = "part" + std::to_string(file + 1 + Below(INCLUDED_FILES - file));
      return Chance(20) ? "@include " + target + "\n"
                        : start + OneOf<std::string>({"include ", "substack "}) + target + "\n";
    }
    if (Chance(2)) {
      return start + OneOf<std::string>({"include nowhere\n", "substack nowhere\n", "sufficient\n", "\n"});
    }
    return start + Control() + " " + Module();
  }

  std::string Control() {
    if (Chance(45)) {
      return OneOf<std::string>({"required", "requisite", "sufficient", "optional"});
    }
    std::string control = "[";
    for (std::uint32_t pairs = 1 + Below(4); pairs > 0; --pairs) {
      control += (Chance(30) ? "default" : NameOf(OneOf(codes_))) + "=" + Action() + " ";
    }
    return control + (Chance(50) ? "default=" + Action() : "") + "]";
  }

  std::string Action() {
    return Chance(35) ? std::to_string(1 + Below(4))
                      : OneOf<std::string>({"ignore", "ok", "done", "bad", "die", "reset"});
  }

  std::string Module() {
    if (Chance(4)) {
      return "pam_that_is_not_there.so\n";
    }
    std::string words = MODULE;
    for (const char* operation : {"auth", "cred", "account", "open", "close", "prepare", "change"}) {
      words += std::string(" ") + operation + "=" + Answer(operation);
    }
    return words + "\n";
  }

  /// A number that is no return code is given only where libpam does not look up what follows from it later.
  std::string Answer(const std::string& operation) {
    if (Chance(3) && (operation == "account" || operation == "prepare")) {
      return OneOf<std::string>({"32", "77", "-3"});
    }
    return std::to_string(static_cast<int>(Chance(45) ? velmorctl::pam::ReturnCode::Success : OneOf(codes_)));
  }

  std::string OddPiece() {
    static const std::vector<std::string> pieces = {"auth",     "account",
                                                    "-auth",    "AUTH",
                                                    "session",  "@include",
                                                    "include",  "substack",
                                                    "required", "[success=ok",
                                                    "[",        "]",
                                                    "\\]",      "\\",
                                                    "\\\n",     "\\ \t\n",
                                                    "# said",   "#",
                                                    "\n",       "\n",
                                                    "\n",       "\r\n",
                                                    "\t",       "\v",
                                                    "\f",       "[default=bad]",
                                                    "x=y",      "[a b]",
                                                    "part1",    "nowhere",
                                                    "optional", "[success=1 default=ignore]",
                                                    "?",        "[]",
                                                    "-",        "word",
                                                    "\xc3\xa4", "sufficient"};
    if (Chance(30)) {
      return "\nauth " + OneOf<std::string>({"required", "optional", "[default=ok]"}) + " " + MODULE + " ";
    }
    if (Chance(3)) {
      return std::string(1, '\0');
    }
    if (Chance(4)) {
      return std::string(900 + Below(250), 'x');
    }
    return (Chance(25) ? MODULE : OneOf(pieces)) + (Chance(75) ? " " : "");
  }

  using Code = velmorctl::pam::ReturnCode;
  std::mt19937 engine_;
  std::vector<Code> codes_ = {Code::Success,
                              Code::Success,
                              Code::AuthenticationError,
                              Code::UserUnknown,
                              Code::Ignore,
                              Code::NewTokenRequired,
                              Code::AuthenticationInformationUnavailable,
                              Code::PermissionDenied,
                              Code::TryAgain,
                              Code::ModuleUnknown};
};

}  // namespace

PolicySet GeneratePolicy(std::uint32_t number) {
  return Generator(number).Policy();
}

PolicySet GenerateOddText(std::uint32_t number) {
  return Generator(number).OddText();
}

}  // namespace velmorctltest
