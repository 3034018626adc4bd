// Seen only by the tag tree's own files (zxml/tag).
#ifndef CVN_ZXML_NAME_INDEX_H_
#define CVN_ZXML_NAME_INDEX_H_

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <functional>
#include <string_view>

#include "zxml/tag.h"
#include "zxml/tag_store.h"

namespace cvn {

// A first-match index over one list of named items: open addressing in the
// tree's arena, each slot a position in the list (plus one; zero is empty)
// beside 32 bits of the name's hash, so that a probe rarely has to look at
// a name. Kept at most half full.
class NameIndex {
 public:
  template <typename T>
  void build(TagStore& store, const TagList<T*>& list) {
    uint32_t slots = 64;
    while (slots / 2 <= list.size()) slots *= 2;
    slots_ = static_cast<uint64_t*>(store.arena().allocate(sizeof(uint64_t) * slots, 8));
    std::memset(slots_, 0, sizeof(uint64_t) * slots);
    mask_ = slots - 1;
    count_ = 0;
    for (size_t i = 0; i < list.size(); ++i) insert(store, list, i);
  }

  template <typename T>
  T* find(const TagList<T*>& list, std::string_view name) const {
    const size_t hash = std::hash<std::string_view>()(name);
    const uint32_t tag = static_cast<uint32_t>(hash >> 32);
    for (size_t at = hash & mask_;; at = (at + 1) & mask_) {
      const uint64_t slot = slots_[at];
      if (slot == 0) return nullptr;
      if (static_cast<uint32_t>(slot >> 32) != tag) continue;
      T* item = list[static_cast<uint32_t>(slot) - 1];
      if (item->name() == name) return item;
    }
  }

  /// Indexes the item at `position`, unless an earlier one has its name.
  template <typename T>
  void insert(TagStore& store, const TagList<T*>& list, size_t position) {
    if ((count_ + 1) * 2 > mask_ + 1) {
      build(store, list);  // the new item is in the list already
      return;
    }
    std::string_view name = list[position]->name();
    const size_t hash = std::hash<std::string_view>()(name);
    const uint32_t tag = static_cast<uint32_t>(hash >> 32);
    size_t at = hash & mask_;
    for (;; at = (at + 1) & mask_) {
      const uint64_t slot = slots_[at];
      if (slot == 0) break;
      if (static_cast<uint32_t>(slot >> 32) == tag &&
          list[static_cast<uint32_t>(slot) - 1]->name() == name)
        return;
    }
    slots_[at] = (uint64_t{tag} << 32) | static_cast<uint64_t>(position + 1);
    ++count_;
  }

 private:
  uint64_t* slots_ = nullptr;
  uint32_t mask_ = 0;
  uint32_t count_ = 0;
};

}  // namespace cvn

#endif  // CVN_ZXML_NAME_INDEX_H_
