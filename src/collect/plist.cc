#include "collect/plist.h"

#include <expat.h>

#include <algorithm>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "collect/plist_builder.h"
#include "collect/plist_bytes.h"
#include "collect/plist_frames.h"
#include "collect/plist_leaves.h"

namespace cvn {

namespace {

constexpr size_t kMaxDepth = 256;
constexpr size_t kChunkSize = 1 << 20;

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

class Reader {
 public:
  bool read(std::string_view document, Plist* out, std::string* warning);

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
  void attach(const PlistValue& value);
  void drop(const char* why);
  void note(const std::string& problem);

  XML_Parser parser_ = nullptr;
  Arena arena_;
  PlistFrameStack stack_;
  // Profiler dictionaries repeat a few dozen keys once per item.
  SharedTexts keys_;
  // The leaf element being read, if any; leaves never nest.
  bool in_leaf_ = false;
  Element leaf_ = Element::kUnknown;
  bool leaf_refused_ = false;
  std::string text_;
  std::string decoded_;
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

void Reader::attach(const PlistValue& value) {
  if (stack_.empty()) {
    if (!root_done_) {
      root_ = value;
      root_done_ = true;
      // Whatever follows the first value is ignored, as CoreFoundation does.
      XML_StopParser(parser_, XML_FALSE);
    }
    return;
  }
  PlistFrame& frame = stack_.back();
  if (frame.is_array) {
    frame.items.push_back(value);
    return;
  }
  if (!frame.has_key) {
    note("value without a key");
    return;
  }
  frame.has_key = false;
  if (frame.key_refused) return;
  frame.insert(frame.key, value);
}

void Reader::drop(const char* why) {
  note(why);
  if (!stack_.empty() && !stack_.back().is_array) stack_.back().has_key = false;
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
      stack_.push(element == Element::kArray);
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
    if (stack_.empty() || stack_.back().is_array) {
      note("key outside a dictionary");
      return;
    }
    PlistFrame& frame = stack_.back();
    if (frame.has_key) note("key without a value");
    frame.has_key = true;
    frame.key_refused = !readable;
    if (!readable) {
      note("unreadable key");
      return;
    }
    frame.key = keys_.share(text_, arena_);
    return;
  }
  PlistValue value;
  readable = readable && readLeaf(&value);
  if (!readable) {
    drop("unreadable value");
    return;
  }
  attach(value);
}

bool Reader::readLeaf(PlistValue* value) {
  using Kind = PlistValue::Kind;
  int64_t number = 0;
  double real = 0.0;
  switch (leaf_) {
    case Element::kString:
      *value = PlistBuilder::text(Kind::kString, arena_.copyText(text_));
      return true;
    case Element::kInteger:
      if (!parsePlistInteger(text_, &number)) return false;
      *value = PlistBuilder::number(Kind::kInteger, number);
      return true;
    case Element::kReal:
      if (!parsePlistReal(text_, &real)) return false;
      *value = PlistBuilder::real(real);
      return true;
    case Element::kDate:
      if (!parsePlistDate(text_, &number)) return false;
      *value = PlistBuilder::number(Kind::kDate, number);
      return true;
    case Element::kTrue:
    case Element::kFalse:
      *value = PlistBuilder::number(Kind::kBoolean, leaf_ == Element::kTrue ? 1 : 0);
      return text_.empty();
    case Element::kData:
      // "<data/>" is refused where "<data></data>" is empty data; expat
      // reports no bytes for the end of an empty-element tag.
      decoded_.clear();
      if (XML_GetCurrentByteCount(parser_) == 0 || !decodePlistBase64(text_, &decoded_))
        return false;
      *value = PlistBuilder::text(Kind::kData, arena_.copyText(decoded_));
      return true;
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
  attach(stack_.pop(arena_));
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

bool Reader::read(std::string_view document, Plist* out, std::string* warning) {
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
      attach(stack_.pop(arena_));
    }
  }
  parser_ = nullptr;
  if (warning) *warning = warning_;
  if (!root_done_) {
    *out = Plist();
    return false;
  }
  PlistBuilder::take(root_, std::move(arena_), out);
  return true;
}

}  // namespace

bool parsePlist(std::string_view document, Plist* out, std::string* warning) {
  Reader reader;
  return reader.read(document, out, warning);
}

}  // namespace cvn
