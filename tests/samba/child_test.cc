// Child processes: what they get, and how they end.

#include "common/child.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <system_error>

#include "expect_failure.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using End = Conversation::End;

constexpr seconds LONG{50};

// A named pipe that programs hold open; its end is seen when none of them is left, so it needs no process
// ids.
class Lifeline {
 public:
  explicit Lifeline(const std::string& path) {
    if (mkfifo(path.c_str(), 0600) == 0) descriptor_ = open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    EXPECT_GE(descriptor_, 0);
  }
  Lifeline(const Lifeline&) = delete;
  Lifeline& operator=(const Lifeline&) = delete;
  ~Lifeline() { close(descriptor_); }

  // Comes back only when no program holds it any more.
  void AwaitEndOfHolders() const {
    char byte = 0;
    while (read(descriptor_, &byte, 1) != 0) {
      pollfd entry = {descriptor_, POLLIN, 0};
      poll(&entry, 1, -1);
    }
  }

 private:
  int descriptor_ = -1;
};

class ChildTest : public testing::Test {
 protected:
  // Makes a program of the lines of a shell script.
  std::string Program(const std::string& lines) const {
    const std::string path = folder_.Path() + "program";
    testsupport::WriteFile(path, "#!/bin/sh\n" + lines + "\n");
    testsupport::SetMode(path, 0755);
    return path;
  }

  Conversation Talk(const std::string& lines, const std::string& secret = "",
                    std::chrono::milliseconds limit = LONG) const {
    return Converse(Program(lines), ChildGroup::kOwn, ChildEnvironment::kMinimal, "request", secret, limit);
  }

  // Whether the process whose id a program has written into a file is gone, collected or not.
  bool IsGone(const std::string& file) const {
    const int process = std::stoi(testsupport::ReadFile(folder_.Path() + file));
    try {
      const std::string text = testsupport::ReadFile("/proc/" + std::to_string(process) + "/stat");
      return text.substr(text.rfind(')') + 2, 1) == "Z";
    } catch (const std::system_error&) {
      return true;
    }
  }

  const testsupport::ScratchFolder folder_;
};

TEST_F(ChildTest, ItGetsTheLineAndGivesOneBack) {
  const Conversation result = Talk("read line; echo \"got $line\"");
  EXPECT_EQ(result.end, End::kAnswered);
  EXPECT_EQ(result.answer, "got request");
}

TEST_F(ChildTest, TheSecretFollowsTheLine) {
  EXPECT_EQ(Talk("read line; echo \"$(head -c 6)\"", "secret").answer, "secret");
}

TEST_F(ChildTest, AnAnswerBeforeTheRequestWasReadCounts) {
  EXPECT_EQ(Talk("echo early; exit 0", std::string(1 << 20, 's')).answer, "early");
}

TEST_F(ChildTest, AChildThatSaysNothingHasDied) {
  EXPECT_EQ(Talk("exit 0").end, End::kDied);
}

TEST_F(ChildTest, AChildThatIsKilledHasDied) {
  EXPECT_EQ(Talk("kill -SEGV $$").end, End::kDied);
}

TEST_F(ChildTest, HalfALineIsNoAnswer) {
  EXPECT_EQ(Talk("printf half").end, End::kDied);
}

TEST_F(ChildTest, AChildThatHangsIsEndedAtTheDeadline) {
  const Lifeline lifeline(folder_.Path() + "lifeline");
  EXPECT_EQ(Talk("exec 3> $(dirname $0)/lifeline; exec sleep 1000", "", seconds(1)).end, End::kDeadline);
  lifeline.AwaitEndOfHolders();
}

TEST_F(ChildTest, ItsOwnChildrenEndWithIt) {
  const Lifeline lifeline(folder_.Path() + "lifeline");
  EXPECT_EQ(Talk("sleep 1000 3> $(dirname $0)/lifeline & wait", "", seconds(1)).end, End::kDeadline);
  lifeline.AwaitEndOfHolders();
}

TEST_F(ChildTest, WhatItLeavesBehindInItsSessionEndsAfterItsAnswer) {
  EXPECT_EQ(Talk("sleep 1000 & echo $! > $(dirname $0)/grandchild; echo done").end, End::kAnswered);
  while (!IsGone("grandchild")) usleep(1000);
}

