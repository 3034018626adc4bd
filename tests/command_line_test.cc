#include "main/command_line.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

struct ParseCase {
  std::vector<std::string> args;
  CommandLineAction action;
  bool silent, debug, log;
  std::string ip, login;
  int silenced;  // how often the redirection ran
};

TEST(CommandLineTest, OptionsAreMatchedExactlyInOrder) {
  const ParseCase cases[] = {
      {{}, CommandLineAction::kScan, false, false, false, "", "", 0},
      {{"-silent", "-log", "-debug"}, CommandLineAction::kScan, true, true, true, "", "", 1},
      {{"/silent", "/log", "/debug"}, CommandLineAction::kScan, true, true, true, "", "", 1},
      // Case matters and unknown options are ignored without a word.
      {{"-LOG", "-Silent", "--debug", "x"},
       CommandLineAction::kScan,
       false,
       false,
       false,
       "",
       "",
       0},
      {{"-ip:10.0.0.1", "/ip:10.0.0.2"},
       CommandLineAction::kScan,
       false,
       false,
       false,
       "10.0.0.2",
       "",
       0},
      {{"-ip:"}, CommandLineAction::kScan, false, false, false, "", "", 0},
      // Only the first colon separates; "-log" never swallows "-login:".
      {{"-login:a:b", "-log"}, CommandLineAction::kScan, false, false, true, "", "a:b", 0},
      {{"/login:"}, CommandLineAction::kScan, false, false, false, "", "", 0},
      // Help stops parsing; what came before has taken effect.
      {{"-silent", "-?", "-log"}, CommandLineAction::kHelp, true, false, false, "", "", 1},
      {{"--help", "-silent"}, CommandLineAction::kHelp, false, false, false, "", "", 0},
  };
  for (const ParseCase& c : cases) {
    ScanSettings s;
    int silenced = 0;
    CommandLineAction action = parseCommandLine(c.args, &s, [&] { ++silenced; });
    std::string where = c.args.empty() ? "(none)" : c.args.front();
    EXPECT_EQ(action, c.action) << where;
    EXPECT_EQ(s.silent, c.silent) << where;
    EXPECT_EQ(s.debug, c.debug) << where;
    EXPECT_EQ(s.log, c.log) << where;
    EXPECT_EQ(s.ip, c.ip) << where;
    EXPECT_EQ(s.login, c.login) << where;
    EXPECT_EQ(silenced, c.silenced) << where;
  }
}

TEST(CommandLineTest, TimeoutTakesWholeSecondsOfAtLeastOne) {
  const struct {
    std::vector<std::string> args;
    int64_t seconds;
  } cases[] = {
      {{}, 300},
      {{"-timeout:45"}, 45},
      {{"/timeout:1"}, 1},
      {{"-timeout:2147483647"}, 2147483647},
      {{"-timeout:20", "-timeout:0"}, 20},
      {{"-timeout:2147483648"}, 300},
      {{"-timeout:-5"}, 300},
      {{"-timeout:5s"}, 300},
      {{"-timeout:"}, 300},
      {{"-Timeout:9"}, 300},
  };
  for (const auto& c : cases) {
    ScanSettings s;
    parseCommandLine(c.args, &s, nullptr);
    EXPECT_EQ(s.profiler_timeout_seconds, c.seconds) << (c.args.empty() ? "" : c.args.back());
  }
}

}  // namespace
}  // namespace cvn
