#include "sections/builder_util.h"

#include <cstdio>

#include "zxml/size_text.h"

namespace cvn {

const Tag* findItems(const TagTree& raw, std::string_view data_type) {
  const Tag* type = raw.top().findChild(data_type);
  return type ? type->findChild("_items") : nullptr;
}

const Tag* findFirstItem(const TagTree& raw, std::string_view data_type) {
  const Tag* items = findItems(raw, data_type);
  return items ? items->firstChild() : nullptr;
}

size_t itemPosition(const Tag& item, size_t index) {
  std::string_view name = item.name();
  constexpr std::string_view kPrefix = "item";
  if (name.size() <= kPrefix.size() || name.substr(0, kPrefix.size()) != kPrefix) return index;
  std::string_view digits = name.substr(kPrefix.size());
  // Nine digits keep the arithmetic far from overflow; no array is that long.
  if (digits.size() > 9) return index;
  size_t position = 0;
  for (char c : digits) {
    if (c < '0' || c > '9') return index;
    position = position * 10 + static_cast<size_t>(c - '0');
  }
  return position;
}

const TagValue* rawValue(const Tag& item, std::string_view key) {
  const TagProperty* p = item.findProperty(key);
  return p ? &p->value() : nullptr;
}

std::string_view rawText(const Tag& item, std::string_view key) {
  const TagValue* v = rawValue(item, key);
  return v ? v->text() : std::string_view();
}

bool hasKey(const Tag& item, std::string_view key) { return item.findProperty(key) != nullptr; }

bool isUnifiedMemory(const Tag& item) {
  return hasKey(item, "SPMemoryDataType") && !item.findChild("_items");
}

void copyField(Tag& record, std::string_view field, const Tag& item, std::string_view key) {
  const TagValue* v = rawValue(item, key);
  record.setProperty(field, v ? *v : TagValue());
}

void copyFieldIfPresent(Tag& record, std::string_view field, const Tag& item,
                        std::string_view key) {
  if (const TagValue* v = rawValue(item, key)) record.setProperty(field, *v);
}

std::string flagText(std::string_view text, std::string_view yes) {
  return text == yes ? "1" : "0";
}

int64_t truncateToInt64(double value) {
  // 2^63 is exact as a double; NaN fails both comparisons.
  constexpr double kLimit = 9223372036854775808.0;
  if (!(value >= -kLimit && value < kLimit)) return 0;
  return static_cast<int64_t>(value);
}

int64_t sizeInMegabytes(std::string_view size_text) {
  double mb = SizeText::toGigabytes(size_text) * 1024.0;
  // The range test comes before the narrowing: a double beyond the float
  // range must not be converted to float at all.
  constexpr double kLimit = 9.2e18;
  if (!(mb > -kLimit && mb < kLimit)) return 0;
  return truncateToInt64(static_cast<float>(mb));
}

Tag& addComplexRecord(Tag& parent, std::string_view name) {
  parent.setProperty(name, TagValue(""), "complex", "");
  return parent.addChild(name);
}

}  // namespace cvn
