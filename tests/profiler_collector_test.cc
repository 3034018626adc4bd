#include "collect/profiler_collector.h"

#include "collect/plist.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "corpus_files.h"
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

// What the collector splices from output(type) of every type but `left_out`.
std::string splicedWithout(const std::vector<std::string>& left_out) {
  std::string document(kProfilerHeader);
  for (const char* type : kTypes) {
    if (std::find(left_out.begin(), left_out.end(), type) == left_out.end()) document += body(type);
  }
  return document + std::string(kProfilerFooter);
}

TEST(ProfilerCollectorTest, SplicesEveryTypeInOrderWithOneHeaderAndFooter) {
  FakeCommandRunner runner;
  runner.setLimits(ToolLimits::forProfilerSeconds(90));
  for (const char* type : kTypes) runner.answer(command(type), output(type));
  // Outputs too short to cut drop out, but the header and footer stay.
  const std::vector<std::string> short_ones = {"SPHardwareDataType", "SPAudioDataType",
                                               "SPPowerDataType"};
  for (const std::string& type : short_ones) runner.answer(command(type), std::string(17, 'x'));
  std::FILE* out = tmpfile();
  std::string document = ProfilerCollector(runner).collect(false, out);
  EXPECT_EQ(document, splicedWithout(short_ones));
  EXPECT_EQ(std::ftell(out), 0) << "nothing is printed without the progress flag";
  std::fclose(out);
  // The slowest types start first.
  ASSERT_EQ(runner.commands_ran_.size(), 21u);
  EXPECT_EQ(
      std::vector<std::string>(runner.commands_ran_.begin(), runner.commands_ran_.begin() + 4),
      (std::vector<std::string>{command("SPApplicationsDataType"), command("SPAirPortDataType"),
                                command("SPDiscBurningDataType"), command("SPHardwareDataType")}));
  EXPECT_EQ(runner.most_at_once_, 6u);
  EXPECT_EQ(runner.chunk_sizes_, std::vector<size_t>(21, 65536));
  EXPECT_EQ(runner.limits_given_, std::vector<ToolDuration>(21, std::chrono::seconds(90)));
}

TEST(ProfilerCollectorTest, TrimModesCutByByteCount) {
  using Trim = ProfilerCollector::Trim;
  const struct {
    std::string output;
    Trim trim;
    std::string expected;
  } cases[] = {
      {output("A"), Trim::kFirst, std::string(kProfilerHeader) + body("A")},
      {output("A"), Trim::kMiddle, body("A")},
      {output("A"), Trim::kLast, body("A") + std::string(kProfilerFooter)},
      // One byte more than the footer, the header or both is kept.
      {std::string(18, 'x'), Trim::kFirst, ""},
      {std::string(19, 'x'), Trim::kFirst, "x"},
      {std::string(190, 'x'), Trim::kMiddle, ""},
      {std::string(191, 'x'), Trim::kMiddle, "x"},
      {std::string(172, 'x'), Trim::kLast, ""},
      {std::string(173, 'x'), Trim::kLast, "x"},
  };
  for (const auto& c : cases)
    EXPECT_EQ(trimProfilerOutput(c.output, c.trim), c.expected) << c.output.size();
}

// Everything one collection gives, to compare two ways of running it.
struct Collected {
  std::string document;
  std::vector<size_t> part_ends;
  std::vector<std::string> extra_documents;
  std::string progress;
};

Collected collectWith(FakeCommandRunner& runner, size_t side_by_side) {
  Collected c;
  char* text = nullptr;
  size_t size = 0;
  std::FILE* out = open_memstream(&text, &size);
  c.document =
      ProfilerCollector(runner, side_by_side).collect(true, out, &c.part_ends, &c.extra_documents);
  std::fclose(out);
  c.progress.assign(text, size);
  std::free(text);
  return c;
}

TEST(ProfilerCollectorTest, SideBySideGivesWhatOneAtATimeGivesForBothSampleMacs) {
  for (const char* mac : {"sample_mac", "modern_mac"}) {
    auto prepare = [&](FakeCommandRunner& runner) {
      std::vector<std::string> types(std::begin(kTypes), std::end(kTypes));
      types.insert(types.end(), {"SPNVMeDataType", "SPStorageDataType", "SPUSBHostDataType"});
      for (const std::string& type : types) {
        runner.answer(command(type), readWholeFile(std::string(CVN_SOURCE_DIR "/tests/") + mac +
                                                   "/profiler/" + type + ".xml"));
      }
      // Prints nothing twice before it answers: asked again at once each time.
      runner.answerInTurn(command("SPBluetoothDataType"), {ToolOutput{}, ToolOutput{}});
    };
    FakeCommandRunner one_at_a_time;
    prepare(one_at_a_time);
    FakeCommandRunner side_by_side;
    prepare(side_by_side);
    side_by_side.last_started_ends_first = true;

    Collected expected = collectWith(one_at_a_time, 1);
    Collected got = collectWith(side_by_side, 6);
    EXPECT_EQ(one_at_a_time.most_at_once_, 1u);
    EXPECT_EQ(side_by_side.most_at_once_, 6u);
    EXPECT_EQ(side_by_side.commands_ran_.size(), 26u) << mac;
    EXPECT_GT(expected.document.size(), 10000u) << mac;
    EXPECT_EQ(got.document, expected.document) << mac;
    EXPECT_EQ(got.part_ends, expected.part_ends) << mac;
    EXPECT_EQ(got.extra_documents, expected.extra_documents) << mac;
    EXPECT_EQ(got.progress, "10%\n20%\n30%\n40%\n50%\n60%\n70%\n80%\n90%\n100%\n") << mac;
    EXPECT_EQ(got.progress, expected.progress) << mac;
  }
}

