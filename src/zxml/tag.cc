#include "zxml/tag.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <functional>
#include <limits>
#include <new>

#include "zxml/arena.h"

namespace cvn {

// ---------------------------------------------------------------- TagStore

// What every tag of one tree shares: the arena that holds them, and one copy
// of each short property name and note that the tree repeats (a raw tree of
// many applications names the same seven keys in every item).
class TagStore {
 public:
  Arena& arena() { return arena_; }

  /// A counted copy of a tag's name; tag names rarely repeat.
  TagName name(std::string_view text) { return TagName(arena_.copyCountedText(text)); }
  /// A counted copy of a property's name, shared with earlier equal ones.
  TagName sharedName(std::string_view text) { return TagName(shared_.share(text, arena_)); }
  /// An annotation's key or text, shared with earlier equal ones.
  std::string_view text(std::string_view text) { return shared_.share(text, arena_); }

  TagList<Annotation>* newAnnotationList() { return arena_.make<TagList<Annotation>>(); }

 private:
  Arena arena_;
  SharedTexts shared_;
};

namespace {
const TagList<Annotation> kNoAnnotations;
}  // namespace

template <typename T>
void TagList<T>::push(TagStore& store, const T& item) {
  if (this->size_ == capacity_) {
    if (capacity_ == UINT32_MAX) throw std::bad_alloc();
    uint32_t capacity = capacity_ == 0               ? 4
                        : capacity_ > UINT32_MAX / 2 ? UINT32_MAX
                                                     : capacity_ * 2;
    T* data = static_cast<T*>(store.arena().allocate(sizeof(T) * capacity, alignof(T)));
    if (this->size_) std::memcpy(static_cast<void*>(data), this->data_, sizeof(T) * this->size_);
    this->data_ = data;
    capacity_ = capacity;
  }
  this->data_[this->size_++] = item;
}

static_assert(sizeof(TagList<Tag*>) == 16, "a list is a pointer and two counts");

template class TagList<Tag*>;
template class TagList<TagProperty*>;
template class TagList<Annotation>;

// ---------------------------------------------------------------- TagValue

TagValue::TagValue(std::string_view s) : int_(0) { assignText(s); }

TagValue TagValue::viewOf(std::string_view text) {
  TagValue value;
  value.type_ = Type::kText;
  value.size_ = static_cast<uint32_t>(std::min<size_t>(text.size(), UINT32_MAX));
  value.storage_ = Storage::kElsewhere;
  value.text_ = text.data();
  return value;
}

TagValue::TagValue(const TagValue& other) : int_(0) { copyFrom(other); }

TagValue::TagValue(TagValue&& other) noexcept : int_(0) {
  std::memcpy(static_cast<void*>(this), &other, sizeof *this);
  // The heap text changes hands; inline and borrowed texts were copied.
  if (other.storage_ == Storage::kHeap) {
    other.storage_ = Storage::kInline;
    other.type_ = Type::kNone;
    other.size_ = 0;
  }
}

TagValue& TagValue::operator=(const TagValue& other) {
  // A source of type none is deliberately a no-op, not a clear.
  if (this == &other || other.type_ == Type::kNone) return *this;
  if (other.isText()) {
    // The text may be this value's own, so it is copied before letting go.
    TagValue copy(other);
    return *this = std::move(copy);
  }
  clear();
  copyFrom(other);
  return *this;
}

TagValue& TagValue::operator=(TagValue&& other) noexcept {
  if (this == &other || other.type_ == Type::kNone) return *this;
  releaseText();
  std::memcpy(static_cast<void*>(this), &other, sizeof *this);
  if (other.storage_ == Storage::kHeap) {
    other.storage_ = Storage::kInline;
    other.type_ = Type::kNone;
    other.size_ = 0;
  }
  return *this;
}

void TagValue::clear() {
  releaseText();
  type_ = Type::kNone;
  int_ = 0;
  size_ = 0;
}

void TagValue::releaseText() {
  if (storage_ == Storage::kHeap) delete[] text_;
  storage_ = Storage::kInline;
}

void TagValue::assignText(std::string_view text) {
  type_ = Type::kText;
  size_ = static_cast<uint32_t>(std::min<size_t>(text.size(), UINT32_MAX));
  if (size_ <= kInlineText) {
    storage_ = Storage::kInline;
    if (size_) std::memcpy(inline_, text.data(), size_);
    inline_[size_] = '\0';
    return;
  }
  char* copy = new char[size_ + 1];
  std::memcpy(copy, text.data(), size_);
  copy[size_] = '\0';
  text_ = copy;
  storage_ = Storage::kHeap;
}

void TagValue::copyFrom(const TagValue& other) {
  if (other.isText()) {
    assignText(other.text());
    return;
  }
  type_ = other.type_;
  storage_ = Storage::kInline;
  size_ = 0;
  if (other.isReal()) {
    real_ = other.real_;
  } else {
    int_ = other.int_;
  }
}

TagValue TagValue::storedIn(const TagValue& value, TagStore& store) {
  if (!value.isText() || value.size_ <= kInlineText) return TagValue(value);
  TagValue stored;
  stored.type_ = Type::kText;
  stored.size_ = value.size_;
  stored.storage_ = Storage::kElsewhere;
  stored.text_ = store.arena().copyText(value.text()).data();
  return stored;
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
      return size_;
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
    case Type::kText: {
      std::string_view t = text();
      if (!t.empty()) std::memcpy(out, t.data(), t.size());
      out[t.size()] = '\0';
      return t.size();
    }
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
      return text() == o.text();
  }
  return false;
}

