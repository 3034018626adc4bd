#include "collect/plist.h"

namespace cvn {

const PlistValue* PlistValue::find(std::string_view key) const {
  if (kind != Kind::kDictionary) return nullptr;
  for (const PlistEntry& entry : dictionary)
    if (entry.key == key) return &entry.value;
  return nullptr;
}

const std::string* PlistValue::findText(std::string_view key) const {
  const PlistValue* value = find(key);
  return value && value->isString() ? &value->text : nullptr;
}

const PlistValue* PlistValue::findArray(std::string_view key) const {
  const PlistValue* value = find(key);
  return value && value->isArray() ? value : nullptr;
}

const PlistValue* PlistValue::findDictionary(std::string_view key) const {
  const PlistValue* value = find(key);
  return value && value->isDictionary() ? value : nullptr;
}

std::string PlistValue::textAt(std::string_view key) const {
  const std::string* text = findText(key);
  return text ? *text : std::string();
}

std::string PlistValue::numberTextAt(std::string_view key) const {
  const PlistValue* value = find(key);
  if (!value) return std::string();
  if (value->kind == Kind::kInteger) return std::to_string(value->integer);
  return value->isString() ? value->text : std::string();
}

const PlistValue* findProfilerItems(const PlistValue& root, std::string_view data_type) {
  if (!root.isArray()) return nullptr;
  for (const PlistValue& entry : root.array) {
    const std::string* type = entry.findText("_dataType");
    if (!type || *type != data_type) continue;
    return entry.findArray("_items");
  }
  return nullptr;
}

const PlistValue* findFirstProfilerItem(const PlistValue& root, std::string_view data_type) {
  const PlistValue* items = findProfilerItems(root, data_type);
  return items && !items->array.empty() ? &items->array.front() : nullptr;
}

}  // namespace cvn
