#include <gtest/gtest.h>

#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

#include "fake_command_runner.h"
#include "fake_file_system.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

std::string infoPlist(std::initializer_list<std::pair<const char*, const char*>> strings,
                      const std::string& more = "") {
  std::string xml = "<plist version=\"1.0\"><dict>";
  for (const auto& [key, value] : strings)
    xml += std::string("<key>") + key + "</key><string>" + value + "</string>";
  return xml + more + "</dict></plist>";
}

TEST(PlugInsSectionTest, RecordsEveryBundleOfTheMachineAndItsUsers) {
  FakeFileSystem fs;
  FakeCommandRunner runner;
  auto build = [&] {
    TagTree snapshot(true, "Snapshot");
    buildPlugInsSection(snapshot, fs, runner);
    return treeText(snapshot.top().findChild("Software"));
  };
  EXPECT_EQ(build(), "+Software=\n*InternetPlug-Ins=\n*Libraries=\n-\n");

  const std::string global = "/Library/Internet Plug-Ins";
  // A binary list that plutil cannot read still leaves the bundle.
  fs.files_[global + "/Broken.plugin/Contents/Info.plist"] = "bplist00";
  fs.files_[global + "/.Hidden.plugin/"] = "";
  fs.files_[global + "/README.txt"] = "";
  const std::string odd = "/Users/alice/Library/Internet Plug-Ins/O\"dd$(x).plugin";
  fs.files_[odd + "/Contents/Info.plist"] = std::string("bplist00\xd1\x01\x02", 11);
  runner.answer(
      "plutil -convert xml1 -o - \"/Users/alice/Library/Internet Plug-Ins/"
      "O\\\"dd\\$(x).plugin/Contents/Info.plist\"",
      infoPlist({{"CFBundleShortVersionString", "7.7"},
                 {"CFBundleVersion", "7.7.3"},
                 {"WebPluginDescription", "Odd 7.7"},
                 {"CFBundleGetInfoString", "Copyright"}}));
  fs.files_["/Users/Shared/"] = "";
  fs.files_["/Users/.hidden/Library/Internet Plug-Ins/Hidden.plugin/"] = "";
  fs.files_["/Library/Frameworks/Headers/"] = "";
  fs.files_["/Library/Frameworks/Python.framework/Versions/Current/Resources/Info.plist"] =
      infoPlist({{"CFBundleVersion", "2.7"}}, "<key>CFBundleName</key><integer>7</integer>");

  EXPECT_EQ(build(), R"x(+Software=
+InternetPlug-Ins=
plugin:1=""
~complex=
plugin:2=""
~complex=
*plugin:1=
name="Broken"
location="/Library/Internet Plug-Ins/Broken.plugin"
*plugin:2=
name="O"dd$(x)"
version="7.7"
location="/Users/alice/Library/Internet Plug-Ins/O"dd$(x).plugin"
description="Odd 7.7"
-
+Libraries=
library:1=""
~complex=
*library:1=
name="Python"
version="2.7"
location="/Library/Frameworks/Python.framework"
-
-
)x");
  EXPECT_EQ(runner.commands_ran_.size(), 2u);
}

}  // namespace
}  // namespace cvn
