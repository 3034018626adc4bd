#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

std::string buildFirewall(TagTree& raw) {
  TagTree snapshot(true, "Snapshot");
  buildFirewallSection(snapshot, raw);
  return treeText(snapshot.top().findChild("Security"));
}

TEST(FirewallSectionTest, RulesAreNumberedByRawPosition) {
  TagTree raw(true, "Macintosh");
  auto set = [&](const std::string& path, const TagValue& value) {
    raw.setValue("/SPFirewallDataType/_items/item0/" + path, value);
  };
  set("spfirewall_globalstate", "spfirewall_globalstate_block_all");
  // item1 was a non-text entry the converter dropped.
  set("spfirewall_services/item0/_name", "Apple Remote Desktop");
  set("spfirewall_services/item0/value", "spfirewall_allow_all");
  set("spfirewall_services/item2/_name", "File Sharing");
  set("spfirewall_services/item2/value", "spfirewall_block_all");
  set("spfirewall_applications/item0/value", int64_t{3});
  set("spfirewall_stealthenabled", "Yes");
  set("spfirewall_loggingenabled", "No");
  EXPECT_EQ(buildFirewall(raw), R"(+Security=
+Firewall=
status="2"
stealth-mode="1"
fw-log="0"
+Services=
service:1=""
~complex=
service:2=""
~complex=
*service:1="Apple Remote Desktop"
status="1"
*service:2="File Sharing"
status="0"
-
+Apps=
app:1=""
~complex=
*app:1=
status="1"
-
-
-
)");
}

TEST(FirewallSectionTest, OtherGlobalStates) {
  const std::pair<const char*, const char*> cases[] = {
      {"limit_connections", "status=\"1\"\n"}, {"allow_all", "status=\"0\"\n"}, {"new", ""}};
  for (const auto& [state, status] : cases) {
    TagTree raw(true, "Macintosh");
    raw.setValue("/SPFirewallDataType/_items/item0/spfirewall_globalstate",
                 TagValue(std::string("spfirewall_globalstate_") + state));
    EXPECT_EQ(buildFirewall(raw), std::string("+Security=\n*Firewall=\n") + status + "-\n");
  }
}

}  // namespace
}  // namespace cvn
