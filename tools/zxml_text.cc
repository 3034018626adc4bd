#include "zxml_text.h"

#include <string>

namespace cvn {

namespace {

// Real trees are a dozen levels deep; the limit keeps the recursive
// renderers and destructors safe.
constexpr size_t kMaxDepth = 256;

struct ParseState {
  QaxTree* tree;
  std::vector<QaxNode*> open;
  QaxNode* current = nullptr;         // receives property lines
  QaxProperty* property = nullptr;    // receives annotation lines after it
  std::string* last_value = nullptr;  // receives continuation lines
};

std::string lineError(size_t line, const std::string& what) {
  return "line " + std::to_string(line) + ": " + what;
}

bool parseZxml(std::string_view text, QaxTree* out, std::vector<std::string>* warnings,
               std::string* error, size_t allowed_open) {
  out->nodes.clear();
  if (text.substr(0, kZxmlHeader.size()) != kZxmlHeader) {
    *error = lineError(1, "no \"?zxml\" header line with the byte-order mark");
    return false;
  }
  ParseState st;
  st.tree = out;
  TextLines lines(text, kZxmlHeader.size(), 1);
  std::string_view line;
  for (TextLines::Step step; (step = lines.next(&line)) != TextLines::Step::kEnd;) {
    const size_t line_number = lines.number();
    if (step == TextLines::Step::kUnterminated) {
      *error = lineError(line_number, "no line feed at the end of the text");
      return false;
    }
    if (line.find('\0') != std::string_view::npos) {
      *error = lineError(line_number, "NUL byte");
      return false;
    }
    if (line == "-") {
      if (st.open.empty()) {
        *error = lineError(line_number, "\"-\" closes no open tag");
        return false;
      }
      st.open.pop_back();
      st.current = nullptr;
      st.property = nullptr;
      st.last_value = nullptr;
      continue;
    }
    size_t eq = line.find('=');
    if (eq == std::string_view::npos) {
      if (!st.last_value) {
        *error = lineError(line_number, "neither a tag, a property nor an annotation");
        return false;
      }
      st.last_value->push_back('\n');
      st.last_value->append(line);
      if (warnings)
        warnings->push_back(lineError(line_number,
                                      "no \"=\"; taken as the continuation of the "
                                      "value above"));
      continue;
    }
    char first = line.front();
    if (first == '+' || first == '*') {
      std::vector<QaxNode>& siblings = st.open.empty() ? out->nodes : st.open.back()->children;
      siblings.emplace_back();
      QaxNode& node = siblings.back();
      node.name = std::string(line.substr(1, eq - 1));
      node.value = std::string(line.substr(eq + 1));
      node.branch = first == '+';
      if (node.branch) {
        if (st.open.size() >= kMaxDepth) {
          *error = lineError(line_number, "tags nested deeper than " + std::to_string(kMaxDepth));
          return false;
        }
        st.open.push_back(&node);
      }
      st.current = &node;
      st.property = nullptr;
      st.last_value = &node.value;
    } else if (first == '~') {
      std::vector<QaxAnnotation>* list = st.property  ? &st.property->annotations
                                         : st.current ? &st.current->annotations
                                                      : nullptr;
      if (!list) {
        *error = lineError(line_number, "annotation without a tag or property above it");
        return false;
      }
      list->push_back(
          QaxAnnotation{std::string(line.substr(1, eq - 1)), std::string(line.substr(eq + 1))});
      st.last_value = &list->back().text;
    } else {
      if (!st.current) {
        *error = lineError(line_number, "property outside a tag (after a closing \"-\")");
        return false;
      }
      st.current->properties.push_back(
          QaxProperty{std::string(line.substr(0, eq)), std::string(line.substr(eq + 1)), {}});
      st.property = &st.current->properties.back();
      st.last_value = &st.property->value;
    }
  }
  if (out->nodes.empty()) {
    *error = lineError(lines.number(), "no top tag");
    return false;
  }
  if (st.open.size() > allowed_open) {
    *error =
        lineError(lines.number(), std::to_string(st.open.size()) + " tags still open at the end");
    return false;
  }
  return true;
}

void renderAnnotations(const std::vector<QaxAnnotation>& list, std::string& out) {
  for (const QaxAnnotation& a : list) out += "~" + a.key + "=" + a.text + "\n";
}

void renderNode(const QaxNode& node, std::string& out) {
  out += (node.branch ? "+" : "*") + node.name + "=" + node.value + "\n";
  renderAnnotations(node.annotations, out);
  for (const QaxProperty& p : node.properties) {
    out += p.name + "=" + p.value + "\n";
    renderAnnotations(p.annotations, out);
  }
  if (!node.branch) return;
  for (const QaxNode& c : node.children) renderNode(c, out);
  out += "-\n";
}

const QaxNode* findIn(const std::vector<QaxNode>& list, std::string_view name) {
  for (const QaxNode& n : list)
    if (n.name == name) return &n;
  return nullptr;
}

}  // namespace

const QaxNode* QaxNode::findChild(std::string_view child_name) const {
  return findIn(children, child_name);
}
const QaxProperty* QaxNode::findProperty(std::string_view property_name) const {
  for (const QaxProperty& p : properties)
    if (p.name == property_name) return &p;
  return nullptr;
}
const QaxNode* QaxTree::findNode(std::string_view path) const {
  const QaxNode* node = top();
  if (!path.empty() && path.front() == '/') path.remove_prefix(1);
  while (node && !path.empty()) {
    size_t slash = path.find('/');
    node = node->findChild(path.substr(0, slash));
    path.remove_prefix(slash == std::string_view::npos ? path.size() : slash + 1);
  }
  return node;
}
const QaxProperty* QaxTree::findProperty(std::string_view path, std::string_view name) const {
  const QaxNode* node = findNode(path);
  return node ? node->findProperty(name) : nullptr;
}

bool parseZxmlText(std::string_view text, QaxTree* out, std::vector<std::string>* warnings,
                   std::string* error, size_t allowed_open) {
  return parseZxml(text, out, warnings, error, allowed_open);
}

std::string renderZxmlText(const QaxTree& tree) {
  std::string out(kZxmlHeader);
  for (const QaxNode& n : tree.nodes) renderNode(n, out);
  return out;
}

}  // namespace cvn
