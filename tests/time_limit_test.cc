// Tools that never answer, run for real: through the runner with short
// limits, and through the whole agent with a profiler type that hangs.
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

#include "collect/interrupt_watch.h"
#include "collect/process_group_runner.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "qax_reader.h"
#include "sections/sections.h"

extern char** environ;

namespace cvn {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

// Processes of the group that are still alive (zombies waiting for their
// parent are dead); given a moment, since SIGKILL lands asynchronously.
int liveMembersOf(pid_t group) {
  int live = 0;
  for (int attempt = 0; attempt < 100; ++attempt) {
    live = 0;
    for (const auto& entry : std::filesystem::directory_iterator("/proc")) {
      const std::string stat = readWholeFile(entry.path() / "stat");
      size_t close = stat.rfind(')');
      char state = 0;
      long parent = 0, process_group = 0;
      if (close != std::string::npos &&
          std::sscanf(stat.c_str() + close + 1, " %c %ld %ld", &state, &parent, &process_group) ==
              3 &&
          process_group == group && state != 'Z')
        ++live;
    }
    if (live == 0) break;
    std::this_thread::sleep_for(milliseconds(20));
  }
  return live;
}

// All side by side in one runner: each ends by its own limit, keeps its own
// output and leaves nothing of its group.
TEST(ProcessGroupRunnerTest, EveryCallEndsByItsLimitAndLeavesNothingOfItsGroup) {
  const milliseconds limit(300), grace(300);
  const std::string interleaved = "for i in 1 2 3; do echo $0$i; sleep 0.05; done";
  const struct {
    const char* what;
    std::string command;
    size_t chunk;
    std::string output;
    bool timed_out;
    bool waits_for_grace;
  } cases[] = {
      {"never answers", "sleep 30", 4, "", true, false},
      {"ignores SIGTERM", "trap '' TERM; sleep 30; sleep 30", 4, "", true, true},
      {"prints a part, then hangs", "printf 'part\\n'; sleep 30", 4, "part\n", true, false},
      {"prints after its limit", "sleep 1; echo late", 4, "", true, false},
      {"ends, leaving a helper behind", "sleep 30 >/dev/null & echo done", 4, "done\n", false,
       false},
      {"ends at once", "echo fine; exit 3", 4, "fine\n", false, false},
      {"prints in turns", "sh -c '" + interleaved + "' a", 2, "a1\na2\na3\n", false, false},
      {"prints in turns too", "sh -c '" + interleaved + "' b", 1, "b1\nb2\nb3\n", false, false},
      {"cannot start", "exec /nonexistent/tool 2>/dev/null", 64, "", false, false},
  };
  const size_t count = sizeof cases / sizeof cases[0];
  auto open_files = [] {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
  };
  const auto open_before = open_files();
  ProcessGroupRunner runner(grace);
  Clock::time_point started = Clock::now();
  std::vector<pid_t> groups;
  for (size_t i = 0; i < count; ++i) {
    runner.start(static_cast<int>(i), cases[i].command, cases[i].chunk,
                 i < 6 ? limit : std::chrono::seconds(20));
    groups.push_back(runner.groupOf(static_cast<int>(i)));
    ASSERT_GT(groups.back(), 0) << cases[i].what;
  }
  std::vector<bool> ended(count);
  int id = 0;
  ToolOutput output;
  while (runner.waitForOne(&id, &output)) {
    auto took = std::chrono::duration_cast<milliseconds>(Clock::now() - started);
    const auto& c = cases[id];
    ended[id] = true;
    EXPECT_EQ(output.text, c.output) << c.what;
    EXPECT_EQ(output.timed_out, c.timed_out) << c.what;
    EXPECT_LT(took, limit + grace + milliseconds(1500)) << c.what;
    EXPECT_EQ(took >= limit + grace, c.waits_for_grace) << c.what;
    EXPECT_EQ(liveMembersOf(groups[id]), 0) << c.what;
    EXPECT_EQ(runner.groupOf(id), -1) << c.what;
  }
  EXPECT_EQ(ended, std::vector<bool>(count, true));
  EXPECT_EQ(open_files(), open_before) << "a pipe was left open";
  pid_t abandoned_group = 0;
  {
    ProcessGroupRunner abandoned(grace);
    abandoned.start(0, "sleep 30", 4, std::chrono::seconds(20));
    abandoned_group = abandoned.groupOf(0);
  }
  EXPECT_EQ(liveMembersOf(abandoned_group), 0) << "a runner ends what it still runs";
  EXPECT_EQ(open_files(), open_before) << "a runner closes what it still reads";
  EXPECT_EQ(runner.run("printf x", 1), "x") << "the runner serves again once all have ended";
}

// A launcher may leave SIGCHLD ignored, so that the kernel reaps the tools
// itself; and with no file descriptor left, a tool cannot start but still
// ends its call.
TEST(ProcessGroupRunnerTest, ToolsEndWhereTheKernelReapsThemOrNoPipeIsLeft) {
  auto reaped_by_the_kernel = [] {
    alarm(5);
    std::signal(SIGCHLD, SIG_IGN);
    ProcessGroupRunner runner;
    std::_Exit(runner.run("printf x", 1) == "x" ? 0 : 1);
  };
  auto without_a_pipe = [] {
    const rlimit only_the_standard_streams = {3, 3};
    setrlimit(RLIMIT_NOFILE, &only_the_standard_streams);
    ProcessGroupRunner runner;
    runner.start(7, "printf x", 1, std::chrono::seconds(5));
    int id = 0;
    ToolOutput output{"unset", true};
    std::_Exit(runner.waitForOne(&id, &output) && id == 7 && output.text.empty() ? 0 : 1);
  };
  EXPECT_EXIT(reaped_by_the_kernel(), ::testing::ExitedWithCode(0), "");
#ifndef __SANITIZE_ADDRESS__  // the sanitizers' runtime needs descriptors of its own
  EXPECT_EXIT(without_a_pipe(), ::testing::ExitedWithCode(0), "");
#else
  (void)without_a_pipe;
#endif
}

// A signal that arrives while tools run is held back; once the watch ends
// it takes its usual course, as if no watch had been there.
TEST(InterruptWatchTest, ASignalHeldBackEndsTheAgentOnceTheWatchEnds) {
  for (int signal_number : {SIGINT, SIGTERM, SIGHUP}) {
    EXPECT_EXIT(
        {
          InterruptWatch watch;
          raise(signal_number);
        },
        ::testing::KilledBySignal(signal_number), "");
  }
}

TEST(CommandRunnerTest, AToolThatHitItsLimitIsNamedOnceAndGivesWhatItPrinted) {
  FakeCommandRunner runner;
  runner.setLimits(ToolLimits::forProfilerSeconds(20));
  EXPECT_EQ(runner.limits().profiler, std::chrono::seconds(20));
  EXPECT_EQ(runner.limits().other, std::chrono::seconds(20));
  EXPECT_EQ(ToolLimits::forProfilerSeconds(900).other, std::chrono::seconds(60));
  char* text = nullptr;
  size_t size = 0;
  std::FILE* log = open_memstream(&text, &size);
  runner.setTimeoutLog(log);
  // An empty listing is asked again, but not one that hung.
  runner.hang("ls -1 /Users/", "");
  runner.hang("dscl . -read \"/users/\x1b[2J\"", "RecordName: x\n");
  TagTree snapshot(true, "Snapshot");
  buildUsersSection(snapshot, runner);
  runner.hang("ls -1 /Users/", "\x1b[2J\n");
  buildUsersSection(snapshot, runner);
  std::fclose(log);
  EXPECT_EQ(std::string(text, size),
            "ls -1 /Users/: no answer in 20 s, kept what it printed\n"
            "ls -1 /Users/: no answer in 20 s, kept what it printed\n"
            "dscl . -read \"/users/?[2J\": no answer in 20 s, kept what it printed\n");
  std::free(text);
  EXPECT_EQ(runner.commands_ran_.size(), 3u);
  EXPECT_EQ(runner.limits_given_.back(), std::chrono::seconds(20));
}

// The whole agent against the sample Mac, with one profiler type that
// never answers.
class HungProfilerTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char pattern[] = "/tmp/cvn-hang-XXXXXX";
    ASSERT_NE(mkdtemp(pattern), nullptr);
    root_ = pattern;
    std::filesystem::create_directories(root_ + "/work");
  }
  void TearDown() override { std::filesystem::remove_all(root_); }

  /// Starts the agent with `args` in the work folder, `answer` on its
  /// stdin; its stdout goes to root_/out.
  pid_t startAgent(const std::string& args, const std::string& answer) {
    std::ofstream(root_ + "/stdin") << answer;
    std::string command =
        "cd '" + root_ +
        "/work' && PATH='" CVN_SOURCE_DIR "/tests/fake_bin':\"$PATH\" FAKE_STATE_DIR='" + root_ +
        "' FAKE_PROFILER_HANG=SPBluetoothDataType"
        " exec '" CVN_BINARY_DIR "/cvnmacagent' " +
        args + " >'" + root_ + "/out' 2>/dev/null <'" + root_ + "/stdin'";
    const char* argv[] = {"sh", "-c", command.c_str(), nullptr};
    pid_t pid = -1;
    EXPECT_EQ(
        posix_spawn(&pid, "/bin/sh", nullptr, nullptr, const_cast<char* const*>(argv), environ), 0);
    return pid;
  }
  /// The hung tool's process group, once it has started.
  pid_t hungGroup() {
    for (int i = 0; i < 1000; ++i) {
      std::ifstream in(root_ + "/hung.pgid");
      pid_t group = 0;
      if (in >> group && group > 0) return group;
      std::this_thread::sleep_for(milliseconds(10));
    }
    return -1;
  }
  std::string out() { return readWholeFile(root_ + "/out"); }

  std::string root_;
};

