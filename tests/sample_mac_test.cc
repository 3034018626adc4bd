// Invariants of the bundled sample Mac: the collector splices the profiler
// outputs by byte count, so a fixture whose header or footer drifts by one
// byte would break every end-to-end test in a way that is hard to trace.

#include <expat.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

const std::string kSampleDir = std::string(CVN_SOURCE_DIR) + "/tests/sample_mac";
const std::string kFakeBin = std::string(CVN_SOURCE_DIR) + "/tests/fake_bin";

const char kHeader[] =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
    "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
    "<plist version=\"1.0\">\n"
    "<array>\n";
const char kFooter[] = "</array>\n</plist>\n";

const std::vector<std::string> kCollectedTypes = {
    "SPHardwareDataType",      "SPNetworkDataType",
    "SPSoftwareDataType",      "SPParallelATADataType",
    "SPAudioDataType",         "SPBluetoothDataType",
    "SPFireWireDataType",      "SPDisplaysDataType",
    "SPMemoryDataType",        "SPPrintersDataType",
    "SPSerialATADataType",     "SPParallelSCSIDataType",
    "SPUSBDataType",           "SPAirPortDataType",
    "SPFirewallDataType",      "SPNetworkLocationDataType",
    "SPNetworkVolumeDataType", "SPApplicationsDataType",
    "SPStartupItemDataType",   "SPDiscBurningDataType",
    "SPPowerDataType"};

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream out;
  out << in.rdbuf();
  return out.str();
}

// Runs a shell command with the fakes first on PATH and returns its stdout.
std::string runWithFakes(const std::string& command, const std::string& env = "") {
  std::string line = "PATH='" + kFakeBin + "':\"$PATH\" " + env + " " + command;
  FILE* pipe = popen(line.c_str(), "r");
  if (pipe == nullptr) return "";
  std::string out;
  char buffer[4096];
  size_t n;
  while ((n = fread(buffer, 1, sizeof buffer, pipe)) > 0) out.append(buffer, n);
  pclose(pipe);
  return out;
}

bool isWellFormedXml(const std::string& text) {
  XML_Parser parser = XML_ParserCreate(nullptr);
  bool ok = XML_Parse(parser, text.data(), static_cast<int>(text.size()), 1) == XML_STATUS_OK;
  XML_ParserFree(parser);
  return ok;
}

std::string dataTypeEntry(const std::string& type) {
  return "\t<dict>\n\t\t<key>_dataType</key>\n\t\t<string>" + type + "</string>\n";
}

size_t countOf(const std::string& text, const std::string& needle) {
  size_t count = 0;
  for (size_t at = text.find(needle); at != std::string::npos; at = text.find(needle, at + 1)) {
    ++count;
  }
  return count;
}

// Text of the first <string> after the given key.
std::string stringAfterKey(const std::string& xml, const std::string& key) {
  size_t at = xml.find("<key>" + key + "</key>");
  if (at == std::string::npos) return "";
  size_t begin = xml.find("<string>", at);
  size_t end = xml.find("</string>", begin);
  if (begin == std::string::npos || end == std::string::npos) return "";
  begin += 8;
  return xml.substr(begin, end - begin);
}

TEST(SampleMacTest, EveryCollectedTypeHasExactHeaderFooterAndOneDict) {
  ASSERT_EQ(sizeof kHeader - 1, 172u);
  ASSERT_EQ(sizeof kFooter - 1, 18u);
  for (const std::string& type : kCollectedTypes) {
    SCOPED_TRACE(type);
    std::string xml = readFile(kSampleDir + "/profiler/" + type + ".xml");
    ASSERT_GT(xml.size(), 190u);
    EXPECT_EQ(xml.substr(0, 172), kHeader);
    EXPECT_EQ(xml.substr(xml.size() - 18), kFooter);
    EXPECT_EQ(xml.find(dataTypeEntry(type)), 172u);
    EXPECT_EQ(countOf(xml, "\n\t<dict>\n"), 1u);
    EXPECT_TRUE(isWellFormedXml(xml));
  }
}