TEST_F(ChildTest, AChildThatDoesNotReadDoesNotBlockTheCaller) {
  EXPECT_EQ(Talk("sleep 1000", std::string(8 << 20, 's'), milliseconds(300)).end, End::kDeadline);
}

TEST_F(ChildTest, NoSigpipeReachesTheCaller) {
  signal(SIGPIPE, SIG_DFL);
  EXPECT_EQ(Talk("exec 0<&- 1>&-; exit 0", std::string(8 << 20, 's')).end, End::kDied);
}

TEST_F(ChildTest, NothingOfTheCallersIsOpenInIt) {
  const std::string path = folder_.Path() + "open-in-the-caller";
  // Without close-on-exec, as a careless host has them.
  const int descriptor = open(path.c_str(), O_RDWR | O_CREAT, 0600);
  ASSERT_GE(descriptor, 3);
  EXPECT_EQ(Talk("list=$(dirname $0)/list; ls -l /proc/$$/fd > $list; echo done").end, End::kAnswered);
  close(descriptor);
  const std::string list = testsupport::ReadFile(folder_.Path() + "list");
  EXPECT_NE(list.find("socket:"), std::string::npos) << list;
  EXPECT_EQ(list.find("open-in-the-caller"), std::string::npos) << list;
}

TEST_F(ChildTest, NothingOfTheCallersEnvironmentReachesIt) {
  setenv("SECRET_OF_THE_CALLER", "x", 1);
  EXPECT_EQ(Talk("echo \"<$SECRET_OF_THE_CALLER>\"").answer, "<>");
}

TEST_F(ChildTest, TheCallersSignalMaskDoesNotReachIt) {
  sigset_t all;
  sigset_t before;
  sigfillset(&all);
  pthread_sigmask(SIG_BLOCK, &all, &before);
  const Conversation result = Talk("echo $(grep SigBlk /proc/self/status)");
  pthread_sigmask(SIG_SETMASK, &before, nullptr);
  EXPECT_EQ(result.answer, "SigBlk: 0000000000000000");
}

TEST_F(ChildTest, ACallerThatIgnoresItsChildrenGetsTheAnswer) {
  signal(SIGCHLD, SIG_IGN);
  EXPECT_EQ(Talk("echo fine").answer, "fine");
  signal(SIGCHLD, SIG_DFL);
}

TEST_F(ChildTest, NoZombieIsLeft) {
  Talk("echo fine");
  EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), -1);
}

TEST_F(ChildTest, AMissingProgramIsAFailure) {
  EXPECT_FAILURE(
      Converse("/no/such/program", ChildGroup::kOwn, ChildEnvironment::kMinimal, "request", "", LONG), 1359);
}

TEST_F(ChildTest, ACallerWithoutStandardDescriptorsIsServed) {
  const int saved[] = {dup(0), dup(1), dup(2)};
  for (int descriptor = 0; descriptor < 3; ++descriptor) close(descriptor);
  const Conversation result = Talk("read line; echo \"got $line\"");
  for (int descriptor = 0; descriptor < 3; ++descriptor) {
    dup2(saved[descriptor], descriptor);
    close(saved[descriptor]);
  }
  EXPECT_EQ(result.answer, "got request");
}

TEST_F(ChildTest, AProgramsOutputIsKept) {
  const ProgramResult result =
      RunProgram({Program("echo one; echo two >&2; exit 3")}, ProgramOutput::kWanted, LONG);
  EXPECT_EQ(result.exitStatus, 3);
  EXPECT_EQ(result.output, "one\ntwo\n");
  EXPECT_FALSE(result.timedOut);
}

TEST_F(ChildTest, AProgramThatHangsIsEnded) {
  const ProgramResult result =
      RunProgram({Program("exec sleep 1000")}, ProgramOutput::kWanted, milliseconds(300));
  EXPECT_TRUE(result.timedOut);
  EXPECT_EQ(result.exitStatus, -1);
}

TEST_F(ChildTest, AProgramsArgumentsAreNotInterpreted) {
  EXPECT_EQ(RunProgram({"/bin/echo", "$(id); `id`"}, ProgramOutput::kWanted, LONG).output, "$(id); `id`\n");
}

TEST_F(ChildTest, TheLastLineIsTheLastOneWithText) {
  EXPECT_EQ(LastLine("one\ntwo \n\n"), "two");
  EXPECT_EQ(LastLine("one"), "one");
  EXPECT_EQ(LastLine("\n \n"), "");
}

}  // namespace
}  // namespace sambaprovider
