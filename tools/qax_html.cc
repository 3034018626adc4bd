#include "qax_html.h"

#include <unordered_map>
#include <vector>

#include "field_display.h"
#include "html_page.h"
#include "mac_summary.h"

namespace cvn {

namespace {

// Past this many distinct fields a table of columns gets too wide to read.
constexpr size_t kMaxColumns = 8;

bool isComplexMarker(const QaxProperty& property) {
  for (const QaxAnnotation& a : property.annotations)
    if (a.key == "complex") return true;
  return false;
}

bool isGroup(const QaxNode& node) {
  return node.branch && node.name.find(':') == std::string::npos;
}

bool isEmptyRecord(const QaxNode& node) {
  return node.value.empty() && node.properties.empty() && node.children.empty();
}

// The fields of a record, and of the records inside it, as rows of a
// key/value table.
void appendFieldRows(const QaxNode& node, const std::string& prefix, bool with_records,
                     std::string& out) {
  std::string_view kind = recordKind(node.name);
  for (const QaxProperty& p : node.properties) {
    if (isComplexMarker(p)) continue;
    out += "<tr>";
    appendHtmlCell("th", prefix + p.name, out);
    appendHtmlCell("td", displayValue(kind, p.name, p.value), out);
    out += "</tr>\n";
  }
  for (const QaxNode& child : node.children) {
    if (!with_records) break;
    if (!child.value.empty()) {
      out += "<tr>";
      appendHtmlCell("th", prefix + child.name, out);
      appendHtmlCell("td", child.value, out);
      out += "</tr>\n";
    }
    appendFieldRows(child, prefix + child.name + " / ", true, out);
  }
}

// A record's table shows the records inside it; a group's shows only its
// own fields, its records follow in tables of their own.
void appendFieldTable(const QaxNode& node, std::string_view caption, bool with_records,
                      std::string& out) {
  out += "<div class=\"scroll\"><table class=\"fields\">";
  if (!caption.empty()) appendHtmlCell("caption", caption, out);
  out += "\n";
  appendFieldRows(node, std::string(), with_records, out);
  out += "</table></div>\n";
}

// Records of one shape read best as rows under shared column heads; records
// that differ (a hard disk beside a USB stick) each get their own table.
bool fitsColumns(const std::vector<const QaxNode*>& records,
                 std::vector<std::string_view>* columns) {
  for (const QaxNode* record : records) {
    if (!record->children.empty()) return false;
    for (const QaxProperty& p : record->properties) {
      if (isComplexMarker(p)) continue;
      bool known = false;
      for (std::string_view c : *columns) known = known || c == p.name;
      if (!known) columns->push_back(p.name);
      if (columns->size() > kMaxColumns) return false;
    }
  }
  for (const QaxNode* record : records)
    if (record->properties.size() * 2 < columns->size()) return false;
  return true;
}

void appendRecordRows(const std::vector<const QaxNode*>& records,
                      const std::vector<std::string_view>& columns, std::string& out) {
  // "Memory-slot" above "1", "2" rather than the kind repeated on each row.
  std::string_view kind = recordKind(records.front()->name);
  bool one_kind = kind.size() < records.front()->name.size();
  bool has_names = false;
  for (const QaxNode* record : records) {
    one_kind = one_kind && recordKind(record->name) == kind && record->name.size() > kind.size() &&
               record->name[kind.size()] == ':';
    has_names = has_names || !record->value.empty();
  }
  out += "<div class=\"scroll\"><table>\n<thead><tr>";
  appendHtmlCell("th", one_kind ? kind : std::string_view("Record"), out);
  if (has_names) out += "<th>Name</th>";
  for (std::string_view c : columns) appendHtmlCell("th", c, out);
  out += "</tr></thead>\n<tbody>\n";
  for (const QaxNode* record : records) {
    out += "<tr>";
    appendHtmlCell("td",
                   one_kind ? std::string_view(record->name).substr(kind.size() + 1)
                            : std::string_view(record->name),
                   out);
    if (has_names) appendHtmlCell("td", record->value, out);
    std::string_view record_kind = recordKind(record->name);
    for (std::string_view c : columns) {
      const QaxProperty* p = record->findProperty(c);
      appendHtmlCell("td", p ? displayValue(record_kind, c, p->value) : std::string(), out);
    }
    out += "</tr>\n";
  }
  out += "</tbody>\n</table></div>\n";
}

class ReportWriter {
 public:
  explicit ReportWriter(std::string& out) : out_(out) {}

