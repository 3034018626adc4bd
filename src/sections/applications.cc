#include <string>
#include <string_view>

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// "lastModified" arrives as "yyyyMMddHHmmss.000000+zone"; the day is enough.
constexpr size_t kDateLength = 8;

enum class SixtyFourBit { kYes, kNo, kUnknown };

// From macOS 11 the profiler no longer says whether an app has 64-bit Intel
// code; it names the code the bundle carries instead, and that is what tells
// an administrator which apps need Rosetta or cannot run at all.
struct ArchKind {
  std::string_view raw;
  const char* arch;
  SixtyFourBit code;
};

constexpr ArchKind kArchKinds[] = {
    {"arch_arm", "Apple Silicon", SixtyFourBit::kYes},
    {"arch_arm_i64", "Universal", SixtyFourBit::kYes},
    {"arch_i64", "Intel", SixtyFourBit::kYes},
    {"arch_i32_i64", "Intel", SixtyFourBit::kYes},
    // Neither 32-bit Intel nor PowerPC code runs on a Mac that reports kinds.
    {"arch_i32", "Intel 32-bit", SixtyFourBit::kNo},
    {"arch_ppc", "PowerPC", SixtyFourBit::kNo},
    {"arch_ios", "iOS", SixtyFourBit::kYes},
    // A web app, like a bundle whose main program is a script, shows no code.
    {"arch_web", "Web", SixtyFourBit::kUnknown},
};
constexpr ArchKind kOtherArch = {"arch_other", "Other", SixtyFourBit::kUnknown};

const ArchKind& findArchKind(std::string_view raw) {
  for (const ArchKind& kind : kArchKinds)
    if (kind.raw == raw) return kind;
  return kOtherArch;
}

void write64BitApp(Tag& app, SixtyFourBit code) {
  if (code == SixtyFourBit::kYes) app.setProperty("64bit-app", TagValue("1"));
  if (code == SixtyFourBit::kUnknown)
    app.setProperty("64bit-app", TagValue("1"), "type", "unknown");
}

void writeApplication(Tag& software, const Tag& item) {
  std::string_view name = rawText(item, "_name");
  // Records are found by name, so two copies of one version share a record.
  std::string record_name = "Soft:";
  record_name += name;
  if (hasKey(item, "version")) {
    record_name += ' ';
    record_name += rawText(item, "version");
  }
  Tag& app = software.setChildValue(record_name, TagValue::viewOf(name));

  copyFieldIfPresent(app, "version", item, "version");
  if (hasKey(item, "app_store"))
    app.setProperty("app-store", TagValue(rawText(item, "app_store") == "no" ? "0" : "1"));
  if (hasKey(item, "lastModified"))
    app.setProperty("inst-date", TagValue(rawText(item, "lastModified").substr(0, kDateLength)));
  copyFieldIfPresent(app, "runtime-environment", item, "runtime_environment");
  copyFieldIfPresent(app, "info", item, "info");
  if (hasKey(item, "has64BitIntelCode")) {
    bool yes = rawText(item, "has64BitIntelCode") == "yes";
    write64BitApp(app, yes ? SixtyFourBit::kYes : SixtyFourBit::kNo);
  } else if (hasKey(item, "arch_kind")) {
    const ArchKind& kind = findArchKind(rawText(item, "arch_kind"));
    write64BitApp(app, kind.code);
    app.setProperty("arch", TagValue(kind.arch));
  } else {
    write64BitApp(app, SixtyFourBit::kUnknown);
  }
  copyField(app, "location", item, "path");
}

}  // namespace

void buildApplicationsSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* type = raw.top().findChild("SPApplicationsDataType");
  if (!type) return;
  // The section exists as soon as the data type does, even without items.
  Tag& software = snapshot.top().addChild("Software");
  const Tag* items = type->findChild("_items");
  if (!items) return;
  for (const auto& item : items->children()) writeApplication(software, *item);
}

}  // namespace cvn
