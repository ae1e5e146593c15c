#include "pam_edit/draft.h"

#include <algorithm>
#include <utility>

#include "system_file/file_calls.h"

namespace velmorctl::pam {

Draft::Draft(RootFolder root)
    : root_(std::move(root)), originals_(std::make_shared<std::map<std::string, Snapshot>>()) {}

const Snapshot& Draft::Original(const std::string& path, const std::string& name) const {
  auto found = originals_->find(path);
  if (found == originals_->end()) {
    found = originals_->emplace(path, ReadSystemFileIfThere(root_, name)).first;
  }
  return found->second;
}

const Draft::Edit* Draft::FindEdit(const std::string& path) const {
  auto found =
      std::find_if(edits_.begin(), edits_.end(), [&path](const Edit& edit) { return edit.path == path; });
  return found == edits_.end() ? nullptr : &*found;
}

std::optional<std::string> Draft::Content(const std::string& name) const {
  std::string path = root_.Resolve(name);
  if (const Edit* edit = FindEdit(path)) {
    return edit->content;
  }
  const Snapshot& original = Original(path, name);
  return original.Exists() ? std::optional(original.content) : std::nullopt;
}

std::string Draft::RequiredContent(const std::string& name) const {
  std::optional<std::string> content = Content(name);
  return content ? *content : ReadSystemFile(root_, name).content;
}

void Draft::Set(const std::string& name, std::optional<std::string> content) {
  std::string path = root_.Resolve(name);
  Original(path, name);
  auto found =
      std::find_if(edits_.begin(), edits_.end(), [&path](const Edit& edit) { return edit.path == path; });
  if (found == edits_.end()) {
    edits_.push_back({std::move(path), name, std::move(content)});
  } else {
    found->content = std::move(content);
  }
}

void Draft::Write(const std::string& name, std::string content) {
  Set(name, std::move(content));
}

void Draft::Remove(const std::string& name) {
  Set(name, std::nullopt);
}

bool Draft::SameFile(const std::string& one, const std::string& other) const {
  return root_.Resolve(one) == root_.Resolve(other);
}

FileReader Draft::Reader() const {
  return [this](const std::string& name) -> FileReading {
    std::string path = root_.Resolve(name);
    if (IsFolder(path)) {
      return {"", "", false};
    }
    if (!FindEdit(path) && !originals_->contains(path)) {
      SnapshotInspection inspection = InspectSystemFile(root_, name);
      bool missing = inspection.problem && inspection.problem->kind == FileProblem::Kind::Missing;
      if (inspection.problem && !missing) {
        return {std::nullopt, inspection.problem->reason, inspection.problem->needsRoot};
      }
      originals_->emplace(path, std::move(inspection.snapshot));
    }
    return {Content(name), "", false};
  };
}

void Draft::AddTo(ChangeSet& changes) const {
  for (const Edit& edit : edits_) {
    const Snapshot& original = Original(edit.path, edit.name);
    if (edit.content) {
      changes.Write(original, *edit.content);
    } else {
      changes.Remove(original);
    }
  }
}

}  // namespace velmorctl::pam
