#include "collect/plist.h"

#include <expat.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <memory>
#include <unordered_map>
#include <utility>

#include "collect/plist_bytes.h"
#include "collect/plist_leaves.h"

namespace cvn {
namespace {

constexpr size_t kMaxDepth = 256;
constexpr size_t kChunkSize = 1 << 20;
constexpr size_t kIndexThreshold = 16;

enum class Element {
  kPlist,
  kArray,
  kDict,
  kKey,
  kString,
  kInteger,
  kReal,
  kDate,
  kTrue,
  kFalse,
  kData,
  kUnknown
};

// Called for every element of the document: the commonest names come first,
// and a view compares lengths before bytes.
Element elementOf(const char* name) {
  static constexpr std::pair<std::string_view, Element> kNames[] = {
      {"key", Element::kKey},     {"string", Element::kString},   {"dict", Element::kDict},
      {"array", Element::kArray}, {"integer", Element::kInteger}, {"date", Element::kDate},
      {"true", Element::kTrue},   {"false", Element::kFalse},     {"real", Element::kReal},
      {"data", Element::kData},   {"plist", Element::kPlist}};
  const std::string_view text(name);
  for (const auto& [element_name, element] : kNames)
    if (element_name == text) return element;
  return Element::kUnknown;
}

struct Frame {
  PlistValue value;  // kArray or kDictionary
  std::string key;
  bool has_key = false;
  bool key_refused = false;
  std::unique_ptr<std::unordered_map<std::string, size_t>> index;
};

// The open containers. A frame's lists are filled in place and keep their
// room when the container closes: the next container at that depth grows
// into it, and each closed container gets one list of its exact size. A
// list growing one entry at a time instead allocated and moved its entries
// several times for every dictionary of the document.
class FrameStack {
 public:
  bool empty() const { return depth_ == 0; }
  size_t size() const { return depth_; }
  Frame& back() { return frames_[depth_ - 1]; }

  void push(PlistValue::Kind kind) {
    if (depth_ == frames_.size()) frames_.emplace_back();
    Frame& frame = frames_[depth_++];
    frame.value.kind = kind;
    frame.value.array.clear();
    frame.value.dictionary.clear();
    frame.key.clear();
    frame.has_key = false;
    frame.key_refused = false;
    frame.index.reset();
  }

  PlistValue pop() {
    Frame& frame = frames_[--depth_];
    PlistValue value;
    value.kind = frame.value.kind;
    value.array.reserve(frame.value.array.size());
    std::move(frame.value.array.begin(), frame.value.array.end(), std::back_inserter(value.array));
    value.dictionary.reserve(frame.value.dictionary.size());
    std::move(frame.value.dictionary.begin(), frame.value.dictionary.end(),
              std::back_inserter(value.dictionary));
    frame.value.array.clear();
    frame.value.dictionary.clear();
    frame.index.reset();
    return value;
  }

 private:
  std::vector<Frame> frames_;
  size_t depth_ = 0;
};

class Reader {
 public:
  bool read(std::string_view document, PlistValue* out, std::string* warning);

 private:
  static void XMLCALL onStart(void* self, const XML_Char* name, const XML_Char** attributes);
  static void XMLCALL onEnd(void* self, const XML_Char* name);
  static void XMLCALL onText(void* self, const XML_Char* text, int len);
  static void XMLCALL onEntityDeclaration(void* self, const XML_Char*, int, const XML_Char*, int,
                                          const XML_Char*, const XML_Char*, const XML_Char*,
                                          const XML_Char*);

  void start(const char* name);
  void end();
  void finishLeaf();
  /// The leaf just closed as a value; false when CoreFoundation would refuse it.
  bool readLeaf(PlistValue* value);
  void attach(PlistValue&& value);
  void drop(const char* why);
  void insert(Frame& frame, std::string&& key, PlistValue&& value);
  void note(const std::string& problem);

