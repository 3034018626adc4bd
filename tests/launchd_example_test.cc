// The launchd job administrators copy from examples/: launchd refuses a job
// it cannot read, and a daemon that starts the agent without "-silent" waits
// for a consent answer that never comes.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "collect/plist.h"
#include "main/command_line.h"

namespace cvn {
namespace {

std::string readExample() {
  std::ifstream in(CVN_SOURCE_DIR "/examples/example.corvane.cvnmacagent.plist", std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

std::string stringAt(const PlistValue& dict, const char* key) {
  const PlistValue* value = dict.find(key);
  return value && value->isString() ? std::string(value->text()) : "(missing)";
}

TEST(LaunchdExampleTest, StartsASilentScanInItsFolderOnASchedule) {
  Plist job;
  std::string warning;
  ASSERT_TRUE(parsePlist(readExample(), &job, &warning));
  EXPECT_EQ(warning, "");
  ASSERT_TRUE(job.isDictionary());

  EXPECT_EQ(stringAt(job, "Label"), "example.corvane.cvnmacagent");
  // Where "cmake --install build --prefix /usr/local" puts the agent.
  const PlistValue* arguments = job.find("ProgramArguments");
  ASSERT_TRUE(arguments && arguments->isArray());
  std::vector<std::string> words;
  for (const PlistValue& word : arguments->items()) words.emplace_back(word.text());
  ASSERT_FALSE(words.empty());
  EXPECT_EQ(words[0], "/usr/local/sbin/cvnmacagent");

  ScanSettings settings;
  bool went_silent = false;
  EXPECT_EQ(parseCommandLine(std::vector<std::string>(words.begin() + 1, words.end()), &settings,
                             [&] { went_silent = true; }),
            CommandLineAction::kScan);
  EXPECT_TRUE(settings.silent && went_silent);

  // The result files land in the working directory; the ">>>" lines beside
  // them tell a collecting tool their names.
  const std::string folder = stringAt(job, "WorkingDirectory");
  EXPECT_EQ(folder.substr(0, 1), "/");
  EXPECT_EQ(stringAt(job, "StandardOutPath"), folder + "/results.log");

  // system_profiler, diskutil and ioreg live in /usr/sbin, dscl and env in
  // /usr/bin, ls and ps in /bin.
  const PlistValue* environment = job.find("EnvironmentVariables");
  ASSERT_TRUE(environment && environment->isDictionary());
  const std::string path = ":" + stringAt(*environment, "PATH") + ":";
  for (const char* folder : {":/usr/sbin:", ":/usr/bin:", ":/bin:"})
    EXPECT_NE(path.find(folder), std::string::npos) << folder;

  // launchd ignores a calendar field that is not an integer in its range.
  const PlistValue* when = job.find("StartCalendarInterval");
  ASSERT_TRUE(when && when->isDictionary() && !when->entries().empty());
  const std::vector<std::pair<std::string, std::pair<int, int>>> ranges = {{"Minute", {0, 59}},
                                                                           {"Hour", {0, 23}},
                                                                           {"Day", {1, 31}},
                                                                           {"Weekday", {0, 7}},
                                                                           {"Month", {1, 12}}};
  for (const PlistEntry& field : when->entries()) {
    SCOPED_TRACE(field.key);
    ASSERT_EQ(field.value.kind(), PlistValue::Kind::kInteger);
    bool known = false;
    for (const auto& range : ranges) {
      if (range.first != field.key) continue;
      known = true;
      EXPECT_GE(field.value.integer(), range.second.first);
      EXPECT_LE(field.value.integer(), range.second.second);
    }
    EXPECT_TRUE(known);
  }
}

}  // namespace
}  // namespace cvn
