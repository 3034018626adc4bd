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
  if (v->isText()) return "\"" + std::string(v->text()) + "\"";
  return v->textForm();
}

inline void appendTreeText(const Tag& tag, std::string& out) {
  bool branch = tag.kind() != Tag::Kind::kLeaf;
  auto annotate = [&out](const Annotation& a) {
    out.append("~").append(a.key).append("=").append(a.text).append("\n");
  };
  out.append(branch ? "+" : "*").append(tag.name()).append("=");
  out += valueText(tag.value()) + "\n";
  for (const Annotation& a : tag.annotations()) annotate(a);
  for (const auto& p : tag.properties()) {
    out.append(p->name()).append("=");
    out += valueText(&p->value()) + "\n";
    for (const Annotation& a : p->annotations()) annotate(a);
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
