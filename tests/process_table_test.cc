#include "collect/process_table.h"

#include <gtest/gtest.h>

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>
#if defined(__linux__)
#include <sys/prctl.h>
#endif

#include <algorithm>
#include <cinttypes>
#include <cstdio>

#include "collect/command_runner.h"
#include "fake_command_runner.h"
#include "tree_text.h"
#include "zxml/trim_text.h"

namespace cvn {
namespace {

const char kListing[] = "ps -axww -o pid= -o user= -o command=";

class FixedTable : public ProcessTable {
 public:
  std::vector<ProcessEntry> entries;
  bool readable = true;
  bool read(std::vector<ProcessEntry>* out) override {
    *out = entries;
    return readable;
  }
};

// A process as the fake ps sees it; `alive` false: it exited after the table
// was read.
struct FakeProcess {
  int64_t pid;
  std::string user;
  std::string command;
  bool alive = true;
};

// The scan used to ask "ps -p PID -o user= -o command=" for each process and
// split the answer at its first blank. Kept here as the reference the single
// listing must agree with.
std::string perProcessReading(const std::vector<ProcessEntry>& entries, CommandRunner& runner) {
  TagTree raw(true, "Macintosh");
  Tag& processes = raw.top().addChild("Processes");
  for (size_t i = 0; i < entries.size(); ++i) {
    if (entries[i].pid == 0) continue;
    std::string output =
        runner.run("ps -p" + std::to_string(entries[i].pid) + " -o user=\"\" -o command=\"\"", 500);
    size_t space = output.find(' ');
    if (output.empty() || space == std::string::npos) continue;
    Tag& p = processes.setChildValue("process:" + std::to_string(i + 1),
                                     TagValue(entries[i].short_name));
    p.setProperty("pid", TagValue(entries[i].pid));
    p.setProperty("ppid", TagValue(entries[i].ppid));
    p.setProperty("user", TagValue(trimText(output.substr(0, space), " \n\r", kTrimBoth)));
    p.setProperty("cmd-line", TagValue(trimText(output.substr(space), " \n\r", kTrimBoth)));
  }
  return treeText(&processes);
}

// Both forms as the Mac's ps prints them: the user column is at least eight
// wide (as wide as its longest name in the listing), the pid column five,
// and a name too long for its column pushes the rest to the right.
void answerLikeBsdPs(FakeCommandRunner& runner, const std::vector<FakeProcess>& machine) {
  size_t width = 8;
  for (const FakeProcess& p : machine) width = std::max(width, p.user.size());
  std::string listing;
  char pid[32];
  for (const FakeProcess& p : machine) {
    if (!p.alive) continue;
    std::string single =
        p.user + std::string(8 - std::min<size_t>(8, p.user.size()), ' ') + " " + p.command + "\n";
    runner.answer("ps -p" + std::to_string(p.pid) + " -o user=\"\" -o command=\"\"", single);
    std::snprintf(pid, sizeof pid, "%5" PRId64 " ", p.pid);
    listing += pid + p.user + std::string(width - p.user.size(), ' ') + " " + p.command + "\n";
  }
  runner.answer(kListing, listing);
}

std::string collected(FixedTable& table, FakeCommandRunner& runner) {
  TagTree raw(true, "Macintosh");
  collectProcesses(raw, table, runner);
  return treeText(raw.top().findChild("Processes"));
}

TEST(ProcessCollectorTest, OneListingGivesTheRecordsThatAskingEachProcessGave) {
  FixedTable table;
  table.entries = {{0, 0, "kernel_task"},    {1, 0, "launchd"},      {57, 1, "mdworker"},
                   {60, 1, "mDNSResponder"}, {88, 1, "Finder"},      {91, 88, "Script"},
                   {104857, 1, "Résumé"},    {120, 1, "loginwindow"}};
  const std::vector<FakeProcess> machine = {
      {1, "root", "/sbin/launchd"},
      {57, "jane", "/System/Library/Frameworks/CoreServices.framework/mdworker", false},
      {60, "_mdnsresponder", "/usr/sbin/mDNSResponder -launchd"},
      {88, "jane", "/System/Library/CoreServices/Finder.app/Contents/MacOS/Finder -psn 0_1"},
      {91, "jane", "/bin/sh -c echo one\ntwo  "},
      {104857, "josé", "/Applications/Résumé Builder.app/Contents/MacOS/Résumé Builder"},
      {120, "root", "  /System/Library/CoreServices/loginwindow.app/Contents/MacOS/loginwindow"},
      {4000, "jane", "ps -axww -o pid= -o user= -o command="},  // started after the table
  };
  FakeCommandRunner runner;
  answerLikeBsdPs(runner, machine);

  std::string records = collected(table, runner);
  // One ps for the whole table, whatever its size.
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{kListing});
  EXPECT_EQ(records, perProcessReading(table.entries, runner));
  EXPECT_EQ(records, R"(+Processes=
*process:2="launchd"
pid=1
ppid=0
user="root"
cmd-line="/sbin/launchd"
*process:4="mDNSResponder"
pid=60
ppid=1
user="_mdnsresponder"
cmd-line="/usr/sbin/mDNSResponder -launchd"
*process:5="Finder"
pid=88
ppid=1
user="jane"
cmd-line="/System/Library/CoreServices/Finder.app/Contents/MacOS/Finder -psn 0_1"
*process:6="Script"
pid=91
ppid=88
user="jane"
cmd-line="/bin/sh -c echo one
two"
*process:7="Résumé"
pid=104857
ppid=1
user="josé"
cmd-line="/Applications/Résumé Builder.app/Contents/MacOS/Résumé Builder"
*process:8="loginwindow"
pid=120
ppid=1
user="root"
cmd-line="/System/Library/CoreServices/loginwindow.app/Contents/MacOS/loginwindow"
-
)");
}

// Listings as other ps versions, or broken ones, print them.
TEST(ProcessCollectorTest, ListingsOfOddShapeGiveWhatTheyHold) {
  const struct {
    const char* what;
    std::string listing;
    std::string records;
  } cases[] = {
      {"procps: names cut to eight, a header and a blank line",
       "  PID USER     COMMAND\n\n    7 averyve+ [kworker/0:1]\n   12 root     \n",
       "*process:1=\"seven\"\npid=7\nppid=1\nuser=\"averyve+\"\ncmd-line=\"[kworker/0:1]\"\n"
       "*process:2=\"twelve\"\npid=12\nppid=1\nuser=\"root\"\ncmd-line=\"\"\n"},
      {"CR line ends, more blanks than one between the fields, tabs kept inside",
       "   7 root  \tcmd\targ \r\n  12   jane x\r\n",
       "*process:1=\"seven\"\npid=7\nppid=1\nuser=\"root\"\ncmd-line=\"\tcmd\targ\"\n"
       "*process:2=\"twelve\"\npid=12\nppid=1\nuser=\"jane\"\ncmd-line=\"x\"\n"},
      {"a pid with nothing after it is left out; a pid listed twice keeps its first line",
       "7\n12 root first\n12 jane second\n",
       "*process:2=\"twelve\"\npid=12\nppid=1\nuser=\"root\"\ncmd-line=\"first\"\n"},
      {"no line end at the end; a pid too long to be one continues the line before",
       "   7 root a\n1234567890123456789012 b\n  12 jane c",
       "*process:1=\"seven\"\npid=7\nppid=1\nuser=\"root\"\ncmd-line=\"a\n1234567890123456789012 "
       "b\"\n*process:2=\"twelve\"\npid=12\nppid=1\nuser=\"jane\"\ncmd-line=\"c\"\n"},
      {"a user without a command and no blank after it is left out", "   7 root\n12 jane x\n",
       "*process:2=\"twelve\"\npid=12\nppid=1\nuser=\"jane\"\ncmd-line=\"x\"\n"},
      {"ps printed nothing", "", ""},
  };
  for (const auto& c : cases) {
    FixedTable table;
    table.entries = {{7, 1, "seven"}, {12, 1, "twelve"}};
    FakeCommandRunner runner;
    runner.answer(kListing, c.listing);
    EXPECT_EQ(collected(table, runner),
              c.records.empty() ? "*Processes=\n" : "+Processes=\n" + c.records + "-\n")
        << c.what;
  }
}

TEST(ProcessCollectorTest, AnUnreadableTableLeavesNoSectionAndRunsNoPs) {
  FixedTable table;
  table.readable = false;
  FakeCommandRunner runner;
  TagTree raw(true, "Macintosh");
  collectProcesses(raw, table, runner);
  EXPECT_EQ(raw.top().findChild("Processes"), nullptr);
  EXPECT_TRUE(runner.commands_ran_.empty());
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
    return std::find_if(entries.begin(), entries.end(),
                        [pid](const ProcessEntry& e) { return e.pid == pid; });
  };
  auto self = find(getpid());
  ASSERT_NE(self, entries.end());
  EXPECT_EQ(self->ppid, getppid());
  auto forked = find(child);
  ASSERT_NE(forked, entries.end());
  EXPECT_EQ(forked->ppid, getpid());
#if defined(__linux__)
  EXPECT_EQ(forked->short_name, "a) (b c");
#endif
}

}  // namespace
}  // namespace cvn