  XML_Parser parser_ = nullptr;
  FrameStack stack_;
  // The leaf element being read, if any; leaves never nest.
  bool in_leaf_ = false;
  Element leaf_ = Element::kUnknown;
  bool leaf_refused_ = false;
  std::string text_;
  // Depth inside an element whose value is dropped as a whole.
  size_t ignored_ = 0;
  bool in_plist_ = false;
  bool root_done_ = false;
  bool stopped_for_entity_ = false;
  PlistValue root_;
  std::string warning_;
};

void Reader::note(const std::string& problem) {
  if (warning_.empty()) {
    warning_ = problem;
    if (parser_) warning_ += " at line " + std::to_string(XML_GetCurrentLineNumber(parser_));
  }
}

void Reader::insert(Frame& frame, std::string&& key, PlistValue&& value) {
  std::vector<PlistEntry>& entries = frame.value.dictionary;
  if (frame.index) {
    auto found = frame.index->find(key);
    if (found != frame.index->end()) {
      entries[found->second].value = std::move(value);
      return;
    }
    frame.index->emplace(key, entries.size());
  } else {
    for (PlistEntry& entry : entries) {
      if (entry.key == key) {
        entry.value = std::move(value);
        return;
      }
    }
  }
  entries.push_back(PlistEntry{std::move(key), std::move(value)});
  if (!frame.index && entries.size() > kIndexThreshold) {
    frame.index = std::make_unique<std::unordered_map<std::string, size_t>>();
    for (size_t i = 0; i < entries.size(); ++i) frame.index->emplace(entries[i].key, i);
  }
}

void Reader::attach(PlistValue&& value) {
  if (stack_.empty()) {
    if (!root_done_) {
      root_ = std::move(value);
      root_done_ = true;
      // Whatever follows the first value is ignored, as CoreFoundation does.
      XML_StopParser(parser_, XML_FALSE);
    }
    return;
  }
  Frame& frame = stack_.back();
  if (frame.value.kind == PlistValue::Kind::kArray) {
    frame.value.array.push_back(std::move(value));
    return;
  }
  if (!frame.has_key) {
    note("value without a key");
    return;
  }
  frame.has_key = false;
  if (frame.key_refused) return;
  insert(frame, std::move(frame.key), std::move(value));
  frame.key.clear();
}

void Reader::drop(const char* why) {
  note(why);
  if (!stack_.empty() && stack_.back().value.kind == PlistValue::Kind::kDictionary)
    stack_.back().has_key = false;
}

void Reader::start(const char* name) {
  if (ignored_ > 0) {
    ++ignored_;
    return;
  }
  if (in_leaf_) {
    // Markup inside a leaf: CoreFoundation refuses the value.
    leaf_refused_ = true;
    ignored_ = 1;
    return;
  }
  Element element = elementOf(name);
  if (element == Element::kPlist && stack_.empty() && !in_plist_) {
    in_plist_ = true;
    return;
  }
  switch (element) {
    case Element::kArray:
    case Element::kDict:
      if (stack_.size() >= kMaxDepth) {
        drop("nesting too deep");
        ignored_ = 1;
        return;
      }
      stack_.push(element == Element::kArray ? PlistValue::Kind::kArray
                                             : PlistValue::Kind::kDictionary);
      return;
    case Element::kPlist:
    case Element::kUnknown:
      drop("unknown element");
      ignored_ = 1;
      return;
    default:
      in_leaf_ = true;
      leaf_ = element;
      leaf_refused_ = false;
      text_.clear();
      return;
  }
}

void Reader::finishLeaf() {
  in_leaf_ = false;
  bool readable = restoreEscapedBytes(text_) && !leaf_refused_;
  if (leaf_ == Element::kKey) {
    if (stack_.empty() || stack_.back().value.kind != PlistValue::Kind::kDictionary) {
      note("key outside a dictionary");
      return;
    }
    Frame& frame = stack_.back();
    if (frame.has_key) note("key without a value");
    frame.has_key = true;
    frame.key_refused = !readable;
    if (!readable) note("unreadable key");
    frame.key = std::move(text_);
    text_.clear();
    return;
  }
  PlistValue value;
  readable = readable && readLeaf(&value);
  if (!readable) {
    drop("unreadable value");
    return;
  }
  attach(std::move(value));
}

bool Reader::readLeaf(PlistValue* value) {
  using Kind = PlistValue::Kind;
  switch (leaf_) {
    case Element::kString:
      value->kind = Kind::kString;
      value->text = std::move(text_);
      text_.clear();
      return true;
    case Element::kInteger:
      value->kind = Kind::kInteger;
      return parsePlistInteger(text_, &value->integer);
    case Element::kReal:
      value->kind = Kind::kReal;
      return parsePlistReal(text_, &value->real);
    case Element::kDate:
      value->kind = Kind::kDate;
      return parsePlistDate(text_, &value->integer);
    case Element::kTrue:
    case Element::kFalse:
      value->kind = Kind::kBoolean;
      value->integer = leaf_ == Element::kTrue ? 1 : 0;
      return text_.empty();
    case Element::kData:
      value->kind = Kind::kData;
      // "<data/>" is refused where "<data></data>" is empty data; expat
      // reports no bytes for the end of an empty-element tag.
      return XML_GetCurrentByteCount(parser_) != 0 && decodePlistBase64(text_, &value->text);
    default:
      return false;
  }
}

void Reader::end() {
  if (ignored_ > 0) {
    --ignored_;
    return;
  }
  if (in_leaf_) {
    finishLeaf();
    return;
  }
  if (stack_.empty()) return;  // </plist>
  attach(stack_.pop());
}

void XMLCALL Reader::onStart(void* self, const XML_Char* name, const XML_Char**) {
  static_cast<Reader*>(self)->start(name);
}

void XMLCALL Reader::onEnd(void* self, const XML_Char*) { static_cast<Reader*>(self)->end(); }

void XMLCALL Reader::onText(void* self, const XML_Char* text, int len) {
  Reader* reader = static_cast<Reader*>(self);
  if (reader->in_leaf_ && reader->ignored_ == 0) reader->text_.append(text, len);
}

void XMLCALL Reader::onEntityDeclaration(void* self, const XML_Char*, int, const XML_Char*, int,
                                         const XML_Char*, const XML_Char*, const XML_Char*,
                                         const XML_Char*) {
  // CoreFoundation refuses internal subsets, and expanding entities is only a risk.
  Reader* reader = static_cast<Reader*>(self);
  reader->stopped_for_entity_ = true;
  XML_StopParser(reader->parser_, XML_FALSE);
}

struct ParserFree {
  void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
};

bool Reader::read(std::string_view document, PlistValue* out, std::string* warning) {
  std::string storage;
  const std::string_view cleaned = escapeRefusedBytes(document, &storage);
  // The declared encoding is overridden: the cleaning works on UTF-8 bytes.
  std::unique_ptr<XML_ParserStruct, ParserFree> parser(XML_ParserCreate("UTF-8"));
  if (!parser) return false;
  parser_ = parser.get();
  XML_SetUserData(parser_, this);
  XML_SetElementHandler(parser_, &Reader::onStart, &Reader::onEnd);
  XML_SetCharacterDataHandler(parser_, &Reader::onText);
  XML_SetEntityDeclHandler(parser_, &Reader::onEntityDeclaration);

  const char* data = cleaned.data();
  size_t offset = 0;
  for (;;) {
    size_t len = std::min(kChunkSize, cleaned.size() - offset);
    bool final = offset + len == cleaned.size();
    if (XML_Parse(parser_, data + offset, static_cast<int>(len), final) != XML_STATUS_OK) {
      if (!root_done_) {
        note(stopped_for_entity_ ? std::string("entity declaration")
                                 : std::string(XML_ErrorString(XML_GetErrorCode(parser_))));
      }
      break;
    }
    offset += len;
    if (final) break;
  }
  if (!root_done_) {
    // The document broke off: keep what was read and close what is open.
    in_leaf_ = false;
    ignored_ = 0;
    while (!stack_.empty()) {
      attach(stack_.pop());
    }
  }
  parser_ = nullptr;
  if (warning) *warning = warning_;
  if (!root_done_) {
    *out = PlistValue();
    return false;
  }
  *out = std::move(root_);
  return true;
}

}  // namespace

bool parsePlist(std::string_view document, PlistValue* out, std::string* warning) {
  Reader reader;
  return reader.read(document, out, warning);
}

}  // namespace cvn
