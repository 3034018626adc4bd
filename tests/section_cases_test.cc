// Runs the section builders on the cases in tests/section_cases/: each case
// gives a raw tree, what the tools answer and which files exist, and the
// section text it must give. The format is described in that folder's
// README.md.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "fake_command_runner.h"
#include "fake_file_system.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

struct SectionCase {
  std::string file, name;
  int line = 0;
  std::vector<std::string> builders;
  std::string show, ioreg, expected;
  std::vector<std::pair<std::string, TagValue>> raw;  // a path ending in "/": the tag's own value
  std::map<std::string, std::string> answers, files;
  bool check_ran = false;
  std::vector<std::string> ran;
};

/// A quoted text with C escapes, taken from the front of `s`.
std::string unquote(std::string& s) {
  std::string out;
  size_t i = 1;
  for (; i < s.size() && s[i] != '"'; ++i) {
    if (s[i] != '\\') {
      out += s[i];
      continue;
    }
    char c = s[++i];
    if (c == 'x') {
      out += static_cast<char>(std::stoi(s.substr(i + 1, 2), nullptr, 16));
      i += 2;
    } else {
      out += c == 'n' ? '\n' : c == 'r' ? '\r' : c == 't' ? '\t' : c == '0' ? '\0' : c;
    }
  }
  s.erase(0, std::min(i + 1, s.size()));
  return out;
}

TagValue valueOf(std::string text) {
  if (text[0] == '"') return TagValue(unquote(text));
  if (text == "true" || text == "false") return TagValue(text == "true");
  if (text.find('.') != std::string::npos) return TagValue(std::stod(text));
  return TagValue(static_cast<int64_t>(std::stoll(text)));
}

std::vector<SectionCase> readCases(const std::string& path) {
  std::vector<SectionCase> cases;
  std::ifstream in(path);
  std::string line, under;
  for (int number = 1; std::getline(in, line); ++number) {
    if (line.empty() || line[0] == '#') continue;
    const size_t space = line.find(' ');
    const std::string word = line.substr(0, space), rest = line.substr(space + 1);
    if (word == "case") {
      cases.emplace_back();
      cases.back().file = path.substr(path.rfind('/') + 1);
      cases.back().name = rest;
      cases.back().line = number;
      under.clear();
      continue;
    }
    SectionCase& c = cases.back();
    std::string args = rest;
    if (word == "build") {
      std::istringstream words(rest);
      for (std::string builder; words >> builder;) c.builders.push_back(builder);
    } else if (word == "show") {
      c.show = rest;
    } else if (word == "under") {
      under = rest;
    } else if (word == "ioreg") {
      c.ioreg = unquote(args);
    } else if (word == "ran") {
      c.check_ran = true;
      if (rest != "nothing") c.ran.push_back(unquote(args));
    } else if (word == "answer" || word == "file") {
      std::string key = unquote(args);
      args.erase(0, 3);  // " = "
      (word == "answer" ? c.answers : c.files)[key] = unquote(args);
    } else if (word == "expect") {
      while (std::getline(in, line) && line != "end") {
        ++number;
        c.expected += line + "\n";
      }
      ++number;
    } else {
      const size_t equals = line.find(" = ");
      if (equals == std::string::npos) {
        ADD_FAILURE() << path << ":" << number << ": neither a key nor a word of the format";
        continue;
      }
      const std::string key = line.substr(0, equals);
      c.raw.emplace_back(key[0] == '/' ? key : under + key, valueOf(line.substr(equals + 3)));
    }
  }
  return cases;
}

std::string build(const SectionCase& c) {
  TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
  for (const auto& [path, value] : c.raw) {
    if (path.back() != '/') {
      raw.setValue(path, value);
      continue;
    }
    Tag* tag = &raw.top();
    for (size_t at = 1; at < path.size(); at = path.find('/', at) + 1)
      tag = &tag->addBranch(path.substr(at, path.find('/', at) - at));
    tag->setValue(value);
  }
  FakeCommandRunner runner;
  for (const auto& [command, output] : c.answers) runner.answer(command, output);
  FakeFileSystem files;
  files.files_ = c.files;
  WrittenVolumes volumes;
  const std::map<std::string, std::function<void()>> builders = {
      {"system", [&] { buildSystemSection(snapshot, raw, c.ioreg); }},
      {"memory", [&] { buildMemorySection(snapshot, raw); }},
      {"displays", [&] { buildDisplaysSection(snapshot, raw); }},
      {"storage", [&] { buildStorageSection(snapshot, raw, volumes); }},
      {"network-adapters", [&] { buildNetworkAdaptersSection(snapshot, raw); }},
      {"printers", [&] { buildPrintersSection(snapshot, raw); }},
      {"usb", [&] { buildUsbSection(snapshot, raw, runner, volumes); }},
      {"os", [&] { buildOperatingSystemSection(snapshot, raw); }},
      {"users", [&] { buildUsersSection(snapshot, runner); }},
      {"applications", [&] { buildApplicationsSection(snapshot, raw); }},
      {"plugins", [&] { buildPlugInsSection(snapshot, files, runner); }},
      {"processors", [&] { buildProcessorsSection(snapshot, raw); }},
      {"processes", [&] { buildProcessesSection(snapshot, raw); }},
      {"environment", [&] { buildEnvironmentSection(snapshot, runner); }},
      {"firewall", [&] { buildFirewallSection(snapshot, raw); }},
  };
  for (const std::string& name : c.builders) {
    auto builder = builders.find(name);
    if (builder == builders.end()) return "no builder named " + name;
    builder->second();
  }
  if (c.check_ran && runner.commands_ran_ != c.ran) {
    std::string ran = "ran instead:\n";
    for (const std::string& command : runner.commands_ran_) ran += command + "\n";
    return ran;
  }
  return treeText(c.show.empty() ? &snapshot.top() : snapshot.top().findChild(c.show));
}

TEST(SectionCasesTest, EveryCaseGivesItsSection) {
  size_t count = 0;
  for (const auto& entry :
       std::filesystem::directory_iterator(CVN_SOURCE_DIR "/tests/section_cases")) {
    if (entry.path().extension() != ".txt") continue;
    for (const SectionCase& c : readCases(entry.path().string())) {
      EXPECT_EQ(build(c), c.expected) << c.file << ":" << c.line << " " << c.name;
      ++count;
    }
  }
  EXPECT_GT(count, 20u);
}

}  // namespace
}  // namespace cvn
