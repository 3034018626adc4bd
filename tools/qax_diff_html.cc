#include "qax_diff_html.h"

#include "field_display.h"
#include "html_page.h"
#include "mac_summary.h"

namespace cvn {

namespace {

using Kind = QaxChange::Kind;
using Subject = QaxChange::Subject;

// Field values read as in the report: with their units, flags as yes/no.
std::string shown(const QaxChange& change, const std::string& value) {
  if (change.subject != Subject::kField) return value;
  std::string_view record = change.record;
  record.remove_prefix(std::min(record.size(), record.rfind('/') + 1));
  return displayValue(recordKind(record), change.field, value);
}

void appendRow(const QaxChange& change, std::string& out) {
  static const char* const kMarks[] = {"+ added", "\xE2\x88\x92 removed", "~ changed"};
  static const char* const kClasses[] = {"added", "removed", "changed"};
  int kind = static_cast<int>(change.kind);
  out += "<tr class=\"";
  out += kClasses[kind];
  out += "\"><td class=\"mark\">";
  out += kMarks[kind];
  out += "</td>";
  appendHtmlCell("td", change.record, out);
  if (change.subject == Subject::kRecord) {
    appendHtmlCell(
        "td", change.note.empty() && change.kind == Kind::kChanged ? "renamed" : change.note, out);
  } else {
    appendHtmlCell(
        "td", change.subject == Subject::kValue ? std::string_view("(name)") : change.field, out);
  }
  appendHtmlCell(
      "td", change.kind == Kind::kAdded ? std::string() : shown(change, change.old_value), out);
  appendHtmlCell(
      "td", change.kind == Kind::kRemoved ? std::string() : shown(change, change.new_value), out);
  out += "</tr>\n";
}

void appendScan(const char* label, const MacSummary& summary, std::string_view name,
                std::string& out) {
  out += "<dt>";
  out += label;
  out += "</dt><dd>";
  for (std::string_view part :
       {name, std::string_view(summary.name), std::string_view(summary.scanned)}) {
    out += "<span>";
    appendHtmlText(part, out);
    out += "</span>";
  }
  out += "</dd>\n";
}

}  // namespace

std::string renderDiffHtml(const QaxDiff& diff, const QaxFile& old_file, std::string_view old_name,
                           const QaxFile& new_file, std::string_view new_name) {
  MacSummary old_summary = summarizeMac(old_file, old_name);
  MacSummary new_summary = summarizeMac(new_file, new_name);
  std::string out = htmlPageStart("Changes on " + new_summary.name);
  out += "<h1>Changes on ";
  appendHtmlText(new_summary.name, out);
  out += "</h1>\n<p class=\"subtitle\">From the scan of ";
  appendHtmlText(old_summary.scanned, out);
  out += " to the scan of ";
  appendHtmlText(new_summary.scanned, out);
  out += "</p>\n";
  if (!diff.same_mac) {
    out += "<p class=\"note\">Not the same Mac: serial number \xE2\x80\x9C";
    appendHtmlText(diff.old_serial, out);
    out += "\xE2\x80\x9D then \xE2\x80\x9C";
    appendHtmlText(diff.new_serial, out);
    out += "\xE2\x80\x9D, MAC address \xE2\x80\x9C";
    appendHtmlText(diff.old_mac, out);
    out += "\xE2\x80\x9D then \xE2\x80\x9C";
    appendHtmlText(diff.new_mac, out);
    out += "\xE2\x80\x9D. Compared all the same.</p>\n";
  }
  size_t counts[3] = {0, 0, 0};
  for (const QaxChange& change : diff.changes) ++counts[static_cast<int>(change.kind)];
  out += "<dl class=\"summary\">\n";
  appendScan("Old", old_summary, old_name, out);
  appendScan("New", new_summary, new_name, out);
  out += "<dt>Changes</dt><dd>" + std::to_string(counts[0]) + " added, " +
         std::to_string(counts[1]) + " removed, " + std::to_string(counts[2]) +
         " changed</dd>\n</dl>\n";
  if (diff.changes.empty()) out += "<p>Nothing changed.</p>\n";
  const std::string* section = nullptr;
  for (const QaxChange& change : diff.changes) {
    if (!section || *section != change.section) {
      if (section) out += "</tbody>\n</table></div>\n</section>\n";
      section = &change.section;
      out += "<section>\n<h2>";
      appendHtmlText(change.section, out);
      out +=
          "</h2>\n<div class=\"scroll\"><table "
          "class=\"diff\">\n<thead><tr><th>Change</th><th>Record</th>"
          "<th>Field</th><th>Old</th><th>New</th></tr></thead>\n<tbody>\n";
    }
    appendRow(change, out);
  }
  if (section) out += "</tbody>\n</table></div>\n</section>\n";
  out += htmlPageEnd();
  return out;
}

}  // namespace cvn
