#include "collect/command_runner.h"

#include <cstdio>
#include <vector>

namespace cvn {

std::string PipeCommandRunner::run(const std::string& command, size_t chunk_size) {
  std::string output;
  if (chunk_size == 0) chunk_size = 1;
  FILE* pipe = ::popen(command.c_str(), "r");
  if (!pipe) return output;
  std::vector<char> chunk(chunk_size);
  size_t got = 0;
  // A tool that has not written yet when we first look gets three chances.
  for (int attempt = 0; attempt < 3; ++attempt) {
    got = std::fread(chunk.data(), 1, chunk_size, pipe);
    if (got > 0 || std::feof(pipe) || std::ferror(pipe)) break;
    std::clearerr(pipe);
  }
  output.append(chunk.data(), got);
  while (got == chunk_size && !std::feof(pipe) && !std::ferror(pipe)) {
    got = std::fread(chunk.data(), 1, chunk_size, pipe);
    output.append(chunk.data(), got);
  }
  ::pclose(pipe);
  return output;
}

CommandRunner& systemCommandRunner() {
  static PipeCommandRunner runner;
  return runner;
}

std::string escapeForDoubleQuotes(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  for (char c : text) {
    if (c == '$' || c == '`' || c == '"' || c == '\\') out += '\\';
    out += c;
  }
  return out;
}

std::string shellQuote(std::string_view text) {
  bool safe = !text.empty();
  for (char c : text) {
    bool ok = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
    for (char s : std::string_view("_./:@%+,=-"))
      if (c == s) ok = true;
    if (!ok) {
      safe = false;
      break;
    }
  }
  if (safe) return std::string(text);
  std::string out = "'";
  for (char c : text) {
    if (c == '\'') {
      out += "'\\''";
    } else {
      out += c;
    }
  }
  out += '\'';
  return out;
}

}  // namespace cvn
