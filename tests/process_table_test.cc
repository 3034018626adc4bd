#include "collect/process_table.h"

#include <gtest/gtest.h>

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>
#if defined(__linux__)
#include <sys/prctl.h>
#endif

#include <algorithm>

#include "fake_scan_sources.h"
#include "tree_text.h"

namespace cvn {
namespace {

const char kListing[] = "ps -axww -o pid= -o user= -o command=";

// Listings as the Mac's ps, other ps versions or broken ones print them, for
// a table of the kernel, "seven" (pid 7) and "twelve" (pid 12).
TEST(ProcessCollectorTest, OneListingGivesWhatItHolds) {
  const struct {
    const char* what;
    std::string listing;
    const char *seven, *twelve;  // "user|cmd-line", or null: no record
  } cases[] = {
      {"BSD ps: the user column as wide as its longest name, a command over two lines, a "
       "process started after the table and the kernel left out",
       "    0 root           kernel\n    7 _mdnsresponder   /usr/sbin/mDNSResponder -launchd\n"
       "   12 jos\xC3\xA9           /bin/sh -c echo one\n\n  two  \n 4000 jane           ps\n",
       "_mdnsresponder|/usr/sbin/mDNSResponder -launchd",
       "jos\xC3\xA9|/bin/sh -c echo one\n\n  two"},
      {"procps: names cut to eight, a header and a blank line",
       "  PID USER     COMMAND\n\n    7 averyve+ [kworker/0:1]\n   12 root     \n",
       "averyve+|[kworker/0:1]", "root|"},
      {"CR line ends, more blanks than one between the fields, tabs kept inside",
       "   7 root  \tcmd\targ \r\n  12   jane x\r\n", "root|\tcmd\targ", "jane|x"},
      {"a pid with nothing after it is left out; a pid listed twice keeps its first line",
       "7\n12 root first\n12 jane second\n", nullptr, "root|first"},
      {"no line end at the end; a pid too long to be one continues the line before",
       "   7 root a\n1234567890123456789012 b\n  12 jane c", "root|a\n1234567890123456789012 b",
       "jane|c"},
      {"a user without a command and no blank after it is left out", "   7 root\n12 jane x\n",
       nullptr, "jane|x"},
      {"ps printed nothing", "", nullptr, nullptr},
  };
  auto record = [](const char* name, const char* pid, const char* fields) {
    if (!fields) return std::string();
    std::string user_cmd = fields;
    size_t bar = user_cmd.find('|');
    return std::string("*process:") + name + "\npid=" + pid + "\nppid=1\nuser=\"" +
           user_cmd.substr(0, bar) + "\"\ncmd-line=\"" + user_cmd.substr(bar + 1) + "\"\n";
  };
  for (const auto& c : cases) {
    FixedProcessTable table;
    table.entries = {{0, 0, "kernel_task"}, {7, 1, "seven"}, {12, 1, "twelve"}};
    FakeCommandRunner runner;
    runner.answer(kListing, c.listing);
    TagTree raw(true, "Macintosh");
    collectProcesses(raw, table, runner);
    std::string records =
        record("2=\"seven\"", "7", c.seven) + record("3=\"twelve\"", "12", c.twelve);
    EXPECT_EQ(treeText(raw.top().findChild("Processes")),
              records.empty() ? "*Processes=\n" : "+Processes=\n" + records + "-\n")
        << c.what;
    // One ps for the whole table, whatever its size.
    EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{kListing});
  }
  // An unreadable table leaves no section, and a table of the kernel alone
  // an empty one; neither runs ps.
  for (bool readable : {false, true}) {
    FixedProcessTable table;
    table.readable = readable;
    table.entries = {{0, 0, "kernel_task"}};
    FakeCommandRunner runner;
    TagTree raw(true, "Macintosh");
    collectProcesses(raw, table, runner);
    EXPECT_EQ(treeText(raw.top().findChild("Processes")), readable ? "*Processes=\n" : "");
    EXPECT_TRUE(runner.commands_ran_.empty());
  }
}

// The machine's own table: this test's process with its parent, and a child
// whose short name holds the blanks and parentheses that end a name in
// /proc's stat line.
TEST(SystemProcessTableTest, ListsThisProcessAndAChildWithAnOddName) {
  int ready[2];
  ASSERT_EQ(pipe(ready), 0);
  pid_t child = fork();
  ASSERT_GE(child, 0);
  if (child == 0) {
#if defined(__linux__)
    prctl(PR_SET_NAME, "a) (b c");
#endif
    char byte = 1;
    (void)!write(ready[1], &byte, 1);
    pause();
    _exit(0);
  }
  char byte = 0;
  ASSERT_EQ(read(ready[0], &byte, 1), 1);
  std::vector<ProcessEntry> entries;
  bool read_ok = makeSystemProcessTable()->read(&entries);
  kill(child, SIGKILL);
  waitpid(child, nullptr, 0);
  close(ready[0]);
  close(ready[1]);
  ASSERT_TRUE(read_ok);
  auto find = [&entries](int64_t pid) {
    auto it = std::find_if(entries.begin(), entries.end(),
                           [pid](const ProcessEntry& e) { return e.pid == pid; });
    return it == entries.end() ? ProcessEntry{-1, -1, ""} : *it;
  };
  EXPECT_EQ(find(getpid()).ppid, getppid());
  EXPECT_EQ(find(child).ppid, getpid());
#if defined(__linux__)
  EXPECT_EQ(find(child).short_name, "a) (b c");
#endif
}

}  // namespace
}  // namespace cvn
