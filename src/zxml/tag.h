// The tag tree: the one data model of the agent. Every piece of collected
// information (the raw profiler tree, each inventory section, the asset
// section) is a TagTree of named Tags carrying typed values, ordered
// properties and ordered annotations.
#ifndef CVN_ZXML_TAG_H_
#define CVN_ZXML_TAG_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <type_traits>
#include <unordered_map>
#include <vector>

namespace cvn {

/// A small tagged union: none, boolean, signed 64-bit integer, double or
/// owned text. Copied by value.
class TagValue {
 public:
  enum class Type : uint8_t { kNone = 0, kBool = 1, kInt = 2, kReal = 3, kText = 4 };

  TagValue() = default;
  explicit TagValue(bool b) : type_(Type::kBool), int_(b ? 1 : 0) {}
  template <typename T, std::enable_if_t<std::is_integral_v<T> && !std::is_same_v<T, bool> &&
                                             !std::is_same_v<T, char>,
                                         int> = 0>
  TagValue(T i) : type_(Type::kInt), int_(static_cast<int64_t>(i)) {}
  TagValue(double d) : type_(Type::kReal), real_(d) {}
  /// A null pointer gives the empty text (type text, not none).
  TagValue(const char* s) : type_(Type::kText), text_(s ? s : "") {}
  TagValue(std::string s) : type_(Type::kText), text_(std::move(s)) {}
  TagValue(std::string_view s) : type_(Type::kText), text_(s) {}

  TagValue(const TagValue&) = default;
  TagValue(TagValue&&) = default;
  /// Assignment from a value of type none leaves this value untouched; only
  /// clear() empties a value.
  TagValue& operator=(const TagValue& other);
  TagValue& operator=(TagValue&& other);

  void clear();

  Type type() const { return type_; }
  bool isNone() const { return type_ == Type::kNone; }
  bool isText() const { return type_ == Type::kText; }
  bool isInt() const { return type_ == Type::kInt; }
  bool isReal() const { return type_ == Type::kReal; }
  bool isBool() const { return type_ == Type::kBool; }

  bool asBool() const { return int_ != 0; }
  int64_t asInt() const { return int_; }
  double asReal() const { return real_; }
  /// The stored text; empty for any other type.
  const std::string& text() const { return text_; }

  /// Length of textForm() without formatting it into a string.
  size_t textLength() const;
  /// Writes the text form ("true"/"false", "%lld", "%.2lf", the bytes of the
  /// text) at `out`, which must have room for textLength() + 1 bytes.
  size_t writeText(char* out) const;
  std::string textForm() const;
  /// Debug aid.
  void printToStderr() const;

  bool operator==(const TagValue& other) const;
  bool operator!=(const TagValue& other) const { return !(*this == other); }

 private:
  Type type_ = Type::kNone;
  int64_t int_ = 0;
  double real_ = 0.0;
  std::string text_;
};

struct Annotation {
  std::string key;
  std::string text;
  bool operator==(const Annotation& o) const { return key == o.key && text == o.text; }
};

/// A named leaf datum owned by a tag.
class TagProperty {
 public:
  explicit TagProperty(std::string name) : name_(std::move(name)) {}

  const std::string& name() const { return name_; }
  const TagValue& value() const { return value_; }
  TagValue& value() { return value_; }
  const std::vector<Annotation>& annotations() const { return annotations_; }

  void setValue(const TagValue& v) { value_ = v; }
  void setValue(TagValue&& v) { value_ = std::move(v); }
  void addAnnotation(std::string key, std::string text);
  /// Replaces the text of the first annotation with `key`, or appends one.
  void setAnnotation(std::string_view key, std::string_view text);
  const Annotation* findAnnotation(std::string_view key) const;

 private:
  std::string name_;
  TagValue value_;
  std::vector<Annotation> annotations_;
};

/// Lookups by name are linear in meaning (the first match wins, duplicates
/// are possible); large lists keep a first-match index so that big sections
/// stay linear to build.
class Tag {
 public:
  enum class Kind : uint32_t { kDocument = 0, kLeaf = 1, kBranch = 2 };

  Tag(Kind kind, std::string name);
  Tag(const Tag&) = delete;
  Tag& operator=(const Tag&) = delete;

  Kind kind() const { return kind_; }
  const std::string& name() const { return name_; }
  /// Null when the tag has no value (dumped as an empty value).
  const TagValue* value() const { return value_.get(); }
  const std::vector<std::unique_ptr<Tag>>& children() const { return children_; }
  const std::vector<std::unique_ptr<TagProperty>>& properties() const { return properties_; }
  const std::vector<Annotation>& annotations() const { return annotations_; }

  Tag* findChild(std::string_view name) const;
  TagProperty* findProperty(std::string_view name) const;
  /// First child, or null.
  Tag* firstChild() const { return children_.empty() ? nullptr : children_.front().get(); }

