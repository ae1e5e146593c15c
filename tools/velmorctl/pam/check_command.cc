/// velmorctl pam check: whether the policies do what they should.
#include <CLI/App.hpp>
#include <algorithm>
#include <set>
#include <utility>

#include "output.h"
#include "pam/check.h"
#include "pam/policy_root.h"
#include "pam/subcommands.h"
#include "system_file/findings.h"

namespace velmorctl::pam {

namespace {

struct Options {
  bool json = false;
  std::string root = "/";
};

/// A file that was left unopened, of those that have capitals in their names.
Finding NeverOpened(const std::string& file) {
  return {{file, 0},
          file.substr(file.rfind('/') + 1),
          "libpam never opens this file: it takes the name of a service in lower case",
          "rename the file to lower case, or remove it"};
}

ExitCode Check(const Options& options, Situation&) {
  PolicyRoot root{RootFolder(options.root)};
  CheckedSystem system = root.System();
  std::set<std::string> opened;
  system.read = [&opened, read = std::move(system.read)](const std::string& path) {
    opened.insert(path);
    return read(path);
  };
  std::vector<Finding> found;
  std::vector<FileProblem> problems;
  for (const std::string& service : root.Services()) {
    for (const Finding& finding : CheckService(service, system)) {
      // What is wrong in an included file is found again with each service.
      if (std::find(found.begin(), found.end(), finding) == found.end()) {
        found.push_back(finding);
        problems.push_back(root.Shown(finding));
      }
    }
  }
  for (const std::string& file : root.FilesWithCapitals()) {
    if (!opened.contains(file)) {
      problems.push_back(root.Shown(NeverOpened(file)));
    }
  }
  return PrintFindings(problems, "velmor.pam-check/1", options.json);
}

}  // namespace

void AddCheck(CLI::App& pam, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* check = pam.add_subcommand("check", "Look for what is wrong with the policies");
  AddRootOption(*check, options->root);
  AddJsonFlag(*check, options->json);
  Bind(*check, invocation, options, Check);
}

}  // namespace velmorctl::pam
