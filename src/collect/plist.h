// Property lists as the profiler prints them, read by our own expat-based
// reader on every platform, with the value kinds CoreFoundation gives.
#ifndef CVN_COLLECT_PLIST_H_
#define CVN_COLLECT_PLIST_H_

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cvn {

struct PlistEntry;

/// One property-list value. Dictionaries keep their keys in document order
/// (a repeated key keeps its first position and takes the last value).
struct PlistValue {
  enum class Kind { kString, kInteger, kReal, kDate, kBoolean, kData, kArray, kDictionary };

  Kind kind = Kind::kString;
  /// kString: the bytes as they are; kData: the decoded bytes.
  std::string text;
  /// kInteger: the value (literals up to 2^64-1 keep their low 64 bits);
  /// kDate: seconds since 1970-01-01T00:00:00Z; kBoolean: 0 or 1.
  int64_t integer = 0;
  /// kReal.
  double real = 0.0;
  std::vector<PlistValue> array;
  std::vector<PlistEntry> dictionary;

  bool isString() const { return kind == Kind::kString; }
  bool isArray() const { return kind == Kind::kArray; }
  bool isDictionary() const { return kind == Kind::kDictionary; }
  /// Dictionary lookup by exact key; null when absent or not a dictionary.
  const PlistValue* find(std::string_view key) const;
  /// The same, null also when the value there is of another kind.
  const std::string* findText(std::string_view key) const;
  const PlistValue* findArray(std::string_view key) const;
  const PlistValue* findDictionary(std::string_view key) const;
  /// The string at `key`, or empty.
  std::string textAt(std::string_view key) const;
  /// The integer at `key` in decimal, or the string there as it is; empty
  /// for anything else.
  std::string numberTextAt(std::string_view key) const;
};

struct PlistEntry {
  std::string key;
  PlistValue value;
};

/// Parses an XML property list. Returns false (and leaves `out` empty) only
/// when no value could be read at all: the text is not XML, or it breaks
/// before its first value. A document that breaks off or is malformed later
/// keeps every value read before the break (open containers are closed), and
/// a single value CoreFoundation could not read is dropped with its key while
/// the rest is kept. Raw control characters, CR and bytes that are not UTF-8
/// are kept byte for byte in strings and keys. Nothing is ever fetched.
/// `warning`, when given, receives a description of the first problem.
bool parsePlist(std::string_view document, PlistValue* out, std::string* warning = nullptr);

/// In a profiler document (an array of one dictionary per data type): the
/// "_items" array of the first dictionary whose "_dataType" is `data_type`.
/// Null when there is none or the document has another shape.
const PlistValue* findProfilerItems(const PlistValue& root, std::string_view data_type);
/// The first of those items, or null.
const PlistValue* findFirstProfilerItem(const PlistValue& root, std::string_view data_type);

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_H_
