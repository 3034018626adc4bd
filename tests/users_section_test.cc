#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <string>

#include "collect/command_runner.h"
#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

const char kAlice[] =
    "dsAttrTypeNative:_writers_passwd: alice\n"
    "AppleMetaNodeLocation: /Local/Default\n"
    "GeneratedUID: 5A1B2C3D-0000-1111-2222-333344445555\n"
    "NFSHomeDirectory: /Users/alice\n"
    "Password: ********\n"
    "PrimaryGroupID: 20\n"
    "RealName:\n"
    " Alice\n"
    " Example \n"
    "RecordName: alice\n"
    "RecordType: dsRecTypeStandard:Users\n"
    "UniqueID: 501\n"
    "UserShell: /bin/bash\n";

// No UserShell: the account is still recorded without "shell".
const char kBob[] =
    "AppleMetaNodeLocation: /Local/Default\n"
    "NFSHomeDirectory: /Users/bob\n"
    "PrimaryGroupID: 20\n"
    "RealName: Bob\n"
    "RecordName: bob\n"
    "RecordType: dsRecTypeStandard:Users\n"
    "UniqueID: 502\n";

class UsersSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildUsersSection(snapshot_, runner_);
    return treeText(snapshot_.top().findChild("User-accounts"));
  }

  TagTree snapshot_{true, "Snapshot"};
  FakeCommandRunner runner_;
};

TEST_F(UsersSectionTest, ReadsEachHomeFolderThatHasAnAccount) {
  // "Guest" has no final newline and is never looked up.
  runner_.answer("ls -1 /Users/", "Alice\nShared\nbob\nGuest");
  runner_.answer("dscl . -read \"/users/Alice\"", kAlice);
  runner_.answer("dscl . -read \"/users/Shared\"",
                 "AppleMetaNodeLocation: /Local/Default\nRecordName: Shared\n");
  runner_.answer("dscl . -read \"/users/bob\"", kBob);

  EXPECT_EQ(build(), R"(+User-accounts=
*usr-acc:alice="alice"
fullname="Alice
 Example"
group="20"
id="501"
shell="/bin/bash"
hdir="/users/Alice"
is-system-user="0"
*usr-acc:bob="bob"
fullname="Bob"
group="20"
id="502"
hdir="/users/bob"
is-system-user="0"
-
)");
  EXPECT_EQ(
      runner_.commands_ran_,
      (std::vector<std::string>{"ls -1 /Users/", "dscl . -read \"/users/Alice\"",
                                "dscl . -read \"/users/Shared\"", "dscl . -read \"/users/bob\""}));
  EXPECT_EQ(runner_.chunk_sizes_, (std::vector<size_t>{100, 100, 100, 100}));
}

TEST_F(UsersSectionTest, FolderWithoutOutputLeavesNoSection) {
  runner_.answer("ls -1 /Users/", "Shared\n");
  EXPECT_EQ(build(), "");
}

TEST_F(UsersSectionTest, FolderWithoutHomeStillOpensTheSection) {
  runner_.answer("ls -1 /Users/", "Shared\n");
  runner_.answer("dscl . -read \"/users/Shared\"", "RecordName: Shared\n");
  EXPECT_EQ(build(), "*User-accounts=\n");
}

TEST_F(UsersSectionTest, NamesReachTheShellInsideTheirQuotes) {
  runner_.answer("ls -1 /Users/", "a \"b\" $c `d` \\e\n");
  build();
  ASSERT_EQ(runner_.commands_ran_.size(), 2u);
  EXPECT_EQ(runner_.commands_ran_[1], "dscl . -read \"/users/a \\\"b\\\" \\$c \\`d\\` \\\\e\"");
}

