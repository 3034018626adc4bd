#include "zxml/tag.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>
#include <string>

#include "zxml/tag_store.h"

namespace cvn {

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

}  // namespace cvn
