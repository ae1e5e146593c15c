/// The name-service switch file as the C library reads it, with the place of each word in the text.
#ifndef VELMORCTL_NSS_SWITCH_FILE_H
#define VELMORCTL_NSS_SWITCH_FILE_H

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "nss/criterion.h"

namespace velmorctl {

/// A service as it is meant: its name, and the words of its criterion.
struct ServiceMeaning {
  std::string name;
  std::vector<std::string> criterion;

  bool operator==(const ServiceMeaning&) const = default;
};

/// A service as it stands in the text. Positions are indices into the whole text.
struct SwitchService {
  ServiceMeaning meaning;
  Actions actions;
  std::size_t begin = 0;
  std::size_t end = 0;  /// behind the name or, when there is one, behind the criterion's bracket
};

/// What is wrong with a line.
struct LineFault {
  enum class Kind {
    NoDatabase,    /// it begins with a colon, and is passed over
    NoColon,       /// the C library reads it all the same; other programs do not
    ManyColons,    /// likewise
    LoneBracket,   /// a bracket without a service before it: the C library reads no further
    BadCriterion,  /// a bracket without meaning: the C library uses no line of the whole file
    Remark,        /// a comment behind the services, which the C library takes for services
    NoNewline      /// it is the last and not ended by a newline: the C library does not read it
  };

  Kind kind;
  std::string value;
};

struct SwitchLine {
  int number = 0;         /// counted from 1
  std::size_t begin = 0;  /// of the text, without the newline at its end
  std::size_t end = 0;
  std::string database;
  std::size_t servicesBegin = 0;  /// behind the colon
  std::vector<SwitchService> services;
  std::vector<LineFault> faults;

  std::vector<ServiceMeaning> Meaning() const;
  bool Has(LineFault::Kind kind) const;
  const SwitchService* Find(std::string_view service) const;
};

/// Keeps every byte; a plain value.
class SwitchFile {
 public:
  explicit SwitchFile(std::string text);

  const std::string& Text() const { return text_; }

  /// The lines that are neither empty nor comments, in order.
  const std::vector<SwitchLine>& Lines() const { return lines_; }

  /// Those of one database. The C library uses the last of them that ends with a newline.
  std::vector<const SwitchLine*> LinesOf(std::string_view database) const;

  /// Whether the line counts: the C library reads it, and no later one takes its place. Of the databases that
  /// the C library does not read every line counts.
  bool Counts(const SwitchLine& line) const;

 private:
  std::string text_;
  std::vector<SwitchLine> lines_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_SWITCH_FILE_H
