#include "collect/profiler_collector.h"

#include "collect/plist.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "fake_command_runner.h"

namespace cvn {
namespace {

const char* const kTypes[] = {"SPHardwareDataType",      "SPNetworkDataType",
                              "SPSoftwareDataType",      "SPParallelATADataType",
                              "SPAudioDataType",         "SPBluetoothDataType",
                              "SPFireWireDataType",      "SPDisplaysDataType",
                              "SPMemoryDataType",        "SPPrintersDataType",
                              "SPSerialATADataType",     "SPParallelSCSIDataType",
                              "SPUSBDataType",           "SPAirPortDataType",
                              "SPFirewallDataType",      "SPNetworkLocationDataType",
                              "SPNetworkVolumeDataType", "SPApplicationsDataType",
                              "SPStartupItemDataType",   "SPDiscBurningDataType",
                              "SPPowerDataType"};

std::string command(const std::string& type) {
  return "system_profiler -detailLevel full -xml " + type;
}

std::string body(const std::string& type) { return "<dict>" + type + "</dict>\n"; }

std::string output(const std::string& type) {
  return std::string(kProfilerHeader) + body(type) + std::string(kProfilerFooter);
}

// Counts calls and answers nothing for the first few.
class SlowRunner : public FakeCommandRunner {
 public:
  int silent_calls = 3;
  std::string run(const std::string& cmd, size_t chunk) override {
    std::string out = FakeCommandRunner::run(cmd, chunk);
    return silent_calls-- > 0 ? std::string() : out;
  }
};

TEST(ProfilerCollectorTest, SplicesEveryTypeInOrderWithOneHeaderAndFooter) {
  FakeCommandRunner runner;
  std::string expected(kProfilerHeader);
  for (const char* type : kTypes) {
    runner.answer(command(type), output(type));
    expected += body(type);
  }
  expected += kProfilerFooter;
  std::FILE* out = tmpfile();
  std::string document = ProfilerCollector(runner).collect(false, out);
  EXPECT_EQ(document, expected);
  EXPECT_EQ(std::ftell(out), 0) << "nothing is printed without the progress flag";
  std::fclose(out);
  ASSERT_EQ(runner.commands_ran_.size(), 21u);
  for (size_t i = 0; i < 21; ++i) {
    EXPECT_EQ(runner.commands_ran_[i], command(kTypes[i]));
    EXPECT_EQ(runner.chunk_sizes_[i], 65536u);
  }
}

TEST(ProfilerCollectorTest, ShortOutputsDropOutButHeaderAndFooterStay) {
  FakeCommandRunner runner;
  for (const char* type : kTypes) runner.answer(command(type), output(type));
  // 17 bytes is too short for the first cut, 189 for the middle, 171 for the last.
  runner.answer(command("SPHardwareDataType"), std::string(17, 'x'));
  runner.answer(command("SPAudioDataType"), std::string(189, 'x'));
  runner.answer(command("SPPowerDataType"), std::string(171, 'x'));
  std::string document = ProfilerCollector(runner).collect(false, nullptr);
  EXPECT_EQ(document.compare(0, kProfilerHeader.size(), kProfilerHeader), 0);
  EXPECT_EQ(document.substr(document.size() - kProfilerFooter.size()), kProfilerFooter);
  EXPECT_EQ(document.find("SPAudioDataType"), std::string::npos);
  EXPECT_EQ(document.find("SPHardwareDataType"), std::string::npos);
  EXPECT_LT(document.find("SPBluetoothDataType"), document.find("SPDisplaysDataType"));
}

TEST(ProfilerCollectorTest, TrimModesCutByByteCount) {
  FakeCommandRunner runner;
  runner.answer(command("A"), output("A"));
  ProfilerCollector collector(runner);
  EXPECT_EQ(collector.runProfiler("A", ProfilerCollector::Trim::kFirst),
            std::string(kProfilerHeader) + body("A"));
  EXPECT_EQ(collector.runProfiler("A", ProfilerCollector::Trim::kMiddle), body("A"));
  EXPECT_EQ(collector.runProfiler("A", ProfilerCollector::Trim::kLast),
            body("A") + std::string(kProfilerFooter));
  runner.answer(command("B"), std::string(190, 'x'));
  EXPECT_EQ(collector.runProfiler("B", ProfilerCollector::Trim::kMiddle), "");
  runner.answer(command("B"), std::string(191, 'x'));
  EXPECT_EQ(collector.runProfiler("B", ProfilerCollector::Trim::kMiddle), "x");
}

}  // namespace
}  // namespace cvn

