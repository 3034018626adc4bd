// Runs the real agent binary against the sample Macs: the fake Apple tools
// come first on PATH and print their recorded outputs; the result file is
// read back with the inspector's reader.
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "qax_reader.h"

extern char** environ;

namespace cvn {
namespace {

const std::string kSource = CVN_SOURCE_DIR;
const std::string kAgent = std::string(CVN_BINARY_DIR) + "/cvnmacagent";
const std::string kQaxdump = std::string(CVN_BINARY_DIR) + "/qaxdump";
const std::string kSampleName = "JANE-MBP_0026BB5C3A91.qax";
const std::string kSampleExpected = kSource + "/tests/sample_mac/expected_result.txt";

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void writeFile(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary | std::ios::trunc) << text;
}

std::string quote(const std::string& s) {
  std::string q = "'";
  for (char c : s) q += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return q + "'";
}

/// Replaces the first (or every) `from` in the file; the text must be there.
void replaceIn(const std::string& path, const std::string& from, const std::string& to,
               bool every = false) {
  std::string text = readFile(path);
  size_t at = text.find(from);
  ASSERT_NE(at, std::string::npos) << from << " in " << path;
  for (; at != std::string::npos; at = every ? text.find(from, at + to.size()) : text.npos)
    text.replace(at, from.size(), to);
  writeFile(path, text);
}

std::string hostNamePart() {
  char host[256] = {0};
  gethostname(host, sizeof host - 1);
  for (char* c = host; *c; ++c)
    *c = static_cast<char>(std::toupper(static_cast<unsigned char>(*c)));
  return host;
}

struct AgentRun {
  int exit_code = -1;
  std::string out;
  std::string err;
};

/// A tag's value (empty `property`) or one of its properties, as read back.
std::string valueAt(const QaxTree& tree, const std::string& path, const std::string& property) {
  const QaxNode* node = tree.findNode(path);
  if (!node) return "<no node>";
  if (property.empty()) return node->value;
  const QaxProperty* p = node->findProperty(property);
  return p ? p->value : "<missing>";
}

class EndToEndTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char tmpl[] = "/tmp/cvn-e2e-XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    root_ = tmpl;
    work_ = root_ + "/work";
    ASSERT_EQ(std::system(("mkdir -p " + quote(work_) + " " + quote(root_ + "/state")).c_str()), 0);
    mac_dir_ = kSource + "/tests/sample_mac";
  }
  void TearDown() override { std::filesystem::remove_all(root_); }

  /// A fresh private copy of the sample Mac that a test may edit.
  std::string copySampleMac() {
    mac_dir_ = root_ + "/mac";
    EXPECT_EQ(std::system(("rm -rf " + quote(mac_dir_) + " && cp -r " +
                           quote(kSource + "/tests/sample_mac") + " " + quote(mac_dir_))
                              .c_str()),
              0);
    return mac_dir_;
  }

  AgentRun run(const std::vector<std::string>& args, const std::string& input = "",
               const std::string& env = "") {
    writeFile(root_ + "/stdin", input);
    std::string command = "cd " + quote(work_) + " && " + shell_prefix_ +
                          "PATH=" + quote(kSource + "/tests/fake_bin") +
                          ":\"$PATH\" FAKE_MAC_DIR=" + quote(mac_dir_) +
                          " FAKE_STATE_DIR=" + quote(root_ + "/state") + " " + env + " " +
                          agent_prefix_ + quote(kAgent);
    for (const std::string& a : args) command += " " + quote(a);
    command += " <" + quote(root_ + "/stdin") + " >" + quote(root_ + "/out") + " 2>" +
               quote(root_ + "/err");
    AgentRun r;
    int status = std::system(command.c_str());
    r.exit_code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    r.out = readFile(root_ + "/out");
    r.err = readFile(root_ + "/err");
    return r;
  }

  /// The file name a silent run reported.
  std::string runSilent(const std::string& env = "") {
    std::string out = run({"-silent"}, "", env).out;
    if (out.compare(0, 3, ">>>") != 0 || out.back() != '\n') return "<none>";
    return out.substr(3, out.size() - 4);
  }

  QaxFile readResult(const std::string& name) {
    QaxFile file;
    std::string error;
    EXPECT_TRUE(readQaxFile(work_ + "/" + name, &file, &error)) << error;
    return file;
  }

  /// What the inspector's check says: "ok" or its complaint.
  std::string check(const std::string& name) {
    std::string command = quote(kQaxdump) + " --check " + quote(work_ + "/" + name) + " >" +
                          quote(root_ + "/check") + " 2>&1";
    int status = std::system(command.c_str());
    std::string said = readFile(root_ + "/check");
    return status == 0 && said.size() >= 3 && said.compare(said.size() - 3, 3, "ok\n") == 0 ? "ok"
                                                                                            : said;
  }

  std::vector<std::string> filesInWork() {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(work_))
      names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
  }

  void clearWork() { ASSERT_EQ(std::system(("rm -rf " + quote(work_) + "/*").c_str()), 0); }

  /// Shell text run before the agent in its shell (limits, traps).
  std::string shell_prefix_;
  /// A command that runs the agent (timeout).
  std::string agent_prefix_;
  std::string root_, work_, mac_dir_;
};

