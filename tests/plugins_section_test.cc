#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "fake_command_runner.h"
#include "fake_file_system.h"
#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

std::string infoPlist(const std::vector<std::pair<std::string, std::string>>& strings) {
  std::string xml =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
      "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
      "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
      "<plist version=\"1.0\">\n<dict>\n";
  for (const auto& [key, value] : strings)
    xml += "\t<key>" + key + "</key>\n\t<string>" + value + "</string>\n";
  return xml + "\t<key>CFBundleSignature</key>\n\t<integer>7</integer>\n</dict>\n</plist>\n";
}

class PlugInsSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildPlugInsSection(snapshot_, fs_, runner_);
    return treeText(snapshot_.top().findChild("Software"));
  }

  TagTree snapshot_{true, "Snapshot"};
  FakeFileSystem fs_;
  FakeCommandRunner runner_;
};

TEST_F(PlugInsSectionTest, MissingFoldersGiveEmptyGroups) {
  EXPECT_EQ(build(), "+Software=\n*InternetPlug-Ins=\n*Libraries=\n-\n");
  EXPECT_TRUE(runner_.commands_ran_.empty());
}

TEST_F(PlugInsSectionTest, RecordsEveryBundleOfTheMachineAndItsUsers) {
  const std::string global = "/Library/Internet Plug-Ins";
  fs_.addFile(global + "/Flash Player.plugin/Contents/Info.plist",
              infoPlist({{"CFBundleName", "Shockwave Flash"},
                         {"CFBundleShortVersionString", "11.9.900.152"},
                         {"CFBundleVersion", "11.9.900"},
                         {"WebPluginDescription", "Shockwave Flash 11.9 r900"},
                         {"CFBundleGetInfoString", "Copyright Adobe"}}));
  // Binary lists are converted by plutil.
  const std::string quicktime = global + "/QuickTime Plugin.plugin/Contents/Info.plist";
  fs_.addFile(quicktime, std::string("bplist00\xd1\x01\x02", 11));
  runner_.answer("plutil -convert xml1 -o - \"" + quicktime + "\"",
                 infoPlist({{"CFBundleVersion", "7.7.3"},
                            {"CFBundleGetInfoString", "QuickTime Plug-in 7.7.3"}}));
  // No Info.plist, a damaged one, and things that are not bundles.
  fs_.addDirectory(global + "/Bare.webplugin");
  fs_.addFile(global + "/Damaged.plugin/Contents/Info.plist", "<plist><dict><key>CFBundleN");
  fs_.addFile(global + "/.DS_Store", "x");
  fs_.addFile(global + "/README.txt", "x");
  // A user's own plug-ins; the path reaches plutil escaped.
  const std::string odd = "/Users/alice/Library/Internet Plug-Ins/O\"dd$(x).plugin";
  fs_.addFile(odd + "/Contents/Info.plist", "bplist00");
  runner_.answer(
      "plutil -convert xml1 -o - \"/Users/alice/Library/Internet Plug-Ins/"
      "O\\\"dd\\$(x).plugin/Contents/Info.plist\"",
      infoPlist({{"CFBundleName", "Odd"}}));
  fs_.addDirectory("/Users/Shared");
  fs_.addFile("/Users/.localized", "");
  fs_.addDirectory("/Users/.hidden/Library/Internet Plug-Ins/Hidden.plugin");
  // Frameworks, with the plist in each of the places it is looked for.
  const std::string frameworks = "/Library/Frameworks";
  fs_.addFile(frameworks + "/Mono.framework/Resources/Info.plist",
              infoPlist({{"CFBundleName", "Mono"}, {"CFBundleVersion", "3.2.5"}}));
  fs_.addFile(frameworks + "/Python.framework/Versions/Current/Resources/Info.plist",
              infoPlist({{"CFBundleShortVersionString", "2.7"},
                         {"CFBundleGetInfoString", "Python Runtime"}}));
  fs_.addFile(frameworks + "/Growl.framework/Contents/Info.plist",
              infoPlist({{"CFBundleName", ""}, {"CFBundleShortVersionString", "1.3"}}));
  fs_.addFile(frameworks + "/notes.framework", "a file");
  fs_.addDirectory(frameworks + "/Headers");

  EXPECT_EQ(build(), R"(+Software=
+InternetPlug-Ins=
plugin:1=""
~complex=
plugin:2=""
~complex=
plugin:3=""
~complex=
plugin:4=""
~complex=
plugin:5=""
~complex=
*plugin:1=
name="Bare"
location="/Library/Internet Plug-Ins/Bare.webplugin"
*plugin:2=
name="Damaged"
location="/Library/Internet Plug-Ins/Damaged.plugin"
*plugin:3=
name="Shockwave Flash"
version="11.9.900.152"
location="/Library/Internet Plug-Ins/Flash Player.plugin"
description="Shockwave Flash 11.9 r900"
*plugin:4=
name="QuickTime Plugin"
version="7.7.3"
location="/Library/Internet Plug-Ins/QuickTime Plugin.plugin"
description="QuickTime Plug-in 7.7.3"
*plugin:5=
name="Odd"
location="/Users/alice/Library/Internet Plug-Ins/O"dd$(x).plugin"
-
+Libraries=
library:1=""
~complex=
library:2=""
~complex=
library:3=""
~complex=
*library:1=
name="Growl"
version="1.3"
location="/Library/Frameworks/Growl.framework"
*library:2=
name="Mono"
version="3.2.5"
location="/Library/Frameworks/Mono.framework"
*library:3=
name="Python"
version="2.7"
location="/Library/Frameworks/Python.framework"
-
-
)");
  EXPECT_EQ(runner_.commands_ran_.size(), 2u);
}

TEST_F(PlugInsSectionTest, BinaryListThatPlutilCannotReadKeepsTheBundle) {
  fs_.addFile("/Library/Internet Plug-Ins/X.plugin/Contents/Info.plist", "bplist00");
  EXPECT_EQ(build(), R"(+Software=
+InternetPlug-Ins=
plugin:1=""
~complex=
*plugin:1=
name="X"
location="/Library/Internet Plug-Ins/X.plugin"
-
*Libraries=
-
)");
}

}  // namespace
}  // namespace cvn
