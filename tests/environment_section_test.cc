#include <gtest/gtest.h>

#include <string>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

std::string buildFrom(const std::string& env_output, FakeCommandRunner* runner_out = nullptr) {
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  runner.answer("env", env_output);
  buildEnvironmentSection(snapshot, runner);
  if (runner_out) *runner_out = runner;
  return treeText(snapshot.top().findChild("Environment"));
}

TEST(EnvironmentSectionTest, OneRecordPerVariable) {
  FakeCommandRunner runner;
  std::string text = buildFrom(
      "PATH=/usr/bin:/bin\n"
      "A=b=c\n"
      "X=\n"
      "MULTI=first line\n"
      "second line\n"
      "key=value inside a value\n"
      "=nameless\n"
      "LAST=no newline",
      &runner);
  EXPECT_EQ(text, R"(+Environment=
env-var:PATH=""
~complex=
env-var:A=""
~complex=
env-var:X=""
~complex=
env-var:MULTI=""
~complex=
env-var:key=""
~complex=
env-var:=""
~complex=
env-var:LAST=""
~complex=
*env-var:PATH=
value="/usr/bin:/bin"
~split=:
system="1"
*env-var:A=
value="b=c"
system="1"
*env-var:X=
value=""
system="1"
*env-var:MULTI=
value="first line"
system="1"
*env-var:key=
value="value inside a value"
system="1"
*env-var:=
value="nameless"
system="1"
*env-var:LAST=
value="no newline"
system="1"
-
)");
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{"env"});
  EXPECT_EQ(runner.chunk_sizes_, std::vector<size_t>{300});
}

TEST(EnvironmentSectionTest, NoOutputNoSection) {
  EXPECT_EQ(buildFrom(""), "");
  EXPECT_EQ(buildFrom("\n\nno equals sign\n"), "");
}

}  // namespace
}  // namespace cvn
