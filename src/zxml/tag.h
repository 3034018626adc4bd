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
#include <vector>

#include "zxml/arena.h"

namespace cvn {

class TagStore;

/// A small tagged union: none, boolean, signed 64-bit integer, double or
/// text. A value on its own owns its text (short texts sit inside it); a
/// value stored in a tree keeps its text in the tree's arena.
class TagValue {
 public:
  enum class Type : uint8_t { kNone = 0, kBool = 1, kInt = 2, kReal = 3, kText = 4 };

  TagValue() : int_(0) {}
  explicit TagValue(bool b) : int_(b ? 1 : 0), type_(Type::kBool) {}
  template <typename T, std::enable_if_t<std::is_integral_v<T> && !std::is_same_v<T, bool> &&
                                             !std::is_same_v<T, char>,
                                         int> = 0>
  TagValue(T i) : int_(static_cast<int64_t>(i)), type_(Type::kInt) {}
  TagValue(double d) : real_(d), type_(Type::kReal) {}
  /// A null pointer gives the empty text (type text, not none).
  TagValue(const char* s) : TagValue(std::string_view(s ? s : "")) {}
  TagValue(const std::string& s) : TagValue(std::string_view(s)) {}
  TagValue(std::string_view s);
  /// A text value that only refers to `text`, for handing a text straight
  /// to a setter without copying it first: it must not outlive `text`.
  /// Copies of it own their text.
  static TagValue viewOf(std::string_view text);

  TagValue(const TagValue& other);
  TagValue(TagValue&& other) noexcept;
  /// Assignment from a value of type none leaves this value untouched; only
  /// clear() empties a value.
  TagValue& operator=(const TagValue& other);
  TagValue& operator=(TagValue&& other) noexcept;
  ~TagValue() { releaseText(); }

  void clear();

  Type type() const { return type_; }
  bool isNone() const { return type_ == Type::kNone; }
  bool isText() const { return type_ == Type::kText; }
  bool isInt() const { return type_ == Type::kInt; }
  bool isReal() const { return type_ == Type::kReal; }
  bool isBool() const { return type_ == Type::kBool; }

  bool asBool() const { return (isBool() || isInt()) && int_ != 0; }
  int64_t asInt() const { return isBool() || isInt() ? int_ : 0; }
  double asReal() const { return isReal() ? real_ : 0.0; }
  /// The stored text; empty for any other type.
  std::string_view text() const {
    if (!isText()) return std::string_view();
    return std::string_view(storage_ == Storage::kInline ? inline_ : text_, size_);
  }

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
  friend class Tag;
  friend class TagProperty;

  // Where a text lives: inside the value, on the heap (owned), or elsewhere
  // (a tree's arena, or the caller's text for viewOf).
  enum class Storage : uint8_t { kInline, kHeap, kElsewhere };
  static constexpr size_t kInlineText = 15;

  /// The copy a tree stores: its text, unless short, copied into `store`.
  static TagValue storedIn(const TagValue& value, TagStore& store);
  void assignText(std::string_view text);
  void copyFrom(const TagValue& other);
  void releaseText();

  union {
    int64_t int_;
    double real_;
    const char* text_;
    char inline_[kInlineText + 1];
  };
  // Texts are cut at 4 GiB - 1 bytes; nothing collected comes near.
  uint32_t size_ = 0;
  Type type_ = Type::kNone;
  Storage storage_ = Storage::kInline;
};

/// A key and a text, both kept by the tree.
struct Annotation {
  std::string_view key;
  std::string_view text;
  bool operator==(const Annotation& o) const { return key == o.key && text == o.text; }
};

/// An ordered list inside a tree's arena, read like a vector. Growing leaves
/// the old room behind in the arena, so the total stays within twice the
/// final size.
template <typename T>
class TagList : public ArenaRange<T, uint32_t> {
  static_assert(std::is_trivially_copyable_v<T>, "a tree's lists hold plain items");

 private:
  friend class Tag;
  friend class TagProperty;
  void push(TagStore& store, const T& item);
  void clear() { this->size_ = 0; }
  T& at(size_t i) { return this->data_[i]; }

  uint32_t capacity_ = 0;
};

/// A name kept by a tree: a pointer to a counted copy (Arena::
/// copyCountedText), so that the millions of names of a large tree take one
/// word each.
class TagName {
 public:
  TagName() = default;
  explicit TagName(std::string_view counted) : bytes_(counted.data()) {}
  std::string_view view() const { return countedText(bytes_); }

 private:
  const char* bytes_ = nullptr;
};

/// A named leaf datum owned by a tag.
class TagProperty {
 public:
  TagProperty(TagStore& store, std::string_view name);
  TagProperty(const TagProperty&) = delete;
  TagProperty& operator=(const TagProperty&) = delete;

  std::string_view name() const { return name_.view(); }
  const TagValue& value() const { return value_; }
  const TagList<Annotation>& annotations() const;

