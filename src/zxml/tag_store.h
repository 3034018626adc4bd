// Seen only by the tag tree's own files (zxml/tag).
#ifndef CVN_ZXML_TAG_STORE_H_
#define CVN_ZXML_TAG_STORE_H_

#include <cstdint>
#include <cstring>
#include <new>
#include <string_view>

#include "zxml/arena.h"
#include "zxml/tag.h"

namespace cvn {

// What every tag of one tree shares: the arena that holds them, and one copy
// of each short property name and note that the tree repeats (a raw tree of
// many applications names the same seven keys in every item).
class TagStore {
 public:
  Arena& arena() { return arena_; }

  /// A counted copy of a tag's name; tag names rarely repeat.
  TagName name(std::string_view text) { return TagName(arena_.copyCountedText(text)); }
  /// A counted copy of a property's name, shared with earlier equal ones.
  TagName sharedName(std::string_view text) { return TagName(shared_.share(text, arena_)); }
  /// An annotation's key or text, shared with earlier equal ones.
  std::string_view text(std::string_view text) { return shared_.share(text, arena_); }

  TagList<Annotation>* newAnnotationList() { return arena_.make<TagList<Annotation>>(); }

 private:
  Arena arena_;
  SharedTexts shared_;
};

template <typename T>
void TagList<T>::push(TagStore& store, const T& item) {
  if (this->size_ == capacity_) {
    if (capacity_ == UINT32_MAX) throw std::bad_alloc();
    uint32_t capacity = capacity_ == 0               ? 4
                        : capacity_ > UINT32_MAX / 2 ? UINT32_MAX
                                                     : capacity_ * 2;
    T* data = static_cast<T*>(store.arena().allocate(sizeof(T) * capacity, alignof(T)));
    if (this->size_) std::memcpy(static_cast<void*>(data), this->data_, sizeof(T) * this->size_);
    this->data_ = data;
    capacity_ = capacity;
  }
  this->data_[this->size_++] = item;
}

}  // namespace cvn

#endif  // CVN_ZXML_TAG_STORE_H_