// The sections of a snapshot and how many records each holds; the process
// list changes from run to run, so there only the record names count.
std::vector<std::string> sectionShape(const QaxTree& tree) {
  std::vector<std::string> shape;
  for (const QaxNode& section : tree.top()->children) {
    if (section.name != "Processes") {
      std::string line = section.name + ":";
      for (const QaxNode& group : section.children)
        line += " " + std::to_string(group.children.size());
      shape.push_back(line + " (" + std::to_string(section.children.size()) + ")");
      continue;
    }
    bool only_processes = true;
    for (const QaxNode& p : section.children)
      only_processes = only_processes && p.name.compare(0, 8, "process:") == 0 && !p.branch;
    shape.push_back(only_processes ? "Processes" : "Processes with other records");
  }
  return shape;
}

// What differs from run to run or host to host: the scan's clock, this
// machine's own name, and its real process table and environment.
void maskVolatileParts(QaxNode& node) {
  for (QaxProperty& p : node.properties) {
    for (const char* name : {"timestamp", "scan-time", "first-scan", "last-scan", "snapshot-list",
                             "int-name", "alias"}) {
      if (p.name == name) p.value = "<varies>";
    }
  }
  for (QaxNode& child : node.children) {
    if (child.name == "Processes" || child.name == "Environment") {
      child.properties.clear();
      child.children.clear();
    }
  }
}

/// Both trees of a result file as ZXML text, with the volatile parts masked.
std::string stableResultText(QaxFile file) {
  std::string text;
  for (QaxBlock& block : file.blocks) {
    text += "== " + block.type + "\n";
    for (QaxNode& top : block.tree.nodes) maskVolatileParts(top);
    text += renderZxmlText(block.tree);
  }
  return text;
}

/// Compares with the expected text committed beside a sample Mac; with
/// CVN_UPDATE_EXPECTED set, rewrites that file instead.
void expectSameAsCommitted(const std::string& actual, const std::string& path) {
  if (std::getenv("CVN_UPDATE_EXPECTED")) writeFile(path, actual);
  EXPECT_EQ(actual, readFile(path)) << "result differs from " << path;
}

// The guard for every later change to collection and the builders: the old
// sample Mac must keep giving exactly this file.
TEST_F(EndToEndTest, TheSampleMacGivesTheCommittedResult) {
  ASSERT_EQ(runSilent(), kSampleName);
  expectSameAsCommitted(stableResultText(readResult(kSampleName)), kSampleExpected);
}

// An Apple Silicon MacBook Pro on macOS 15: NVMe disk, APFS volumes, unified
// memory, a USB stick in a Media list, an external main display.
TEST_F(EndToEndTest, TheModernMacGivesTheCommittedResult) {
  mac_dir_ = kSource + "/tests/modern_mac";
  const std::string profiler_log = root_ + "/profiler.log";
  // No NetBIOS name on today's Macs: the computer's own name leads.
  const std::string name = hostNamePart() + "_F4D4886A1CE2.qax";
  ASSERT_EQ(runSilent("FAKE_PROFILER_LOG=" + quote(profiler_log)), name);
  expectSameAsCommitted(stableResultText(readResult(name)),
                        kSource + "/tests/modern_mac/expected_result.txt");
  // The newer types are asked once each.
  std::string asked = readFile(profiler_log);
  for (const char* type : {"SPNVMeDataType", "SPStorageDataType", "SPUSBHostDataType"}) {
    size_t at = asked.find(std::string(type) + "\n");
    ASSERT_NE(at, std::string::npos) << type;
    EXPECT_EQ(asked.find(std::string(type) + "\n", at + 1), std::string::npos) << type;
  }
}

