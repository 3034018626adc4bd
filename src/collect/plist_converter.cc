#include "collect/plist_converter.h"

#include <cinttypes>
#include <cstdio>
#include <ctime>
#include <deque>
#include <optional>
#include <utility>
#include <vector>

#include "zxml/date_text.h"

namespace cvn {

namespace {

// Deeper values than the reader ever builds are left out rather than risk
// the stack on a hand-made value.
constexpr size_t kMaxDepth = 512;

bool isSkippedDataType(std::string_view name) {
  return name == "SPLogsDataType" || name == "SPFontsDataType";
}

bool isSkippedTopKey(std::string_view key) {
  return key == "_dataType" || key == "_detailLevel" || key == "_properties";
}

bool isNamedListKey(std::string_view key) {
  return key == "spfirewall_applications" || key == "spfirewall_services";
}

// Nothing (type none) for the kinds that store nothing.
TagValue leafValue(const PlistValue& value, bool top_level) {
  switch (value.kind()) {
    case PlistValue::Kind::kString:
      // The list outlives the conversion, so the tree copies the text
      // straight from it.
      return TagValue::viewOf(value.text());
    case PlistValue::Kind::kInteger:
      if (top_level) {
        char buf[32];
        std::snprintf(buf, sizeof buf, "%lld", static_cast<long long>(value.integer()));
        return TagValue(buf);
      }
      return TagValue(value.integer());
    case PlistValue::Kind::kReal:
      return TagValue(value.real());
    case PlistValue::Kind::kDate: {
      // The zone was read once when the conversion began.
      std::string text = formatLocalDateInCurrentZone(value.integer(), true);
      if (text.empty()) return TagValue();
      return TagValue(std::move(text));
    }
    default:
      return TagValue();
  }
}

}  // namespace

// A tag on the way down. It is only created when a leaf is stored below it,
// so empty dictionaries and arrays leave nothing, exactly as storing every
// leaf by its full path does; walking with a cursor avoids re-walking the
// path from the top for every leaf.
struct PlistConverter::Node {
  Node* parent = nullptr;
  std::string name;
  // Set once created; from then on a branch, as a path step leaves it.
  Tag* tag = nullptr;
  // Root nodes only: the document the paths are read from.
  Tag* document = nullptr;

  Tag& create() {
    if (!tag) tag = &parent->create().addChild(name);
    return *tag;
  }

  void store(std::string_view key, TagValue&& value) {
    if (value.isNone()) return;
    if (tag) {
      tag->setProperty(key, std::move(value));
      return;
    }
    if (!name.empty()) {
      // The tag is made a branch, just as storing by a path from the top
      // would step through it.
      tag = &parent->create().addBranch(name);
      tag->setProperty(key, std::move(value));
      return;
    }
    storeByFullPath(key, value);
  }

  // An empty name would read as a leading "/" one step up, so such a node
  // takes the whole path from the document (rare: empty keys or data types).
  void storeByFullPath(std::string_view key, const TagValue& value) {
    std::vector<Node*> chain;
    Node* root = this;
    for (; root->parent; root = root->parent) chain.push_back(root);
    std::string path = root->tag == root->document ? "" : "/";
    for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
      if (it != chain.rbegin()) path += '/';
      path += (*it)->name;
    }
    path += '/';
    path += key;
    root->document->setPropertyByPath(path, value);
    Tag* current = root->tag;
    for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
      current = current->findChild((*it)->name);
      (*it)->tag = current;
    }
  }
};

std::string PlistConverter::sanitizeKey(std::string_view key) {
  std::string out;
  out.reserve(key.size());
  for (size_t i = 0; i < key.size(); ++i) {
    char c = key[i];
    if (c == '\'' || c == ' ' || c == '/' || c == ',') {
      out += '_';
      continue;
    }
    // U+2019, U+2018 and U+201B are E2 80 99, E2 80 98 and E2 80 9B.
    if (c == '\xE2' && i + 2 < key.size() && key[i + 1] == '\x80' &&
        (key[i + 2] == '\x99' || key[i + 2] == '\x98' || key[i + 2] == '\x9B')) {
      out += '_';
      i += 2;
      continue;
    }
    out += c;
  }
  return out;
}

