// Runs the real agent binary against the sample Mac: the fake Apple tools
// come first on PATH and print its recorded outputs; the result file is read
// back with the inspector's reader.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
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

std::string readFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void writeFile(const std::string& path, const std::string& text) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out << text;
}

std::string quote(const std::string& s) {
  std::string q = "'";
  for (char c : s) q += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return q + "'";
}

struct AgentRun {
  int exit_code = -1;
  std::string out;
  std::string err;
};

std::string hostNamePart() {
  char host[256] = {0};
  gethostname(host, sizeof host - 1);
  std::string upper;
  for (char* c = host; *c; ++c)
    upper += static_cast<char>(std::toupper(static_cast<unsigned char>(*c)));
  return upper;
}

class EndToEndTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char tmpl[] = "/tmp/cvn-e2e-XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    root_ = tmpl;
    work_ = root_ + "/work";
    state_ = root_ + "/state";
    ASSERT_EQ(std::system(("mkdir -p " + quote(work_) + " " + quote(state_)).c_str()), 0);
    mac_dir_ = kSource + "/tests/sample_mac";
  }
  void TearDown() override { std::system(("rm -rf " + quote(root_)).c_str()); }

  /// A private copy of the sample Mac that a test may edit.
  std::string copySampleMac() {
    std::string copy = root_ + "/mac";
    EXPECT_EQ(
        std::system(("cp -r " + quote(kSource + "/tests/sample_mac") + " " + quote(copy)).c_str()),
        0);
    mac_dir_ = copy;
    return copy;
  }

  AgentRun run(const std::vector<std::string>& args, const std::string& input = "",
               const std::string& env = "") {
    writeFile(root_ + "/stdin", input);
    std::string command = "cd " + quote(work_) + " && " + shell_prefix_ +
                          "PATH=" + quote(kSource + "/tests/fake_bin") +
                          ":\"$PATH\" FAKE_MAC_DIR=" + quote(mac_dir_) +
                          " FAKE_STATE_DIR=" + quote(state_) + " " + env + " " + agent_prefix_ +
                          quote(kAgent);
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

  QaxFile readResult(const std::string& name) {
    QaxFile file;
    std::string error;
    EXPECT_TRUE(readQaxFile(work_ + "/" + name, &file, &error)) << error;
    return file;
  }

  static std::string property(const QaxTree& tree, const std::string& path,
                              const std::string& name) {
    const QaxProperty* p = tree.findProperty(path, name);
    return p ? p->value : "<missing>";
  }

  /// The file name a silent run reported.
  static std::string reportedName(const AgentRun& r) {
    if (r.out.compare(0, 3, ">>>") != 0 || r.out.back() != '\n') return "<none>";
    return r.out.substr(3, r.out.size() - 4);
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

  /// Shell text run before the agent in its shell (limits, traps).
  std::string shell_prefix_;
  /// A command that runs the agent (timeout).
  std::string agent_prefix_;
  std::string root_, work_, state_, mac_dir_;
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

void replaceOnce(const std::string& path, const std::string& from, const std::string& to) {
  std::string text = readFile(path);
  size_t at = text.find(from);
  ASSERT_NE(at, std::string::npos) << from << " in " << path;
  text.replace(at, from.size(), to);
  writeFile(path, text);
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

TEST_F(EndToEndTest, SilentRunPrintsOnlyTheFileNameAndNeverOverwrites) {
  for (const char* expected : {"JANE-MBP_0026BB5C3A91.qax", "JANE-MBP_0026BB5C3A91(1).qax",
                               "JANE-MBP_0026BB5C3A91(2).qax"}) {
    AgentRun r = run({"-silent"});
    EXPECT_EQ(r.exit_code, 0);
    EXPECT_EQ(r.out, std::string(">>>") + expected + "\n");
    EXPECT_EQ(r.err, "");
    EXPECT_EQ(access((work_ + "/" + expected).c_str(), R_OK), 0) << expected;
  }
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

TEST_F(EndToEndTest, ConsentDecidesWhetherToScan) {
  const struct {
    std::string input;
    int exit_code;
    const char* last_line;
  } cases[] = {
      {"n\n", 0, "Scan canceled.\n"},
      {"Y\n", 1, "Incorrect input. Application terminated.\n"},
      {std::string(500, 'y'), 1, "Incorrect input. Application terminated.\n"},
      {"", 1, "Incorrect input. Application terminated.\n"},
  };
  for (const auto& c : cases) {
    AgentRun r = run({}, c.input);
    EXPECT_EQ(r.exit_code, c.exit_code) << c.input.substr(0, 10);
    EXPECT_EQ(r.out,
              std::string("Corvane scanner for MacOS X\nDo you want to start the scan of local "
                          "computer?(y/n)\n") +
                  c.last_line);
    EXPECT_NE(access((work_ + "/" + kSampleName).c_str(), F_OK), 0) << "no scan may run";
  }
}

TEST_F(EndToEndTest, HelpPrintsUsageWithoutTheHiddenOptionsAndScansNothing) {
  AgentRun r = run({"-silent", "-?"});
  EXPECT_EQ(r.exit_code, 0);
  EXPECT_NE(r.out.find("Corvane's Mac OS X Agent\nUsage: cvnmacagent [OPTION...]\n"),
            std::string::npos);
  EXPECT_EQ(r.out.find("-log"), std::string::npos);
  EXPECT_NE(access((work_ + "/" + kSampleName).c_str(), F_OK), 0);
}

TEST_F(EndToEndTest, ResultFileCarriesTheSampleMacsFacts) {
  ASSERT_EQ(run({"-silent", "-login:admin"}).out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.snapshot_count, 1u);
  const QaxBlock& snap = file.blocks[0];
  const QaxBlock& asset = file.blocks[1];
  EXPECT_EQ(snap.type, "snapshot");
  EXPECT_EQ(snap.snaptype, "mac:1");
  EXPECT_EQ(asset.type, "assetinfo");

  const QaxTree& s = snap.tree;
  EXPECT_EQ(snap.timestamp, property(s, "/", "timestamp"));
  EXPECT_EQ(snap.timestamp.size(), 23u) << snap.timestamp;  // ...000000+0 in UTC
  EXPECT_EQ(property(s, "/", "client-version"), "14.10.29.0");
  EXPECT_EQ(property(s, "/", "scan-subtype"), "sstService");
  EXPECT_EQ(property(s, "/", "snaptype"), "mac:1");
  EXPECT_EQ(property(s, "/", "hostname"), "Jane-MBP");
  EXPECT_EQ(property(s, "/", "domain"), "WORKGROUP");
  EXPECT_EQ(property(s, "/", "user-name"), "jane");
  EXPECT_EQ(property(s, "/", "ip-address"), "192.168.1.23");
  for (const char* section :
       {"System", "Processors", "Memory", "Video", "Storage", "Network", "Peripherals", "OS",
        "User-accounts", "Software", "Processes", "Environment", "Security"}) {
    EXPECT_NE(s.findNode(section), nullptr) << section;
  }
  EXPECT_EQ(property(s, "/System/Computer-system", "model"), "MacBookPro5,5");
  EXPECT_EQ(property(s, "/Storage/Physical-disks/HDD:1", "size"), "500");
  EXPECT_EQ(property(s, "/User-accounts/usr-acc:jane", "hdir"), "/users/jane");
  // The agent's own process is in the table with its command line.
  bool found_self = false;
  for (const QaxNode& p : s.findNode("Processes")->children) {
    const QaxProperty* cmd = p.findProperty("cmd-line");
    if (cmd && cmd->value.find("cvnmacagent -silent") != std::string::npos) found_self = true;
  }
  EXPECT_TRUE(found_self);

  const QaxTree& a = asset.tree;
  const struct {
    const char* path;
    const char* name;
    const char* value;
  } fields[] = {
      {"/", "hostname", "Jane-MBP"},
      {"/", "ip-address", "192.168.1.23"},
      {"/", "static-ip", "0"},
      {"/", "login", "admin"},
      {"/", "user-name", "jane"},
      {"/", "virtual-type", "nvtPhysical"},
      {"/", "mac-address", "00-26-BB-5C-3A-91"},
      {"/", "uuid", "5F3C7A2E-9B41-4D8A-A6E2-1C0B7D94E3F1"},
      {"/", "serial-number", "W89311JK66E"},
      {"/control", "domain", "WORKGROUP"},
      {"/control", "os-name", "Mac OS X v10.6 (Snow Leopard)"},
      {"/control", "os-sp", "Update 8"},
      {"/control", "os-ver", "10.6.8 (10K549)"},
      {"/control", "cpu-count", "1"},
      {"/control", "cpu-count-virtual", "2"},
      {"/control", "cpu-speed", "2260"},
      {"/control", "cpu-manuf", "GenuineIntel"},
      {"/control", "phys-memory", "4096"},
      {"/control", "video-ram", "256"},
      {"/control", "video-res", "1280 x 800"},
      {"/control", "monitor-count", "2"},
      {"/control", "monitor-diag", "13"},
      {"/control", "hdd-capacity", "500.1"},
      {"/control", "disk:1", "312.45"},
      {"/control", "disk:3", "3.12"},
      {"/control", "fw-status", "5"},
  };
  for (const auto& f : fields) EXPECT_EQ(property(a, f.path, f.name), f.value) << f.name;
  const QaxProperty* system_disk = a.findProperty("/control", "disk:1");
  ASSERT_NE(system_disk, nullptr);
  ASSERT_EQ(system_disk->annotations.size(), 3u);
  EXPECT_EQ(system_disk->annotations[0].key + "=" + system_disk->annotations[0].text,
            "free=312450187264");
  EXPECT_EQ(system_disk->annotations[1].key + "=" + system_disk->annotations[1].text, "free%=79");
  EXPECT_EQ(system_disk->annotations[2].key + "=" + system_disk->annotations[2].text, "sys=1");
  EXPECT_EQ(a.findProperty("/control", "disk:2")->annotations.size(), 2u) << "only / is sys";
}

// The guard for every later change to collection and the builders: the old
// sample Mac must keep giving exactly this file.
TEST_F(EndToEndTest, TheSampleMacGivesTheCommittedResult) {
  ASSERT_EQ(run({"-silent"}).out, ">>>" + kSampleName + "\n");
  expectSameAsCommitted(stableResultText(readResult(kSampleName)),
                        kSource + "/tests/sample_mac/expected_result.txt");
}

// An Apple Silicon MacBook Pro on macOS 15: NVMe disk, APFS volumes, unified
// memory, a USB stick in a Media list, an external main display.
TEST_F(EndToEndTest, TheModernMacGivesTheCommittedResult) {
  mac_dir_ = kSource + "/tests/modern_mac";
  const std::string profiler_log = root_ + "/profiler.log";
  AgentRun r = run({"-silent"}, "", "FAKE_PROFILER_LOG=" + quote(profiler_log));
  // No NetBIOS name on today's Macs: the computer's own name leads.
  const std::string name = hostNamePart() + "_F4D4886A1CE2.qax";
  ASSERT_EQ(r.out, ">>>" + name + "\n");
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
// than the one the outputs are spliced by; the result must not change.
TEST_F(EndToEndTest, AnHttpsDoctypeGivesTheSameResult) {
  const std::string profiler = copySampleMac() + "/profiler/";
  for (const auto& entry : std::filesystem::directory_iterator(profiler))
    replaceOnce(entry.path().string(), "\"http://www.apple.com/", "\"https://www.apple.com/");
  ASSERT_EQ(run({"-silent"}).out, ">>>" + kSampleName + "\n");
  EXPECT_EQ(stableResultText(readResult(kSampleName)),
            readFile(kSource + "/tests/sample_mac/expected_result.txt"));
}

TEST_F(EndToEndTest, DebugScanKeepsTheProfilersWholeOutput) {
  ASSERT_EQ(run({"-debug", "-silent"}).out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.blocks[0].type, "assetinfo");
  EXPECT_EQ(file.blocks[1].type, "customdata");
  EXPECT_EQ(file.blocks[1].id, "rawdata");
  EXPECT_TRUE(file.blocks[1].data == readFile(kSource + "/tests/sample_mac/profiler/full.xml"))
      << "the raw block differs from the profiler's output";
  const QaxTree& a = file.blocks[0].tree;
  EXPECT_EQ(property(a, "/", "scan-type"), "nstNone");
  EXPECT_EQ(property(a, "/", "error-message"), "Debug scan");
  EXPECT_EQ(property(a, "/", "hostname"), "Jane-MBP");
  EXPECT_EQ(a.findNode("/control"), nullptr);
}

TEST_F(EndToEndTest, AProfilerThatStaysSilentAtFirstIsWaitedFor) {
  AgentRun r = run({"-silent"}, "", "FAKE_PROFILER_EMPTY_TIMES=5");
  EXPECT_EQ(r.out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  EXPECT_EQ(property(file.blocks[0].tree, "/System/Computer-system", "model"), "MacBookPro5,5");
}

// Bad tool output never stops the scan: the file is written and what could
// be read is in it.
TEST_F(EndToEndTest, BrokenProfilerOutputCostsOnlyItsOwnDataType) {
  const std::string profiler = copySampleMac() + "/profiler/";
  std::string software = readFile(profiler + "SPSoftwareDataType.xml");
  std::string usb = readFile(profiler + "SPUSBDataType.xml");
  // Malformed in the middle of the document: software loses its closing
  // tags and its last keys.
  size_t cut = software.find("<key>os_version</key>");
  ASSERT_NE(cut, std::string::npos);
  writeFile(profiler + "SPSoftwareDataType.xml", software.substr(0, cut) +
                                                     "<key>broken</key><string>x</dict>" +
                                                     software.substr(software.size() - 18));
  writeFile(profiler + "SPAudioDataType.xml", "too short");
  writeFile(profiler + "SPUSBDataType.xml", usb.substr(0, usb.size() / 2));
  writeFile(profiler + "SPHardwareDataType.xml", std::string(400, '#') + "\n");
  AgentRun r = run({"-silent"});
  EXPECT_EQ(r.out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  const QaxTree& s = file.blocks[0].tree;
  EXPECT_EQ(s.findNode("System/Computer-system"), nullptr) << "the hardware output was no XML";
  EXPECT_NE(s.findNode("System/Mem-slots"), nullptr);
  EXPECT_EQ(property(s, "/Network/Adapters/net-adapter:2", "ip-address"), "192.168.1.23");
  EXPECT_EQ(property(s, "/OS/os:1", "kernel"), "Darwin 10.8.0") << "read before the break";
  EXPECT_EQ(property(s, "/", "user-name"), "") << "lost after the break";
  EXPECT_NE(s.findNode("Security/Firewall"), nullptr) << "types after the break survive";
  EXPECT_EQ(property(file.blocks[1].tree, "/", "mac-address"), "00-26-BB-5C-3A-91");
}

TEST_F(EndToEndTest, OutputThatIsNoXmlAtAllGivesAFileWithoutProfilerData) {
  const std::string profiler = copySampleMac() + "/profiler/";
  for (const auto& entry : std::filesystem::directory_iterator(profiler)) {
    writeFile(entry.path().string(), std::string(400, '#') + "\n");
  }
  AgentRun r = run({"-silent"});
  const std::string name = hostNamePart() + "_.qax";
  EXPECT_EQ(r.out, ">>>" + name + "\n");
  QaxFile file = readResult(name);
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.blocks[0].tree.findNode("System"), nullptr);
  EXPECT_NE(file.blocks[0].tree.findNode("User-accounts"), nullptr);
  EXPECT_EQ(property(file.blocks[1].tree, "/", "mac-address"), "");
}

TEST_F(EndToEndTest, AnInterfaceWithoutEthernetDataLeavesTheAddressEmpty) {
  const std::string profiler = copySampleMac() + "/profiler/";
  std::string network = readFile(profiler + "SPNetworkDataType.xml");
  // The hardware address key stops being found: no service matches.
  for (size_t at; (at = network.find("<key>Ethernet</key>")) != std::string::npos;)
    network.replace(at, 19, "<key>Ethernet_x</key>");
  writeFile(profiler + "SPNetworkDataType.xml", network);
  AgentRun r = run({"-silent"});
  const std::string name = hostNamePart() + "_.qax";
  EXPECT_EQ(r.out, ">>>" + name + "\n");
  QaxFile file = readResult(name);
  EXPECT_EQ(property(file.blocks[0].tree, "/", "ip-address"), "192.168.1.23");
  EXPECT_EQ(property(file.blocks[0].tree, "/", "hostname"), "");
  EXPECT_EQ(property(file.blocks[1].tree, "/", "mac-address"), "");
}

TEST_F(EndToEndTest, AFiftyMegabyteApplicationListIsScanned) {
  const std::string profiler = copySampleMac() + "/profiler/";
  std::string apps = readFile(profiler + "SPApplicationsDataType.xml");
  size_t items = apps.find("<key>_items</key>");
  ASSERT_NE(items, std::string::npos);
  size_t array = apps.find("<array>", items) + 7;
  const std::string info(9000, 'i');
  std::string extra;
  const int kApps = 5600;
  for (int i = 0; i < kApps; ++i) {
    extra += "\n\t\t\t<dict>\n\t\t\t\t<key>_name</key>\n\t\t\t\t<string>Generated " +
             std::to_string(i) + "</string>\n\t\t\t\t<key>info</key>\n\t\t\t\t<string>" + info +
             "</string>\n\t\t\t\t<key>version</key>\n\t\t\t\t<string>1.0</string>\n\t\t\t</dict>";
  }
  apps.insert(array, extra);
  ASSERT_GT(apps.size(), 50u * 1000 * 1000);
  writeFile(profiler + "SPApplicationsDataType.xml", apps);
  AgentRun r = run({"-silent"});
  EXPECT_EQ(r.out, ">>>" + kSampleName + "\n");
  QaxFile file = readResult(kSampleName);
  const QaxNode* software = file.blocks[0].tree.findNode("Software");
  ASSERT_NE(software, nullptr);
  EXPECT_NE(software->findChild("Soft:Generated 5599 1.0"), nullptr);
  EXPECT_NE(software->findChild("Soft:Safari 5.1"), nullptr);
}

// Text a local user can put into what the tools print, written to break the
// result's structure: a process started from a file with line breaks in its
// name, an application's name, a full name in the directory service, a USB
// volume's and a disk's media name, a user folder with "=". Every file keeps
// the sections of a clean scan, the check accepts it, and the record reads
// back as its text with the markup defused.
TEST_F(EndToEndTest, CollectedTextCannotForgeStructure) {
  AgentRun clean = run({"-silent"});
  ASSERT_EQ(reportedName(clean), kSampleName);
  const std::vector<std::string> clean_shape = sectionShape(readResult(kSampleName).blocks[0].tree);
  ASSERT_EQ(std::system(("rm -f " + quote(work_ + "/" + kSampleName)).c_str()), 0);

  // Any local user can start a process from a file named like this.
  const std::string process_name = "z\n-\n+Evil=1";
  const std::string program = root_ + "/" + process_name;
  ASSERT_EQ(symlink("/bin/sleep", program.c_str()), 0);
  char arg0[] = "z", arg1[] = "600";
  char* argv[] = {arg0, arg1, nullptr};
  pid_t hostile = 0;
  ASSERT_EQ(posix_spawn(&hostile, program.c_str(), nullptr, nullptr, argv, environ), 0);

  const struct {
    const char* route;
    const char* file;  // in the sample Mac; empty for none
    std::string from, to;
    const char* node;
    const char* property;  // empty: the tag's own value
    std::string stored;
  } routes[] = {
      {"process name", "", "", "", "", "", ""},
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
      {"user folder with =", "users/ls.txt", "jane\n", "=eq\n", "/User-accounts/usr-acc:_eq",
       "hdir", "/users/=eq"},
  };
  for (const auto& r : routes) {
    SCOPED_TRACE(r.route);
    const std::string mac = root_ + "/mac";
    ASSERT_EQ(std::system(("rm -rf " + quote(mac)).c_str()), 0);
    copySampleMac();
    if (*r.file) replaceOnce(mac + "/" + r.file, r.from, r.to);
    if (r.to == "=eq\n") {
      replaceOnce(mac + "/users/jane.txt", "RecordName: jane", "RecordName: =eq");
      ASSERT_EQ(std::rename((mac + "/users/jane.txt").c_str(), (mac + "/users/=eq.txt").c_str()),
                0);
    }
    AgentRun result = run({"-silent"});
    const std::string name = reportedName(result);
    EXPECT_EQ(check(name), "ok");
    QaxFile file = readResult(name);
    ASSERT_EQ(file.blocks.size(), 2u);
    const QaxTree& snapshot = file.blocks[0].tree;
    EXPECT_EQ(sectionShape(snapshot), clean_shape);
    bool found_process = false;
    for (const QaxNode& p : snapshot.findNode("Processes")->children)
      found_process = found_process || p.value == "z - +Evil=1";
    EXPECT_TRUE(found_process);
    if (*r.node) {
      const QaxNode* node = snapshot.findNode(r.node);
      ASSERT_NE(node, nullptr) << r.node;
      const QaxProperty* p = *r.property ? node->findProperty(r.property) : nullptr;
      EXPECT_EQ(*r.property ? (p ? p->value : "<missing>") : node->value, r.stored);
    }
    ASSERT_EQ(std::system(("rm -f " + quote(work_ + "/" + name)).c_str()), 0);
  }
  kill(hostile, SIGKILL);
  waitpid(hostile, nullptr, 0);
}

// The host part comes from the NetBIOS name, which a user can set: it may
// neither lead out of the working directory nor make the name too long.
TEST_F(EndToEndTest, TheResultStaysInTheWorkingDirectoryUnderAFittingName) {
  const std::string mac = copySampleMac();
  const std::string location = mac + "/profiler/SPNetworkLocationDataType.xml";
  const std::string original = readFile(location);
  std::string long_host;
  for (int i = 0; i < 100; ++i) long_host += "Mac";
  const std::string cut(long_host.substr(0, 226));
  std::string upper_cut;
  for (char c : cut) upper_cut += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  const struct {
    std::string netbios;
    std::vector<std::string> names;  // of two runs
  } cases[] = {
      {"../ESCTEST/X", {"_._ESCTEST_X_0026BB5C3A91.qax", "_._ESCTEST_X_0026BB5C3A91(1).qax"}},
      {long_host, {upper_cut + "_0026BB5C3A91.qax", upper_cut + "_0026BB5C3A91(1).qax"}},
  };
  for (const auto& c : cases) {
    writeFile(location, original);
    replaceOnce(location, "<string>Jane-MBP</string>", "<string>" + c.netbios + "</string>");
    for (const std::string& expected : c.names) {
      AgentRun r = run({"-silent"});
      EXPECT_EQ(r.out, ">>>" + expected + "\n");
      EXPECT_LE(expected.size(), 255u);
      EXPECT_EQ(access((work_ + "/" + expected).c_str(), F_OK), 0) << expected;
    }
    std::vector<std::string> sorted = c.names;
    std::sort(sorted.begin(), sorted.end());
    EXPECT_EQ(filesInWork(), sorted);
    ASSERT_EQ(std::system(("rm -f " + quote(work_) + "/*").c_str()), 0);
  }
  EXPECT_NE(access((root_ + "/ESCTEST").c_str(), F_OK), 0) << "written outside the directory";
}

// Whatever bears the name, the save moves on to the next counter: it never
// writes through a dangling link, never waits on a FIFO.
TEST_F(EndToEndTest, ANameTakenByAnythingIsPassedOver) {
  const std::string base = work_ + "/JANE-MBP_0026BB5C3A91";
  ASSERT_EQ(symlink((root_ + "/target").c_str(), (base + ".qax").c_str()), 0);
  ASSERT_EQ(mkfifo((base + "(1).qax").c_str(), 0644), 0);
  ASSERT_EQ(mkdir((base + "(2).qax").c_str(), 0755), 0);
  // A hanging agent must fail the test rather than stall it.
  agent_prefix_ = "timeout 600 ";
  AgentRun r = run({"-silent"});
  EXPECT_EQ(r.out, ">>>JANE-MBP_0026BB5C3A91(3).qax\n");
  EXPECT_EQ(check("JANE-MBP_0026BB5C3A91(3).qax"), "ok");
  EXPECT_NE(access((root_ + "/target").c_str(), F_OK), 0) << "written through the link";
  EXPECT_EQ(filesInWork(), (std::vector<std::string>{
                               "JANE-MBP_0026BB5C3A91(1).qax", "JANE-MBP_0026BB5C3A91(2).qax",
                               "JANE-MBP_0026BB5C3A91(3).qax", "JANE-MBP_0026BB5C3A91.qax"}));
}

// A disk that fills up during the save: the message as before, no partial
// result under any name, the earlier result untouched.
TEST_F(EndToEndTest, AFailedSaveLeavesNothingBehind) {
  ASSERT_EQ(reportedName(run({"-silent"})), kSampleName);
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

// One name of 150 MB: every text is cut at 1 MiB on a UTF-8 boundary, so
// the file stays one that a reader can inflate.
TEST_F(EndToEndTest, AHugeApplicationNameIsCutToOneMebibyte) {
  const std::string profiler = copySampleMac() + "/profiler/";
  std::string huge;
  huge.reserve(150u << 20);
  while (huge.size() < (150u << 20)) huge += "\xC3\xA9";  // é
  replaceOnce(profiler + "SPApplicationsDataType.xml", "<string>Safari</string>",
              "<string>" + huge + "</string>");
  huge.clear();
  huge.shrink_to_fit();
  AgentRun r = run({"-silent"});
  ASSERT_EQ(reportedName(r), kSampleName);
  EXPECT_EQ(check(kSampleName), "ok");
  QaxFile file = readResult(kSampleName);
  const QaxNode* software = file.blocks[0].tree.findNode("Software");
  ASSERT_NE(software, nullptr);
  size_t found = 0;
  for (const QaxNode& app : software->children) {
    if (app.value.size() < 1000) continue;
    ++found;
    // "Soft:" is odd, so the name's cut would split an é.
    EXPECT_EQ(app.name.size(), (1u << 20) - 1);
    EXPECT_EQ(app.value.size(), 1u << 20);
    EXPECT_EQ(app.value.compare(app.value.size() - 2, 2, "\xC3\xA9"), 0);
  }
  EXPECT_EQ(found, 1u);
}

}  // namespace
}  // namespace cvn
