// The raw-tree conversion done the plain way: every leaf stored through
// TagTree::setValue with its full path. The converter walks with a cursor
// instead; the fuzzer checks that both give the same tree.
#ifndef CVN_FUZZ_PLIST_PATH_REFERENCE_H_
#define CVN_FUZZ_PLIST_PATH_REFERENCE_H_

#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "zxml/date_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace reference {

inline void convertValue(TagTree& tree, const PlistValue& v, const std::string& path, bool top,
                         bool named_list) {
  using Kind = PlistValue::Kind;
  for (size_t i = 0; v.isDictionary() && i < v.entries().size(); ++i) {
    const PlistEntry& e = v.entries()[i];
    std::string item = path + "/item" + std::to_string(i);
    if (!named_list) {
      bool named = e.key == "spfirewall_applications" || e.key == "spfirewall_services";
      convertValue(tree, e.value, path + "/" + PlistConverter::sanitizeKey(e.key), false, named);
    } else if (e.value.isString()) {
      tree.setValue(item + "/_name", TagValue(e.key));
      tree.setValue(item + "/value", TagValue(e.value.text()));
    }
  }
  for (size_t i = 0; v.isArray() && i < v.items().size(); ++i)
    convertValue(tree, v.items()[i], path + "/item" + std::to_string(i), false, false);
  std::string date = v.kind() == Kind::kDate ? formatLocalDate(v.integer(), true) : "";
  if (v.kind() == Kind::kString) tree.setValue(path, TagValue(v.text()));
  if (v.kind() == Kind::kInteger)
    tree.setValue(path, top ? TagValue(std::to_string(v.integer())) : TagValue(v.integer()));
  if (v.kind() == Kind::kReal) tree.setValue(path, TagValue(v.real()));
  if (!date.empty()) tree.setValue(path, TagValue(date));
}

inline void convertPlist(TagTree& tree, const PlistValue& root) {
  for (size_t i = 0; root.isArray() && i < root.items().size(); ++i) {
    const PlistValue* type = root.items()[i].find("_dataType");
    if (!type || !type->isString() || type->text() == "SPLogsDataType" ||
        type->text() == "SPFontsDataType")
      continue;
    for (const PlistEntry& e : root.items()[i].entries()) {
      if (e.key == "_dataType" || e.key == "_detailLevel" || e.key == "_properties") continue;
      convertValue(tree, e.value,
                   "/" + std::string(type->text()) + "/" + PlistConverter::sanitizeKey(e.key), true,
                   false);
    }
  }
}

}  // namespace reference
}  // namespace cvn

#endif  // CVN_FUZZ_PLIST_PATH_REFERENCE_H_
