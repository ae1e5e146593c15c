#include "pam_edit/draft.h"

#include <algorithm>
#include <utility>

#include "pam/policy_root.h"
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
  const std::optional<std::string> path = root_.Find(one);
  return path && path == root_.Find(other);
}

FileReader Draft::Reader() const {
  return [this](const std::string& name) -> FileReading {
    std::optional<std::string> path = root_.Find(name);
    if (!path) {
      return ReadingOf(InspectSystemFile(root_, name));
    }
    if (IsFolder(*path)) {
      return {"", std::nullopt};
    }
    if (!FindEdit(*path) && !originals_->contains(*path)) {
      SnapshotInspection inspection = InspectSystemFile(root_, name);
      FileReading reading = ReadingOf(inspection);
      if (reading.problem) {
        return reading;
      }
      originals_->emplace(*path, std::move(inspection.snapshot));
    }
    return {Content(name), std::nullopt};
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
