#include "html_page.h"

#include "utf8_text.h"

namespace cvn {

namespace {

constexpr size_t kShortCell = 32;

// Sized for a laptop screen, long values wrap instead of widening the page,
// and paper gets black on white without the navigation.
constexpr std::string_view kStyle = R"(
* { box-sizing: border-box; }
body { margin: 0; background: #f4f5f7; color: #1d1d1f;
  font: 15px/1.45 -apple-system, "Segoe UI", Roboto, "Helvetica Neue", Arial, sans-serif; }
main { max-width: 1200px; margin: 0 auto; padding: 24px 28px 48px; }
h1 { font-size: 26px; margin: 0 0 2px; }
h2 { font-size: 20px; margin: 32px 0 10px; padding-bottom: 4px; border-bottom: 2px solid #c9ccd3; }
h3 { font-size: 16px; margin: 20px 0 8px; color: #3a3b40; }
.subtitle { margin: 0 0 18px; color: #5f6168; }
.note { margin: 12px 0; padding: 8px 12px; border-left: 4px solid #c77700; background: #fff4df; }
dl.summary { display: grid; grid-template-columns: max-content minmax(0, 1fr); gap: 6px 28px;
  margin: 0; padding: 16px 20px; background: #fff; border: 1px solid #d5d7dd; border-radius: 10px; }
dl.summary dt { font-weight: 600; color: #5f6168; }
dl.summary dd { margin: 0; overflow-wrap: anywhere; }
dl.summary dd span { display: block; }
nav { margin: 18px 0 0; font-size: 14px; line-height: 1.9; }
nav a { margin-right: 14px; color: #0b5cad; text-decoration: none; white-space: nowrap; }
table { width: 100%; border-collapse: collapse; margin: 0 0 14px; background: #fff; font-size: 13.5px; }
caption { text-align: left; font-weight: 600; padding: 6px 0 4px; overflow-wrap: anywhere; }
div.scroll { overflow-x: auto; margin: 0 0 14px; }
div.scroll table { margin: 0; }
th, td { text-align: left; vertical-align: top; padding: 5px 9px; border: 1px solid #e1e3e8;
  white-space: pre-wrap; overflow-wrap: break-word; }
.long { overflow-wrap: anywhere; }
thead th { background: #e9ebf0; font-weight: 600; }
tbody tr:nth-child(even) td { background: #f9fafb; }
table.fields th { width: 30%; background: #f1f2f5; font-weight: 600; }
td.mark { white-space: nowrap; font-weight: 600; }
table.diff { table-layout: fixed; }
table.diff th:nth-child(1) { width: 10em; }
table.diff th:nth-child(2) { width: 24%; }
table.diff th:nth-child(3) { width: 18%; }
table.diff tr.added td { background: #e7f5ea; }
table.diff tr.removed td { background: #fcebea; }
table.diff tr.changed td { background: #fff6e3; }
table.diff tr.added td.mark { color: #146c2e; }
table.diff tr.removed td.mark { color: #a3221b; }
table.diff tr.changed td.mark { color: #8a5300; }
@media print {
  body { background: #fff; font-size: 10pt; }
  main { max-width: none; padding: 0; }
  nav { display: none; }
  div.scroll { overflow: visible; }
  dl.summary { border-color: #888; break-inside: avoid; }
  h2, h3, caption { break-after: avoid; }
  tr { break-inside: avoid; }
  thead { display: table-header-group; }
  th, td { border-color: #999; }
}
)";

}  // namespace

void appendHtmlText(std::string_view text, std::string& out) {
  size_t i = 0;
  while (i < text.size()) {
    char c = text[i];
    size_t length = utf8SequenceLength(text, i);
    uint32_t cp = length ? utf8CodePoint(text, i, length) : 0;
    if (length == 0 || (cp < 0x20 && c != '\n' && c != '\t') || (cp >= 0x7F && cp < 0xA0)) {
      out += "\xEF\xBF\xBD";
    } else if (c == '&') {
      out += "&amp;";
    } else if (c == '<') {
      out += "&lt;";
    } else if (c == '>') {
      out += "&gt;";
    } else if (c == '"') {
      out += "&quot;";
    } else if (c == '\'') {
      out += "&#39;";
    } else {
      out.append(text, i, length);
    }
    i += length ? length : 1;
  }
}

std::string htmlText(std::string_view text) {
  std::string out;
  appendHtmlText(text, out);
  return out;
}

void appendHtmlCell(const char* tag, std::string_view text, std::string& out) {
  out += '<';
  out += tag;
  if (text.size() > kShortCell) out += " class=\"long\"";
  out += '>';
  appendHtmlText(text, out);
  out += "</";
  out += tag;
  out += '>';
}

std::string htmlPageStart(std::string_view title) {
  std::string out =
      "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
      "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
      "<meta http-equiv=\"Content-Security-Policy\" content=\"default-src 'none'; "
      "style-src 'unsafe-inline'\">\n<title>";
  appendHtmlText(title, out);
  out += "</title>\n<style>";
  out += kStyle;
  out += "</style>\n</head>\n<body>\n<main>\n";
  return out;
}

std::string_view htmlPageEnd() { return "</main>\n</body>\n</html>\n"; }

}  // namespace cvn