  /// Replaces the value with a copy (a value of type none changes nothing).
  void setValue(const TagValue& v);
  void addAnnotation(std::string_view key, std::string_view text);
  /// Replaces the text of the first annotation with `key`, or appends one.
  void setAnnotation(std::string_view key, std::string_view text);
  const Annotation* findAnnotation(std::string_view key) const;

 private:
  TagStore* store_;
  TagName name_;
  TagValue value_;
  // Most properties have none; the list is made with the first.
  TagList<Annotation>* annotations_ = nullptr;
};

/// Lookups by name are linear in meaning (the first match wins, duplicates
/// are possible); large lists keep a first-match index so that big sections
/// stay linear to build. Tags live in their tree's arena and are made by the
/// tree and by their parents, never on their own.
class Tag {
 public:
  enum class Kind : uint32_t { kDocument = 0, kLeaf = 1, kBranch = 2 };

  Tag(TagStore& store, Kind kind, std::string_view name);
  Tag(const Tag&) = delete;
  Tag& operator=(const Tag&) = delete;

  Kind kind() const { return kind_; }
  std::string_view name() const { return name_.view(); }
  /// Null when the tag has no value (dumped as an empty value).
  const TagValue* value() const { return value_; }
  const TagList<Tag*>& children() const { return children_; }
  const TagList<TagProperty*>& properties() const { return properties_; }
  const TagList<Annotation>& annotations() const;

  Tag* findChild(std::string_view name) const;
  TagProperty* findProperty(std::string_view name) const;
  /// First child, or null.
  Tag* firstChild() const { return children_.empty() ? nullptr : children_.front(); }

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
  void addAnnotation(std::string_view key, std::string_view text);
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
  void annotateByPath(std::string_view path, std::string_view key, std::string_view text);
  /// Annotates the first property named by the last segment; intermediate
  /// segments are children. Creates nothing.
  void annotatePropertyByPath(std::string_view path, std::string_view key, std::string_view text);

  /// Deep copy of `other` into this tag: kind, name, value, annotations,
  /// then every property and every child, in order. Replaces what this tag
  /// held. Must not be called on a tag that is listed in a parent under a
  /// different name than `other`'s.
  void copyFrom(const Tag& other);

  /// Appends a deep copy of `other` as a new last child (no name lookup).
  Tag& appendCopyOf(const Tag& other);

 private:
  struct Indexes;

  Tag& appendChild(std::string_view name);
  TagProperty& appendProperty(std::string_view name);
  void makeBranch();
  Tag* stepInto(std::string_view segment, bool create);

  TagStore* store_;
  TagName name_;
  TagValue* value_ = nullptr;
  TagList<Tag*> children_;
  TagList<TagProperty*> properties_;
  TagList<Annotation>* annotations_ = nullptr;
  // First-match indexes, made once a list grows past a handful of entries;
  // most tags never need one.
  Indexes* indexes_ = nullptr;
  Kind kind_;
};

/// The flags of dumpText, serialise and SnapshotFile::addTree, each a type of
/// its own so that two flags passed in the wrong order do not compile, with
/// short names so that calls read as what they ask for.
enum class DumpClose { kCloseTags, kLeaveTagsOpen };
enum class DumpChildren { kWithChildren, kWithoutChildren };
enum class BlockLayout { kWholeText, kSplitSections };
enum class BlockCompression { kUncompressed, kCompressed };
inline constexpr DumpClose kCloseTags = DumpClose::kCloseTags;
inline constexpr DumpClose kLeaveTagsOpen = DumpClose::kLeaveTagsOpen;
inline constexpr DumpChildren kWithChildren = DumpChildren::kWithChildren;
inline constexpr DumpChildren kWithoutChildren = DumpChildren::kWithoutChildren;
inline constexpr BlockLayout kWholeText = BlockLayout::kWholeText;
inline constexpr BlockLayout kSplitSections = BlockLayout::kSplitSections;
inline constexpr BlockCompression kUncompressed = BlockCompression::kUncompressed;
inline constexpr BlockCompression kCompressed = BlockCompression::kCompressed;

/// An unnamed document tag whose first child is the top tag ("Macintosh",
/// "Snapshot", "AssetInfo"). Serialising lives in zxml/zXML.
class TagTree {
 public:
  /// `native_byte_order` selects the byte order of the split-mode trailer:
  /// little-endian, the target's own, or else big-endian, as the container's
  /// trailer (zxml/QAXfile) does.
  TagTree(bool native_byte_order, std::string_view top_name);
  TagTree(const TagTree& other);
  TagTree& operator=(const TagTree&) = delete;
  ~TagTree();

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
  size_t dumpText(char* buffer, size_t offset, DumpClose close, DumpChildren children) const;
  /// The whole tree as a block: ZXML text, optionally split into sections and
  /// compressed, with the trailer. The caller owns the bytes.
  std::vector<uint8_t> serialise(BlockCompression compression, BlockLayout layout) const;

 private:
  bool native_byte_order_;
  std::unique_ptr<TagStore> store_;
  Tag* document_;
};

}  // namespace cvn

#endif  // CVN_ZXML_TAG_H_
