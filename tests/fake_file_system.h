// A FileSystem held in memory, for builders that walk folders and for whole
// scans that must not see the machine's own files.
#ifndef CVN_TESTS_FAKE_FILE_SYSTEM_H_
#define CVN_TESTS_FAKE_FILE_SYSTEM_H_

#include <map>
#include <set>
#include <string>
#include <vector>

#include "collect/file_system.h"

namespace cvn {

// Files by path; a folder is any path that something lies below, so "F/"
// alone makes an empty folder F.
class FakeFileSystem : public FileSystem {
 public:
  std::vector<std::string> listDirectory(const std::string& path) override {
    std::set<std::string> names;
    for (const auto& file : files_) {
      if (file.first.compare(0, path.size() + 1, path + "/") != 0) continue;
      std::string rest = file.first.substr(path.size() + 1);
      if (!rest.empty()) names.insert(rest.substr(0, rest.find('/')));
    }
    return std::vector<std::string>(names.begin(), names.end());
  }
  bool isDirectory(const std::string& path) override {
    auto below = files_.lower_bound(path + "/");
    return below != files_.end() && below->first.compare(0, path.size() + 1, path + "/") == 0;
  }
  bool readFile(const std::string& path, size_t max_bytes, std::string* out) override {
    auto it = files_.find(path);
    *out = it == files_.end() ? "" : it->second.substr(0, max_bytes);
    return it != files_.end();
  }
  std::map<std::string, std::string> files_;
};

}  // namespace cvn

#endif  // CVN_TESTS_FAKE_FILE_SYSTEM_H_
