#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

#include "collect/process_group_runner.h"
#include "collect/shell_quote.h"
#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

// Hands out a canned listing and runs dscl commands through the real shell,
// with a stand-in dscl from `dir`.
class ListingThenShellRunner : public ProcessGroupRunner {
 public:
  void start(int id, const std::string& command, size_t chunk_size, ToolDuration limit) override {
    if (command == "ls -1 /Users/") {
      ProcessGroupRunner::start(id, "printf '%s' " + shellQuote(listing), chunk_size, limit);
    } else {
      ProcessGroupRunner::start(id, dir + "/" + command, chunk_size, limit);
    }
  }
  std::string listing;
  std::string dir;
};

TEST(UsersSectionTest, HostileNamesReadTheirAccountAndRunNothingElse) {
  char pattern[] = "/tmp/cvn_users_XXXXXX";
  ASSERT_NE(mkdtemp(pattern), nullptr);
  ListingThenShellRunner runner;
  runner.dir = pattern;
  const std::string marker = runner.dir + "/MARKER", script = runner.dir + "/dscl";
  // Names the record after the path it was given, so an argument split or
  // altered by the shell shows in the account name.
  std::ofstream(script) << "#!/bin/sh\nprintf 'x\\nNFSHomeDirectory: /h\\nRecordName: "
                           "%s\\nRecordType: t\\n' \"$3\"\n";
  ASSERT_EQ(chmod(script.c_str(), 0755), 0);
  // Guards the test itself: the same text without escaping does run.
  runner.run("dscl . -read \"/users/x\"; touch " + marker + "; : \"\"", 100);
  EXPECT_EQ(unlink(marker.c_str()), 0);

  for (const std::string& name :
       {"x\"; touch " + marker + "; : \"", "$(touch " + marker + ")", "`touch " + marker + "`",
        "\\\"; touch " + marker + " #", "a b ${IFS}touch${IFS}" + marker}) {
    runner.listing = name + "\n";
    TagTree snapshot(true, "Snapshot");
    buildUsersSection(snapshot, runner);
    EXPECT_NE(access(marker.c_str(), F_OK), 0) << name;
    const Tag* accounts = snapshot.top().findChild("User-accounts");
    EXPECT_TRUE(accounts && accounts->findChild("usr-acc:/users/" + name)) << name;
  }
  unlink(marker.c_str());
  unlink(script.c_str());
  rmdir(pattern);
}

}  // namespace
}  // namespace cvn