// Profilers that name their DTD over https print a header one byte longer
// than the one the outputs are spliced by, and one that stays silent at first
// is waited for: neither may change the result.
TEST_F(EndToEndTest, HttpsDoctypesAndLateProfilersGiveTheCommittedResult) {
  ASSERT_EQ(runSilent("FAKE_PROFILER_EMPTY_TIMES=5"), kSampleName);
  EXPECT_EQ(stableResultText(readResult(kSampleName)), readFile(kSampleExpected));
  clearWork();
  const std::string profiler = copySampleMac() + "/profiler/";
  for (const auto& entry : std::filesystem::directory_iterator(profiler))
    replaceIn(entry.path().string(), "\"http://www.apple.com/", "\"https://www.apple.com/");
  ASSERT_EQ(runSilent(), kSampleName);
  EXPECT_EQ(stableResultText(readResult(kSampleName)), readFile(kSampleExpected));
}

// The masked comparison leaves out the clock, the login option, the block
// headers and the process table; these are checked here.
TEST_F(EndToEndTest, ResultFileCarriesLoginHeadersAndTheAgentsOwnProcess) {
  ASSERT_EQ(run({"-silent", "-login:admin"}).out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.snapshot_count, 1u);
  const QaxBlock& snap = file.blocks[0];
  EXPECT_EQ(snap.type + " " + snap.snaptype + " " + file.blocks[1].type,
            "snapshot mac:1 assetinfo");
  EXPECT_EQ(snap.timestamp, valueAt(snap.tree, "/", "timestamp"));
  EXPECT_EQ(snap.timestamp.size(), 23u) << snap.timestamp;  // ...000000+0 in UTC
  EXPECT_EQ(valueAt(file.blocks[1].tree, "/", "login"), "admin");
  bool found_self = false;
  for (const QaxNode& p : snap.tree.findNode("Processes")->children) {
    const QaxProperty* cmd = p.findProperty("cmd-line");
    found_self = found_self || (cmd && cmd->value.find("cvnmacagent -silent") != cmd->value.npos);
  }
  EXPECT_TRUE(found_self);
}

TEST_F(EndToEndTest, LogShowsEveryStageInOrder) {
  AgentRun r = run({"-log"}, "y\n");
  EXPECT_EQ(r.exit_code, 0);
  std::string expected =
      "Corvane scanner for MacOS X\nDo you want to start the scan of local computer?(y/n)\n"
      "Scan started...\n"
      "------Start Log------\nI. Collecting Data....\n"
      "10%\n20%\n30%\n40%\n50%\n60%\n70%\n80%\n90%\n100%\ndone\n"
      "II. Parsing Data....done\n"
      "III. Get Data For AssetInfo....33% 66% 100% done\n"
      "IV. PostProcess>>>\n";
  for (int step = 1; step <= 15; ++step) expected += std::to_string(step) + "...done\n";
  expected +=
      "IV. PostProcess End.\n"
      "V. Creating AssetInfo Section....done\n"
      "VI. Generating File name....done\n"
      "VII. Saving to file....done\n"
      "------End Log------\n"
      "\nScan finished. Results saved to file \"" +
      work_ + "/" + kSampleName + "\"\n";
  EXPECT_EQ(r.out, expected);
}

TEST_F(EndToEndTest, ConsentAndHelpDecideWhetherToScan) {
  const std::string prompt =
      "Corvane scanner for MacOS X\nDo you want to start the scan of local computer?(y/n)\n";
  const std::string refused = prompt + "Incorrect input. Application terminated.\n";
  const struct {
    std::vector<std::string> args;
    std::string input;
    int exit_code;
    std::string out;  // the whole output, or a part of the help text
  } cases[] = {
      {{}, "n\n", 0, prompt + "Scan canceled.\n"},
      {{}, "Y\n", 1, refused},
      {{}, std::string(500, 'y'), 1, refused},
      {{}, "", 1, refused},
      // The hidden options stay out of the usage text.
      {{"-silent", "-?"}, "", 0, "Corvane's Mac OS X Agent\nUsage: cvnmacagent [OPTION...]\n"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.input.substr(0, 10));
    AgentRun r = run(c.args, c.input);
    EXPECT_EQ(r.exit_code, c.exit_code);
    EXPECT_TRUE(c.args.empty() ? r.out == c.out : r.out.find(c.out) != r.out.npos) << r.out;
    EXPECT_EQ(r.out.find("-log"), std::string::npos);
    EXPECT_EQ(filesInWork(), std::vector<std::string>{}) << "no scan may run";
  }
}