void PlistConverter::chainFor(std::string_view path, std::deque<Node>& chain) {
  // As TagTree::setValue reads "<path>/<key>": a leading "/" starts at the
  // top tag, and every segment after it (empty ones too) is a tag.
  Node root;
  root.document = &tree_.document();
  root.tag = &tree_.top();
  if (!path.empty() && path.front() != '/') root.tag = &tree_.document();
  chain.push_back(std::move(root));
  if (path.empty()) return;
  if (path.front() == '/') path.remove_prefix(1);
  for (;;) {
    size_t slash = path.find('/');
    Node node;
    node.parent = &chain.back();
    node.name = std::string(path.substr(0, slash));
    chain.push_back(std::move(node));
    if (slash == std::string_view::npos) return;
    path.remove_prefix(slash + 1);
  }
}

void PlistConverter::convertPlist(const PlistValue& root) {
  if (!root.isArray()) return;
  tzset();
  for (const PlistValue& element : root.items()) {
    if (!element.isDictionary()) continue;
    std::optional<std::string_view> data_type = element.findText("_dataType");
    if (!data_type || isSkippedDataType(*data_type)) continue;
    std::deque<Node> chain;
    chainFor("/" + std::string(*data_type), chain);
    Node& base = chain.back();
    for (const PlistEntry& entry : element.entries()) {
      if (isSkippedTopKey(entry.key)) continue;
      std::string key = sanitizeKey(entry.key);
      if (entry.value.isDictionary() || entry.value.isArray()) {
        walkValue(entry.value, base, std::move(key), 1);
      } else {
        base.store(key, leafValue(entry.value, true));
      }
    }
  }
}

void PlistConverter::convertDictionary(const PlistValue& dictionary, std::string_view path) {
  tzset();
  std::deque<Node> chain;
  chainFor(path, chain);
  walkDictionary(dictionary, chain.back(), 0);
}

void PlistConverter::convertArray(const PlistValue& array, std::string_view path) {
  tzset();
  std::deque<Node> chain;
  chainFor(path, chain);
  walkArray(array, chain.back(), 0);
}

void PlistConverter::convertNamedList(const PlistValue& dictionary, std::string_view path) {
  tzset();
  std::deque<Node> chain;
  chainFor(path, chain);
  walkNamedList(dictionary, chain.back());
}

void PlistConverter::walkValue(const PlistValue& value, Node& parent, std::string name,
                               size_t depth) {
  if (value.isDictionary() || value.isArray()) {
    if (depth >= kMaxDepth) return;
    Node child;
    child.parent = &parent;
    child.name = std::move(name);
    if (value.isDictionary()) {
      walkDictionary(value, child, depth + 1);
    } else {
      walkArray(value, child, depth + 1);
    }
    return;
  }
  parent.store(name, leafValue(value, false));
}

void PlistConverter::walkDictionary(const PlistValue& dictionary, Node& node, size_t depth) {
  if (!dictionary.isDictionary()) return;
  for (const PlistEntry& entry : dictionary.entries()) {
    if (entry.value.isDictionary() && isNamedListKey(entry.key)) {
      Node child;
      child.parent = &node;
      child.name = sanitizeKey(entry.key);
      walkNamedList(entry.value, child);
      continue;
    }
    walkValue(entry.value, node, sanitizeKey(entry.key), depth);
  }
}

void PlistConverter::walkArray(const PlistValue& array, Node& node, size_t depth) {
  if (!array.isArray()) return;
  for (size_t i = 0; i < array.items().size(); ++i)
    walkValue(array.items()[i], node, "item" + std::to_string(i), depth);
}

void PlistConverter::walkNamedList(const PlistValue& dictionary, Node& node) {
  if (!dictionary.isDictionary()) return;
  for (size_t i = 0; i < dictionary.entries().size(); ++i) {
    const PlistEntry& entry = dictionary.entries()[i];
    if (!entry.value.isString()) continue;  // its number stays used
    Node item;
    item.parent = &node;
    item.name = "item" + std::to_string(i);
    item.store("_name", TagValue::viewOf(entry.key));
    item.store("value", TagValue::viewOf(entry.value.text()));
  }
}

}  // namespace cvn
