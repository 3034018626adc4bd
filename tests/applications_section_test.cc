#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

class ApplicationsSectionTest : public ::testing::Test {
 protected:
  void set(int item, const std::string& key, const TagValue& value) {
    raw_.setValue("/SPApplicationsDataType/_items/item" + std::to_string(item) + "/" + key, value);
  }
  std::string build() {
    buildApplicationsSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Software"));
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(ApplicationsSectionTest, WritesEachApplicationByNameAndVersion) {
  set(0, "_name", "Safari");
  set(0, "version", "6.1");
  set(0, "app_store", "no");
  set(0, "lastModified", "20131115213000.000000+60");
  set(0, "runtime_environment", "arch_x86");
  set(0, "info", "Safari 6.1, Copyright 2003-2013 Apple Inc.");
  set(0, "has64BitIntelCode", "yes");
  set(0, "path", "/Applications/Safari.app");
  // No version, 32-bit only, a non-text store flag.
  set(1, "_name", "Old Tool");
  set(1, "app_store", int64_t{1});
  set(1, "has64BitIntelCode", "no");
  set(1, "path", "/Applications/Old Tool.app");
  // Nothing known about the architecture; no path.
  set(2, "_name", "Helper");
  set(2, "version", "1.0");
  set(2, "lastModified", "2013");

  EXPECT_EQ(build(), R"(+Software=
*Soft:Safari 6.1="Safari"
version="6.1"
app-store="0"
inst-date="20131115"
runtime-environment="arch_x86"
info="Safari 6.1, Copyright 2003-2013 Apple Inc."
64bit-app="1"
location="/Applications/Safari.app"
*Soft:Old Tool="Old Tool"
app-store="1"
location="/Applications/Old Tool.app"
*Soft:Helper 1.0="Helper"
version="1.0"
inst-date="2013"
64bit-app="1"
~type=unknown
location=
-
)");
}

TEST_F(ApplicationsSectionTest, CopiesOfOneVersionMergeWithTheLaterValuesWinning) {
  set(0, "_name", "Tool");
  set(0, "version", "2.0");
  set(0, "info", "first copy");
  set(0, "path", "/Applications/Tool.app");
  set(1, "_name", "Tool");
  set(1, "version", "2.0");
  set(1, "has64BitIntelCode", "yes");
  set(1, "path", "/Users/a/Applications/Tool.app");
  set(2, "_name", "Tool");
  set(2, "version", "2.1");
  set(2, "has64BitIntelCode", "yes");
  set(2, "path", "/Volumes/b/Tool.app");

  EXPECT_EQ(build(), R"(+Software=
*Soft:Tool 2.0="Tool"
version="2.0"
info="first copy"
64bit-app="1"
~type=unknown
location="/Users/a/Applications/Tool.app"
*Soft:Tool 2.1="Tool"
version="2.1"
64bit-app="1"
location="/Volumes/b/Tool.app"
-
)");
}

TEST_F(ApplicationsSectionTest, DataTypeWithoutItemsLeavesAnEmptySection) {
  raw_.setValue("/SPApplicationsDataType/_detail", "full");
  EXPECT_EQ(build(), "*Software=\n");
}

TEST_F(ApplicationsSectionTest, NoDataTypeNoSection) { EXPECT_EQ(build(), ""); }

TEST_F(ApplicationsSectionTest, TenThousandApplicationsKeepEveryRecord) {
  for (int i = 0; i < 10000; ++i) {
    set(i, "_name", "App " + std::to_string(i));
    set(i, "version", "1." + std::to_string(i % 7));
    set(i, "path", "/Applications/App.app");
  }
  buildApplicationsSection(snapshot_, raw_);
  const Tag* software = snapshot_.top().findChild("Software");
  ASSERT_NE(software, nullptr);
  EXPECT_EQ(software->children().size(), 10000u);
  EXPECT_NE(software->findChild("Soft:App 9999 1.3"), nullptr);
}

}  // namespace
}  // namespace cvn
