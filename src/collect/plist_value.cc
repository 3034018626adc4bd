#include "collect/plist.h"

#include <memory>
#include <new>
#include <utility>

namespace cvn {

// A profiler document holds a value for every few dozen bytes; their handles
// are most of a parsed list.
static_assert(sizeof(PlistValue) <= 24, "a value is a kind, a size and one word");
static_assert(sizeof(PlistEntry) <= 40, "an entry is a key view and a value");

const PlistValue* PlistValue::find(std::string_view key) const {
  for (const PlistEntry& entry : entries())
    if (entry.key == key) return &entry.value;
  return nullptr;
}

std::optional<std::string_view> PlistValue::findText(std::string_view key) const {
  const PlistValue* value = find(key);
  if (!value || !value->isString()) return std::nullopt;
  return value->text();
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
  return std::string(findText(key).value_or(std::string_view()));
}

std::string PlistValue::numberTextAt(std::string_view key) const {
  const PlistValue* value = find(key);
  if (!value) return std::string();
  if (value->kind() == Kind::kInteger) return std::to_string(value->integer());
  return std::string(value->isString() ? value->text() : std::string_view());
}

Plist::Plist(Plist&& other) noexcept
    : PlistValue(static_cast<const PlistValue&>(other)), arena_(std::move(other.arena_)) {
  static_cast<PlistValue&>(other) = PlistValue();
}

Plist& Plist::operator=(Plist&& other) noexcept {
  if (this != &other) {
    static_cast<PlistValue&>(*this) = static_cast<const PlistValue&>(other);
    arena_ = std::move(other.arena_);
    static_cast<PlistValue&>(other) = PlistValue();
  }
  return *this;
}

void Plist::appendItems(const std::vector<const PlistValue*>& items, Plist&& owner) {
  if (&owner == this) return;
  const PlistRange<PlistValue> old = this->items();
  PlistValue* list = static_cast<PlistValue*>(
      arena_.allocate(sizeof(PlistValue) * (old.size() + items.size()), alignof(PlistValue)));
  PlistValue* next = std::uninitialized_copy(old.begin(), old.end(), list);
  for (const PlistValue* item : items) new (next++) PlistValue(*item);
  arena_.adopt(std::move(owner.arena_));
  static_cast<PlistValue&>(owner) = PlistValue();
  kind_ = Kind::kArray;
  items_ = list;
  size_ = old.size() + items.size();
}

const PlistValue* findProfilerItems(const PlistValue& root, std::string_view data_type) {
  for (const PlistValue& entry : root.items()) {
    std::optional<std::string_view> type = entry.findText("_dataType");
    if (!type || *type != data_type) continue;
    return entry.findArray("_items");
  }
  return nullptr;
}

const PlistValue* findFirstProfilerItem(const PlistValue& root, std::string_view data_type) {
  const PlistValue* items = findProfilerItems(root, data_type);
  return items && !items->items().empty() ? &items->items().front() : nullptr;
}

}  // namespace cvn
