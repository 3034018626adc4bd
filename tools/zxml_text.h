// The ZXML text of one tree, read and written back: the inspector's view of
// a block once it is inflated.
#ifndef CVN_TOOLS_ZXML_TEXT_H_
#define CVN_TOOLS_ZXML_TEXT_H_

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace cvn {

/// The first line of every ZXML text: a byte-order mark and "?zxml".
inline constexpr std::string_view kZxmlHeader = "\xEF\xBB\xBF?zxml\n";

/// Walks text made of lines that each end in a line feed, counting them.
class TextLines {
 public:
  enum class Step { kLine, kEnd, kUnterminated };

  TextLines(std::string_view text, size_t start, size_t first_number)
      : text_(text), pos_(start), number_(first_number) {}
  /// The next line, without its line feed; kUnterminated when the text ends
  /// without one.
  Step next(std::string_view* line) {
    if (pos_ >= text_.size()) return Step::kEnd;
    ++number_;
    size_t end = text_.find('\n', pos_);
    if (end == std::string_view::npos) return Step::kUnterminated;
    *line = text_.substr(pos_, end - pos_);
    pos_ = end + 1;
    return Step::kLine;
  }
  /// The number of the line last returned (or found unterminated).
  size_t number() const { return number_; }

 private:
  std::string_view text_;
  size_t pos_;
  size_t number_;
};

struct QaxAnnotation {
  std::string key;
  std::string text;
};

struct QaxProperty {
  std::string name;
  std::string value;
  std::vector<QaxAnnotation> annotations;
};

/// A tag as the text stored it: values are texts, whatever their kind was.
struct QaxNode {
  std::string name;
  bool branch = false;
  std::string value;
  std::vector<QaxAnnotation> annotations;
  std::vector<QaxProperty> properties;
  std::vector<QaxNode> children;

  const QaxNode* findChild(std::string_view child_name) const;
  const QaxProperty* findProperty(std::string_view property_name) const;
};

struct QaxTree {
  /// The tags directly under the document; the first is the top tag.
  std::vector<QaxNode> nodes;

  const QaxNode* top() const { return nodes.empty() ? nullptr : &nodes.front(); }
  /// The tag at a "/"-separated path below the top tag ("/Hardware/CPU" or
  /// "Hardware/CPU"); "" and "/" give the top tag. Null when missing.
  const QaxNode* findNode(std::string_view path) const;
  /// The property `name` of the tag at `path`, or null.
  const QaxProperty* findProperty(std::string_view path, std::string_view name) const;
};

/// Parses ZXML text (header line included). Continuation lines are reported
/// in `warnings` (may be null). `allowed_open` tags may stay open at the
/// end (a split block leaves the top tag to its trailer).
bool parseZxmlText(std::string_view text, QaxTree* out, std::vector<std::string>* warnings,
                   std::string* error, size_t allowed_open = 0);
/// The tree as ZXML text, header line included.
std::string renderZxmlText(const QaxTree& tree);

}  // namespace cvn

#endif  // CVN_TOOLS_ZXML_TEXT_H_