// ------------------------------------------------------------- TagProperty

TagProperty::TagProperty(TagStore& store, std::string_view name)
    : store_(&store), name_(store.sharedName(name)) {}

const TagList<Annotation>& TagProperty::annotations() const {
  return annotations_ ? *annotations_ : kNoAnnotations;
}

void TagProperty::setValue(const TagValue& v) {
  if (v.isNone()) return;
  value_ = TagValue::storedIn(v, *store_);
}

void TagProperty::addAnnotation(std::string_view key, std::string_view text) {
  if (!annotations_) annotations_ = store_->newAnnotationList();
  annotations_->push(*store_, Annotation{store_->text(key), store_->text(text)});
}

void TagProperty::setAnnotation(std::string_view key, std::string_view text) {
  if (annotations_) {
    for (size_t i = 0; i < annotations_->size(); ++i) {
      if ((*annotations_)[i].key == key) {
        annotations_->at(i).text = store_->text(text);
        return;
      }
    }
  }
  addAnnotation(key, text);
}

const Annotation* TagProperty::findAnnotation(std::string_view key) const {
  for (const Annotation& a : annotations())
    if (a.key == key) return &a;
  return nullptr;
}

// --------------------------------------------------------------- NameIndex

namespace {

// A first-match index over one list of named items: open addressing in the
// tree's arena, each slot a position in the list (plus one; zero is empty)
// beside 32 bits of the name's hash, so that a probe rarely has to look at
// a name. Kept at most half full.
class NameIndex {
 public:
  template <typename T>
  void build(TagStore& store, const TagList<T*>& list) {
    uint32_t slots = 64;
    while (slots / 2 <= list.size()) slots *= 2;
    slots_ = static_cast<uint64_t*>(store.arena().allocate(sizeof(uint64_t) * slots, 8));
    std::memset(slots_, 0, sizeof(uint64_t) * slots);
    mask_ = slots - 1;
    count_ = 0;
    for (size_t i = 0; i < list.size(); ++i) insert(store, list, i);
  }

  template <typename T>
  T* find(const TagList<T*>& list, std::string_view name) const {
    const size_t hash = std::hash<std::string_view>()(name);
    const uint32_t tag = static_cast<uint32_t>(hash >> 32);
    for (size_t at = hash & mask_;; at = (at + 1) & mask_) {
      const uint64_t slot = slots_[at];
      if (slot == 0) return nullptr;
      if (static_cast<uint32_t>(slot >> 32) != tag) continue;
      T* item = list[static_cast<uint32_t>(slot) - 1];
      if (item->name() == name) return item;
    }
  }

  /// Indexes the item at `position`, unless an earlier one has its name.
  template <typename T>
  void insert(TagStore& store, const TagList<T*>& list, size_t position) {
    if ((count_ + 1) * 2 > mask_ + 1) {
      build(store, list);  // the new item is in the list already
      return;
    }
    std::string_view name = list[position]->name();
    const size_t hash = std::hash<std::string_view>()(name);
    const uint32_t tag = static_cast<uint32_t>(hash >> 32);
    size_t at = hash & mask_;
    for (;; at = (at + 1) & mask_) {
      const uint64_t slot = slots_[at];
      if (slot == 0) break;
      if (static_cast<uint32_t>(slot >> 32) == tag &&
          list[static_cast<uint32_t>(slot) - 1]->name() == name)
        return;
    }
    slots_[at] = (uint64_t{tag} << 32) | static_cast<uint64_t>(position + 1);
    ++count_;
  }

 private:
  uint64_t* slots_ = nullptr;
  uint32_t mask_ = 0;
  uint32_t count_ = 0;
};

// Below this many entries a list is searched from the front.
constexpr size_t kIndexThreshold = 16;

}  // namespace

struct Tag::Indexes {
  NameIndex children;
  NameIndex properties;
  bool has_children = false;
  bool has_properties = false;
};

// --------------------------------------------------------------------- Tag