  void appendTree(const QaxNode& top, std::string_view title) {
    appendGroup(top, std::string(title), 0);
  }

  /// The anchors of the sections written, with their titles.
  std::vector<std::pair<std::string, std::string>> toc;

 private:
  void appendGroup(const QaxNode& group, const std::string& title, int depth) {
    if (depth <= 1) {
      std::string id = "s" + std::to_string(toc.size() + 1);
      toc.emplace_back(id, title);
      out_ += "<section>\n<h2 id=\"" + id + "\">";
    } else {
      out_ += "<h3>";
    }
    appendHtmlText(title, out_);
    out_ += depth <= 1 ? "</h2>\n" : "</h3>\n";
    bool has_fields = !group.value.empty();
    for (const QaxProperty& p : group.properties) has_fields = has_fields || !isComplexMarker(p);
    if (has_fields) appendFieldTable(group, group.value, false, out_);
    // Records of one kind share a table; a disk's table is not a USB stick's.
    std::vector<std::vector<const QaxNode*>> kinds;
    std::unordered_map<std::string_view, size_t> kind_index;
    for (const QaxNode& child : group.children) {
      if (isGroup(child) || isEmptyRecord(child)) continue;
      auto found = kind_index.try_emplace(recordKind(child.name), kinds.size());
      if (found.second) kinds.emplace_back();
      kinds[found.first->second].push_back(&child);
    }
    for (const std::vector<const QaxNode*>& records : kinds) appendRecords(records);
    // The top tag's fields stand alone; each section is a group of its own.
    for (const QaxNode& child : group.children) {
      if (!isGroup(child)) continue;
      appendGroup(child, depth == 0 ? child.name : title + " / " + child.name, depth + 1);
    }
    if (depth <= 1) out_ += "</section>\n";
  }

  void appendRecords(const std::vector<const QaxNode*>& records) {
    std::vector<std::string_view> columns;
    if (records.size() > 1 && fitsColumns(records, &columns)) {
      appendRecordRows(records, columns, out_);
      return;
    }
    for (const QaxNode* record : records) {
      std::string caption = record->name;
      if (!record->value.empty()) caption += " \xC2\xB7 " + record->value;
      appendFieldTable(*record, caption, true, out_);
    }
  }

  std::string& out_;
};

void appendSummary(const MacSummary& summary, std::string& out) {
  out += "<dl class=\"summary\">\n";
  for (const MacSummaryLine& line : summary.lines) {
    appendHtmlCell("dt", line.label, out);
    out += "<dd>";
    if (line.values.empty()) out += "\xE2\x80\x94";
    for (const std::string& value : line.values) {
      if (line.values.size() > 1) out += "<span>";
      appendHtmlText(value, out);
      if (line.values.size() > 1) out += "</span>";
    }
    out += "</dd>\n";
  }
  out += "</dl>\n";
}

}  // namespace

std::string renderQaxHtml(const QaxFile& file, std::string_view file_name) {
  MacSummary summary = summarizeMac(file, file_name);
  std::string body;
  ReportWriter writer(body);
  if (const QaxNode* snapshot = findTreeTop(file, "snapshot")) writer.appendTree(*snapshot, "Scan");
  if (const QaxNode* asset = findTreeTop(file, "assetinfo"))
    writer.appendTree(*asset, "Asset information");
  std::string out = htmlPageStart("Mac report: " + summary.name);
  out += "<h1>";
  appendHtmlText(summary.name.empty() ? std::string_view("Mac report") : summary.name, out);
  out += "</h1>\n<p class=\"subtitle\">Inventory scanned ";
  appendHtmlText(summary.scanned, out);
  out += ", from ";
  appendHtmlText(file_name, out);
  out += "</p>\n";
  appendSummary(summary, out);
  out += "<nav>";
  for (const auto& entry : writer.toc) {
    out += "<a href=\"#" + entry.first + "\">";
    appendHtmlText(entry.second, out);
    out += "</a> ";
  }
  out += "</nav>\n";
  out += body;
  out += htmlPageEnd();
  return out;
}

}  // namespace cvn
