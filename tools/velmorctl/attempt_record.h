/// Following what the provider writes down of its attempts.
#ifndef VELMORCTL_ATTEMPT_RECORD_H
#define VELMORCTL_ATTEMPT_RECORD_H

#include <cstdint>
#include <string>
#include <vector>

namespace velmorctl {

/// Reads what is added to /var/lib/quenix/PROVIDER/attempts.log for this process. A provider that keeps no
/// such record gives no lines. For one thread.
class AttemptRecord {
 public:
  /// What stands in the record already is passed over.
  explicit AttemptRecord(const std::string& provider);

  struct Line {
    std::string step;
    std::string event;
    std::int64_t status = 0;
    std::string text;
  };

  /// The complete lines that were added since the last call.
  std::vector<Line> TakeNew();

 private:
  std::string path_;
  std::uint64_t position_ = 0;
};

}  // namespace velmorctl

#endif  // VELMORCTL_ATTEMPT_RECORD_H
