// Turns the parsed profiler property list into the raw tag tree that every
// section builder reads: one property per leaf, addressed by the path of
// data type, sanitised keys and numbered array items.
#ifndef CVN_COLLECT_PLIST_CONVERTER_H_
#define CVN_COLLECT_PLIST_CONVERTER_H_

#include <cstddef>
#include <deque>
#include <string>
#include <string_view>

#include "collect/plist.h"
#include "zxml/tag.h"

namespace cvn {

class PlistConverter {
 public:
  /// Values are stored into `tree` (normally the empty raw tree "Macintosh").
  explicit PlistConverter(TagTree& tree) : tree_(tree) {}

  /// The entry point: `root` is the array of data-type dictionaries. Each
  /// dictionary lands under "/<data type>" with its direct keys except
  /// "_dataType", "_detailLevel" and "_properties"; "SPLogsDataType" and
  /// "SPFontsDataType" are skipped. Anything that is not an array gives
  /// nothing.
  void convertPlist(const PlistValue& root);

  /// The walkers store the leaves of `value` below `path` ("/a/b" starts at
  /// the top tag, as TagTree::setValue reads it). Integers become 64-bit
  /// integer values here, where the top level stores them as "%lld" text.
  void convertDictionary(const PlistValue& dictionary, std::string_view path);
  void convertArray(const PlistValue& array, std::string_view path);
  /// A dictionary from a name to a state (the firewall's application and
  /// service lists): entry i becomes "item<i>" with "_name" and "value";
  /// entries that are not strings keep their number but store nothing.
  void convertNamedList(const PlistValue& dictionary, std::string_view path);

  /// The key with each of ' space / , U+2019 U+2018 U+201B replaced by "_".
  static std::string sanitizeKey(std::string_view key);

 private:
  struct Node;

  void chainFor(std::string_view path, std::deque<Node>& chain);
  void walkValue(const PlistValue& value, Node& parent, std::string name, size_t depth);
  void walkDictionary(const PlistValue& dictionary, Node& node, size_t depth);
  void walkArray(const PlistValue& array, Node& node, size_t depth);
  void walkNamedList(const PlistValue& dictionary, Node& node);

  TagTree& tree_;
};

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_CONVERTER_H_
