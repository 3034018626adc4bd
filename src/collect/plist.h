// Property lists as the profiler prints them, read by our own expat-based
// reader on every platform, with the value kinds CoreFoundation gives.
//
// A parsed list is built once and read a few times, and a profiler document
// holds hundreds of thousands of values: every value, key and text lives in
// one arena owned by the root (Plist), and a value is a small handle into it.
#ifndef CVN_COLLECT_PLIST_H_
#define CVN_COLLECT_PLIST_H_

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "zxml/arena.h"

namespace cvn {

struct PlistEntry;
class Plist;
class PlistBuilder;

/// A read-only view of a list of values or entries in a parsed list.
template <typename T>
using PlistRange = ArenaRange<const T>;

/// One property-list value. Dictionaries keep their keys in document order
/// (a repeated key keeps its first position and takes the last value).
///
/// A value refers into the storage of the Plist it belongs to and is valid
/// as long as that Plist (moving the Plist keeps it valid). Every accessor
/// answers for every kind: a value of another kind reads as empty or 0.
class PlistValue {
 public:
  enum class Kind : uint8_t {
    kString,
    kInteger,
    kReal,
    kDate,
    kBoolean,
    kData,
    kArray,
    kDictionary
  };

  /// An empty string. User-provided, not defaulted, so that a const value
  /// can be declared without an initializer (Clang asks for that).
  PlistValue() {}
  PlistValue(const PlistValue&) = default;
  PlistValue& operator=(const PlistValue&) = default;
  // A copy of the root would outlive the storage it refers to.
  PlistValue(const Plist&) = delete;
  PlistValue& operator=(const Plist&) = delete;

  Kind kind() const { return kind_; }
  bool isString() const { return kind_ == Kind::kString; }
  bool isArray() const { return kind_ == Kind::kArray; }
  bool isDictionary() const { return kind_ == Kind::kDictionary; }

  /// kString: the bytes as they are; kData: the decoded bytes.
  std::string_view text() const {
    return kind_ == Kind::kString || kind_ == Kind::kData ? std::string_view(text_, size_)
                                                          : std::string_view();
  }
  /// kInteger: the value (literals up to 2^64-1 keep their low 64 bits);
  /// kDate: seconds since 1970-01-01T00:00:00Z; kBoolean: 0 or 1.
  int64_t integer() const {
    return kind_ == Kind::kInteger || kind_ == Kind::kDate || kind_ == Kind::kBoolean ? integer_
                                                                                      : 0;
  }
  double real() const { return kind_ == Kind::kReal ? real_ : 0.0; }
  /// An array's values.
  PlistRange<PlistValue> items() const;
  /// A dictionary's entries, in document order.
  PlistRange<PlistEntry> entries() const;

  /// Dictionary lookup by exact key; null when absent or not a dictionary.
  const PlistValue* find(std::string_view key) const;
  /// The same, nothing (or null) also when the value there is of another kind.
  std::optional<std::string_view> findText(std::string_view key) const;
  const PlistValue* findArray(std::string_view key) const;
  const PlistValue* findDictionary(std::string_view key) const;
  /// The string at `key`, or empty.
  std::string textAt(std::string_view key) const;
  /// The integer at `key` in decimal, or the string there as it is; empty
  /// for anything else.
  std::string numberTextAt(std::string_view key) const;

 private:
  friend class PlistBuilder;
  friend class Plist;

  union {
    const char* text_ = nullptr;
    const PlistValue* items_;
    const PlistEntry* entries_;
    int64_t integer_;
    double real_;
  };
  size_t size_ = 0;  // bytes of text, values or entries
  Kind kind_ = Kind::kString;
};

struct PlistEntry {
  std::string_view key;
  PlistValue value;
};

inline PlistRange<PlistValue> PlistValue::items() const {
  return isArray() ? PlistRange<PlistValue>(items_, size_) : PlistRange<PlistValue>();
}

inline PlistRange<PlistEntry> PlistValue::entries() const {
  return isDictionary() ? PlistRange<PlistEntry>(entries_, size_) : PlistRange<PlistEntry>();
}

/// A parsed property list: its root value, and the storage of every value,
/// key and text in it. Dropping it frees the whole list at once.
class Plist : public PlistValue {
 public:
  Plist() = default;
  Plist(Plist&& other) noexcept;
  Plist& operator=(Plist&& other) noexcept;
  Plist(const Plist&) = delete;
  Plist& operator=(const Plist&) = delete;

  /// Appends `items`, values of `owner`, to this list's items (this becomes
  /// an empty array first when it is no array) and keeps `owner`'s storage
  /// alive with this list's own, so no value is copied; `owner` is left
  /// empty.
  void appendItems(const std::vector<const PlistValue*>& items, Plist&& owner);

  /// Heap bytes the list holds.
  size_t bytesReserved() const { return arena_.bytesReserved(); }

 private:
  friend class PlistBuilder;

  Arena arena_;
};

/// Parses an XML property list. Returns false (and leaves `out` empty) only
/// when no value could be read at all: the text is not XML, or it breaks
/// before its first value. A document that breaks off or is malformed later
/// keeps every value read before the break (open containers are closed), and
/// a single value CoreFoundation could not read is dropped with its key while
/// the rest is kept. Raw control characters, CR and bytes that are not UTF-8
/// are kept byte for byte in strings and keys. Nothing is ever fetched.
/// `warning`, when given, receives a description of the first problem.
bool parsePlist(std::string_view document, Plist* out, std::string* warning = nullptr);

/// In a profiler document (an array of one dictionary per data type): the
/// "_items" array of the first dictionary whose "_dataType" is `data_type`.
/// Null when there is none or the document has another shape.
const PlistValue* findProfilerItems(const PlistValue& root, std::string_view data_type);
/// The first of those items, or null.
const PlistValue* findFirstProfilerItem(const PlistValue& root, std::string_view data_type);

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_H_
