// Invariants of the bundled sample Mac: the collector splices the profiler
// outputs by byte count, so a fixture whose header or footer drifts by one
// byte would break every end-to-end test in a way that is hard to trace.

#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace {

const std::string kSampleDir = std::string(CVN_SOURCE_DIR) + "/tests/sample_mac";
const std::string kModernDir = std::string(CVN_SOURCE_DIR) + "/tests/modern_mac";
const std::string kFakeBin = std::string(CVN_SOURCE_DIR) + "/tests/fake_bin";

const char kHeader[] =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
    "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
    "<plist version=\"1.0\">\n"
    "<array>\n";
const char kFooter[] = "</array>\n</plist>\n";
static_assert(sizeof kHeader - 1 == 172 && sizeof kFooter - 1 == 18, "collector splices on these");

// Short names of the collected data types, "SP" + name + "DataType".
const std::vector<std::string> kCollectedTypes = {
    "Hardware",    "Network",     "Software", "ParallelATA",     "Audio",         "Bluetooth",
    "FireWire",    "Displays",    "Memory",   "Printers",        "SerialATA",     "ParallelSCSI",
    "USB",         "AirPort",     "Firewall", "NetworkLocation", "NetworkVolume", "Applications",
    "StartupItem", "DiscBurning", "Power"};

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), {}};
}

std::string runWithFakes(const std::string& command) {
  FILE* pipe = popen(("PATH='" + kFakeBin + "':\"$PATH\" " + command).c_str(), "r");
  if (pipe == nullptr) return "<popen failed>";
  std::string out;
  char buffer[4096];
  size_t n;
  while ((n = fread(buffer, 1, sizeof buffer, pipe)) > 0) out.append(buffer, n);
  pclose(pipe);
  return out;
}

// Checks the byte layout the collector splices on and returns the file.
std::string readProfilerFile(const std::string& name, const std::string& dir = kSampleDir) {
  std::string xml = readFile(dir + "/profiler/" + name + ".xml");
  EXPECT_EQ(xml.substr(0, 172), kHeader);
  EXPECT_EQ(xml.substr(xml.size() < 18 ? 0 : xml.size() - 18), kFooter);
  return xml;
}

TEST(SampleMacTest, ProfilerFilesKeepTheSplicedLayout) {
  std::string full = readProfilerFile("full");
  for (const std::string& name : kCollectedTypes) {
    std::string type = "SP" + name + "DataType";
    SCOPED_TRACE(type);
    std::string entry = "\t<dict>\n\t\t<key>_dataType</key>\n\t\t<string>" + type + "</string>\n";
    EXPECT_EQ(readProfilerFile(type).find(entry), 172u);
    EXPECT_NE(full.find(entry), std::string::npos);
  }
}

TEST(SampleMacTest, TheModernMacAnswersTheNewerTypesToo) {
  std::vector<std::string> types = kCollectedTypes;
  for (const char* extra : {"NVMe", "Storage", "USBHost"}) types.push_back(extra);
  std::string full = readProfilerFile("full", kModernDir);
  for (const std::string& name : types) {
    std::string type = "SP" + name + "DataType";
    SCOPED_TRACE(type);
    std::string entry = "\t\t<key>_dataType</key>\n\t\t<string>" + type + "</string>\n";
    EXPECT_NE(readProfilerFile(type, kModernDir).find(entry), std::string::npos);
    EXPECT_NE(full.find(entry), std::string::npos);
  }
}

TEST(SampleMacTest, FakesPrintTheRecordingsByteForByte) {
  // An empty file name means the fake must print nothing.
  const std::vector<std::pair<std::string, std::string>> cases = {
      {"system_profiler -detailLevel full -xml SPUSBDataType", "profiler/SPUSBDataType.xml"},
      {"system_profiler -detailLevel full -xml", "profiler/full.xml"},
      {"ls -1 /Users/", "users/ls.txt"},
      {"dscl . -read \"/users/jane\"", "users/jane.txt"},
      {"diskutil info /dev/disk2", "diskutil/disk2.txt"},
      {"ioreg -rd1 -c IOPlatformExpertDevice", "ioreg/IOPlatformExpertDevice.txt"},
      // Printing the USB file here would mean the fake evaluated its argument.
      {"system_profiler -detailLevel full -xml '$(echo SPUSBDataType)' 2>/dev/null", ""},
      // The older Mac knows none of today's types.
      {"system_profiler -detailLevel full -xml SPNVMeDataType", ""},
  };
  for (const auto& [command, file] : cases) {
    SCOPED_TRACE(command);
    std::string expected = file.empty() ? "" : readFile(kSampleDir + "/" + file);
    ASSERT_EQ(expected.empty(), file.empty());
    EXPECT_EQ(runWithFakes(command), expected);
  }
}

}  // namespace
