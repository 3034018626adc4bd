#include "main/scan_driver.h"

#include <unistd.h>

#include <cctype>
#include <climits>
#include <cstdlib>
#include <ctime>
#include <memory>

#include "asset/asset_info.h"
#include "collect/command_runner.h"
#include "collect/network_identity.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "collect/process_table.h"
#include "collect/profiler_collector.h"
#include "collect/quick_facts.h"
#include "main/post_processor.h"
#include "zxml/QAXfile.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

std::string currentDirectory() {
  // getcwd with a system-allocated buffer: no length limit of our own.
  std::unique_ptr<char, decltype(&std::free)> cwd(::getcwd(nullptr, 0), &std::free);
  return cwd ? std::string(cwd.get()) : std::string(".");
}

bool fileExists(const std::string& path) {
  std::FILE* f = std::fopen(path.c_str(), "r");
  if (!f) return false;
  std::fclose(f);
  return true;
}

AssetIdentity assetIdentityOf(const NetworkIdentity& network, const std::string& computer_name,
                              const std::string& ip, const std::string& login) {
  AssetIdentity asset;
  asset.workgroup = network.workgroup;
  asset.computer_name = computer_name;
  asset.netbios_name = network.netbios_name;
  asset.mac_address = network.mac_address;
  asset.ip = ip;
  asset.login = login;
  asset.manual_ip = network.manual;
  return asset;
}

}  // namespace

std::string chooseResultName(const std::string& directory, const std::string& host,
                             const std::string& mac_address, std::string* full_path) {
  std::string host_part;
  for (char c : host) host_part += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  std::string address_part;
  for (char c : mac_address)
    if (c != '-') address_part += c;
  std::string name = host_part + "_" + address_part + ".qax";
  *full_path = directory + "/" + name;
  for (int counter = 1; fileExists(*full_path) && counter < INT_MAX; ++counter) {
    name = host_part + "_" + address_part + "(" + std::to_string(counter) + ").qax";
    *full_path = directory + "/" + name;
  }
  return name;
}

void ScanDriver::log(bool enabled, const char* text) {
  if (!enabled) return;
  std::fputs(text, tools_.out);
  std::fflush(tools_.out);
}

void ScanDriver::run(const OutputSettings& output, bool silent, bool debug, std::string ip,
                     const std::string& login) {
  if (output.abort_flag) return;
  if (debug) {
    runDebug(output, silent, std::move(ip), login);
  } else {
    runNormal(output, silent, std::move(ip), login);
  }
}

