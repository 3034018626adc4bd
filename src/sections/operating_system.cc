// The "OS" section: release name, version, update, kernel, uptime and
// architecture of the installed system.
#include "sections/operating_system.h"

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

constexpr const char* kReleaseNames[] = {
    "Mac OS X v10.0 (Cheetah)",      "Mac OS X v10.1 (Puma)",  "Mac OS X v10.2 (Jaguar)",
    "Mac OS X v10.3 (Panther)",      "Mac OS X v10.4 (Tiger)", "Mac OS X v10.5 (Leopard)",
    "Mac OS X v10.6 (Snow Leopard)", "Mac OS X v10.7 (Lion)",  "OS X v10.8 (Mountain Lion)",
    "OS X v10.9 (Mavericks)",
};
constexpr int kNamedMinors = static_cast<int>(sizeof kReleaseNames / sizeof kReleaseNames[0]);

// Nine digits never overflow an int; longer numbers saturate there.
constexpr int kNumberCap = 999999999;

bool isDigit(char c) { return c >= '0' && c <= '9'; }

// Like atoi, without its overflow: leading blanks, an optional sign, then
// digits; no digits give 0.
int readInteger(std::string_view text) {
  size_t i = 0;
  while (i < text.size() && (text[i] == ' ' || text[i] == '\t' || text[i] == '\n' ||
                             text[i] == '\r' || text[i] == '\v' || text[i] == '\f'))
    ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
  int value = 0;
  for (; i < text.size() && isDigit(text[i]); ++i)
    value = value > kNumberCap / 10 ? kNumberCap : value * 10 + (text[i] - '0');
  return negative ? -value : value;
}

// The piece up to the first "." (or, without one, the first blank), read
// as a number.
int readCutNumber(std::string_view text) {
  size_t cut = text.find('.');
  if (cut == std::string_view::npos) cut = text.find(' ');
  return readInteger(text.substr(0, cut));
}

// The first word at or after `from` that begins with a digit.
size_t findNumberWord(std::string_view text, size_t from) {
  for (size_t i = from; i < text.size(); ++i) {
    if (isDigit(text[i]) && (i == 0 || text[i - 1] == ' ')) return i;
  }
  return std::string_view::npos;
}

// "Update N" from the third number of "10.6.8 (10K549)"; empty when it is
// missing, 0 or not a number.
std::string updateText(std::string_view version) {
  std::string_view number = version.substr(0, version.find(' '));
  size_t first = number.find('.');
  if (first == std::string_view::npos) return std::string();
  size_t second = number.find('.', first + 1);
  if (second == std::string_view::npos) return std::string();
  std::string_view third = number.substr(second + 1);
  size_t digits = 0;
  while (digits < third.size() && isDigit(third[digits])) ++digits;
  if (digits == 0 || digits > 9) return std::string();
  int update = readInteger(third.substr(0, digits));
  return update > 0 ? formatText("Update %d", update) : std::string();
}

}  // namespace

OsVersionText parseOsVersion(std::string_view os_version) {
  OsVersionText os;
  constexpr std::string_view kMarker = "OS X";
  size_t marker = os_version.find(kMarker);
  if (marker != std::string_view::npos) {
    size_t start = marker + kMarker.size() + 1;
    if (start < os_version.size() && !isDigit(os_version[start])) {
      size_t word = findNumberWord(os_version, start);
      if (word != std::string_view::npos) start = word;
    }
    std::string_view version = start < os_version.size() ? os_version.substr(start) : "";
    os.version = std::string(version);
    os.major = 10;
    // Past "10." whatever the first number says: these are 10.x releases.
    os.minor = readCutNumber(version.size() > 3 ? version.substr(3) : "");
  } else {
    size_t start = findNumberWord(os_version, 0);
    if (start != std::string_view::npos) {
      std::string_view version = os_version.substr(start);
      os.version = std::string(version);
      os.major = readInteger(version);
      size_t point = version.find('.');
      std::string_view number = version.substr(0, version.find(' '));
      os.minor = point < number.size() ? readCutNumber(version.substr(point + 1)) : 0;
    }
  }
  // Every release the table names said "OS X" in this text, so a text
  // without the marker keeps its own name.
  if (marker != std::string_view::npos && os.minor >= 0 && os.minor < kNamedMinors) {
    os.name = kReleaseNames[os.minor];
  } else {
    os.name = std::string(os_version);
  }
  os.update = updateText(os.version);
  return os;
}

int64_t uptimeSeconds(std::string_view uptime) {
  int64_t total = 0;
  int64_t field = 0;
  int64_t place = 1;
  int64_t multiplier = 1;
  int fields = 0;
  for (size_t i = uptime.size(); i-- > 1;) {
    char c = uptime[i];
    if (c == ' ') break;
    if (c == ':') {
      total += field * multiplier;
      if (++fields == 4) return total;
      field = 0;
      place = 1;
      multiplier *= multiplier < 3600 ? 60 : 24;
    } else if (isDigit(c) && place <= 100000000) {
      field += (c - '0') * place;
      place *= 10;
    }
  }
  return total + field * multiplier;
}

std::string formatDmtfInterval(int64_t seconds) {
  if (seconds < 0) seconds = 0;
  long long days = seconds / 86400;
  int rest = static_cast<int>(seconds % 86400);
  return formatText("%08lld%02d%02d%02d.000000:000", days, rest / 3600, rest % 3600 / 60,
                    rest % 60);
}

void buildOperatingSystemSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* item = findFirstItem(raw, "SPSoftwareDataType");
  if (!item) return;
  OsVersionText os = parseOsVersion(rawText(*item, "os_version"));
  Tag& record = snapshot.top().addChild("OS").addChild("os:1");
  bool has_kind = false;
  for (const Annotation& a : record.annotations()) has_kind = has_kind || a.key == "kind";
  if (!has_kind) record.addAnnotation("kind", "mac");

  record.setProperty("name", TagValue(os.name));
  record.setProperty("version", TagValue(os.version));
  if (!os.update.empty()) record.setProperty("update", TagValue(os.update));
  copyFieldIfPresent(record, "kernel", *item, "kernel_version");
  record.setProperty("manuf", TagValue("Apple Inc."));
  record.setProperty("uptime",
                     TagValue(formatDmtfInterval(uptimeSeconds(rawText(*item, "uptime")))));
  bool always_64 = os.major > 10 || (os.major == 10 && os.minor >= 7);
  bool is_64 = always_64 || rawText(*item, "64bit_kernel_and_kexts") == "yes";
  record.setProperty("architecture", TagValue(is_64 ? "64-bit" : "32-bit"));
}

}  // namespace cvn
