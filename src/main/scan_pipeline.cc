#include "main/scan_pipeline.h"

#include "asset/asset_info.h"
#include "collect/network_identity.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "collect/process_table.h"
#include "collect/profiler_collector.h"
#include "collect/quick_facts.h"
#include "main/clock.h"
#include "main/post_processor.h"
#include "zxml/QAXfile.h"

namespace cvn {
namespace {

void logStage(const ScanRequest& request, const char* text) {
  if (!request.log) return;
  std::fputs(text, request.log);
  std::fflush(request.log);
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

std::string hostOf(const NetworkIdentity& identity, const std::string& computer_name) {
  return identity.netbios_name.empty() ? computer_name : identity.netbios_name;
}

void writeSnapshotHeader(TagTree& snapshot, const std::string& date, int64_t scan_seconds,
                         const NetworkIdentity& identity, const QuickFacts& facts,
                         const std::string& ip) {
  snapshot.setValue("/timestamp", TagValue(date));
  snapshot.setValue("/scan-time", TagValue(scan_seconds * 1000));
  snapshot.setValue("/client-version", TagValue("14.10.29.0"));
  snapshot.setValue("/scan-subtype", TagValue("sstService"));
  snapshot.setValue("/snaptype", TagValue("mac:1"));
  snapshot.setValue("/hostname", TagValue(identity.netbios_name));
  snapshot.setValue("/domain", TagValue(identity.workgroup));
  snapshot.setValue("/user-name", TagValue(facts.user_name));
  snapshot.setValue("/ip-address", TagValue(ip));
}

}  // namespace

ScanResult runScanPipeline(std::string document, const std::vector<size_t>& part_ends,
                           const ScanRequest& request, const ScanSources& sources,
                           std::vector<std::string> extra_documents) {
  ScanResult result;
  std::string ip = request.ip;
  // A document that cannot be read leaves the trees without profiler data;
  // the scan still writes its file.
  Plist plist;
  parseCollectedDocument(document, part_ends, &plist, &result.parse_warning);
  addExtraTypes(extra_documents, &plist);
  // Swapped out rather than assigned: assigning an empty string keeps the
  // document's whole buffer allocated.
  std::string().swap(document);
  std::vector<std::string>().swap(extra_documents);

  const std::string ioreg_uuid = readPlatformUuid(sources.runner);
  QuickFacts facts = readQuickFacts(plist, ioreg_uuid);
  NetworkIdentity identity;
  readNetworkIdentity(plist, ip, &identity);
  std::string serial = readSerialNumber(plist);
  auto raw = std::make_unique<TagTree>(request.native, "Macintosh");
  logStage(request, "II. Parsing Data....");
  PlistConverter(*raw).convertPlist(plist);
  // The list and the raw tree are both whole only until here.
  plist = Plist();
  logStage(request, "done\n");
  logStage(request, "III. Get Data For AssetInfo....");
  logStage(request, "33% ");
  logStage(request, "66% ");
  collectProcesses(*raw, sources.processes, sources.runner);
  logStage(request, "100% done\n");

  result.snapshot = std::make_unique<TagTree>(request.native, "Snapshot");
  TagTree& snapshot = *result.snapshot;
  postProcess(snapshot, *raw, SectionSources{sources.runner, sources.files, ioreg_uuid},
              request.log);
  int64_t end_time = sources.clock.now();
  raw.reset();

  std::string computer_name = sources.computer_name ? sources.computer_name() : std::string();
  // The short form is made and thrown away, as the long form replaces it.
  std::string date = SnapshotFile::makeTimestamp(false, end_time);
  date = SnapshotFile::makeTimestamp(true, end_time);
  writeSnapshotHeader(snapshot, date, end_time - request.start_time, identity, facts, ip);

  logStage(request, "V. Creating AssetInfo Section....");
  AssetIdentity asset = assetIdentityOf(identity, computer_name, ip, request.login);
  asset.serial_number = serial;
  result.asset_info = buildAssetInfo(request.native, snapshot, date, facts, asset);
  logStage(request, "done\n");

  SnapshotFile file(request.native);
  file.addTree(snapshot, kSnapshotBlock, kWholeText, kCompressed);
  file.addTree(*result.asset_info, kAssetInfoBlock, kWholeText, kCompressed);
  result.image = file.makeImage(kCompressedDirectory);
  result.host = hostOf(identity, computer_name);
  result.mac_address = identity.mac_address;
  return result;
}

ScanResult runDebugPipeline(const std::string& document, const ScanRequest& request,
                            const ScanSources& sources) {
  ScanResult result;
  std::string ip = request.ip;
  Plist plist;
  parsePlist(document, &plist, &result.parse_warning);
  NetworkIdentity identity;
  readNetworkIdentity(plist, ip, &identity);
  plist = Plist();

  SnapshotFile file(request.native);
  std::string computer_name = sources.computer_name ? sources.computer_name() : std::string();
  result.host = hostOf(identity, computer_name);
  result.mac_address = identity.mac_address;
  AssetIdentity asset = assetIdentityOf(identity, computer_name, ip, request.login);
  std::string date = SnapshotFile::makeTimestamp(true, sources.clock.now());
  addDebugAssetInfo(file, request.native, result.host, date, asset, document);
  result.image = file.makeImage(kCompressedDirectory);
  return result;
}

}  // namespace cvn
