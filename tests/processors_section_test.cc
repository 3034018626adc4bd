#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

class ProcessorsSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildProcessorsSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Processors"));
  }
  void set(const std::string& key, const TagValue& value) {
    raw_.setValue("/SPHardwareDataType/_items/item0/" + key, value);
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(ProcessorsSectionTest, PerCoreCacheIsMultipliedThenSpreadOverPackages) {
  set("packages", TagValue(int64_t{2}));
  set("cpu_type", TagValue("Quad-Core Intel Xeon"));
  set("number_processors", TagValue(int64_t{8}));
  set("number_cpus", TagValue(int64_t{99}));
  set("l2_cache_core", TagValue("256 KB"));
  set("l3_cache", TagValue("8 MB"));
  set("current_processor_speed", TagValue("2.66 GHz"));
  EXPECT_EQ(build(), R"txt(+Processors=
*Processor:1="Quad-Core Intel Xeon"
core-count=8
l2-cache-size=1024
l3-cache-size=4096
current-clock-speed=2660
*Processor:2="Quad-Core Intel Xeon"
core-count=8
l2-cache-size=1024
l3-cache-size=4096
current-clock-speed=2660
-
)txt");
}

TEST_F(ProcessorsSectionTest, WithoutPackagesOneUndividedProcessor) {
  set("number_cpus", TagValue(int64_t{2}));
  set("l2_cache", TagValue("6 MB"));
  set("l3_cache_size", TagValue("3 MB"));
  set("current_processor_speed", TagValue("2,01 GHz"));
  EXPECT_EQ(build(), R"txt(+Processors=
*Processor:1="CPU #1"
core-count=2
l2-cache-size=6144
l3-cache-size=6144
current-clock-speed=2010
-
)txt");
}

TEST_F(ProcessorsSectionTest, WrongKindsReadAsEmptyOrZero) {
  set("cpu_type", TagValue(int64_t{7}));
  set("number_processors", TagValue("4"));
  set("l2_cache_core", TagValue(int64_t{256}));
  set("current_processor_speed", TagValue(2.5));
  EXPECT_EQ(build(), R"txt(+Processors=
*Processor:1=7
core-count=0
l2-cache-size=0
l3-cache-size=0
-
)txt");
}

TEST_F(ProcessorsSectionTest, WholeCacheUsesIntegerDivision) {
  set("packages", TagValue(int64_t{3}));
  set("l2_cache", TagValue("1 MB"));
  set("current_processor_speed", TagValue("fast"));
  std::string text = build();
  EXPECT_NE(text.find("*Processor:3=\"CPU #3\"\ncore-count=1\nl2-cache-size=341\n"),
            std::string::npos)
      << text;
  EXPECT_NE(text.find("current-clock-speed=0\n"), std::string::npos) << text;
}

TEST_F(ProcessorsSectionTest, UnusablePackageCountsWriteNothing) {
  const TagValue bad[] = {TagValue("2"), TagValue(int64_t{0}), TagValue(int64_t{-1}), TagValue(1.0),
                          TagValue(int64_t{1} << 40)};
  for (const TagValue& packages : bad) {
    TagTree raw(true, "Macintosh");
    raw.setValue("/SPHardwareDataType/_items/item0/packages", packages);
    raw.setValue("/SPHardwareDataType/_items/item0/cpu_type", TagValue("Intel Core 2 Duo"));
    TagTree snapshot(true, "Snapshot");
    buildProcessorsSection(snapshot, raw);
    EXPECT_EQ(snapshot.top().findChild("Processors"), nullptr) << packages.textForm();
  }
}

TEST_F(ProcessorsSectionTest, NoHardwareNoSection) {
  raw_.setValue("/SPSoftwareDataType/_items/item0/os_version", TagValue("Mac OS X 10.6.8"));
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
