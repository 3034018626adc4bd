#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

using Keys = std::vector<std::pair<const char*, TagValue>>;

// The whole section, or with `first_only` the values of the first processor
// and the number of processors.
std::string buildProcessors(const Keys& keys, bool first_only = false) {
  TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
  for (const auto& [key, value] : keys)
    raw.setValue(std::string("/SPHardwareDataType/_items/item0/") + key, value);
  buildProcessorsSection(snapshot, raw);
  const Tag* section = snapshot.top().findChild("Processors");
  if (!first_only || !section) return treeText(section);
  std::istringstream lines(treeText(section->findChild("Processor:1")));
  std::string line, values;
  while (std::getline(lines, line)) values += line.substr(line.find('=') + 1) + " ";
  return values + "x" + std::to_string(section->children().size());
}

TEST(ProcessorsSectionTest, PackageCoreAndCacheRules) {
  // Values: name, cores, L2 KB, L3 KB, MHz, "x" processors.
  const std::pair<Keys, const char*> cases[] = {
      // A per-core cache is multiplied by the cores, then spread over packages.
      {{{"packages", 2},
        {"cpu_type", "Quad-Core Intel Xeon"},
        {"number_processors", 8},
        {"l2_cache_core", "256 KB"},
        {"l3_cache", "8 MB"},
        {"current_processor_speed", "2.66 GHz"}},
       "\"Quad-Core Intel Xeon\" 8 1024 4096 2660 x2"},
      // Without "packages" one processor; a per-size cache counts per core.
      {{{"number_cpus", 2}, {"l2_cache", "6 MB"}, {"l3_cache_size", "3 MB"}},
       "\"CPU #1\" 2 6144 6144 x1"},
      // A whole-machine cache is divided as an integer; no core count is one.
      {{{"packages", 3}, {"l2_cache", "1 MB"}, {"current_processor_speed", "2,01 GHz"}},
       "\"CPU #1\" 1 341 0 2010 x3"},
      {{{"cpu_type", 7}, {"number_processors", "4"}, {"current_processor_speed", 2.5}},
       "7 0 0 0 x1"},
  };
  for (const auto& [keys, expected] : cases)
    EXPECT_EQ(buildProcessors(keys, true), expected) << keys.front().first;
  // Unusable package counts write nothing.
  for (const TagValue& packages :
       {TagValue("2"), TagValue(0), TagValue(-1), TagValue(1.0), TagValue(int64_t{1} << 40)})
    EXPECT_EQ(buildProcessors({{"packages", packages}}), "") << packages.textForm();
}

TEST(ProcessorsSectionTest, ChipNamesAndCoreTexts) {
  // Values: name, cores, L2 KB, L3 KB.
  const std::pair<Keys, const char*> cases[] = {
      {{{"chip_type", "Apple M5 Max"}, {"number_processors", "proc 18:6:0:12"}},
       "\"Apple M5 Max\" 18 x1"},
      // Apple's virtual machines count their cores as an integer.
      // A chip that does report a cache gets both sizes, as an Intel Mac does.
      {{{"chip_type", "Apple M4 Max (Virtual)"}, {"number_processors", 4}, {"l2_cache", "4 MB"}},
       "\"Apple M4 Max (Virtual)\" 4 4096 0 x1"},
      {{{"cpu_type", "Intel Core i7"}, {"chip_type", "Apple M1"}}, "\"Intel Core i7\" 1 0 0 x1"},
      // Only "proc" with three or four whole numbers is a core count.
      {{{"number_processors", "proc 9:6:3"}}, "\"CPU #1\" 9 0 0 x1"},
      {{{"number_processors", "proc 8:4"}}, "\"CPU #1\" 0 0 0 x1"},
      {{{"number_processors", "proc 8:4:4:0:0"}}, "\"CPU #1\" 0 0 0 x1"},
      {{{"number_processors", "proc 8:x:4"}}, "\"CPU #1\" 0 0 0 x1"},
      {{{"number_processors", "proc 99999999999:1:1"}}, "\"CPU #1\" 0 0 0 x1"},
      {{{"number_processors", "8:4:4"}}, "\"CPU #1\" 0 0 0 x1"},
  };
  for (const auto& [keys, expected] : cases)
    EXPECT_EQ(buildProcessors(keys, true), expected) << keys.front().second.textForm();
}

}  // namespace
}  // namespace cvn
