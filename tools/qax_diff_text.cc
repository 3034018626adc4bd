#include "qax_diff_text.h"

#include "qax_json.h"
#include "utf8_text.h"

namespace cvn {

namespace {

using Kind = QaxChange::Kind;
using Subject = QaxChange::Subject;

std::string quoted(const std::string& text) { return terminalText(text, true); }
std::string plain(const std::string& text) { return terminalText(text, false); }

// An added or removed record's own value, when its name does not already
// tell it (a device's name beside "Device:7", not "Safari" beside
// "Soft:Safari 5.1").
std::string recordValueText(const QaxChange& change) {
  const std::string& value = change.kind == Kind::kAdded ? change.new_value : change.old_value;
  if (value.empty() || change.record.find(value) != std::string::npos) return std::string();
  return " " + quoted(value);
}

}  // namespace

std::string renderDiffText(const QaxDiff& diff) {
  std::string out;
  const std::string* section = nullptr;
  const std::string* record = nullptr;
  bool upgrade_said = false;
  for (const QaxChange& change : diff.changes) {
    if (!section || *section != change.section) {
      out += plain(change.section) + "\n";
      section = &change.section;
      record = nullptr;
    }
    if (change.subject == Subject::kRecord) {
      record = &change.record;
      upgrade_said = !change.note.empty();
      if (change.kind == Kind::kChanged) {
        out += "  ~ " + plain(change.record) + " (" +
               (change.note.empty() ? "was " + plain(change.old_value) : plain(change.note)) +
               ")\n";
      } else {
        out += (change.kind == Kind::kAdded ? "  + " : "  - ") + plain(change.record) +
               recordValueText(change) + "\n";
        record = nullptr;
      }
      continue;
    }
    if (!record || *record != change.record) {
      out += "  ~ " + plain(change.record) + "\n";
      record = &change.record;
      upgrade_said = false;
    }
    if (upgrade_said && change.field == "version") continue;
    out += "      " +
           (change.subject == Subject::kValue ? std::string("(name)") : plain(change.field)) + ": ";
    if (change.kind == Kind::kAdded) {
      out += "added " + quoted(change.new_value);
    } else if (change.kind == Kind::kRemoved) {
      out += "removed " + quoted(change.old_value);
    } else {
      out += quoted(change.old_value) + " -> " + quoted(change.new_value);
    }
    out += "\n";
  }
  return out;
}

std::string renderDiffJson(const QaxDiff& diff) {
  std::string out = "[";
  for (size_t i = 0; i < diff.changes.size(); ++i) {
    const QaxChange& change = diff.changes[i];
    out += i ? ",\n  {\"section\": " : "\n  {\"section\": ";
    appendJsonString(change.section, out);
    out += ", \"record\": ";
    appendJsonString(change.record, out);
    out += change.kind == Kind::kAdded     ? ", \"change\": \"added\""
           : change.kind == Kind::kRemoved ? ", \"change\": \"removed\""
                                           : ", \"change\": \"changed\"";
    out += ", \"field\": ";
    if (change.subject == Subject::kRecord) {
      out += "null";
    } else {
      appendJsonString(change.field, out);
    }
    out += ", \"old\": ";
    if (change.kind == Kind::kAdded) {
      out += "null";
    } else {
      appendJsonString(change.old_value, out);
    }
    out += ", \"new\": ";
    if (change.kind == Kind::kRemoved) {
      out += "null";
    } else {
      appendJsonString(change.new_value, out);
    }
    out += "}";
  }
  out += diff.changes.empty() ? "]\n" : "\n]\n";
  return out;
}

std::string differentMacText(const QaxDiff& diff) {
  return "not the same Mac: serial number " + quoted(diff.old_serial) + " then " +
         quoted(diff.new_serial) + ", MAC address " + quoted(diff.old_mac) + " then " +
         quoted(diff.new_mac) + "; compared all the same";
}

}  // namespace cvn
