// Collected text that becomes part of a shell command: a folder or device
// name must never end its quotes or start a substitution.
#ifndef CVN_COLLECT_SHELL_QUOTE_H_
#define CVN_COLLECT_SHELL_QUOTE_H_

#include <string>
#include <string_view>

namespace cvn {

/// `text` ready to stand inside double quotes in a shell command: the
/// characters the shell still interprets there ($ ` " \) are escaped, so a
/// value never ends the quotes or starts a substitution.
std::string escapeForDoubleQuotes(std::string_view text);
/// `text` as one shell word: unchanged when it holds only characters that
/// are safe unquoted ([A-Za-z0-9_./:@%+,=-]), else single-quoted.
std::string shellQuote(std::string_view text);

}  // namespace cvn

#endif  // CVN_COLLECT_SHELL_QUOTE_H_
