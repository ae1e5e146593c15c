#include "nss/switch_file.h"

#include <algorithm>
#include <utility>

#include "nss/databases.h"
#include "nss/words.h"

namespace velmorctl {

namespace {

using Kind = LineFault::Kind;

/// Reads one line of the text from its begin to its end.
class LineReader {
 public:
  LineReader(std::string_view text, SwitchLine& line) : text_(text), line_(line), position_(line.begin) {}

  /// False when the line is empty or a comment.
  bool Read() {
    SkipSpace();
    if (AtEnd() || Current() == '#') {
      return false;
    }
    ReadDatabase();
    CutRemark();
    while (ReadService()) {
    }
    return true;
  }

 private:
  bool AtEnd() const { return position_ == line_.end || position_ == remark_; }
  char Current() const { return text_[position_]; }

  void SkipSpace() {
    while (!AtEnd() && IsSpace(Current())) {
      ++position_;
    }
  }

  std::string Rest() const { return std::string(text_.substr(position_, line_.end - position_)); }

  template <class Stop>
  std::string TakeUntil(Stop stop) {
    const std::size_t begin = position_;
    while (!AtEnd() && !IsSpace(Current()) && !stop(Current())) {
      ++position_;
    }
    return std::string(text_.substr(begin, position_ - begin));
  }

  void ReadDatabase() {
    line_.database = TakeUntil([](char character) { return character == ':'; });
    if (line_.database.empty()) {
      line_.faults.push_back({Kind::NoDatabase, Rest()});
    }
    // The C library passes over any number of blanks and colons here.
    std::size_t colons = 0;
    line_.servicesBegin = position_;
    for (; !AtEnd() && (IsSpace(Current()) || Current() == ':'); ++position_) {
      if (Current() == ':') {
        ++colons;
        line_.servicesBegin = position_ + 1;
      }
    }
    if (colons != 1) {
      line_.faults.push_back({colons == 0 ? Kind::NoColon : Kind::ManyColons,
                              std::string(text_.substr(line_.begin, position_ - line_.begin))});
    }
    position_ = line_.servicesBegin;
  }

  void CutRemark() {
    const std::size_t found = text_.find('#', position_);
    if (found < line_.end) {
      line_.faults.push_back({Kind::Remark, std::string(text_.substr(found, line_.end - found))});
      remark_ = found;
    }
  }

  bool ReadService() {
    SkipSpace();
    if (AtEnd()) {
      return false;
    }
    SwitchService service;
    service.begin = position_;
    service.meaning.name = TakeUntil([](char character) { return character == '['; });
    if (service.meaning.name.empty()) {
      line_.faults.push_back({Kind::LoneBracket, Rest()});
      return false;
    }
    service.end = position_;
    SkipSpace();
    const bool good = AtEnd() || Current() != '[' || ReadCriterion(service);
    line_.services.push_back(std::move(service));
    return good;
  }

  bool ReadCriterion(SwitchService& service) {
    const std::size_t end = std::min(line_.end, remark_);
    const std::size_t bracket = std::min(text_.find(']', position_), end);
    const std::string_view inside = text_.substr(position_ + 1, bracket - position_ - 1);
    const std::optional<Actions> actions = bracket < end ? ParseCriterion(inside) : std::nullopt;
    if (!actions) {
      const std::size_t length = bracket < end ? bracket + 1 - position_ : end - position_;
      line_.faults.push_back({Kind::BadCriterion, std::string(text_.substr(position_, length))});
      return false;
    }
    service.actions = *actions;
    service.meaning.criterion = SplitWords(inside);
    position_ = bracket + 1;
    service.end = position_;
    return true;
  }

  std::string_view text_;
  SwitchLine& line_;
  std::size_t position_;
  std::size_t remark_ = std::string_view::npos;
};

}  // namespace

std::vector<ServiceMeaning> SwitchLine::Meaning() const {
  std::vector<ServiceMeaning> meaning;
  for (const SwitchService& service : services) {
    meaning.push_back(service.meaning);
  }
  return meaning;
}

bool SwitchLine::Has(LineFault::Kind kind) const {
  return std::any_of(faults.begin(), faults.end(),
                     [kind](const LineFault& fault) { return fault.kind == kind; });
}

const SwitchService* SwitchLine::Find(std::string_view service) const {
  const auto found =
      std::find_if(services.begin(), services.end(),
                   [service](const SwitchService& candidate) { return candidate.meaning.name == service; });
  return found == services.end() ? nullptr : &*found;
}

SwitchFile::SwitchFile(std::string text) : text_(std::move(text)) {
  int number = 0;
  for (std::size_t begin = 0; begin < text_.size();) {
    const std::size_t newline = text_.find('\n', begin);
    SwitchLine line;
    line.number = ++number;
    line.begin = begin;
    line.end = std::min(newline, text_.size());
    if (LineReader(text_, line).Read()) {
      if (newline == std::string::npos) {
        line.faults.push_back({Kind::NoNewline, text_.substr(begin)});
      }
      lines_.push_back(std::move(line));
    }
    begin = newline == std::string::npos ? text_.size() : newline + 1;
  }
}

std::vector<const SwitchLine*> SwitchFile::LinesOf(std::string_view database) const {
  std::vector<const SwitchLine*> found;
  for (const SwitchLine& line : lines_) {
    if (line.database == database) {
      found.push_back(&line);
    }
  }
  return found;
}

bool SwitchFile::Counts(const SwitchLine& line) const {
  if (!IsLibraryDatabase(line.database)) {
    return true;
  }
  return !line.Has(Kind::NoNewline) &&
         std::none_of(lines_.begin(), lines_.end(), [&line](const SwitchLine& other) {
           return other.database == line.database && other.number > line.number &&
                  !other.Has(Kind::NoNewline);
         });
}

}  // namespace velmorctl
