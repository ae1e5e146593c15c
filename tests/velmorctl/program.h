/// Running the shipped command, as a shell would.
#ifndef VELMORCTL_PROGRAM_H
#define VELMORCTL_PROGRAM_H

#include <sys/types.h>

#include <chrono>
#include <nlohmann/json.hpp>
#include <string>
#include <thread>
#include <vector>

namespace velmorctltest {

/// How a run of the command ended.
struct Outcome {
  int exitCode = -1;     /// -1 when a signal ended it
  int signalNumber = 0;  /// 0 when it exited
  bool leftCoreFile = false;
  std::string output;
  std::string errors;

  /// The output as a JSON document; fails when it is none.
  nlohmann::json Json() const { return nlohmann::json::parse(output); }
};

/// What is special in a run.
struct Setting {
  std::string standardInput;                    /// the whole of it
  std::vector<std::string> descriptorContents;  /// of the descriptors 10, 11, ... that the command inherits
  std::string outputTo;                         /// where standard output goes instead of into the outcome
  std::string errorsTo;                         /// the same for standard error
  bool asRoot = true;
};

Setting WithInput(const std::string& standardInput);
Setting WithDescriptor(const std::string& content);
Setting WithOutputTo(const std::string& path);
Setting WithErrorsTo(const std::string& path);
Setting WithoutRoot();

/// A command that runs; killed when this object ends before it does.
class RunningProgram {
 public:
  explicit RunningProgram(const std::vector<std::string>& arguments, const Setting& setting = {});
  RunningProgram(const RunningProgram&) = delete;
  RunningProgram& operator=(const RunningProgram&) = delete;
  ~RunningProgram();

  pid_t Process() const { return process_; }
  void Signal(int number) const;

  /// What it has written to standard error so far.
  std::string ErrorsSoFar() const;

  /// Waits for its end.
  Outcome Wait();

 private:
  pid_t process_;
  bool ended_ = false;
  std::string files_;
  std::string output_;
  std::string errors_;
};

/// Runs the command to its end.
Outcome Velmorctl(const std::vector<std::string>& arguments, const Setting& setting = {});

/// Ends the calling process by becoming the command; for a child that has set up its descriptors.
[[noreturn]] void BecomeProgram(const std::vector<std::string>& arguments, bool asRoot);

/// Waits until `condition` holds; false when it does not within a time that is long on any machine.
template <class Condition>
bool Eventually(Condition condition) {
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(40);
  while (!condition()) {
    if (std::chrono::steady_clock::now() > deadline) {
      return false;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
  return true;
}

}  // namespace velmorctltest

#endif  // VELMORCTL_PROGRAM_H
