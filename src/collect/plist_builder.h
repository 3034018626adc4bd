// Seen only by the property-list reader's own files.
#ifndef CVN_COLLECT_PLIST_BUILDER_H_
#define CVN_COLLECT_PLIST_BUILDER_H_

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <utility>

#include "collect/plist.h"
#include "zxml/arena.h"

namespace cvn {

// The reader's access to the handles' insides; texts and lists given to it
// already live in the arena that ends up in the Plist.
class PlistBuilder {
 public:
  using Kind = PlistValue::Kind;

  static PlistValue text(Kind kind, std::string_view text) {
    PlistValue value;
    value.kind_ = kind;
    value.text_ = text.data();
    value.size_ = text.size();
    return value;
  }
  static PlistValue number(Kind kind, int64_t number) {
    PlistValue value;
    value.kind_ = kind;
    value.integer_ = number;
    return value;
  }
  static PlistValue real(double real) {
    PlistValue value;
    value.kind_ = Kind::kReal;
    value.real_ = real;
    return value;
  }
  static PlistValue array(const PlistValue* items, size_t size) {
    PlistValue value;
    value.kind_ = Kind::kArray;
    value.items_ = items;
    value.size_ = size;
    return value;
  }
  static PlistValue dictionary(const PlistEntry* entries, size_t size) {
    PlistValue value;
    value.kind_ = Kind::kDictionary;
    value.entries_ = entries;
    value.size_ = size;
    return value;
  }
  static void take(const PlistValue& root, Arena&& arena, Plist* out) {
    static_cast<PlistValue&>(*out) = root;
    out->arena_ = std::move(arena);
  }
};

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_BUILDER_H_
