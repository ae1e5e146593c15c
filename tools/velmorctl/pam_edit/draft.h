/// The files inside a root as they would be, before anything is written.
#ifndef VELMORCTL_PAM_EDIT_DRAFT_H
#define VELMORCTL_PAM_EDIT_DRAFT_H

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "pam/policy_files.h"
#include "system_file/change_set.h"
#include "system_file/root_folder.h"
#include "system_file/snapshot.h"

namespace velmorctl::pam {

/// A value: a copy goes on from where the original stands. Names that lead to one file are one file. What was
/// read once is not read again, so that all copies start from the same bytes. For one thread.
class Draft {
 public:
  explicit Draft(RootFolder root);

  /// The content of a file that is called `name` inside the root; nothing when there is none. Throws Failure
  /// when it cannot be read.
  std::optional<std::string> Content(const std::string& name) const;

  /// The same for a file that has to be there.
  std::string RequiredContent(const std::string& name) const;

  void Write(const std::string& name, std::string content);
  void Remove(const std::string& name);

  /// Whether the names lead to the same file.
  bool SameFile(const std::string& one, const std::string& other) const;

  /// Reads policies out of this draft, as long as it lives.
  FileReader Reader() const;

  /// Plans to make the files what they are here, in the order in which they were first written or removed.
  void AddTo(ChangeSet& changes) const;

  const RootFolder& Root() const { return root_; }

 private:
  struct Edit {
    std::string path;
    std::string name;
    std::optional<std::string> content;
  };

  const Snapshot& Original(const std::string& path, const std::string& name) const;
  const Edit* FindEdit(const std::string& path) const;
  void Set(const std::string& name, std::optional<std::string> content);

  RootFolder root_;
  std::shared_ptr<std::map<std::string, Snapshot>> originals_;  // by path
  std::vector<Edit> edits_;
};

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_DRAFT_H
