// Where the recorded outputs of real Macs are, for the tests that run the
// agent's code over them: CVN_CORPUS_DIR, else the "shared/corpus" folder
// beside the checkout. Tests skip when neither exists.
#ifndef CVN_TESTS_CORPUS_FILES_H_
#define CVN_TESTS_CORPUS_FILES_H_

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <system_error>

namespace cvn {

/// The corpus folder, or an empty path when there is none.
inline std::filesystem::path findCorpus() {
  std::error_code error;
  if (const char* dir = std::getenv("CVN_CORPUS_DIR"))
    return std::filesystem::is_directory(dir, error) ? std::filesystem::path(dir)
                                                     : std::filesystem::path();
  for (const char* candidate :
       {CVN_SOURCE_DIR "/../shared/corpus", CVN_SOURCE_DIR "/../../shared/corpus"}) {
    if (std::filesystem::is_directory(candidate, error)) return candidate;
  }
  return {};
}

inline std::string readWholeFile(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream bytes;
  bytes << in.rdbuf();
  return bytes.str();
}

/// A recorded property list: starts with the XML declaration, holds a plist.
inline bool isPlistText(const std::string& text) {
  return text.compare(0, 5, "<?xml") == 0 && text.find("<plist") != std::string::npos;
}

}  // namespace cvn

#endif  // CVN_TESTS_CORPUS_FILES_H_
