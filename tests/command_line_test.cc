#include "main/command_line.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

// What a command line sets, as "action [silent] [debug] [log] [ip=] [login=]
// [timeout=] silenced:N" (N: how often the redirection ran); a timeout of
// 300 seconds, the default, is not shown.
TEST(CommandLineTest, OptionsAreMatchedExactlyInOrder) {
  const struct {
    std::vector<std::string> args;
    const char* expected;
  } cases[] = {
      {{}, "scan silenced:0"},
      {{"-silent", "-log", "-debug"}, "scan silent debug log silenced:1"},
      {{"/silent", "/log", "/debug"}, "scan silent debug log silenced:1"},
      // Case matters and unknown options are ignored without a word.
      {{"-LOG", "-Silent", "--debug", "x", "-Timeout:9"}, "scan silenced:0"},
      {{"-ip:10.0.0.1", "/ip:10.0.0.2"}, "scan ip=10.0.0.2 silenced:0"},
      {{"-ip:"}, "scan silenced:0"},
      // Only the first colon separates; "-log" never swallows "-login:".
      {{"-login:a:b", "-log"}, "scan log login=a:b silenced:0"},
      {{"/login:"}, "scan silenced:0"},
      // Help stops parsing; what came before has taken effect.
      {{"-silent", "-?", "-log"}, "help silent silenced:1"},
      {{"--help", "-silent"}, "help silenced:0"},
      // Whole seconds of at least one; a bad value keeps the one before.
      {{"-timeout:45"}, "scan timeout=45 silenced:0"},
      {{"/timeout:1"}, "scan timeout=1 silenced:0"},
      {{"-timeout:2147483647"}, "scan timeout=2147483647 silenced:0"},
      {{"-timeout:20", "-timeout:0"}, "scan timeout=20 silenced:0"},
      {{"-timeout:2147483648", "-timeout:-5", "-timeout:5s", "-timeout:"}, "scan silenced:0"},
  };
  for (const auto& c : cases) {
    ScanSettings s;
    int silenced = 0;
    CommandLineAction action = parseCommandLine(c.args, &s, [&] { ++silenced; });
    std::string got = action == CommandLineAction::kHelp ? "help" : "scan";
    got +=
        std::string(s.silent ? " silent" : "") + (s.debug ? " debug" : "") + (s.log ? " log" : "");
    if (!s.ip.empty()) got += " ip=" + s.ip;
    if (!s.login.empty()) got += " login=" + s.login;
    if (s.profiler_timeout_seconds != 300)
      got += " timeout=" + std::to_string(s.profiler_timeout_seconds);
    EXPECT_EQ(got + " silenced:" + std::to_string(silenced), c.expected)
        << (c.args.empty() ? "(none)" : c.args.front());
  }
}

}  // namespace
}  // namespace cvn
