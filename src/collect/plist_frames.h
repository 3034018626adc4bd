// The containers the property-list reader holds open, seen only by its own
// files.
#ifndef CVN_COLLECT_PLIST_FRAMES_H_
#define CVN_COLLECT_PLIST_FRAMES_H_

#include <cstddef>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "collect/plist.h"
#include "collect/plist_builder.h"
#include "zxml/arena.h"

namespace cvn {

struct PlistFrame {
  static constexpr size_t kIndexThreshold = 16;

  bool is_array = false;
  std::vector<PlistValue> items;
  std::vector<PlistEntry> entries;
  std::string_view key;  // in the arena
  bool has_key = false;
  bool key_refused = false;
  // Key positions, kept once a dictionary outgrows a linear search.
  bool indexed = false;
  std::unordered_map<std::string_view, size_t> index;

  /// Adds an entry to the dictionary; a repeated key keeps its first
  /// position and takes the last value.
  void insert(std::string_view entry_key, const PlistValue& value) {
    if (indexed) {
      auto [found, added] = index.try_emplace(entry_key, entries.size());
      if (!added) {
        entries[found->second].value = value;
        return;
      }
    } else {
      for (PlistEntry& entry : entries) {
        if (entry.key == entry_key) {
          entry.value = value;
          return;
        }
      }
    }
    entries.push_back(PlistEntry{entry_key, value});
    if (!indexed && entries.size() > kIndexThreshold) {
      indexed = true;
      for (size_t i = 0; i < entries.size(); ++i) index.emplace(entries[i].key, i);
    }
  }
};

// The open containers. A frame's lists are filled in place and keep their
// room when the container closes: the next container at that depth grows
// into it, and each closed container gets one list of its exact size in the
// arena. A list growing one entry at a time instead allocated and moved its
// entries several times for every dictionary of the document.
class PlistFrameStack {
 public:
  bool empty() const { return depth_ == 0; }
  size_t size() const { return depth_; }
  PlistFrame& back() { return frames_[depth_ - 1]; }

  void push(bool is_array) {
    if (depth_ == frames_.size()) frames_.emplace_back();
    PlistFrame& frame = frames_[depth_++];
    frame.is_array = is_array;
    frame.items.clear();
    frame.entries.clear();
    frame.key = std::string_view();
    frame.has_key = false;
    frame.key_refused = false;
    if (frame.indexed) frame.index.clear();
    frame.indexed = false;
  }

  PlistValue pop(Arena& arena) {
    PlistFrame& frame = frames_[--depth_];
    if (frame.is_array) {
      PlistValue value = PlistBuilder::array(copyList(frame.items, arena), frame.items.size());
      frame.items.clear();
      return value;
    }
    PlistValue value =
        PlistBuilder::dictionary(copyList(frame.entries, arena), frame.entries.size());
    frame.entries.clear();
    return value;
  }

 private:
  template <typename T>
  static const T* copyList(const std::vector<T>& list, Arena& arena) {
    if (list.empty()) return nullptr;
    T* copy = static_cast<T*>(arena.allocate(sizeof(T) * list.size(), alignof(T)));
    std::uninitialized_copy(list.begin(), list.end(), copy);
    return copy;
  }

  std::vector<PlistFrame> frames_;
  size_t depth_ = 0;
};

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_FRAMES_H_
