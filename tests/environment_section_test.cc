#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(EnvironmentSectionTest, OneRecordPerVariable) {
  FakeCommandRunner runner;
  // A value's second line has no "=" and is no variable.
  runner.answer("env", "PATH=/usr/bin:/bin\nA=b=c\nsecond line\nX=");
  TagTree snapshot(true, "Snapshot");
  buildEnvironmentSection(snapshot, runner);
  EXPECT_EQ(treeText(snapshot.top().findChild("Environment")), R"(+Environment=
env-var:PATH=""
~complex=
env-var:A=""
~complex=
env-var:X=""
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
-
)");
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{"env"});
}

}  // namespace
}  // namespace cvn