void ScanDriver::runNormal(const OutputSettings& output, bool silent, std::string ip,
                           const std::string& login) {
  const bool logging = output.progress_log != 0;
  const bool native = output.tree_flag != 0;
  std::time_t start = std::time(nullptr);
  log(logging, "------Start Log------\n");
  log(logging, "I. Collecting Data....\n");
  std::vector<size_t> part_ends;
  ProfilerCollector collector(tools_.runner);
  std::string document = collector.collect(logging, tools_.out, &part_ends);
  std::vector<std::string> extra_documents = collector.collectExtraTypes();
  log(logging, "done\n");

  // A document that cannot be read leaves the trees without profiler data;
  // the scan still writes its file.
  PlistValue plist;
  parseCollectedDocument(document, part_ends, &plist);
  addExtraTypes(extra_documents, &plist);
  document = std::string();
  extra_documents.clear();

  QuickFacts facts = readQuickFacts(plist, tools_.runner);
  auto raw = std::make_unique<TagTree>(native, "Macintosh");
  log(logging, "II. Parsing Data....");
  PlistConverter(*raw).convertPlist(plist);
  log(logging, "done\n");
  log(logging, "III. Get Data For AssetInfo....");
  NetworkIdentity identity;
  readNetworkIdentity(plist, ip, &identity);
  log(logging, "33% ");
  std::string serial = readSerialNumber(plist);
  log(logging, "66% ");
  plist = PlistValue();
  collectProcesses(*raw, tools_.processes, tools_.runner);
  log(logging, "100% done\n");

  TagTree snapshot(native, "Snapshot");
  postProcess(snapshot, *raw, logging, tools_.runner, tools_.files, tools_.out);
  std::time_t end = std::time(nullptr);

  std::string computer_name = tools_.computer_name ? tools_.computer_name() : std::string();
  // The short form is made and thrown away, as the long form replaces it.
  std::string date = SnapshotFile::makeTimestamp(false);
  date = SnapshotFile::makeTimestamp(true);

  snapshot.setValue("/timestamp", TagValue(date));
  snapshot.setValue("/scan-time", TagValue(static_cast<int64_t>(end - start) * 1000));
  snapshot.setValue("/client-version", TagValue("14.10.29.0"));
  snapshot.setValue("/scan-subtype", TagValue("sstService"));
  snapshot.setValue("/snaptype", TagValue("mac:1"));
  snapshot.setValue("/hostname", TagValue(identity.netbios_name));
  snapshot.setValue("/domain", TagValue(identity.workgroup));
  snapshot.setValue("/user-name", TagValue(facts.user_name));
  snapshot.setValue("/ip-address", TagValue(ip));

  log(logging, "V. Creating AssetInfo Section....");
  AssetIdentity asset = assetIdentityOf(identity, computer_name, ip, login);
  asset.serial_number = serial;
  std::unique_ptr<TagTree> asset_tree =
      buildAssetInfo(output.tree_flag, snapshot, date, facts, asset);
  log(logging, "done\n");

  SnapshotFile file(native);
  file.addTree(snapshot, kSnapshotBlock, false, true);
  file.addTree(*asset_tree, kAssetInfoBlock, false, true);
  raw.reset();

  std::string host = identity.netbios_name.empty() ? computer_name : identity.netbios_name;
  saveAndReport(file, output, silent, host, identity.mac_address);
}

void ScanDriver::runDebug(const OutputSettings& output, bool silent, std::string ip,
                          const std::string& login) {
  std::string document;
  // Deliberately unbounded, like the collector: a profiler that never
  // answers keeps the debug scan waiting.
  do {
    document = tools_.runner.run("system_profiler -detailLevel full -xml", 65536);
  } while (document.empty());

  PlistValue plist;
  parsePlist(document, &plist);
  NetworkIdentity identity;
  readNetworkIdentity(plist, ip, &identity);
  plist = PlistValue();

  SnapshotFile file(output.tree_flag != 0);
  std::string computer_name = tools_.computer_name ? tools_.computer_name() : std::string();
  std::string host = identity.netbios_name.empty() ? computer_name : identity.netbios_name;
  AssetIdentity asset = assetIdentityOf(identity, computer_name, ip, login);
  addDebugAssetInfo(file, output.tree_flag, host, asset, document);

  OutputSettings quiet = output;
  quiet.progress_log = 0;  // the debug scan prints no stage texts
  saveAndReport(file, quiet, silent, host, identity.mac_address);
}

void ScanDriver::saveAndReport(SnapshotFile& file, const OutputSettings& output, bool silent,
                               const std::string& host, const std::string& mac_address) {
  const bool logging = output.progress_log != 0;
  std::string directory = currentDirectory();
  log(logging, "VI. Generating File name....");
  std::string full_path;
  std::string name = chooseResultName(directory, host, mac_address, &full_path);
  log(logging, "done\n");
  log(logging, "VII. Saving to file....");
  bool saved = file.save(full_path, true);
  log(logging, "done\n");
  log(logging, "------End Log------\n");
  if (!saved) {
    std::fprintf(tools_.err, "Cannot create file :%s\n", full_path.c_str());
  } else if (silent) {
    std::fprintf(tools_.out, ">>>%s\n", name.c_str());
  } else {
    std::fprintf(tools_.out, "\nScan finished. Results saved to file \"%s\"\n", full_path.c_str());
  }
  std::fflush(tools_.out);
}

}  // namespace cvn