  /// Get-or-add: the existing child of that name, else a new leaf child.
  Tag& addChild(std::string_view name);
  /// addChild(name), and the child counts as a branch from now on, as a
  /// path step through it leaves it, even while it holds only properties.
  Tag& addBranch(std::string_view name);
  /// addChild(name), then the child's value becomes a copy of `value`.
  Tag& setChildValue(std::string_view name, const TagValue& value);
  void setValue(const TagValue& value);
  /// Assigns the value of the existing property, or appends a new one that
  /// carries the annotation (note_key, note_text) when both are non-null.
  TagProperty& setProperty(std::string_view name, const TagValue& value,
                           const char* note_key = nullptr, const char* note_text = nullptr);
  /// The same, taking the value over instead of copying it.
  TagProperty& setProperty(std::string_view name, TagValue&& value);
  void addAnnotation(std::string key, std::string text);
  /// The first "<base><N>" for N = 1, 2, ... that no child bears.
  std::string nextNumberedName(std::string_view base) const;

  /// The path setter: every segment but the last is a tag (created on
  /// demand, turning leaves into branches); the last segment is a property.
  /// A leading "/" steps into the first child. With both notes non-null the
  /// property's annotation `note_key` gets `note_text` (replaced or added).
  TagProperty& setPropertyByPath(std::string_view path, const TagValue& value,
                                 const char* note_key = nullptr, const char* note_text = nullptr);
  /// Annotates the tag named by `path`. Creates nothing. After each
  /// intermediate segment the walk continues in that child's *first child*
  /// ("a/b" annotates the b found under the first child of a).
  void annotateByPath(std::string_view path, const std::string& key, const std::string& text);
  /// Annotates the first property named by the last segment; intermediate
  /// segments are children. Creates nothing.
  void annotatePropertyByPath(std::string_view path, const std::string& key,
                              const std::string& text);

  /// Deep copy of `other` into this tag: kind, name, value, annotations,
  /// then every property and every child, in order. Replaces what this tag
  /// held. Must not be called on a tag that is listed in a parent under a
  /// different name than `other`'s.
  void copyFrom(const Tag& other);

  /// Appends a deep copy of `other` as a new last child (no name lookup).
  Tag& appendCopyOf(const Tag& other);

 private:
  static constexpr size_t kIndexThreshold = 16;

  Tag& appendChild(std::string_view name);
  void makeBranch();
  Tag* stepInto(std::string_view segment, bool create);

  Kind kind_;
  std::string name_;
  std::unique_ptr<TagValue> value_;
  std::vector<std::unique_ptr<Tag>> children_;
  std::vector<std::unique_ptr<TagProperty>> properties_;
  std::vector<Annotation> annotations_;
  TagProperty& appendProperty(std::string_view name);

  // First-match indexes, built once a list grows past kIndexThreshold; most
  // tags never need one, so they cost a pointer until then. The keys view
  // the names the children and properties own: those live on the heap and
  // keep their names, so a lookup or an insert copies no text.
  std::unique_ptr<std::unordered_map<std::string_view, Tag*>> child_index_;
  std::unique_ptr<std::unordered_map<std::string_view, TagProperty*>> property_index_;
};

/// Names for the flags of dumpText, serialise and SnapshotFile::addTree, so
/// that calls read as what they ask for.
inline constexpr bool kCloseTags = false;
inline constexpr bool kLeaveTagsOpen = true;
inline constexpr bool kWithChildren = false;
inline constexpr bool kWithoutChildren = true;
inline constexpr bool kWholeText = false;
inline constexpr bool kSplitSections = true;
inline constexpr bool kCompressed = true;
inline constexpr bool kUncompressed = false;

/// An unnamed document tag whose first child is the top tag ("Macintosh",
/// "Snapshot", "AssetInfo"). Serialising lives in zxml/zXML.
class TagTree {
 public:
  /// `native_byte_order` selects the byte order of the split-mode trailer.
  TagTree(bool native_byte_order, std::string_view top_name);
  TagTree(const TagTree& other);
  TagTree& operator=(const TagTree&) = delete;

  Tag& document() { return *document_; }
  const Tag& document() const { return *document_; }
  /// The top tag (first child of the document).
  Tag& top() { return *document_->firstChild(); }
  const Tag& top() const { return *document_->firstChild(); }
  bool nativeByteOrder() const { return native_byte_order_; }

  TagProperty& setValue(std::string_view path, const TagValue& value,
                        const char* note_key = nullptr, const char* note_text = nullptr);

  /// An upper estimate of the ZXML text length (zxml/zXML).
  size_t textSize() const;
  /// Writes the ZXML text at `buffer + offset` (which must hold textSize()
  /// bytes) and returns the bytes written. The flags apply to the document's
  /// direct children only.
  size_t dumpText(char* buffer, size_t offset, bool no_close, bool no_children) const;
  /// The whole tree as a block: ZXML text, optionally split into sections and
  /// compressed, with the trailer. The caller owns the bytes.
  std::vector<uint8_t> serialise(bool compressed, bool split) const;

 private:
  bool native_byte_order_;
  std::unique_ptr<Tag> document_;
};

}  // namespace cvn

#endif  // CVN_ZXML_TAG_H_