TEST(ProfilerCollectorTest, ARunThatHitItsLimitIsLeftOutNamedAndNeverAskedAgain) {
  FakeCommandRunner runner;
  runner.setLimits(ToolLimits::forProfilerSeconds(300));
  for (const char* type : kTypes) runner.answer(command(type), output(type));
  runner.answer(command("SPNVMeDataType"), output("SPNVMeDataType"));
  for (const char* type :
       {"SPHardwareDataType", "SPBluetoothDataType", "SPPowerDataType", "SPStorageDataType"})
    runner.hang(command(type), output(type));
  Collected c = collectWith(runner, 6);
  EXPECT_EQ(c.document,
            splicedWithout({"SPHardwareDataType", "SPBluetoothDataType", "SPPowerDataType"}));
  EXPECT_EQ(c.extra_documents, std::vector<std::string>{output("SPNVMeDataType")})
      << "SPStorageDataType hung, and SPUSBHostDataType printed nothing: asked once each";
  EXPECT_EQ(c.progress,
            "SPHardwareDataType: no answer in 300 s, left out\n10%\n20%\n"
            "SPBluetoothDataType: no answer in 300 s, left out\n30%\n40%\n50%\n60%\n70%\n"
            "80%\n90%\nSPPowerDataType: no answer in 300 s, left out\n100%\n"
            "SPStorageDataType: no answer in 300 s, left out\n");
  EXPECT_EQ(runner.commands_ran_.size(), 24u);
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
  std::vector<std::string> expected(std::begin(kTypes), std::end(kTypes));
  expected[4] = "(none)";  // audio keeps only what came before its break
  EXPECT_EQ(dataTypes(root), expected);
  // A well-formed document is read whole, whatever the parts.
  document =
      std::string(kProfilerHeader) + typeDict("A") + typeDict("B") + std::string(kProfilerFooter);
  ASSERT_TRUE(parseCollectedDocument(document, {10, document.size()}, &root));
  EXPECT_EQ(dataTypes(root), (std::vector<std::string>{"A", "B"}));
  EXPECT_FALSE(parseCollectedDocument("no xml here", {5, 11}, &root));
}

TEST(ExtraTypesTest, OnlyTheAskedTypesJoinTheListAndEachOnce) {
  auto document = [](const std::string& dicts) {
    return std::string(kProfilerHeader) + dicts + std::string(kProfilerFooter);
  };
  const std::string nvme = typeDict("SPNVMeDataType"), hardware = typeDict("SPHardwareDataType");
  const struct {
    const char* what;
    std::string main;  // empty: the main document was unreadable
    std::vector<std::string> documents;
    std::string expected;
  } cases[] = {
      {"appended after the main types",
       hardware,
       {document(nvme), document(typeDict("SPStorageDataType"))},
       "SPHardwareDataType SPNVMeDataType SPStorageDataType"},
      {"a type nobody asked for stays out",
       hardware,
       {document(hardware + typeDict("SPUSBHostDataType"))},
       "SPHardwareDataType SPUSBHostDataType"},
      {"a type already there is not added twice", nvme, {document(nvme)}, "SPNVMeDataType"},
      {"no XML and broken XML are passed over",
       hardware,
       {"", "<plist", document("<dict><key>_dataType</key><string>SPNVMeData")},
       "SPHardwareDataType"},
      {"an unreadable main document still gets them", "", {document(nvme)}, "SPNVMeDataType"},
  };
  for (const auto& c : cases) {
    Plist root;
    if (!c.main.empty()) {
      ASSERT_TRUE(parsePlist(document(c.main), &root));
    }
    addExtraTypes(c.documents, &root);
    std::string types;
    for (const std::string& type : dataTypes(root)) types += (types.empty() ? "" : " ") + type;
    EXPECT_EQ(types, c.expected) << c.what;
  }
}

}  // namespace
}  // namespace cvn
