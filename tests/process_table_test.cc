#include "collect/process_table.h"

#include <gtest/gtest.h>

#include "fake_command_runner.h"
#include "tree_text.h"

namespace cvn {
namespace {

class FixedTable : public ProcessTable {
 public:
  std::vector<ProcessEntry> entries;
  bool readable = true;
  bool read(std::vector<ProcessEntry>* out) override {
    *out = entries;
    return readable;
  }
};

std::string ps(int pid) { return "ps -p" + std::to_string(pid) + " -o user=\"\" -o command=\"\""; }

TEST(ProcessCollectorTest, NumbersFollowTablePositionsAndSkipTheGone) {
  FixedTable table;
  table.entries = {{0, 0, "kernel_task"},
                   {1, 0, "launchd"},
                   {57, 1, "gone"},
                   {88, 1, "Finder"},
                   {90, 1, "nospace"}};
  FakeCommandRunner runner;
  runner.answer(ps(1), "root /sbin/launchd\n");
  runner.answer(
      ps(88), "jane     /System/Library/CoreServices/Finder.app/Contents/MacOS/Finder -psn 0_1\n");
  runner.answer(ps(90), "justoneword\n");
  TagTree raw(true, "Macintosh");
  collectProcesses(raw, table, runner);

  EXPECT_EQ(treeText(raw.top().findChild("Processes")), R"(+Processes=
*process:2="launchd"
pid=1
ppid=0
user="root"
cmd-line="/sbin/launchd"
*process:4="Finder"
pid=88
ppid=1
user="jane"
cmd-line="/System/Library/CoreServices/Finder.app/Contents/MacOS/Finder -psn 0_1"
-
)");
  // The kernel itself is never asked about.
  EXPECT_EQ(runner.commands_ran_, (std::vector<std::string>{ps(1), ps(57), ps(88), ps(90)}));
  EXPECT_EQ(runner.chunk_sizes_.front(), 500u);
}

TEST(ProcessCollectorTest, AnUnreadableTableLeavesNoSection) {
  FixedTable table;
  table.readable = false;
  FakeCommandRunner runner;
  TagTree raw(true, "Macintosh");
  collectProcesses(raw, table, runner);
  EXPECT_EQ(raw.top().findChild("Processes"), nullptr);
}

}  // namespace
}  // namespace cvn
