// The raw-tree conversion done the plain way: every leaf stored through
// TagTree::setValue with its full path. The converter walks with a cursor
// instead; tests and the fuzzer check that both give the same tree.
#ifndef CVN_TESTS_PLIST_PATH_REFERENCE_H_
#define CVN_TESTS_PLIST_PATH_REFERENCE_H_

#include <cstdio>
#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "zxml/date_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace reference {

inline void storeLeaf(TagTree& tree, const std::string& path, const PlistValue& v, bool top) {
  switch (v.kind) {
    case PlistValue::Kind::kString:
      tree.setValue(path, TagValue(v.text));
      break;
    case PlistValue::Kind::kInteger:
      if (top) {
        char buf[32];
        std::snprintf(buf, sizeof buf, "%lld", static_cast<long long>(v.integer));
        tree.setValue(path, TagValue(buf));
      } else {
        tree.setValue(path, TagValue(v.integer));
      }
      break;
    case PlistValue::Kind::kReal:
      tree.setValue(path, TagValue(v.real));
      break;
    case PlistValue::Kind::kDate: {
      std::string text = formatLocalDate(v.integer, true);
      if (!text.empty()) tree.setValue(path, TagValue(text));
      break;
    }
    default:
      break;
  }
}

inline void convertValue(TagTree& tree, const PlistValue& v, const std::string& path, bool top,
                         bool named_list);

inline void convertDictionary(TagTree& tree, const PlistValue& d, const std::string& path) {
  for (const PlistEntry& e : d.dictionary) {
    bool named = e.key == "spfirewall_applications" || e.key == "spfirewall_services";
    convertValue(tree, e.value, path + "/" + PlistConverter::sanitizeKey(e.key), false, named);
  }
}

inline void convertValue(TagTree& tree, const PlistValue& v, const std::string& path, bool top,
                         bool named_list) {
  if (v.isDictionary() && named_list) {
    for (size_t i = 0; i < v.dictionary.size(); ++i) {
      const PlistEntry& e = v.dictionary[i];
      if (!e.value.isString()) continue;
      std::string item = path + "/item" + std::to_string(i);
      tree.setValue(item + "/_name", TagValue(e.key));
      tree.setValue(item + "/value", TagValue(e.value.text));
    }
  } else if (v.isDictionary()) {
    convertDictionary(tree, v, path);
  } else if (v.isArray()) {
    for (size_t i = 0; i < v.array.size(); ++i)
      convertValue(tree, v.array[i], path + "/item" + std::to_string(i), false, false);
  } else {
    storeLeaf(tree, path, v, top);
  }
}

inline void convertPlist(TagTree& tree, const PlistValue& root) {
  if (!root.isArray()) return;
  for (const PlistValue& element : root.array) {
    const PlistValue* type = element.find("_dataType");
    if (!type || !type->isString() || type->text == "SPLogsDataType" ||
        type->text == "SPFontsDataType")
      continue;
    for (const PlistEntry& e : element.dictionary) {
      if (e.key == "_dataType" || e.key == "_detailLevel" || e.key == "_properties") continue;
      convertValue(tree, e.value, "/" + type->text + "/" + PlistConverter::sanitizeKey(e.key), true,
                   false);
    }
  }
}

}  // namespace reference
}  // namespace cvn

#endif  // CVN_TESTS_PLIST_PATH_REFERENCE_H_