Tag::Tag(TagStore& store, Kind kind, std::string_view name)
    : store_(&store), name_(store.name(name)), kind_(kind) {}

const TagList<Annotation>& Tag::annotations() const {
  return annotations_ ? *annotations_ : kNoAnnotations;
}

Tag* Tag::findChild(std::string_view name) const {
  if (indexes_ && indexes_->has_children) return indexes_->children.find(children_, name);
  for (Tag* c : children_)
    if (c->name() == name) return c;
  return nullptr;
}

TagProperty* Tag::findProperty(std::string_view name) const {
  if (indexes_ && indexes_->has_properties) return indexes_->properties.find(properties_, name);
  for (TagProperty* p : properties_)
    if (p->name() == name) return p;
  return nullptr;
}

void Tag::makeBranch() {
  if (kind_ == Kind::kLeaf) kind_ = Kind::kBranch;
}

Tag& Tag::appendChild(std::string_view name) {
  makeBranch();
  Tag* child = store_->arena().make<Tag>(*store_, Kind::kLeaf, name);
  children_.push(*store_, child);
  if (indexes_ && indexes_->has_children) {
    indexes_->children.insert(*store_, children_, children_.size() - 1);
  } else if (children_.size() > kIndexThreshold) {
    if (!indexes_) indexes_ = store_->arena().make<Indexes>();
    indexes_->children.build(*store_, children_);
    indexes_->has_children = true;
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
    value_ = store_->arena().make<TagValue>(TagValue::storedIn(value, *store_));
  } else if (!value.isNone()) {
    *value_ = TagValue::storedIn(value, *store_);
  }
}

TagProperty& Tag::appendProperty(std::string_view name) {
  TagProperty* prop = store_->arena().make<TagProperty>(*store_, name);
  properties_.push(*store_, prop);
  if (indexes_ && indexes_->has_properties) {
    indexes_->properties.insert(*store_, properties_, properties_.size() - 1);
  } else if (properties_.size() > kIndexThreshold) {
    if (!indexes_) indexes_ = store_->arena().make<Indexes>();
    indexes_->properties.build(*store_, properties_);
    indexes_->has_properties = true;
  }
  return *prop;
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

void Tag::addAnnotation(std::string_view key, std::string_view text) {
  if (!annotations_) annotations_ = store_->newAnnotationList();
  annotations_->push(*store_, Annotation{store_->text(key), store_->text(text)});
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

void Tag::annotateByPath(std::string_view path, std::string_view key, std::string_view text) {
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

void Tag::annotatePropertyByPath(std::string_view path, std::string_view key,
                                 std::string_view text) {
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
  // A parent's index reads this name, so an equal name is left alone; a
  // different one is only allowed on a tag no parent lists.
  if (name() != other.name()) name_ = store_->name(other.name());
  value_ = nullptr;
  if (other.value_) setValue(*other.value_);
  if (annotations_) annotations_->clear();
  for (const Annotation& a : other.annotations()) addAnnotation(a.key, a.text);
  // The old entries stay in the arena, unlisted; duplicate names are legal
  // in the copy, so properties and children are appended, not looked up.
  properties_.clear();
  children_.clear();
  if (indexes_) indexes_->has_children = indexes_->has_properties = false;
  for (const TagProperty* p : other.properties_) {
    TagProperty& prop = appendProperty(p->name());
    prop.setValue(p->value());
    for (const Annotation& a : p->annotations()) prop.addAnnotation(a.key, a.text);
  }
  for (const Tag* c : other.children_) appendCopyOf(*c);
}

Tag& Tag::appendCopyOf(const Tag& other) {
  Tag& child = appendChild(other.name());
  child.copyFrom(other);
  return child;
}

// ----------------------------------------------------------------- TagTree

TagTree::TagTree(bool native_byte_order, std::string_view top_name)
    : native_byte_order_(native_byte_order), store_(std::make_unique<TagStore>()) {
  document_ = store_->arena().make<Tag>(*store_, Tag::Kind::kDocument, std::string_view());
  // The top tag starts as a leaf; it becomes a branch with its first child.
  document_->addChild(top_name);
}

TagTree::TagTree(const TagTree& other)
    : native_byte_order_(other.native_byte_order_), store_(std::make_unique<TagStore>()) {
  document_ = store_->arena().make<Tag>(*store_, Tag::Kind::kDocument, std::string_view());
  document_->copyFrom(*other.document_);
}

// Tags and their values live in the arena and free nothing of their own:
// dropping the store drops the whole tree.
TagTree::~TagTree() = default;

TagProperty& TagTree::setValue(std::string_view path, const TagValue& value, const char* note_key,
                               const char* note_text) {
  return document_->setPropertyByPath(path, value, note_key, note_text);
}

}  // namespace cvn
