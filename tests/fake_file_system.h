// An in-memory FileSystem: files with their bytes, and the folders that hold
// them (created along each file's path).
#ifndef CVN_TESTS_FAKE_FILE_SYSTEM_H_
#define CVN_TESTS_FAKE_FILE_SYSTEM_H_

#include <map>
#include <set>
#include <string>
#include <vector>

#include "collect/file_system.h"

namespace cvn {

class FakeFileSystem : public FileSystem {
 public:
  void addFile(const std::string& path, std::string bytes) {
    files_[path] = std::move(bytes);
    addDirectory(path.substr(0, path.rfind('/')));
    entries_[path.substr(0, path.rfind('/'))].insert(path.substr(path.rfind('/') + 1));
  }
  void addDirectory(const std::string& path) {
    for (std::string dir = path; !dir.empty(); dir = dir.substr(0, dir.rfind('/'))) {
      directories_.insert(dir);
      size_t slash = dir.rfind('/');
      if (slash == std::string::npos) break;
      if (slash > 0) entries_[dir.substr(0, slash)].insert(dir.substr(slash + 1));
    }
  }

  std::vector<std::string> listDirectory(const std::string& path) override {
    auto it = entries_.find(path);
    if (it == entries_.end()) return {};
    return std::vector<std::string>(it->second.begin(), it->second.end());
  }
  bool isDirectory(const std::string& path) override { return directories_.count(path) > 0; }
  bool readFile(const std::string& path, size_t max_bytes, std::string* out) override {
    out->clear();
    auto it = files_.find(path);
    if (it == files_.end()) return false;
    *out = it->second.substr(0, max_bytes);
    return true;
  }

 private:
  std::map<std::string, std::string> files_;
  std::set<std::string> directories_;
  std::map<std::string, std::set<std::string>> entries_;
};

}  // namespace cvn

#endif  // CVN_TESTS_FAKE_FILE_SYSTEM_H_