TEST(SampleMacTest, FullDumpHoldsEveryTypeAndTheSkippedOnes) {
  std::string xml = readFile(kSampleDir + "/profiler/full.xml");
  EXPECT_EQ(xml.substr(0, 172), kHeader);
  EXPECT_EQ(xml.substr(xml.size() - 18), kFooter);
  EXPECT_TRUE(isWellFormedXml(xml));
  std::vector<std::string> expected = kCollectedTypes;
  expected.push_back("SPLogsDataType");
  expected.push_back("SPFontsDataType");
  for (const std::string& type : expected) {
    EXPECT_EQ(countOf(xml, dataTypeEntry(type)), 1u) << type;
  }
  EXPECT_EQ(countOf(xml, "\n\t<dict>\n"), expected.size());
}

TEST(SampleMacTest, FactsAgreeAcrossTools) {
  std::string hardware = readFile(kSampleDir + "/profiler/SPHardwareDataType.xml");
  std::string ioreg = readFile(kSampleDir + "/ioreg/IOPlatformExpertDevice.txt");
  std::string uuid = stringAfterKey(hardware, "platform_UUID");
  ASSERT_EQ(uuid.size(), 36u);
  EXPECT_NE(ioreg.find("\"IOPlatformUUID\" = \"" + uuid + "\"\n"), std::string::npos);

  std::string network = readFile(kSampleDir + "/profiler/SPNetworkDataType.xml");
  std::string locations = readFile(kSampleDir + "/profiler/SPNetworkLocationDataType.xml");
  std::string mac = stringAfterKey(network, "MAC Address");
  ASSERT_EQ(mac.size(), 17u);
  EXPECT_NE(locations.find("<string>" + mac + "</string>"), std::string::npos);

  std::string usb = readFile(kSampleDir + "/profiler/SPUSBDataType.xml");
  EXPECT_NE(usb.find("<string>disk2</string>"), std::string::npos);
  EXPECT_NE(readFile(kSampleDir + "/diskutil/disk2.txt")
                .find("Device / Media Name:      Flash Disk Media\n"),
            std::string::npos);
}

TEST(SampleMacTest, DisplayEdidsAreValidBaseBlocks) {
  std::string displays = readFile(kSampleDir + "/profiler/SPDisplaysDataType.xml");
  size_t found = 0;
  for (size_t at = displays.find("<string>0x00ffffffffffff00"); at != std::string::npos;
       at = displays.find("<string>0x00ffffffffffff00", at + 1)) {
    std::string hex = displays.substr(at + 10, 256);
    ASSERT_EQ(displays.compare(at + 10 + 256, 9, "</string>"), 0);
    unsigned sum = 0;
    for (size_t i = 0; i < hex.size(); i += 2) {
      sum += static_cast<unsigned>(std::stoul(hex.substr(i, 2), nullptr, 16));
    }
    EXPECT_EQ(sum % 256, 0u);
    ++found;
  }
  EXPECT_EQ(found, 2u);
}

TEST(SampleMacTest, FakesAreExecutable) {
  for (const char* tool : {"system_profiler", "dscl", "ls", "diskutil", "ioreg"}) {
    EXPECT_EQ(access((kFakeBin + "/" + tool).c_str(), X_OK), 0) << tool;
  }
}

