#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(ApplicationsSectionTest, CopiesOfOneVersionMergeWithTheLaterValuesWinning) {
  TagTree raw(true, "Macintosh");
  auto set = [&](int item, const std::string& key, const TagValue& value) {
    raw.setValue("/SPApplicationsDataType/_items/item" + std::to_string(item) + "/" + key, value);
  };
  set(0, "_name", "Tool");
  set(0, "version", "2.0");
  set(0, "app_store", "no");
  set(0, "lastModified", "20131115213000.000000+60");
  set(0, "has64BitIntelCode", "no");
  set(0, "path", "/Applications/Tool.app");
  set(1, "_name", "Tool");
  set(1, "version", "2.0");
  set(1, "has64BitIntelCode", "yes");
  set(1, "path", "/Users/a/Tool.app");
  // No version, a non-text store flag, nothing known about 64-bit code.
  set(2, "_name", "Helper");
  set(2, "app_store", int64_t{1});
  set(2, "lastModified", "2013");
  TagTree snapshot(true, "Snapshot");
  buildApplicationsSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Software")), R"(+Software=
*Soft:Tool 2.0="Tool"
version="2.0"
app-store="0"
inst-date="20131115"
location="/Users/a/Tool.app"
64bit-app="1"
*Soft:Helper="Helper"
app-store="1"
inst-date="2013"
64bit-app="1"
~type=unknown
location=
-
)");
}

TEST(ApplicationsSectionTest, ArchKindNamesTheCodeOnlyWhereNo64BitIntelFlagIsGiven) {
  using Keys = std::vector<std::pair<const char*, const char*>>;
  // The keys of an item named "A", and its record's lines between the name and "location".
  const std::pair<Keys, const char*> cases[] = {
      {{{"arch_kind", "arch_arm"}}, "64bit-app=\"1\"\narch=\"Apple Silicon\"\n"},
      {{{"arch_kind", "arch_arm_i64"}}, "64bit-app=\"1\"\narch=\"Universal\"\n"},
      {{{"arch_kind", "arch_i64"}}, "64bit-app=\"1\"\narch=\"Intel\"\n"},
      {{{"arch_kind", "arch_i32_i64"}}, "64bit-app=\"1\"\narch=\"Intel\"\n"},
      {{{"arch_kind", "arch_i32"}}, "arch=\"Intel 32-bit\"\n"},
      {{{"arch_kind", "arch_ppc"}}, "arch=\"PowerPC\"\n"},
      {{{"arch_kind", "arch_ios"}}, "64bit-app=\"1\"\narch=\"iOS\"\n"},
      {{{"arch_kind", "arch_web"}}, "64bit-app=\"1\"\n~type=unknown\narch=\"Web\"\n"},
      {{{"arch_kind", "arch_other"}}, "64bit-app=\"1\"\n~type=unknown\narch=\"Other\"\n"},
      {{{"arch_kind", "arch_riscv"}}, "64bit-app=\"1\"\n~type=unknown\narch=\"Other\"\n"},
      // The flag, where the profiler still prints it, says all there is.
      {{{"has64BitIntelCode", "no"}, {"arch_kind", "arch_arm"}}, ""},
  };
  for (const auto& [keys, expected] : cases) {
    TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
    raw.setValue("/SPApplicationsDataType/_items/item0/_name", "A");
    for (const auto& [key, value] : keys)
      raw.setValue(std::string("/SPApplicationsDataType/_items/item0/") + key, value);
    buildApplicationsSection(snapshot, raw);
    EXPECT_EQ(treeText(snapshot.top().findChild("Software")),
              std::string("+Software=\n*Soft:A=\"A\"\n") + expected + "location=\n-\n")
        << keys.back().second;
  }
}

}  // namespace
}  // namespace cvn