TEST_F(EndToEndTest, DebugScanKeepsTheProfilersWholeOutput) {
  ASSERT_EQ(run({"-debug", "-silent"}).out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.blocks[0].type + " " + file.blocks[1].type + " " + file.blocks[1].id,
            "assetinfo customdata rawdata");
  EXPECT_TRUE(file.blocks[1].data == readFile(kSource + "/tests/sample_mac/profiler/full.xml"))
      << "the raw block differs from the profiler's output";
  const QaxTree& a = file.blocks[0].tree;
  EXPECT_EQ(valueAt(a, "/", "scan-type") + "|" + valueAt(a, "/", "error-message") + "|" +
                valueAt(a, "/", "hostname"),
            "nstNone|Debug scan|Jane-MBP");
  EXPECT_EQ(a.findNode("/control"), nullptr);
}

// Broken, huge or hostile tool output never stops the scan or breaks the
// file: each route edits one copy of the sample Mac, and the result must
// pass the inspector's check and hold what could be read. Text a local user
// can put into what the tools print (a process started from a file with line
// breaks in its name, an application's name, a full name, a USB volume's and
// a disk's media name, a user folder with "=") keeps the sections of a clean
// scan and reads back with its markup defused.
TEST_F(EndToEndTest, BrokenHugeAndHostileToolOutputStillGivesACheckedFile) {
  ASSERT_EQ(runSilent(), kSampleName);
  const std::vector<std::string> clean_shape = sectionShape(readResult(kSampleName).blocks[0].tree);
  clearWork();

  // Any local user can start a process from a file named like this.
  const std::string program = root_ + "/z\n-\n+Evil=1";
  ASSERT_EQ(symlink("/bin/sleep", program.c_str()), 0);
  char arg0[] = "z", arg1[] = "600";
  char* argv[] = {arg0, arg1, nullptr};
  pid_t hostile = 0;
  ASSERT_EQ(posix_spawn(&hostile, program.c_str(), nullptr, nullptr, argv, environ), 0);

  using Edit = std::function<void(const std::string& mac)>;
  const std::string apps = "profiler/SPApplicationsDataType.xml";
  const std::string huge_name = [] {
    std::string e;
    for (int i = 0; i < 524285; ++i) e += "\xC3\xA9";  // é
    return e;
  }();
  struct Value {
    int block;  // 0 the snapshot, 1 the asset tree
    std::string path;
    const char* property;  // empty: the tag's own value
    std::string value;
  };
  struct Route {
    const char* route;
    bool clean_shape;
    std::string name;  // empty: the sample Mac's
    Edit edit;
    std::vector<Value> values;
  };
  std::vector<Route> routes = {
      {"malformed, short and cut profiler outputs",
       false,
       "",
       [](const std::string& mac) {
         const std::string profiler = mac + "/profiler/";
         std::string software = readFile(profiler + "SPSoftwareDataType.xml");
         // Software loses its closing tags and its last keys.
         software = software.substr(0, software.find("<key>os_version</key>")) +
                    "<key>broken</key><string>x</dict>" + software.substr(software.size() - 18);
         writeFile(profiler + "SPSoftwareDataType.xml", software);
         writeFile(profiler + "SPAudioDataType.xml", "too short");
         std::string usb = readFile(profiler + "SPUSBDataType.xml");
         writeFile(profiler + "SPUSBDataType.xml", usb.substr(0, usb.size() / 2));
         writeFile(profiler + "SPHardwareDataType.xml", std::string(400, '#') + "\n");
       },
       {{0, "/System/Computer-system", "", "<no node>"},
        {0, "/System/Mem-slots", "", ""},
        {0, "/Network/Adapters/net-adapter:2", "ip-address", "192.168.1.23"},
        {0, "/OS/os:1", "kernel", "Darwin 10.8.0"},  // read before the break
        {0, "/", "user-name", ""},                   // lost after it
        {0, "/Security/Firewall", "", ""},           // types after it survive
        {1, "/", "mac-address", "00-26-BB-5C-3A-91"}}},
      {"no XML at all",
       false,
       hostNamePart() + "_.qax",
       [](const std::string& mac) {
         for (const auto& entry : std::filesystem::directory_iterator(mac + "/profiler"))
           writeFile(entry.path().string(), std::string(400, '#') + "\n");
       },
       {{0, "/System", "", "<no node>"},
        {0, "/User-accounts", "", ""},
        {1, "/", "mac-address", ""}}},
      {"no Ethernet data, so no service matches",
       true,
       hostNamePart() + "_.qax",
       [](const std::string& mac) {
         replaceIn(mac + "/profiler/SPNetworkDataType.xml", "<key>Ethernet</key>",
                   "<key>Ethernet_x</key>", true);
       },
       {{0, "/", "ip-address", "192.168.1.23"},
        {0, "/", "hostname", ""},
        {1, "/", "mac-address", ""}}},
      {"a fifty megabyte application list",
       false,
       "",
       [&](const std::string& mac) {
         std::string text = readFile(mac + "/" + apps);
         std::string extra;
         const std::string info(9000, 'i');
         for (int i = 0; i < 5600; ++i) {
           extra += "\n\t\t\t<dict>\n\t\t\t\t<key>_name</key>\n\t\t\t\t<string>Generated " +
                    std::to_string(i) + "</string>\n\t\t\t\t<key>info</key>\n\t\t\t\t<string>" +
                    info +
                    "</string>\n\t\t\t\t<key>version</key>\n\t\t\t\t<string>1.0</string>\n\t\t\t"
                    "</dict>";
         }
         text.insert(text.find("<array>", text.find("<key>_items</key>")) + 7, extra);
         ASSERT_GT(text.size(), 50u * 1000 * 1000);
         writeFile(mac + "/" + apps, text);
       },
       {{0, "/Software/Soft:Generated 5599 1.0", "", "Generated 5599"},
        {0, "/Software/Soft:Safari 5.1", "", "Safari"}}},
      // One name of 16 MiB, across many of the reader's 1 MiB chunks: every
      // text is cut at 1 MiB on a UTF-8 boundary, so the file stays one that
      // a reader can inflate. "Soft:" is odd, so the record name's cut would
      // split an é.
      {"a huge application name",
       true,
       "",
       [&](const std::string& mac) {
         std::string huge;
         huge.reserve(16u << 20);
         while (huge.size() < (16u << 20)) huge += "\xC3\xA9";
         replaceIn(mac + "/" + apps, "<string>Safari</string>", "<string>" + huge + "</string>");
       },
       {{0, "/Software/Soft:" + huge_name, "", huge_name + "\xC3\xA9\xC3\xA9\xC3\xA9"}}},
      // The NetBIOS name, which a user can set, gives the file name's host
      // part: it may not lead out of the working directory.
      {"NetBIOS name",
       true,
       "_._ESCTEST_X_0026BB5C3A91.qax",
       [](const std::string& mac) {
         replaceIn(mac + "/profiler/SPNetworkLocationDataType.xml", "<string>Jane-MBP</string>",
                   "<string>../ESCTEST/X</string>");
       },
       {}},
      {"user folder with =",
       true,
       "",
       [](const std::string& mac) {
         replaceIn(mac + "/users/ls.txt", "jane\n", "=eq\n");
         replaceIn(mac + "/users/jane.txt", "RecordName: jane", "RecordName: =eq");
         std::rename((mac + "/users/jane.txt").c_str(), (mac + "/users/=eq.txt").c_str());
       },
       {{0, "/User-accounts/usr-acc:_eq", "hdir", "/users/=eq"}}},
  };
  // Text a local user controls, and where it must read back defused.
  const struct {
    const char *route, *file;
    std::string from, to, path;
    const char* property;
    std::string stored;
  } texts[] = {
      {"application name", "profiler/SPApplicationsDataType.xml", "<string>Safari</string>",
       "<string>Safari\n-\n+Evil=1</string>", "/Software/Soft:Safari - +Evil_1 5.1", "",
       "Safari - +Evil=1"},
      {"application name, unbalanced", "profiler/SPApplicationsDataType.xml",
       "<string>Mail</string>", "<string>Mail\n-\n-\n-\n</string>",
       "/Software/Soft:Mail - - -  4.5", "", "Mail - - -\n"},
      {"application name with NUL", "profiler/SPApplicationsDataType.xml",
       "<string>Terminal</string>", std::string("<string>Term\0inal\n-</string>", 28),
       "/Software/Soft:Term", "", "Term"},
      {"dscl RealName", "users/jane.txt", "RealName:\n Jane Appleseed\n",
       "RealName:\n Jane Appleseed\n-\n+Evil=1\n", "/User-accounts/usr-acc:jane", "fullname",
       "Jane Appleseed - +Evil=1"},
      {"dscl RealName on two lines", "users/admin.txt", "RealName: Administrator\n",
       "RealName: Carol Q. Example\n Administrator\n", "/User-accounts/usr-acc:admin", "fullname",
       "Carol Q. Example\n Administrator"},
      {"USB volume name", "profiler/SPUSBDataType.xml", "<string>JANE_USB</string>",
       "<string>JANE_USB\n-\n-\n+Evil=1</string>", "/Storage/Logical-disks/partition:3", "",
       "JANE_USB - - +Evil=1"},
      {"diskutil media name", "diskutil/disk2.txt", "Flash Disk Media", "Flash\n-\n+Evil=1 Media",
       "/Storage/Physical-disks/Removable:1", "model", "Flash - +Evil=1"},
  };
  for (const auto& t : texts) {
    Edit edit = [&t](const std::string& mac) { replaceIn(mac + "/" + t.file, t.from, t.to); };
    routes.push_back({t.route, true, "", edit, {{0, t.path, t.property, t.stored}}});
  }
  for (const auto& r : routes) {
    SCOPED_TRACE(r.route);
    r.edit(copySampleMac());
    const std::string name = runSilent();
    EXPECT_EQ(name, r.name.empty() ? kSampleName : r.name);
    EXPECT_EQ(check(name), "ok");
    QaxFile file = readResult(name);
    ASSERT_EQ(file.blocks.size(), 2u);
    const QaxTree& snapshot = file.blocks[0].tree;
    if (r.clean_shape) {
      EXPECT_EQ(sectionShape(snapshot), clean_shape);
    }
    bool found_process = false;
    for (const QaxNode& p : snapshot.findNode("Processes")->children)
      found_process = found_process || p.value == "z - +Evil=1";
    EXPECT_TRUE(found_process);
    for (const Value& v : r.values)
      EXPECT_EQ(valueAt(file.blocks[v.block].tree, v.path, v.property), v.value) << v.path;
    clearWork();
  }
  kill(hostile, SIGKILL);
  waitpid(hostile, nullptr, 0);
}