TEST_F(HungProfilerTest, TheScanEndsAfterTheLimitWithAFileThatChecksOut) {
  Clock::time_point started = Clock::now();
  pid_t agent = startAgent("-log -timeout:2", "y\n");
  int status = 0;
  ASSERT_EQ(waitpid(agent, &status, 0), agent);
  EXPECT_LT(Clock::now() - started, std::chrono::seconds(10));
  EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
  std::string said = out();
  EXPECT_NE(said.find("20%\nSPBluetoothDataType: no answer in 2 s, left out\n30%\n"),
            std::string::npos)
      << said;
  EXPECT_EQ(liveMembersOf(hungGroup()), 0);

  QaxFile file;
  std::string error;
  ASSERT_TRUE(readQaxFile(root_ + "/work/JANE-MBP_0026BB5C3A91.qax", &file, &error)) << error;
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(root_ + "/work"),
                          std::filesystem::directory_iterator()),
            1);
  std::string check = "'" CVN_BINARY_DIR "/qaxdump' --check '" + root_ +
                      "/work/JANE-MBP_0026BB5C3A91.qax' >/dev/null 2>&1";
  EXPECT_EQ(std::system(check.c_str()), 0);
}

TEST_F(HungProfilerTest, ASignalToTheAgentEndsTheToolsGroupFirst) {
  for (int signal_number : {SIGTERM, SIGINT, SIGHUP}) {
    pid_t agent = startAgent("-silent", "");
    pid_t group = hungGroup();
    ASSERT_GT(group, 0);
    ASSERT_EQ(kill(agent, signal_number), 0);
    int status = 0;
    ASSERT_EQ(waitpid(agent, &status, 0), agent);
    EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == signal_number) << signal_number;
    EXPECT_EQ(liveMembersOf(group), 0) << signal_number;
    EXPECT_EQ(out(), "") << signal_number;
    EXPECT_TRUE(std::filesystem::is_empty(root_ + "/work")) << signal_number;
    std::filesystem::remove(root_ + "/hung.pgid");
  }
}

}  // namespace
}  // namespace cvn
