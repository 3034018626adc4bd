#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "collect/command_runner.h"
#include "collect/file_system.h"
#include "collect/plist.h"
#include "collect/shell_quote.h"
#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// An Info.plist is a few kilobytes; anything far larger is not one.
constexpr size_t kMaxInfoPlistBytes = 1 << 20;

// What a bundle says about itself; empty texts are unknown.
struct BundleInfo {
  std::string name;
  std::string version;
  std::string description;
};

bool isHidden(std::string_view name) { return !name.empty() && name.front() == '.'; }

// "Flash Player.plugin" names itself "Flash Player" when its plist does not.
std::string nameFromFolder(const std::string& folder) {
  size_t dot = folder.rfind('.');
  return dot == std::string::npos || dot == 0 ? folder : folder.substr(0, dot);
}

std::string firstString(const PlistValue& info, std::initializer_list<std::string_view> keys) {
  for (std::string_view key : keys) {
    std::optional<std::string_view> text = info.findText(key);
    if (text && !text->empty()) return std::string(*text);
  }
  return std::string();
}

// Binary property lists go through plutil first: our reader takes XML only.
bool readInfoPlist(FileSystem& fs, CommandRunner& runner, const std::string& path, Plist* info) {
  std::string bytes;
  if (!fs.readFile(path, kMaxInfoPlistBytes, &bytes) || bytes.empty()) return false;
  if (bytes.compare(0, 6, "bplist") == 0)
    bytes = runner.run("plutil -convert xml1 -o - \"" + escapeForDoubleQuotes(path) + "\"", 4096);
  return parsePlist(bytes, info) && info->isDictionary();
}

BundleInfo readBundle(FileSystem& fs, CommandRunner& runner, const std::string& bundle_path,
                      const std::string& folder, const std::vector<std::string>& plist_paths) {
  BundleInfo bundle;
  for (const std::string& relative : plist_paths) {
    Plist info;
    if (!readInfoPlist(fs, runner, bundle_path + relative, &info)) continue;
    bundle.name = firstString(info, {"CFBundleName"});
    bundle.version = firstString(info, {"CFBundleShortVersionString", "CFBundleVersion"});
    bundle.description = firstString(info, {"WebPluginDescription", "CFBundleGetInfoString"});
    break;
  }
  if (bundle.name.empty()) bundle.name = nameFromFolder(folder);
  return bundle;
}

/// The bundles directly inside `folder` (hidden entries and plain files are
/// not bundles).
std::vector<std::string> listBundles(FileSystem& fs, const std::string& folder,
                                     std::string_view suffix) {
  std::vector<std::string> bundles;
  for (const std::string& entry : fs.listDirectory(folder)) {
    if (isHidden(entry)) continue;
    if (entry.size() < suffix.size() ||
        entry.compare(entry.size() - suffix.size(), suffix.size(), suffix) != 0)
      continue;
    if (fs.isDirectory(folder + "/" + entry)) bundles.push_back(entry);
  }
  return bundles;
}

void writeRecord(Tag& record, const BundleInfo& bundle, const std::string& location,
                 bool with_description) {
  record.setProperty("name", TagValue(bundle.name));
  if (!bundle.version.empty()) record.setProperty("version", TagValue(bundle.version));
  record.setProperty("location", TagValue(location));
  if (with_description && !bundle.description.empty())
    record.setProperty("description", TagValue(bundle.description));
}

void writePlugIns(Tag& software, FileSystem& fs, CommandRunner& runner) {
  Tag& group = software.addChild("InternetPlug-Ins");
  std::vector<std::string> folders = {"/Library/Internet Plug-Ins"};
  for (const std::string& user : fs.listDirectory("/Users")) {
    std::string home = "/Users/" + user;
    if (!isHidden(user) && fs.isDirectory(home))
      folders.push_back(home + "/Library/Internet Plug-Ins");
  }
  const std::vector<std::string> plist_paths = {"/Contents/Info.plist"};
  int number = 0;
  for (const std::string& folder : folders) {
    for (const std::string& entry : listBundles(fs, folder, "")) {
      std::string path = folder + "/" + entry;
      BundleInfo bundle = readBundle(fs, runner, path, entry, plist_paths);
      Tag& record = addComplexRecord(group, formatText("plugin:%d", ++number));
      writeRecord(record, bundle, path, true);
    }
  }
}

void writeLibraries(Tag& software, FileSystem& fs, CommandRunner& runner) {
  Tag& group = software.addChild("Libraries");
  const std::string folder = "/Library/Frameworks";
  // Frameworks keep their Info.plist in Resources, reached through the
  // Versions/Current link; a few are laid out like applications.
  const std::vector<std::string> plist_paths = {
      "/Resources/Info.plist", "/Versions/Current/Resources/Info.plist", "/Contents/Info.plist"};
  int number = 0;
  for (const std::string& entry : listBundles(fs, folder, ".framework")) {
    std::string path = folder + "/" + entry;
    BundleInfo bundle = readBundle(fs, runner, path, entry, plist_paths);
    Tag& record = addComplexRecord(group, formatText("library:%d", ++number));
    writeRecord(record, bundle, path, false);
  }
}

}  // namespace

void buildPlugInsSection(TagTree& snapshot, FileSystem& fs, CommandRunner& runner) {
  Tag& software = snapshot.top().addChild("Software");
  writePlugIns(software, fs, runner);
  writeLibraries(software, fs, runner);
}

}  // namespace cvn