namespace cvn {
namespace {

std::string typeDict(const std::string& type) {
  return "<dict><key>_dataType</key><string>" + type + "</string></dict>\n";
}

std::vector<std::string> dataTypes(const PlistValue& root) {
  std::vector<std::string> types;
  for (const PlistValue& d : root.items()) {
    const PlistValue* type = d.find("_dataType");
    types.push_back(type ? std::string(type->text()) : "(none)");
  }
  return types;
}

TEST(CollectedDocumentTest, AMalformedPieceCostsOnlyItself) {
  FakeCommandRunner runner;
  for (const char* type : kTypes) {
    runner.answer(command(type),
                  std::string(kProfilerHeader) + typeDict(type) + std::string(kProfilerFooter));
  }
  runner.answer(command("SPAudioDataType"), std::string(kProfilerHeader) +
                                                "<dict><key>_dataType</key><string>broken" +
                                                std::string(kProfilerFooter));
  std::vector<size_t> part_ends;
  std::string document = ProfilerCollector(runner).collect(false, nullptr, &part_ends);
  ASSERT_EQ(part_ends.size(), 21u);
  EXPECT_EQ(part_ends.back(), document.size());

  Plist root;
  ASSERT_TRUE(parseCollectedDocument(document, part_ends, &root));
  std::vector<std::string> types = dataTypes(root);
  ASSERT_EQ(types.size(), 21u);
  EXPECT_EQ(types.front(), "SPHardwareDataType");
  EXPECT_EQ(types[3], "SPParallelATADataType");
  EXPECT_EQ(types[4], "(none)") << "audio keeps only what came before its break";
  EXPECT_EQ(types[5], "SPBluetoothDataType");
  EXPECT_EQ(types.back(), "SPPowerDataType");
}

TEST(CollectedDocumentTest, AWellFormedDocumentIsReadWhole) {
  std::string document =
      std::string(kProfilerHeader) + typeDict("A") + typeDict("B") + std::string(kProfilerFooter);
  Plist root;
  ASSERT_TRUE(parseCollectedDocument(document, {10, document.size()}, &root));
  EXPECT_EQ(dataTypes(root), (std::vector<std::string>{"A", "B"}));
  EXPECT_FALSE(parseCollectedDocument("no xml here", {5, 11}, &root));
}

TEST(ExtraTypesTest, EachIsAskedOnceAndOnlyWhatPrintedSomethingIsKept) {
  FakeCommandRunner runner;
  std::string nvme =
      std::string(kProfilerHeader) + typeDict("SPNVMeDataType") + std::string(kProfilerFooter);
  runner.answer(command("SPNVMeDataType"), nvme);
  // SPStorageDataType prints nothing, as on a profiler that does not know it.
  runner.answer(command("SPUSBHostDataType"), "<plist");
  std::vector<std::string> documents = ProfilerCollector(runner).collectExtraTypes();
  EXPECT_EQ(documents, (std::vector<std::string>{nvme, "<plist"}));
  EXPECT_EQ(runner.commands_ran_,
            (std::vector<std::string>{command("SPNVMeDataType"), command("SPStorageDataType"),
                                      command("SPUSBHostDataType")}));
}

TEST(ExtraTypesTest, OnlyTheAskedTypesJoinTheListAndEachOnce) {
  auto document = [](const std::string& dicts) {
    return std::string(kProfilerHeader) + dicts + std::string(kProfilerFooter);
  };
  const struct {
    const char* what;
    std::vector<std::string> root_types;  // empty: the main document was unreadable
    std::vector<std::string> documents;
    std::vector<std::string> expected;
  } cases[] = {
      {"appended after the main types",
       {"SPHardwareDataType"},
       {document(typeDict("SPNVMeDataType")), document(typeDict("SPStorageDataType"))},
       {"SPHardwareDataType", "SPNVMeDataType", "SPStorageDataType"}},
      {"a type nobody asked for stays out",
       {"SPHardwareDataType"},
       {document(typeDict("SPHardwareDataType") + typeDict("SPUSBHostDataType"))},
       {"SPHardwareDataType", "SPUSBHostDataType"}},
      {"a type already there is not added twice",
       {"SPNVMeDataType"},
       {document(typeDict("SPNVMeDataType"))},
       {"SPNVMeDataType"}},
      {"no XML and broken XML are passed over",
       {"SPHardwareDataType"},
       {"", "<plist", document("<dict><key>_dataType</key><string>SPNVMeData")},
       {"SPHardwareDataType"}},
      {"an unreadable main document still gets them",
       {},
       {document(typeDict("SPNVMeDataType"))},
       {"SPNVMeDataType"}},
  };
  for (const auto& c : cases) {
    Plist root;
    if (!c.root_types.empty()) {
      std::string main;
      for (const std::string& type : c.root_types) main += typeDict(type);
      ASSERT_TRUE(parsePlist(document(main), &root));
    }
    addExtraTypes(c.documents, &root);
    EXPECT_EQ(dataTypes(root), c.expected) << c.what;
  }
}

}  // namespace
}  // namespace cvn
