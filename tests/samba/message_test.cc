// Requests and answers.

#include "common/message.h"

#include <gtest/gtest.h>

#include <cstring>

#include "expect_failure.h"
#include "support/files.h"
#include "velmor/secret.h"

namespace sambaprovider {
namespace {

constexpr std::chrono::seconds LONG{50};

Answer AskScript(const std::string& lines, Request request) {
  const testsupport::ScratchFolder folder;
  const std::string path = folder.Path() + "program";
  testsupport::WriteFile(path, "#!/bin/sh\n" + lines + "\n");
  testsupport::SetMode(path, 0755);
  return Ask(path, ChildGroup::kOwn, ChildEnvironment::kMinimal, request, LONG);
}

Request Simple() {
  Request request;
  request.fields = {{"operation", "join"}};
  return request;
}

TEST(MessageTest, AnAnswerIsParsed) {
  const Answer answer = AskScript("echo '{\"status\":86,\"text\":\"no\"}'", Simple());
  ASSERT_EQ(answer.end, Conversation::End::kAnswered);
  EXPECT_EQ(answer.fields["status"], 86);
}

TEST(MessageTest, AnAnswerThatIsNotUnderstoodCountsAsADeath) {
  for (const char* text : {"hello", "{}", "[]", "{\"status\":\"0\",\"text\":\"\"}",
                           "{\"status\":-1,\"text\":\"\"}", "{\"status\":0}"}) {
    EXPECT_EQ(AskScript("echo '" + std::string(text) + "'", Simple()).end, Conversation::End::kDied) << text;
  }
}

TEST(MessageTest, TheSecretIsNotInTheLine) {
  Request request = Simple();
  request.secret = velmor::Secret(std::string_view("Passw0rd"));
  const Answer answer = AskScript(
      "read line; case \"$line\" in *Passw0rd*) exit 1;; esac\n"
      "[ \"$(head -c 8)\" = Passw0rd ] && echo '{\"status\":0,\"text\":\"apart\"}'",
      std::move(request));
  ASSERT_EQ(answer.end, Conversation::End::kAnswered);
  EXPECT_EQ(answer.fields["text"], "apart");
}

TEST(MessageTest, ANameThatIsNotUtf8IsRefusedBeforeAnythingIsStarted) {
  Request request = Simple();
  request.fields["user"] = "\xff";
  EXPECT_FAILURE(Ask("/no/such/program", ChildGroup::kOwn, ChildEnvironment::kMinimal, request, LONG), 87);
}

TEST(MessageTest, AFieldThatIsNoTextIsRefused) {
  Request request;
  request.fields = {{"user", 1}};
  EXPECT_FAILURE(request.Text("user"), 87);
  EXPECT_EQ(request.Text("absent"), "");
}

}  // namespace
}  // namespace sambaprovider
