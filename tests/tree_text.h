// Renders a tag subtree as compact text for whole-section comparisons. The
// layout follows the ZXML dump, but value kinds show: text is quoted
// ("MacBook"), integers are bare (500), reals have two decimals (1.50),
// booleans are true/false and a missing or none value is empty.
#ifndef CVN_TESTS_TREE_TEXT_H_
#define CVN_TESTS_TREE_TEXT_H_

#include <string>

#include "zxml/tag.h"

namespace cvn {

inline std::string valueText(const TagValue* v) {
  if (!v || v->isNone()) return "";
  if (v->isText()) return "\"" + v->text() + "\"";
  return v->textForm();
}

inline void appendTreeText(const Tag& tag, std::string& out) {
  bool branch = tag.kind() != Tag::Kind::kLeaf;
  out += (branch ? "+" : "*") + tag.name() + "=" + valueText(tag.value()) + "\n";
  for (const Annotation& a : tag.annotations()) out += "~" + a.key + "=" + a.text + "\n";
  for (const auto& p : tag.properties()) {
    out += p->name() + "=" + valueText(&p->value()) + "\n";
    for (const Annotation& a : p->annotations()) out += "~" + a.key + "=" + a.text + "\n";
  }
  for (const auto& c : tag.children()) appendTreeText(*c, out);
  if (branch) out += "-\n";
}

/// The subtree of `tag` ("" for a null tag).
inline std::string treeText(const Tag* tag) {
  std::string out;
  if (tag) appendTreeText(*tag, out);
  return out;
}

}  // namespace cvn

#endif  // CVN_TESTS_TREE_TEXT_H_
