// Runs the hardware and system builders over recorded profiler outputs of
// real Macs when the shared corpus is at hand (CVN_CORPUS_DIR, else the
// "shared/corpus" folder beside the checkout or its parent).
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <sstream>
#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

namespace fs = std::filesystem;

class HardwareSectionsCorpusTest : public ::testing::Test {
 protected:
  void SetUp() override {
    corpus_ = findCorpus();
    if (corpus_.empty()) GTEST_SKIP() << "no recorded profiler outputs at hand";
  }

  // Converts each file into the one raw tree, as one multi-type run would.
  void convert(std::initializer_list<const char*> files) {
    for (const char* file : files) {
      std::ifstream in(corpus_ / file, std::ios::binary);
      ASSERT_TRUE(in) << file;
      std::ostringstream bytes;
      bytes << in.rdbuf();
      PlistValue value;
      ASSERT_TRUE(parsePlist(bytes.str(), &value)) << file;
      PlistConverter(raw_).convertPlist(value);
    }
    buildSystemSection(snapshot_, raw_, runner_);
    buildProcessorsSection(snapshot_, raw_);
    buildMemorySection(snapshot_, raw_);
    buildNetworkAdaptersSection(snapshot_, raw_);
    buildOperatingSystemSection(snapshot_, raw_);
  }
  std::string section(const char* name) { return treeText(snapshot_.top().findChild(name)); }

  fs::path corpus_;
  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
  FakeCommandRunner runner_;
};

constexpr char kOhaiDir[] = "ohai/test-data/unit/plugins/darwin/";

TEST_F(HardwareSectionsCorpusTest, MacBookPro8WithLion) {
  const std::string full = std::string(kOhaiDir) + "system_profiler_output.rb.d/";
  convert({(full + "SystemProfilerOutput_Full.xml").c_str(),
           (full + "SystemProfilerOutput_Mini.xml").c_str()});
  EXPECT_TRUE(runner_.commands_ran_.empty());
  std::string system = section("System");
  EXPECT_NE(system.find("*Computer-system=\nmodel=\"MacBookPro8,2\"\n"
                        "uuid=\"DAB12AB34-1234-2222-12FE-1CA6A8F2CB91\"\n"
                        "*Chassis=\nmanuf=\"Apple Inc.\"\nserial=\"ABCDEFG12345\"\n"),
            std::string::npos)
      << system;
  EXPECT_NE(system.find("*mem-slot:1=\nused=\"1\"\ncapacity=4096\n~base-value=4294967296\n"
                        "*mem-slot:2=\nused=\"1\"\ncapacity=4096\n"),
            std::string::npos)
      << system;
  EXPECT_NE(system.find("*Profile:1=\"AC Power\"\nsystem-sleep-timer=0\ndisk-sleep-timer=0\n"
                        "display-sleep-timer=30\nwake-on-lan=\"1\"\n"),
            std::string::npos)
      << system;
  EXPECT_NE(system.find("*Profile:2=\"Battery_Power\"\n"), std::string::npos) << system;

  EXPECT_EQ(section("Processors"), R"txt(+Processors=
*Processor:1="Intel Core i7"
core-count=4
l2-cache-size=1024
l3-cache-size=6144
current-clock-speed=2200
-
)txt");
  std::string memory = section("Memory");
  EXPECT_NE(memory.find("*Memory-slot:2=\nused=\"1\"\nmanuf=\"0x802C\"\ncapacity=4096\n"
                        "mem-type=\"DDR3\"\nspeed=\"1067\"\nbank-label=\"BANK 1/DIMM0\"\n"
                        "*General-info=\nphysical-memory=8192\n"),
            std::string::npos)
      << memory;
  EXPECT_EQ(section("OS"), R"txt(+OS=
*os:1=
~kind=mac
name="Mac OS X v10.7 (Lion)"
version="10.7.5 (11G63)"
update="Update 5"
kernel="Darwin 11.4.2"
manuf="Apple Inc."
uptime="00000000062337.000000:000"
architecture="64-bit"
-
)txt");
  std::string network = section("Network");
  EXPECT_NE(network.find("*net-adapter:4=\"Wi-Fi\"\nbsd-device-name=\"en1\"\ntype=\"AirPort\"\n"
                         "*net-adapter:5=\"Bluetooth PAN\"\n"),
            std::string::npos)
      << network;
}

TEST_F(HardwareSectionsCorpusTest, MacBookPro10Overview) {
  convert({"grr/grr/test/grr_response_test/test_data/system_profiler.xml"});
  EXPECT_NE(section("System").find("model=\"MacBookPro10,1\""), std::string::npos);
  EXPECT_NE(section("System").find("serial=\"C02JQ0F5F6L9\""), std::string::npos);
  EXPECT_NE(section("Memory").find("physical-memory=16384\n"), std::string::npos);
  EXPECT_NE(section("Processors").find("current-clock-speed=2300\n"), std::string::npos);
}

TEST_F(HardwareSectionsCorpusTest, MacBookPro11WithPowerProfiles) {
  const std::string hardware = std::string(kOhaiDir) + "hardware_system_profiler_output.rb.d/";
  convert({(hardware + "HardwareSystemProfilerOutput_Hardware.xml").c_str(),
           (hardware + "HardwareSystemProfilerOutput_Power.xml").c_str()});
  std::string system = section("System");
  EXPECT_NE(system.find("model=\"MacBookPro11,1\""), std::string::npos) << system;
  EXPECT_NE(system.find("*Profile:2=\"Battery_Power\"\nsystem-sleep-timer=1\n"
                        "disk-sleep-timer=10\ndisplay-sleep-timer=2\nwake-on-ac-change=\"0\"\n"
                        "wake-on-clamshell-open=\"1\"\nreduce-brightness=\"1\"\n"
                        "display-sleep-uses-dim=\"1\"\n"),
            std::string::npos)
      << system;
  EXPECT_NE(section("Processors")
                .find("core-count=2\nl2-cache-size=512\nl3-cache-size=4096\n"
                      "current-clock-speed=3000\n"),
            std::string::npos)
      << section("Processors");
}

}  // namespace
}  // namespace cvn
