#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// "lastModified" arrives as "yyyyMMddHHmmss.000000+zone"; the day is enough.
constexpr size_t kDateLength = 8;

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
  if (!hasKey(item, "has64BitIntelCode")) {
    app.setProperty("64bit-app", TagValue("1"), "type", "unknown");
  } else if (rawText(item, "has64BitIntelCode") == "yes") {
    app.setProperty("64bit-app", TagValue("1"));
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
