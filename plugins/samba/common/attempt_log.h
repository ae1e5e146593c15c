/// The record of attempts: why an operation came to its status, and how far it has got.
#ifndef SAMBA_COMMON_ATTEMPT_LOG_H
#define SAMBA_COMMON_ATTEMPT_LOG_H

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <string>

namespace sambaprovider {

/// One line of the record, as JSON with its line end. Bytes that are not UTF-8 are replaced.
std::string FormatAttemptLine(const std::string& time, pid_t process, const std::string& operation,
                              const std::string& step, const std::string& event, uint32_t status,
                              const std::string& text);

/// Appends to the record for one operation. Never throws: a record that cannot be written must not make the
/// operation fail. Several processes may append at once; each line is one write.
class AttemptLog {
 public:
  /// `process` is the one that called the plug-in.
  AttemptLog(pid_t process, std::string operation);

  /// Renames a record that has grown too long, so that the next line begins a new one. Hold the
  /// OperationLock.
  static void Rotate();

  void Begin(const std::string& step, const std::string& text) const;
  void End(const std::string& step, uint32_t status, const std::string& text) const;
  void Note(const std::string& step, const std::string& text) const;

  /// Runs `body` as a step: its result is the closing text; a Failure is recorded and passed on.
  void Run(const std::string& step, const std::string& text, const std::function<std::string()>& body) const;

 private:
  void Append(const char* event, const std::string& step, uint32_t status, const std::string& text) const;

  pid_t process_;
  std::string operation_;
};

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_ATTEMPT_LOG_H
