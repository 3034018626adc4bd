// The launchd job administrators copy from examples/: launchd refuses a job
// it cannot read, and a daemon that starts the agent without "-silent" waits
// for a consent answer that never comes.
#include <gtest/gtest.h>

#include <fstream>
#include <functional>
#include <map>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "collect/plist.h"
#include "main/command_line.h"

namespace cvn {
namespace {

std::string stringAt(const PlistValue* dict, const char* key) {
  const PlistValue* value = dict ? dict->find(key) : nullptr;
  return value && value->isString() ? std::string(value->text()) : "(missing)";
}

TEST(LaunchdExampleTest, StartsASilentScanInItsFolderOnASchedule) {
  std::ifstream in(CVN_SOURCE_DIR "/examples/example.corvane.cvnmacagent.plist", std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  Plist job;
  std::string warning;
  ASSERT_TRUE(parsePlist(text.str(), &job, &warning) && job.isDictionary());
  EXPECT_EQ(warning, "");
  EXPECT_EQ(stringAt(&job, "Label"), "example.corvane.cvnmacagent");

  // Where "cmake --install build --prefix /usr/local" puts the agent.
  const PlistValue* arguments = job.find("ProgramArguments");
  ASSERT_TRUE(arguments && arguments->isArray() && !arguments->items().empty());
  std::vector<std::string> words;
  for (const PlistValue& word : arguments->items()) words.emplace_back(word.text());
  EXPECT_EQ(words[0], "/usr/local/sbin/cvnmacagent");
  ScanSettings settings;
  words.erase(words.begin());
  EXPECT_EQ(parseCommandLine(words, &settings, [] {}), CommandLineAction::kScan);
  EXPECT_TRUE(settings.silent);

  // The result files land in the working directory; the ">>>" lines beside
  // them tell a collecting tool their names.
  const std::string folder = stringAt(&job, "WorkingDirectory");
  EXPECT_EQ(folder.substr(0, 1), "/");
  EXPECT_EQ(stringAt(&job, "StandardOutPath"), folder + "/results.log");

  // system_profiler, diskutil and ioreg live in /usr/sbin, dscl and env in
  // /usr/bin, ls and ps in /bin.
  const std::string path = ":" + stringAt(job.find("EnvironmentVariables"), "PATH") + ":";
  for (const char* folder : {":/usr/sbin:", ":/usr/bin:", ":/bin:"})
    EXPECT_NE(path.find(folder), std::string::npos) << folder;

  // launchd ignores a calendar field that is not an integer in its range.
  const std::map<std::string, std::pair<int, int>, std::less<>> ranges = {{"Minute", {0, 59}},
                                                                          {"Hour", {0, 23}},
                                                                          {"Day", {1, 31}},
                                                                          {"Weekday", {0, 7}},
                                                                          {"Month", {1, 12}}};
  const PlistValue* when = job.find("StartCalendarInterval");
  ASSERT_TRUE(when && when->isDictionary() && !when->entries().empty());
  for (const PlistEntry& field : when->entries()) {
    auto range = ranges.find(field.key);
    ASSERT_TRUE(range != ranges.end() && field.value.kind() == PlistValue::Kind::kInteger)
        << field.key;
    EXPECT_GE(field.value.integer(), range->second.first) << field.key;
    EXPECT_LE(field.value.integer(), range->second.second) << field.key;
  }
}

}  // namespace
}  // namespace cvn