// A name already taken by anything (a dangling link, a FIFO, a folder) is
// passed over, never written through or waited on.
TEST_F(EndToEndTest, TheResultGetsAFreshName) {
  agent_prefix_ = "timeout 600 ";  // a hanging agent must fail the test, not stall it
  const std::string base = work_ + "/JANE-MBP_0026BB5C3A91";
  AgentRun first = run({"-silent"});
  EXPECT_EQ(first.exit_code, 0);
  EXPECT_EQ(first.out + first.err, ">>>" + kSampleName + "\n");
  ASSERT_EQ(symlink((root_ + "/target").c_str(), (base + "(1).qax").c_str()), 0);
  ASSERT_EQ(mkfifo((base + "(2).qax").c_str(), 0644), 0);
  ASSERT_EQ(mkdir((base + "(3).qax").c_str(), 0755), 0);
  EXPECT_EQ(runSilent(), "JANE-MBP_0026BB5C3A91(4).qax");
  EXPECT_EQ(check("JANE-MBP_0026BB5C3A91(4).qax"), "ok");
  EXPECT_NE(access((root_ + "/target").c_str(), F_OK), 0) << "written through the link";
  EXPECT_EQ(filesInWork().size(), 5u);
}

// A disk that fills up during the save: the message as before, no partial
// result under any name, the earlier result untouched.
TEST_F(EndToEndTest, AFailedSaveLeavesNothingBehind) {
  ASSERT_EQ(runSilent(), kSampleName);
  const std::string earlier = readFile(work_ + "/" + kSampleName);
  // Files may grow to 8 blocks; past that write() fails as on a full disk.
  shell_prefix_ = "trap '' XFSZ; ulimit -f 8; ";
  AgentRun r = run({}, "y\n");
  EXPECT_EQ(r.exit_code, 0);
  EXPECT_EQ(r.err, "<dscl_cmd> DS Error: -14136 (eDSRecordNotFound)\nCannot create file :" + work_ +
                       "/JANE-MBP_0026BB5C3A91(1).qax\n");
  EXPECT_EQ(r.out.find("Scan finished"), std::string::npos);
  EXPECT_EQ(filesInWork(), std::vector<std::string>{kSampleName});
  EXPECT_TRUE(readFile(work_ + "/" + kSampleName) == earlier) << "the earlier result changed";
}

}  // namespace
}  // namespace cvn