TEST_F(UsersSectionTest, LabelsCutOffAtTheEndStayInBounds) {
  struct Case {
    const char* output;
    const char* expected;
  };
  const Case cases[] = {
      // No RecordName: nothing to name the record by.
      {"\nNFSHomeDirectory: /Users/x\nRealName: X\n", "*User-accounts=\n"},
      // No RecordType: the name runs to the end of the output.
      {"\nNFSHomeDirectory: /Users/x\nRecordName: x\n",
       "+User-accounts=\n*usr-acc:x=\"x\"\nhdir=\"/users/x\"\nis-system-user=\"0\"\n-\n"},
      // Labels that end the output, with and without their values.
      {"\nNFSHomeDirectory:\nRecordName:x RecordType:\nUniqueID:\nUserShell:",
       "+User-accounts=\n*usr-acc:x=\"x\"\nid=\"\"\nshell=\"\"\nhdir=\"/users/x\"\n"
       "is-system-user=\"0\"\n-\n"},
      // Labels before the home directory are not the account's.
      {"UniqueID: 7\nRealName: Early\n\nNFSHomeDirectory:/\nRecordName:y\nRecordType:",
       "+User-accounts=\n*usr-acc:y=\"y\"\nhdir=\"/users/x\"\nis-system-user=\"0\"\n-\n"},
      {"\nNFSHomeDirectory:", "*User-accounts=\n"},
  };
  for (const Case& c : cases) {
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    runner.answer("ls -1 /Users/", "x\n");
    runner.answer("dscl . -read \"/users/x\"", c.output);
    buildUsersSection(snapshot, runner);
    EXPECT_EQ(treeText(snapshot.top().findChild("User-accounts")), c.expected) << c.output;
  }
}

// Hands out a canned listing, then lets the real shell run everything else.
class ListingThenShellRunner : public CommandRunner {
 public:
  explicit ListingThenShellRunner(std::string listing) : listing_(std::move(listing)) {}
  std::string run(const std::string& command, size_t chunk_size) override {
    if (command == "ls -1 /Users/") return listing_;
    return shell_.run(command, chunk_size);
  }

 private:
  std::string listing_;
  PipeCommandRunner shell_;
};

class HostileFolderTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char pattern[] = "/tmp/cvn_users_XXXXXX";
    ASSERT_NE(mkdtemp(pattern), nullptr);
    dir_ = pattern;
    marker_ = dir_ + "/MARKER";
    // A stand-in for dscl that echoes the record path it was given, so the
    // test also sees that the name arrived as one intact argument.
    std::string script = dir_ + "/dscl";
    std::ofstream(script) << "#!/bin/sh\n"
                             "printf 'x\\nNFSHomeDirectory: /h\\nRecordName: %s\\n"
                             "RecordType: t\\n' \"$3\"\n";
    ASSERT_EQ(chmod(script.c_str(), 0755), 0);
    const char* path = std::getenv("PATH");
    old_path_ = path ? path : "";
    setenv("PATH", (dir_ + ":" + old_path_).c_str(), 1);
  }
  void TearDown() override {
    setenv("PATH", old_path_.c_str(), 1);
    unlink(marker_.c_str());
    unlink((dir_ + "/dscl").c_str());
    rmdir(dir_.c_str());
  }
  bool markerExists() const { return access(marker_.c_str(), F_OK) == 0; }

  std::string dir_;
  std::string marker_;
  std::string old_path_;
};

TEST_F(HostileFolderTest, UnquotedCommandWouldRunTheInjection) {
  // Guards the test itself: the same text without escaping does run.
  PipeCommandRunner shell;
  shell.run("dscl . -read \"/users/x\"; touch " + marker_ + "; : \"\"", 100);
  EXPECT_TRUE(markerExists());
}

TEST_F(HostileFolderTest, NamesReadTheirAccountAndRunNothingElse) {
  const std::string names[] = {
      "x\"; touch " + marker_ + "; : \"", "$(touch " + marker_ + ")",
      "`touch " + marker_ + "`",          "\\\"; touch " + marker_ + " #",
      "a b ${IFS}touch${IFS}" + marker_,
  };
  for (const std::string& name : names) {
    TagTree snapshot(true, "Snapshot");
    ListingThenShellRunner runner(name + "\n");
    buildUsersSection(snapshot, runner);
    EXPECT_FALSE(markerExists()) << name;
    const Tag* accounts = snapshot.top().findChild("User-accounts");
    ASSERT_NE(accounts, nullptr) << name;
    ASSERT_EQ(accounts->children().size(), 1u) << name;
    EXPECT_EQ(accounts->children()[0]->name(), "usr-acc:/users/" + name);
  }
}

}  // namespace
}  // namespace cvn
