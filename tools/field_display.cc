#include "field_display.h"

#include <cstdlib>

namespace cvn {

namespace {

struct FieldRule {
  std::string_view kind;  // empty: any record
  std::string_view field;
  std::string_view unit;  // empty: a flag
};

// The units the section builders store in; sizes of disks and volumes are
// decimal gigabytes, memory is in megabytes.
constexpr FieldRule kRules[] = {
    {"", "size", "GB"},
    {"", "free", "GB"},
    {"", "capacity", "MB"},
    {"", "video-memory", "MB"},
    {"", "used%", "%"},
    {"General-info", "physical-memory", "MB"},
    {"Memory-slot", "speed", "MHz"},
    {"Processor", "l2-cache-size", "KB"},
    {"Processor", "l3-cache-size", "KB"},
    {"Processor", "current-clock-speed", "MHz"},
    {"control", "phys-memory", "MB"},
    {"control", "video-ram", "MB"},
    {"control", "cpu-speed", "MHz"},
    {"control", "hdd-capacity", "GB"},
    {"control", "disk", "GB"},
    {"Device", "device-speed", "Mb/s"},
    {"Device", "bus-power", "mA"},
    {"Device", "bus-power-used", "mA"},
    {"Removable", "bus-power", "mA"},
    {"Removable", "bus-power-used", "mA"},
    {"Profile", "system-sleep-timer", "min"},
    {"Profile", "disk-sleep-timer", "min"},
    {"Profile", "display-sleep-timer", "min"},
    {"max-visible-image-size", "width", "cm"},
    {"max-visible-image-size", "height", "cm"},
    {"max-visible-image-size", "diagonal", "in"},
    {"h-freq", "min", "kHz"},
    {"h-freq", "max", "kHz"},
    {"v-freq", "min", "Hz"},
    {"v-freq", "max", "Hz"},
    // Flags: "1" and "0".
    {"", "used", ""},
    {"", "is-default", ""},
    {"", "is-fax", ""},
    {"", "64bit-app", ""},
    {"", "app-store", ""},
    {"", "main-display", ""},
    {"", "serial-digital", ""},
    {"", "auto-restart-on-power-loss", ""},
    {"", "wake-on-lan", ""},
    {"", "wake-on-ac-change", ""},
    {"", "wake-on-clamshell-open", ""},
    {"", "display-sleep-uses-dim", ""},
    {"", "reduce-brightness", ""},
    {"", "sleep-on-power-button", ""},
    {"", "is-system-user", ""},
    {"", "static-ip", ""},
    {"", "stealth-mode", ""},
    {"", "fw-log", ""},
    {"env-var", "system", ""},
    {"service", "status", ""},
    {"app", "status", ""},
};

bool isNumber(std::string_view text) {
  size_t digits = 0;
  for (size_t i = 0; i < text.size(); ++i) {
    char c = text[i];
    if (c >= '0' && c <= '9') {
      ++digits;
    } else if (!(c == '.' || c == ',' || (c == '-' && i == 0))) {
      return false;
    }
  }
  return digits > 0;
}

bool allDigits(std::string_view text) {
  return !text.empty() && text.find_first_not_of("0123456789") == std::string_view::npos;
}

const FieldRule* findRule(std::string_view kind, std::string_view field) {
  field = recordKind(field);  // "disk:1" of the asset summary
  for (const FieldRule& rule : kRules)
    if (rule.field == field && (rule.kind.empty() || rule.kind == kind)) return &rule;
  return nullptr;
}

std::string twoDigits(int n) {
  return std::string(1, static_cast<char>('0' + n / 10 % 10)) + static_cast<char>('0' + n % 10);
}

// "00000006214209.000000:000": days, hours, minutes and seconds.
std::string displayUptime(std::string_view value) {
  if (value.size() < 14 || !allDigits(value.substr(0, 14))) return std::string(value);
  long days = std::strtol(std::string(value.substr(0, 8)).c_str(), nullptr, 10);
  std::string clock = std::string(value.substr(8, 2)) + ":" + std::string(value.substr(10, 2)) +
                      ":" + std::string(value.substr(12, 2));
  return days ? std::to_string(days) + (days == 1 ? " day " : " days ") + clock : clock;
}

}  // namespace

std::string_view recordKind(std::string_view record_name) {
  return record_name.substr(0, record_name.find(':'));
}

std::string displayValue(std::string_view kind, std::string_view field, std::string_view value) {
  if ((field == "timestamp" || field == "first-scan" || field == "last-scan" ||
       field == "snapshot-list") &&
      kind != "env-var")
    return displayScanTime(value);
  if (field == "inst-date" && value.size() == 8 && allDigits(value))
    return std::string(value.substr(0, 4)) + "-" + std::string(value.substr(4, 2)) + "-" +
           std::string(value.substr(6, 2));
  if (field == "uptime" && kind == "os") return displayUptime(value);
  const FieldRule* rule = findRule(kind, field);
  if (!rule) return std::string(value);
  if (rule->unit.empty()) return value == "1" ? "yes" : value == "0" ? "no" : std::string(value);
  if (!isNumber(value)) return std::string(value);
  return std::string(value) + (rule->unit == "%" ? "" : " ") + std::string(rule->unit);
}

std::string displayScanTime(std::string_view stamp) {
  // yyyyMMddHHmmss.000000 and a signed offset in minutes.
  if (stamp.size() < 23 || !allDigits(stamp.substr(0, 14)) || stamp[14] != '.' ||
      (stamp[21] != '+' && stamp[21] != '-') || !allDigits(stamp.substr(22)) || stamp.size() > 26)
    return std::string(stamp);
  int minutes = std::atoi(std::string(stamp.substr(22)).c_str());
  if (minutes > 24 * 60) return std::string(stamp);
  std::string out = std::string(stamp.substr(0, 4)) + "-" + std::string(stamp.substr(4, 2)) + "-" +
                    std::string(stamp.substr(6, 2)) + " " + std::string(stamp.substr(8, 2)) + ":" +
                    std::string(stamp.substr(10, 2)) + ":" + std::string(stamp.substr(12, 2));
  return out + " UTC" + stamp[21] + twoDigits(minutes / 60) + ":" + twoDigits(minutes % 60);
}

}  // namespace cvn