TEST(SampleMacTest, FakesPrintTheRecordings) {
  struct Case {
    std::string command;
    std::string file;
  };
  const std::vector<Case> cases = {
      {"system_profiler -detailLevel full -xml SPUSBDataType", "profiler/SPUSBDataType.xml"},
      {"system_profiler -detailLevel full -xml", "profiler/full.xml"},
      {"ls -1 /Users/", "users/ls.txt"},
      {"dscl . -read \"/users/jane\"", "users/jane.txt"},
      {"dscl . -read \"/users/admin\"", "users/admin.txt"},
      {"diskutil info /dev/disk2", "diskutil/disk2.txt"},
      {"ioreg -rd1 -c IOPlatformExpertDevice", "ioreg/IOPlatformExpertDevice.txt"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.command);
    std::string expected = readFile(kSampleDir + "/" + c.file);
    ASSERT_FALSE(expected.empty());
    EXPECT_EQ(runWithFakes(c.command), expected);
  }
  EXPECT_EQ(runWithFakes("ioreg -rd1 -c IOPlatformExpertDevice | awk '/IOPlatformUUID/ { "
                         "split($0, line, \"\\\"\"); printf(\"%s\", line[4]); }'"),
            "5F3C7A2E-9B41-4D8A-A6E2-1C0B7D94E3F1");
}

TEST(SampleMacTest, FakesPrintNothingForUnknownOrHostileNames) {
  char dir_template[] = "/tmp/sample_mac_testXXXXXX";
  ASSERT_NE(mkdtemp(dir_template), nullptr);
  std::string dir = dir_template;
  std::string marker = dir + "/ran";
  EXPECT_EQ(runWithFakes("dscl . -read \"/users/Shared\" 2>/dev/null"), "");
  EXPECT_EQ(runWithFakes("dscl . -read '/users/x;touch " + marker + "' 2>/dev/null"), "");
  EXPECT_EQ(runWithFakes("dscl . -read '/users/../users/jane' 2>/dev/null"), "");
  EXPECT_EQ(runWithFakes("system_profiler -detailLevel full -xml '$(touch " + marker + ")'"), "");
  EXPECT_EQ(runWithFakes("system_profiler -detailLevel full -xml ../users/jane"), "");
  EXPECT_EQ(runWithFakes("system_profiler -detailLevel full -xml SPNoSuchDataType"), "");
  EXPECT_EQ(runWithFakes("diskutil info '/dev/../users/jane' 2>/dev/null"), "");
  EXPECT_NE(access(marker.c_str(), F_OK), 0);
  // Other ls calls reach the real ls.
  EXPECT_EQ(runWithFakes("ls -d '" + dir + "'"), dir + "\n");
  rmdir(dir.c_str());
}

TEST(SampleMacTest, ProfilerKnobsDelayOutputAndLogCalls) {
  char dir_template[] = "/tmp/sample_mac_testXXXXXX";
  ASSERT_NE(mkdtemp(dir_template), nullptr);
  std::string dir = dir_template;
  std::string env = "FAKE_STATE_DIR='" + dir + "' FAKE_PROFILER_EMPTY_TIMES=2 " +
                    "FAKE_PROFILER_LOG='" + dir + "/log'";
  std::string command = "system_profiler -detailLevel full -xml SPPowerDataType";
  EXPECT_EQ(runWithFakes(command, env), "");
  EXPECT_EQ(runWithFakes(command, env), "");
  EXPECT_EQ(runWithFakes(command, env), readFile(kSampleDir + "/profiler/SPPowerDataType.xml"));
  EXPECT_EQ(readFile(dir + "/log"),
            "-detailLevel full -xml SPPowerDataType\n"
            "-detailLevel full -xml SPPowerDataType\n"
            "-detailLevel full -xml SPPowerDataType\n");
  std::remove((dir + "/log").c_str());
  std::remove((dir + "/system_profiler.calls").c_str());
  rmdir(dir.c_str());
}

TEST(SampleMacTest, FakesFollowFakeMacDir) {
  // Tests point the fakes at an edited copy; an empty directory means a Mac
  // whose tools print nothing.
  char dir_template[] = "/tmp/sample_mac_testXXXXXX";
  ASSERT_NE(mkdtemp(dir_template), nullptr);
  std::string dir = dir_template;
  EXPECT_EQ(runWithFakes("system_profiler -detailLevel full -xml SPHardwareDataType",
                         "FAKE_MAC_DIR='" + dir + "'"),
            "");
  rmdir(dir.c_str());
}

}  // namespace
