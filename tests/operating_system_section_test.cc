#include "sections/operating_system.h"

#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(OsVersionTest, SplitsTheProfilerText) {
  struct Case {
    const char* text;
    const char* name;
    const char* version;
    const char* update;
    int major;
    int minor;
  };
  const Case cases[] = {
      {"Mac OS X 10.6.8 (10K549)", "Mac OS X v10.6 (Snow Leopard)", "10.6.8 (10K549)", "Update 8",
       10, 6},
      {"Mac OS X Server 10.6.8 (10K549)", "Mac OS X v10.6 (Snow Leopard)", "10.6.8 (10K549)",
       "Update 8", 10, 6},
      {"Mac OS X 10.4.11 (8S2167)", "Mac OS X v10.4 (Tiger)", "10.4.11 (8S2167)", "Update 11", 10,
       4},
      {"Mac OS X 10.7 (11A511)", "Mac OS X v10.7 (Lion)", "10.7 (11A511)", "", 10, 7},
      {"Mac OS X 10.6.0 (10A432)", "Mac OS X v10.6 (Snow Leopard)", "10.6.0 (10A432)", "", 10, 6},
      {"OS X 10.8.5 (12F45)", "OS X v10.8 (Mountain Lion)", "10.8.5 (12F45)", "Update 5", 10, 8},
      {"OS X 10.9.5 (13F34)", "OS X v10.9 (Mavericks)", "10.9.5 (13F34)", "Update 5", 10, 9},
      {"OS X 10.10 (14A389)", "OS X 10.10 (14A389)", "10.10 (14A389)", "", 10, 10},
      {"OS X 10.11.6 (15G1217)", "OS X 10.11.6 (15G1217)", "10.11.6 (15G1217)", "Update 6", 10, 11},
      {"Mac OS X 10.x", "Mac OS X v10.0 (Cheetah)", "10.x", "", 10, 0},
      {"Mac OS X", "Mac OS X v10.0 (Cheetah)", "", "", 10, 0},
      {"Mac OS X 10.1.08", "Mac OS X v10.1 (Puma)", "10.1.08", "Update 8", 10, 1},
      {"Mac OS X 10.5.99999999999 (9L31a)", "Mac OS X v10.5 (Leopard)", "10.5.99999999999 (9L31a)",
       "", 10, 5},
      {"macOS 10.12.6 (16G29)", "macOS 10.12.6 (16G29)", "10.12.6 (16G29)", "Update 6", 10, 12},
      {"macOS 11.2.3 (20D91)", "macOS 11.2.3 (20D91)", "11.2.3 (20D91)", "Update 3", 11, 2},
      {"Darwin 10.3", "Darwin 10.3", "10.3", "", 10, 3},
      {"macOS Sonoma", "macOS Sonoma", "", "", -1, -1},
      {"", "", "", "", -1, -1},
      {"OS X 10.99999999999999999999 (X)", "OS X 10.99999999999999999999 (X)",
       "10.99999999999999999999 (X)", "", 10, 999999999},
  };
  for (const Case& c : cases) {
    OsVersionText os = parseOsVersion(c.text);
    EXPECT_EQ(os.name, c.name) << c.text;
    EXPECT_EQ(os.version, c.version) << c.text;
    EXPECT_EQ(os.update, c.update) << c.text;
    EXPECT_EQ(os.major, c.major) << c.text;
    EXPECT_EQ(os.minor, c.minor) << c.text;
  }
}

TEST(OsVersionTest, UptimeBecomesADmtfInterval) {
  struct Case {
    const char* uptime;
    const char* interval;
  };
  const Case cases[] = {
      {"up 1:02:03:04", "00000001020304.000000:000"},
      {"up 0:6:23:37", "00000000062337.000000:000"},
      {"up 45", "00000000000045.000000:000"},
      {"up 3:00", "00000000000300.000000:000"},
      {"up 0:0:59:60", "00000000010000.000000:000"},     // carries into the next field
      {"up 9:1:02:03:04", "00000001020304.000000:000"},  // a fifth field is ignored
      {"1:02:03:04", "00000000020304.000000:000"},       // the first character is never read
      {"up 12345678901:0:0:0", "345678901000000.000000:000"},
      {"up 1d:2h", "00000000000102.000000:000"},  // only digits count
      {"", "00000000000000.000000:000"},
  };
  for (const Case& c : cases)
    EXPECT_EQ(formatDmtfInterval(uptimeSeconds(c.uptime)), c.interval) << c.uptime;
}

class OperatingSystemSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildOperatingSystemSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("OS"));
  }
  void set(const std::string& key, const TagValue& value) {
    raw_.setValue("/SPSoftwareDataType/_items/item0/" + key, value);
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(OperatingSystemSectionTest, SnowLeopardWithoutTheKernelFlagIs32Bit) {
  set("os_version", TagValue("Mac OS X 10.6.8 (10K549)"));
  set("kernel_version", TagValue("Darwin 10.8.0"));
  set("uptime", TagValue("up 1:02:03:04"));
  set("64bit_kernel_and_kexts", TagValue("Yes"));
  EXPECT_EQ(build(), R"txt(+OS=
*os:1=
~kind=mac
name="Mac OS X v10.6 (Snow Leopard)"
version="10.6.8 (10K549)"
update="Update 8"
kernel="Darwin 10.8.0"
manuf="Apple Inc."
uptime="00000001020304.000000:000"
architecture="32-bit"
-
)txt");
}

TEST_F(OperatingSystemSectionTest, KernelFlagAndLaterReleasesAre64Bit) {
  struct Case {
    const char* os_version;
    const char* flag;
    const char* architecture;
  };
  const Case cases[] = {
      {"Mac OS X 10.6.8 (10K549)", "yes", "64-bit"}, {"Mac OS X 10.5.8 (9L31a)", "no", "32-bit"},
      {"Mac OS X 10.7.5 (11G63)", "no", "64-bit"},   {"OS X 10.10 (14A389)", "", "64-bit"},
      {"macOS 11.2.3 (20D91)", "", "64-bit"},        {"Mac OS X 10.x", "", "32-bit"},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    raw.setValue("/SPSoftwareDataType/_items/item0/os_version", TagValue(c.os_version));
    if (*c.flag) raw.setValue("/SPSoftwareDataType/_items/item0/64bit_kernel_and_kexts", c.flag);
    TagTree snapshot(true, "Snapshot");
    buildOperatingSystemSection(snapshot, raw);
    const Tag* record = snapshot.top().findChild("OS")->findChild("os:1");
    EXPECT_EQ(record->findProperty("architecture")->value().text(), c.architecture) << c.os_version;
  }
}

TEST_F(OperatingSystemSectionTest, WrongKindsReadAsEmptyText) {
  set("os_version", TagValue(int64_t{10}));
  set("uptime", TagValue(int64_t{3600}));
  set("kernel_version", TagValue(int64_t{11}));
  EXPECT_EQ(build(), R"txt(+OS=
*os:1=
~kind=mac
name=""
version=""
kernel=11
manuf="Apple Inc."
uptime="00000000000000.000000:000"
architecture="32-bit"
-
)txt");
}

TEST_F(OperatingSystemSectionTest, NoSoftwareItemNoSection) {
  raw_.setValue("/SPSoftwareDataType/_items/flag", TagValue("no item"));
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
