// The frame of the inspector's HTML pages: one self-contained document with
// its style sheet inline, no script and nothing fetched, and the escaping
// that keeps collected text from ever becoming markup.
#ifndef CVN_TOOLS_HTML_PAGE_H_
#define CVN_TOOLS_HTML_PAGE_H_

#include <string>
#include <string_view>

namespace cvn {

/// Appends `text` as HTML text: markup characters become references, line
/// breaks stay (cells keep them), and controls and bytes that are no UTF-8
/// become U+FFFD.
void appendHtmlText(std::string_view text, std::string& out);
std::string htmlText(std::string_view text);

/// `<tag>text</tag>`. Long cells may break anywhere, short ones only
/// between words, so that a long command line does not squeeze a name
/// column to a letter's width.
void appendHtmlCell(const char* tag, std::string_view text, std::string& out);

/// The document up to the opening of <main>, with `title` escaped.
std::string htmlPageStart(std::string_view title);
/// Closes what htmlPageStart opened.
std::string_view htmlPageEnd();

}  // namespace cvn

#endif  // CVN_TOOLS_HTML_PAGE_H_
