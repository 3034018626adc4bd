// The "Processors" section: one entry per processor package, with the
// machine-wide figures of the hardware overview spread over the packages.
#include <cmath>
#include <cstdlib>
#include <optional>
#include <string>

#include "collect/processor_text.h"
#include "sections/builder_util.h"
#include "sections/sections.h"
#include "zxml/size_text.h"

namespace cvn {
namespace {

// A package count beyond this is not a real machine but a damaged value; it
// must not make the builder write millions of entries.
constexpr int64_t kMaxPackages = 256;

int64_t readCoreCount(const Tag& item) {
  const TagValue* count = rawValue(item, "number_processors");
  if (!count) count = rawValue(item, "number_cpus");
  if (!count) return 1;
  if (count->isInt()) return count->asInt();
  // Apple Silicon counts its cores in a text, "proc 8:4:4".
  std::optional<int64_t> cores =
      count->isText() ? coreCountOfProcText(count->text()) : std::nullopt;
  return cores.value_or(0);
}

// KB per package from the whole-machine form, else from the per-core forms
// multiplied by the core count; 0 when the profiler reports none of them.
int64_t cacheSizePerPackage(const Tag& item, const char* whole_key, const char* core_key,
                            const char* size_key, int64_t cores, int64_t packages) {
  if (hasKey(item, whole_key))
    return truncateToInt64(SizeText::toKilobytes(rawText(item, whole_key))) / packages;
  for (const char* key : {core_key, size_key}) {
    if (hasKey(item, key)) {
      double kb = SizeText::toKilobytes(rawText(item, key));
      return truncateToInt64(static_cast<double>(cores) * kb / static_cast<double>(packages));
    }
  }
  return 0;
}

bool hasAnyCacheKey(const Tag& item) {
  for (const char* key :
       {"l2_cache", "l2_cache_core", "l2_cache_size", "l3_cache", "l3_cache_core", "l3_cache_size"})
    if (hasKey(item, key)) return true;
  return false;
}

}  // namespace

void buildProcessorsSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* item = findFirstItem(raw, "SPHardwareDataType");
  if (!item) return;
  int64_t packages = 1;
  if (const TagValue* value = rawValue(*item, "packages")) {
    if (!value->isInt()) return;
    packages = value->asInt();
    if (packages < 1 || packages > kMaxPackages) return;
  }
  int64_t cores = readCoreCount(*item);
  int64_t l2 =
      cacheSizePerPackage(*item, "l2_cache", "l2_cache_core", "l2_cache_size", cores, packages);
  int64_t l3 =
      cacheSizePerPackage(*item, "l3_cache", "l3_cache_core", "l3_cache_size", cores, packages);
  const TagValue* speed = rawValue(*item, "current_processor_speed");
  bool has_speed = speed && speed->isText();
  int64_t megahertz = has_speed ? megahertzOfSpeedText(speed->text()) : 0;
  const TagValue* cpu_type = rawValue(*item, "cpu_type");
  // Apple Silicon names its chip instead ("Apple M1 Pro") and reports no
  // caches, so a 0 there would be as false as a clock speed of 0.
  bool apple_silicon = !cpu_type && hasKey(*item, "chip_type");
  if (apple_silicon) cpu_type = rawValue(*item, "chip_type");
  bool write_caches = !apple_silicon || hasAnyCacheKey(*item);

  for (int64_t p = 1; p <= packages; ++p) {
    Tag& processors = snapshot.top().addChild("Processors");
    std::string name = formatText("Processor:%lld", static_cast<long long>(p));
    Tag& processor = processors.setChildValue(
        name, cpu_type ? *cpu_type : TagValue(formatText("CPU #%lld", static_cast<long long>(p))));
    processor.setProperty("core-count", TagValue(cores));
    if (write_caches) {
      processor.setProperty("l2-cache-size", TagValue(l2));
      processor.setProperty("l3-cache-size", TagValue(l3));
    }
    if (has_speed) processor.setProperty("current-clock-speed", TagValue(megahertz));
  }
}

}  // namespace cvn
