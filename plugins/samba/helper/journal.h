/// What is under way, so that the next run can put a killed one right. There only while something changes.
#ifndef SAMBA_HELPER_JOURNAL_H
#define SAMBA_HELPER_JOURNAL_H

#include <optional>
#include <string>

namespace sambaprovider {

struct Journal {
  enum class Operation { kJoin, kLeave, kPrefer };
  Operation operation = Operation::kJoin;
  std::string dnsDomain;
  std::string netbiosDomain;
  std::string computer;
  /// The controller where a join makes the account, so that undoing it removes the account there again; empty
  /// when it makes none.
  std::string accountMadeAt;
};

/// Nothing when no operation was interrupted; also for a journal that cannot be understood, which can only be
/// one that was never written whole. Throws Failure (kInternalError) when it cannot be read.
std::optional<Journal> LoadJournal();

/// Written durably before the first change and removed after the last one. Throw Failure (kInternalError).
void SaveJournal(const Journal& journal);
void RemoveJournal();

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_JOURNAL_H
