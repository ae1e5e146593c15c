#include "velmor/run_program.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "support/clock.h"
#include "support/files.h"
#include "velmor/unique_fd.h"

namespace {

using velmor::ProgramEnd;

class RunProgramTest : public testing::Test {
 protected:
  velmor::Program Command(std::vector<std::string> arguments) const {
    return {std::move(arguments),
            {"PATH=/usr/bin:/bin", "FOLDER=" + folder_.Path()},
            OutputFile(),
            std::chrono::seconds(60)};
  }
  velmor::Program Shell(const std::string& script) const { return Command({"/bin/sh", "-c", script}); }

  std::string OutputFile() const { return folder_.Path() + "output"; }
  std::string Output() const { return testsupport::ReadFile(OutputFile()); }

  testsupport::ScratchFolder folder_;
};

TEST_F(RunProgramTest, SuccessHasNoFailure) {
  const ProgramEnd end = velmor::RunProgram(Shell("exit 0"));
  EXPECT_EQ(end.startError, 0);
  EXPECT_EQ(end.failure, "");
}

TEST_F(RunProgramTest, AStatusIsNamed) {
  EXPECT_EQ(velmor::RunProgram(Shell("exit 3")).failure, "it ended with status 3");
}

TEST_F(RunProgramTest, ASignalIsNamed) {
  EXPECT_EQ(velmor::RunProgram(Shell("kill -s SEGV $$")).failure, "it was ended by signal 11");
}

TEST_F(RunProgramTest, AMissingProgramHasAnErrorNumber) {
  const ProgramEnd end = velmor::RunProgram(Command({"/nowhere"}));
  EXPECT_EQ(end.startError, ENOENT);
}

TEST_F(RunProgramTest, BothOutputsGoToTheFileOneAfterTheOther) {
  velmor::RunProgram(Shell("echo one; echo two >&2; echo three"));
  EXPECT_EQ(Output(), "one\ntwo\nthree\n");
}

TEST_F(RunProgramTest, TheProgramHasThatEnvironmentOnly) {
  velmor::Program program = Command({"/usr/bin/env"});
  program.environment = {"A=1", "B=two words"};
  velmor::RunProgram(program);
  EXPECT_EQ(Output(), "A=1\nB=two words\n");
}

TEST_F(RunProgramTest, TheProgramHasNoInput) {
  velmor::RunProgram(Shell("wc -c"));
  EXPECT_EQ(Output(), "0\n");
}

TEST_F(RunProgramTest, TheProgramHasNoOtherDescriptor) {
  ASSERT_EQ(dup2(STDIN_FILENO, 9), 9);
  velmor::RunProgram(Shell("[ -e /proc/self/fd/9 ] && echo open || echo closed"));
  EXPECT_EQ(Output(), "closed\n");
}

TEST_F(RunProgramTest, TheProgramHasNoIgnoredSignal) {
  signal(SIGTERM, SIG_IGN);
  EXPECT_EQ(velmor::RunProgram(Shell("kill -s TERM $$")).failure, "it was ended by signal 15");
}

TEST_F(RunProgramTest, WhatRunsTooLongIsKilledWithAllThatItStarted) {
  const std::string pipe = folder_.Path() + "pipe";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  testsupport::FakeClock clock;
  ProgramEnd end;
  std::thread run(
      [&] { end = velmor::RunProgram(Shell("exec 8>$FOLDER/pipe; sleep 600 & echo >&8; wait")); });
  const velmor::UniqueFd alive(open(pipe.c_str(), O_RDONLY));
  char byte = 0;
  EXPECT_EQ(read(alive.Get(), &byte, 1), 1);

  clock.MoveMonotonicClock(std::chrono::seconds(61));
  run.join();

  EXPECT_EQ(end.failure, "it did not end within 60 seconds");
  EXPECT_EQ(read(alive.Get(), &byte, 1), 0) << "a process has it open yet";
}

TEST_F(RunProgramTest, AProcessThatIgnoresItsChildrenGetsNoFailure) {
  signal(SIGCHLD, SIG_IGN);
  EXPECT_EQ(velmor::RunProgram(Shell("exit 3")).failure, "");
}

}  // namespace
