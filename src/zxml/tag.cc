#include "zxml/tag.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>

namespace cvn {

// ---------------------------------------------------------------- TagValue

TagValue& TagValue::operator=(const TagValue& other) {
  // A source of type none is deliberately a no-op, not a clear.
  if (this == &other || other.type_ == Type::kNone) return *this;
  clear();
  type_ = other.type_;
  int_ = other.int_;
  real_ = other.real_;
  text_ = other.text_;
  return *this;
}

TagValue& TagValue::operator=(TagValue&& other) {
  if (this == &other || other.type_ == Type::kNone) return *this;
  clear();
  type_ = other.type_;
  int_ = other.int_;
  real_ = other.real_;
  text_ = std::move(other.text_);
  return *this;
}

void TagValue::clear() {
  type_ = Type::kNone;
  int_ = 0;
  real_ = 0.0;
  std::string().swap(text_);
}

namespace {

// Large enough for "%.2lf" of the largest double (309 digits, sign, ".00").
constexpr size_t kNumberRoom = 400;

// "%.2lf" of a double, exactly as printf rounds it: x * 100 is exact in a
// 64-bit-mantissa long double, so rounding that product to the nearest
// integer (ties to even, done by hand: nearbyintl is slow) is rounding the
// exact binary value. Plain to_chars
// gives the same text but costs several times more on large trees.
size_t formatReal(double x, char* out) {
  if constexpr (std::numeric_limits<long double>::digits >= 60) {
    if (std::isfinite(x) && std::fabs(x) < 9.0e16) {
      long double scaled = std::fabs(static_cast<long double>(x) * 100.0L);
      uint64_t hundredths = static_cast<uint64_t>(scaled);
      long double fraction = scaled - static_cast<long double>(hundredths);
      if (fraction > 0.5L || (fraction == 0.5L && (hundredths & 1) != 0)) ++hundredths;
      char* p = out;
      if (std::signbit(x)) *p++ = '-';
      p = std::to_chars(p, p + 24, hundredths / 100).ptr;
      *p++ = '.';
      *p++ = static_cast<char>('0' + hundredths % 100 / 10);
      *p++ = static_cast<char>('0' + hundredths % 10);
      return static_cast<size_t>(p - out);
    }
  }
  return static_cast<size_t>(
      std::to_chars(out, out + kNumberRoom, x, std::chars_format::fixed, 2).ptr - out);
}

// to_chars formats exactly as "%lld" does, without printf's overhead.
size_t formatNumber(const TagValue& v, char* out) {
  if (v.isReal()) return formatReal(v.asReal(), out);
  return static_cast<size_t>(std::to_chars(out, out + kNumberRoom, v.asInt()).ptr - out);
}

}  // namespace

size_t TagValue::textLength() const {
  char buf[kNumberRoom];
  switch (type_) {
    case Type::kNone:
      return 0;
    case Type::kBool:
      return int_ ? 4 : 5;
    case Type::kInt:
    case Type::kReal:
      return formatNumber(*this, buf);
    case Type::kText:
      return text_.size();
  }
  return 0;
}

size_t TagValue::writeText(char* out) const {
  switch (type_) {
    case Type::kNone:
      *out = '\0';
      return 0;
    case Type::kBool:
      std::memcpy(out, int_ ? "true" : "false", int_ ? 5 : 6);
      return int_ ? 4 : 5;
    case Type::kInt:
    case Type::kReal: {
      // Formatted aside first: the caller only promises textLength() + 1.
      char buf[kNumberRoom];
      size_t n = formatNumber(*this, buf);
      std::memcpy(out, buf, n);
      out[n] = '\0';
      return n;
    }
    case Type::kText:
      std::memcpy(out, text_.data(), text_.size());
      out[text_.size()] = '\0';
      return text_.size();
  }
  return 0;
}

std::string TagValue::textForm() const {
  std::string s(textLength() + 1, '\0');
  s.resize(writeText(&s[0]));
  return s;
}

void TagValue::printToStderr() const {
  std::string s = textForm();
  std::fwrite(s.data(), 1, s.size(), stderr);
}

bool TagValue::operator==(const TagValue& o) const {
  if (type_ != o.type_) return false;
  switch (type_) {
    case Type::kNone:
      return true;
    case Type::kBool:
    case Type::kInt:
      return int_ == o.int_;
    case Type::kReal:
      return real_ == o.real_;
    case Type::kText:
      return text_ == o.text_;
  }
  return false;
}

// ------------------------------------------------------------- TagProperty

void TagProperty::addAnnotation(std::string key, std::string text) {
  annotations_.push_back(Annotation{std::move(key), std::move(text)});
}

void TagProperty::setAnnotation(std::string_view key, std::string_view text) {
  for (Annotation& a : annotations_) {
    if (a.key == key) {
      a.text = std::string(text);
      return;
    }
  }
  annotations_.push_back(Annotation{std::string(key), std::string(text)});
}

const Annotation* TagProperty::findAnnotation(std::string_view key) const {
  for (const Annotation& a : annotations_)
    if (a.key == key) return &a;
  return nullptr;
}

// --------------------------------------------------------------------- Tag

Tag::Tag(Kind kind, std::string name) : kind_(kind), name_(std::move(name)) {}

Tag* Tag::findChild(std::string_view name) const {
  if (child_index_) {
    auto it = child_index_->find(name);
    return it == child_index_->end() ? nullptr : it->second;
  }
  for (const auto& c : children_)
    if (c->name_ == name) return c.get();
  return nullptr;
}

TagProperty* Tag::findProperty(std::string_view name) const {
  if (property_index_) {
    auto it = property_index_->find(name);
    return it == property_index_->end() ? nullptr : it->second;
  }
  for (const auto& p : properties_)
    if (p->name() == name) return p.get();
  return nullptr;
}

void Tag::makeBranch() {
  if (kind_ == Kind::kLeaf) kind_ = Kind::kBranch;
}

Tag& Tag::appendChild(std::string_view name) {
  makeBranch();
  children_.push_back(std::make_unique<Tag>(Kind::kLeaf, std::string(name)));
  Tag* child = children_.back().get();
  if (child_index_) {
    child_index_->emplace(child->name_, child);  // keeps the first match
  } else if (children_.size() > kIndexThreshold) {
    child_index_ = std::make_unique<std::unordered_map<std::string_view, Tag*>>();
    for (const auto& c : children_) child_index_->emplace(c->name_, c.get());
  }
  return *child;
}

Tag& Tag::addChild(std::string_view name) {
  if (Tag* existing = findChild(name)) {
    makeBranch();
    return *existing;
  }
  return appendChild(name);
}

Tag& Tag::addBranch(std::string_view name) {
  Tag& child = addChild(name);
  child.makeBranch();
  return child;
}

Tag& Tag::setChildValue(std::string_view name, const TagValue& value) {
  Tag& child = addChild(name);
  child.setValue(value);
  return child;
}

void Tag::setValue(const TagValue& value) {
  if (!value_) {
    value_ = std::make_unique<TagValue>(value);
  } else {
    *value_ = value;
  }
}

TagProperty& Tag::appendProperty(std::string_view name) {
  properties_.push_back(std::make_unique<TagProperty>(std::string(name)));
  TagProperty& prop = *properties_.back();
  if (property_index_) {
    property_index_->emplace(prop.name(), &prop);
  } else if (properties_.size() > kIndexThreshold) {
    property_index_ = std::make_unique<std::unordered_map<std::string_view, TagProperty*>>();
    for (const auto& p : properties_) property_index_->emplace(p->name(), p.get());
  }
  return prop;
}

TagProperty& Tag::setProperty(std::string_view name, const TagValue& value, const char* note_key,
                              const char* note_text) {
  if (TagProperty* existing = findProperty(name)) {
    existing->setValue(value);
    return *existing;
  }
  TagProperty& prop = appendProperty(name);
  prop.setValue(value);
  if (note_key && note_text) prop.addAnnotation(note_key, note_text);
  return prop;
}

TagProperty& Tag::setProperty(std::string_view name, TagValue&& value) {
  TagProperty* prop = findProperty(name);
  if (!prop) prop = &appendProperty(name);
  prop->setValue(std::move(value));
  return *prop;
}

void Tag::addAnnotation(std::string key, std::string text) {
  annotations_.push_back(Annotation{std::move(key), std::move(text)});
}

std::string Tag::nextNumberedName(std::string_view base) const {
  std::string name;
  for (unsigned long n = 1;; ++n) {
    name.assign(base);
    name += std::to_string(n);
    if (!findChild(name)) return name;
  }
}

Tag* Tag::stepInto(std::string_view segment, bool create) {
  Tag* child = findChild(segment);
  if (!child && create) child = &appendChild(segment);
  return child;
}

TagProperty& Tag::setPropertyByPath(std::string_view path, const TagValue& value,
                                    const char* note_key, const char* note_text) {
  Tag* current = this;
  if (!path.empty() && path.front() == '/') {
    path.remove_prefix(1);
    // A tag without children has no top to step into; stay where we are.
    if (Tag* first = current->firstChild()) current = first;
  }
  for (size_t slash = path.find('/'); slash != std::string_view::npos; slash = path.find('/')) {
    current->makeBranch();
    current = current->stepInto(path.substr(0, slash), true);
    // A tag that a path step lands on counts as a branch even when it only
    // ever receives properties ("/a/b/c" leaves both a and b branches).
    current->makeBranch();
    path.remove_prefix(slash + 1);
  }
  TagProperty* prop = current->findProperty(path);
  if (!prop) return current->setProperty(path, value, note_key, note_text);
  prop->setValue(value);
  if (note_key && note_text) prop->setAnnotation(note_key, note_text);
  return *prop;
}

void Tag::annotateByPath(std::string_view path, const std::string& key, const std::string& text) {
  Tag* current = this;
  for (;;) {
    if (!path.empty() && path.front() == '/') {
      path.remove_prefix(1);
      current = current->firstChild();
      if (!current) return;
    }
    size_t slash = path.find('/');
    if (slash == std::string_view::npos) {
      if (Tag* target = current->findChild(path)) target->addAnnotation(key, text);
      return;
    }
    current->makeBranch();
    current = current->findChild(path.substr(0, slash));
    if (!current) return;
    // The "/" stays, so the walk goes on in the found child's first child.
    path.remove_prefix(slash);
  }
}

void Tag::annotatePropertyByPath(std::string_view path, const std::string& key,
                                 const std::string& text) {
  Tag* current = this;
  if (!path.empty() && path.front() == '/') {
    path.remove_prefix(1);
    current = current->firstChild();
    if (!current) return;
  }
  for (size_t slash = path.find('/'); slash != std::string_view::npos; slash = path.find('/')) {
    current->makeBranch();
    current = current->findChild(path.substr(0, slash));
    if (!current) return;
    path.remove_prefix(slash + 1);
  }
  if (TagProperty* prop = current->findProperty(path)) prop->addAnnotation(key, text);
}

void Tag::copyFrom(const Tag& other) {
  if (this == &other) return;
  kind_ = other.kind_;
  // A parent's index views this name's bytes, so an equal name is left
  // alone; a different one is only allowed on a tag no parent lists.
  if (name_ != other.name_) name_ = other.name_;
  value_ = other.value_ ? std::make_unique<TagValue>(*other.value_) : nullptr;
  annotations_ = other.annotations_;
  properties_.clear();
  property_index_.reset();
  for (const auto& p : other.properties_) {
    TagProperty& prop = setProperty(p->name(), TagValue());
    prop.value() = p->value();
    for (const Annotation& a : p->annotations()) prop.addAnnotation(a.key, a.text);
  }
  children_.clear();
  child_index_.reset();
  for (const auto& c : other.children_) appendCopyOf(*c);
  // Duplicate names are legal: appending copies, not setProperty, keeps them.
}

Tag& Tag::appendCopyOf(const Tag& other) {
  Tag& child = appendChild(other.name_);
  child.copyFrom(other);
  return child;
}

// ----------------------------------------------------------------- TagTree

TagTree::TagTree(bool native_byte_order, std::string_view top_name)
    : native_byte_order_(native_byte_order),
      document_(std::make_unique<Tag>(Tag::Kind::kDocument, std::string())) {
  // The top tag starts as a leaf; it becomes a branch with its first child.
  document_->addChild(top_name);
}

TagTree::TagTree(const TagTree& other)
    : native_byte_order_(other.native_byte_order_),
      document_(std::make_unique<Tag>(Tag::Kind::kDocument, std::string())) {
  document_->copyFrom(*other.document_);
}

TagProperty& TagTree::setValue(std::string_view path, const TagValue& value, const char* note_key,
                               const char* note_text) {
  return document_->setPropertyByPath(path, value, note_key, note_text);
}

}  // namespace cvn
