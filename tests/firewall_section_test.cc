#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

class FirewallSectionTest : public ::testing::Test {
 protected:
  void set(const std::string& path, const TagValue& value) {
    raw_.setValue("/SPFirewallDataType/_items/item0/" + path, value);
  }
  std::string build() {
    buildFirewallSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Security"));
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(FirewallSectionTest, RulesAreNumberedByRawPosition) {
  set("spfirewall_globalstate", "spfirewall_globalstate_block_all");
  // item1 was a non-text entry the converter dropped.
  set("spfirewall_services/item0/_name", "Apple Remote Desktop");
  set("spfirewall_services/item0/value", "spfirewall_allow_all");
  set("spfirewall_services/item2/_name", "File Sharing");
  set("spfirewall_services/item2/value", "spfirewall_block_all");
  set("spfirewall_applications/item0/_name", "cupsd");
  set("spfirewall_applications/item0/value", int64_t{3});
  set("spfirewall_applications/item1/value", "spfirewall_limit_connections");
  set("spfirewall_stealthenabled", "Yes");
  set("spfirewall_loggingenabled", "No");

  EXPECT_EQ(build(), R"(+Security=
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
app:2=""
~complex=
*app:1="cupsd"
status="1"
*app:2=
status="1"
-
-
-
)");
}

TEST_F(FirewallSectionTest, GlobalStates) {
  const struct {
    const char* state;
    const char* expected;
  } cases[] = {
      {"spfirewall_globalstate_limit_connections", "status=\"1\"\n"},
      {"spfirewall_globalstate_allow_all", "status=\"0\"\n"},
      {"spfirewall_globalstate_something_new", ""},
  };
  for (const auto& c : cases) {
    TagTree raw(true, "Macintosh");
    raw.setValue("/SPFirewallDataType/_items/item0/spfirewall_globalstate", c.state);
    TagTree snapshot(true, "Snapshot");
    buildFirewallSection(snapshot, raw);
    EXPECT_EQ(treeText(snapshot.top().findChild("Security")),
              std::string("+Security=\n*Firewall=\n") + c.expected + "-\n")
        << c.state;
  }
}

TEST_F(FirewallSectionTest, NothingKnownLeavesAnEmptyGroup) {
  set("spfirewall_globalstate", int64_t{1});
  EXPECT_EQ(build(), "+Security=\n*Firewall=\n-\n");
}

TEST_F(FirewallSectionTest, NoItemsNoSection) {
  raw_.setValue("/SPFirewallDataType/_name", "firewall");
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
