#include <gtest/gtest.h>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(ProcessesSectionTest, CopiesTheGatheredListWhole) {
  TagTree raw(true, "Macintosh");
  raw.setValue("/SPSoftwareDataType/_items/item0/os_version", "Mac OS X 10.6.8");
  raw.setValue("/Processes/process:1/pid", int64_t{1});
  raw.setValue("/Processes/process:1/cmd-line", "/sbin/launchd");
  raw.top().findChild("Processes")->findChild("process:1")->setValue(TagValue("launchd"));
  raw.setValue("/Processes/process:3/pid", int64_t{57});
  raw.setValue("/Processes/process:3/cmd-line", "/usr/sbin/cupsd -l");

  TagTree snapshot(true, "Snapshot");
  snapshot.setValue("/OS/os:1/name", "Mac OS X");
  buildProcessesSection(snapshot, raw);

  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+OS=
+os:1=
name="Mac OS X"
-
-
+Processes=
+process:1="launchd"
pid=1
cmd-line="/sbin/launchd"
-
+process:3=
pid=57
cmd-line="/usr/sbin/cupsd -l"
-
-
-
)");
  // The raw tree is only read.
  EXPECT_NE(raw.top().findChild("Processes"), nullptr);
}

TEST(ProcessesSectionTest, NoGatheredListNoSection) {
  TagTree raw(true, "Macintosh");
  TagTree snapshot(true, "Snapshot");
  buildProcessesSection(snapshot, raw);
  EXPECT_EQ(treeText(&snapshot.top()), "*Snapshot=\n");
}

}  // namespace
}  // namespace cvn
