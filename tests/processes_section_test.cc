#include <gtest/gtest.h>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(ProcessesSectionTest, CopiesTheGatheredListWholeAndNothingWhenAbsent) {
  TagTree raw(true, "Macintosh");
  TagTree snapshot(true, "Snapshot");
  buildProcessesSection(snapshot, raw);
  EXPECT_EQ(treeText(&snapshot.top()), "*Snapshot=\n");

  raw.setValue("/Processes/process:1/pid", int64_t{1});
  raw.top().findChild("Processes")->findChild("process:1")->setValue(TagValue("launchd"));
  raw.setValue("/Processes/process:3/cmd-line", "/usr/sbin/cupsd -l");
  buildProcessesSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Processes")), R"(+Processes=
+process:1="launchd"
pid=1
-
+process:3=
cmd-line="/usr/sbin/cupsd -l"
-
-
)");
}

}  // namespace
}  // namespace cvn
