#include "zxml/tag.h"

#include <memory>
#include <string>

#include "zxml/arena.h"
#include "zxml/name_index.h"
#include "zxml/tag_store.h"

namespace cvn {

namespace {
const TagList<Annotation> kNoAnnotations;
}  // namespace

static_assert(sizeof(TagList<Tag*>) == 16, "a list is a pointer and two counts");

template class TagList<Tag*>;
template class TagList<TagProperty*>;
template class TagList<Annotation>;

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

// --------------------------------------------------------------- Indexes

namespace {

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
