// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

#include <Tests/Programs/OrvaneFixture.h>
#include <Varnel/DiskWatch/DiskAccessNote.h>
#include <orvane/Arguments.h>
#include <orvane/CommandTable.h>
#include <orvane/HelpText.h>
#include <orvane/LiveDisks.h>
#include <orvane/ScanReport.h>

namespace Orvane::Testing {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;

// What a parser might split, unquote or take for something else.
std::vector<std::string> hostileValues() {
  return {"[a,b]",    "++",
          "-",        "--",
          "-x",       "--json",
          "--json=x", "a=b",
          "x y",      "{'a', \"b\"}",
          "%s\\n",    "",
          "\xff\xfe", std::string(254, '\xe9') + "\n"};
}

TEST(Commands, GetTheirValuesUntouched) {
  CommandTable table;
  for (Command& command : table.commands) {
    std::vector<std::string> taken;
    const auto record = [&](const std::string& value) {
      taken.push_back(value);
      return Complaint();
    };
    command.operands.value.take = record;
    for (Option& option : command.options) option.value.take = record;
    const auto expect = [&](const std::vector<std::string>& arguments,
                            const std::vector<std::string>& values) {
      taken.clear();
      EXPECT_EQ(takeArguments(command.options, command.operands, arguments).wrong, std::nullopt);
      EXPECT_EQ(taken, values) << command.name;
    };
    for (const std::string& value : hostileValues()) {
      for (const Option& option : command.options) {
        if (option.value.name.empty()) continue;
        expect({"--" + option.name, value}, {value});
        expect({"--" + option.name + "=" + value}, {value});
        if (option.letter == 0) continue;
        expect({std::string("-") + option.letter, value}, {value});
        if (!value.empty()) expect({std::string("-") + option.letter + value}, {value});
      }
      if (command.operands.max > 0) expect({"--", value}, {value});
      if (command.operands.max > 2) expect({"a", "--", value, "--"}, {"a", value, "--"});
      if (command.operands.max > 0 && !value.starts_with('-')) expect({value}, {value});
    }
  }
}

// Every name once, every text in 80 columns of ASCII.
TEST(Commands, AreExplained) {
  const CommandTable table;
  for (const Command& command : table.commands) {
    EXPECT_THAT(helpText(table), HasSubstr("\n  " + command.name + " "));
    const std::string help = helpText(table, command.name);
    std::multiset<std::string> names;
    std::vector<Option> options = command.options;
    options.insert(options.end(), table.options.begin(), table.options.end());
    for (const Option& option : options) {
      names.insert(option.name);
      if (option.letter != 0) names.insert(std::string(1, option.letter));
      EXPECT_THAT(help, HasSubstr(formsOf(option) + " "));
    }
    for (const std::string& name : names) EXPECT_EQ(names.count(name), 1u) << name;
    for (const std::string& word : command.operands.value.words) EXPECT_THAT(help, HasSubstr(word));
    std::istringstream lines(help + helpText(table));
    for (std::string line; std::getline(lines, line);) {
      EXPECT_LE(line.size(), 80u) << line;
      EXPECT_THAT(line, Not(Contains(::testing::Truly([](char c) { return c < ' ' || c > '~'; }))));
    }
  }
}

/// The members of an object, and "list[].member" for those of the objects in its lists.
std::set<std::string> membersOf(const nlohmann::json& object) {
  std::set<std::string> members;
  for (const auto& [key, value] : object.items()) {
    if (!value.is_array() || value.empty() || !value[0].is_object()) members.insert(key);
    if (!value.is_array()) continue;
    for (const auto& each : value)
      for (const std::string& inner : membersOf(each.is_object() ? each : nlohmann::json::object()))
        members.insert(key + "[]." + inner);
  }
  return members;
}

Notes notesOfAReader() {
  Varnel::DiskAccessNote note;
  note.program = "a\nb";
  note.disks.push_back({.uniqueID = "DISK",
                        .volume = "/",
                        .maxReaders = 1,
                        .places = {{"read\x1b", 0.25}},
                        .waiters = {1, 0, 2, 0},
                        .waitersForProcesses = {0, 0, 0, 3}});
  return {{8, note.text()}, {7, "{}"}, {6, "no note"}};
}

TEST(LiveDisks, ShowWhoReadsWhat) {
  EXPECT_EQ(textOfLiveDisks(notesOfAReader()),
            "a\\nb (8)\n"
            "  DISK (/): 1 of 1 place\n"
            "    for 0.250 s: read\\x1B\n"
            "    waiting: 1 user-interactive, 2 utility\n"
            "    waiting for other processes: 3 background\n");
  EXPECT_EQ(textOfLiveDisks({}), "no process tells of its disks\n");
}

TEST_F(Orvane, PrintsTheMembersThatItsHelpNames) {
  folder.write("a\xfe/x", "same");
  folder.write("b/x", "same");
  std::filesystem::create_hard_link(folder.write("c\xff", "same"), folder.path("d\xff"));
  for (const Command& command : CommandTable().commands) {
    if (command.fields.empty()) continue;
    std::istringstream words(command.name + " --json");
    std::vector<std::string> arguments{std::istream_iterator<std::string>(words), {}};
    if (command.operands.max > 0) arguments.push_back(folder.path());
    if (command.operands.max > 1) arguments.push_back(folder.path("a\xfe"));
    for (const Option& option : command.options)
      if (option.isRequired)
        arguments.insert(arguments.end(), {"--" + option.name, option.value.words.at(0)});
    auto printed = membersOf(nlohmann::json::parse(run(arguments).output));
    if (command.name == "disks")
      printed.merge(membersOf({{"processes", jsonOfLiveDisks(notesOfAReader())}}));
    std::set<std::string> named;
    // One that is printed only where it says something may be missing.
    for (const JSONField& field : command.fields)
      if (field.key != "groups[].files[].reference" && field.key != "groups[].files[].reason")
        named.insert(field.key);
    EXPECT_EQ(printed, named) << command.name;
  }
}

TEST_F(Orvane, ExplainsItself) {
  const Outcome bare = run({});
  EXPECT_EQ(bare.status, 2);
  EXPECT_THAT(bare.errors, AllOf(HasSubstr("Usage: orvane scan"), HasSubstr("--help")));
  EXPECT_EQ(run({"--help"}).output, run({"help"}).output);
  EXPECT_EQ(run({"scan", "--help"}).output, run({"help", "scan"}).output);
  EXPECT_EQ(run({"remind", "-h"}).output, run({"help", "remind"}).output);
  EXPECT_EQ(run({"remind", "every", "-h"}).output, run({"help", "remind", "every"}).output);
  const std::string page = read(VARNEL_DOCUMENTS "/orvane.md");
  for (const ExitStatus& status : exitStatuses)
    EXPECT_THAT(page, HasSubstr(std::string("| ") + status.numbers + " | " + status.meaning));
  const std::string report = read(VARNEL_DOCUMENTS "/scan-report.md");
  for (const JSONField& field : scanReportFields())
    EXPECT_THAT(report, HasSubstr("`" + field.key + "`"));
  EXPECT_FALSE(hasLog());
}

TEST(Commands, AreInTheManualPage) {
  const CommandTable table;
  for (const char* name : {"manual", "completion"}) ASSERT_NE(table.find(name), nullptr);
  const ScanFolder folder;
  const std::string page = folder.path("page");
  const auto shell = [](const std::string& command) {
    return Varnel::Tests::outputOf("/bin/bash -c '" + command + "' 2>&1");
  };
  shell(ORVANE_PROGRAM " manual >" + page);
  EXPECT_EQ(shell("LC_ALL=C.UTF-8 MANWIDTH=80 man --warnings -l " + page + " >" + page + ".txt"),
            "");
  // As man shows it, in one line.
  const std::string text = shell("tr -s \"\\n \" \" \" <" + page + ".txt");
  for (const Command& command : table.commands) {
    EXPECT_THAT(text, HasSubstr(synopsis(command)));
    for (const Option& option : command.options)
      EXPECT_THAT(text, HasSubstr(formsOf(option) + " " + option.description));
    for (const JSONField& field : command.fields) EXPECT_THAT(text, HasSubstr(field.key));
  }
  for (const ExitStatus& status : exitStatuses) EXPECT_THAT(text, HasSubstr(status.numbers));
}

TEST(Commands, AreCompleted) {
  const struct {
    const char* words;  ///< The last one is to be completed.
    const char* completions;
  } cases[] = {
      {"sca", "scan"},
      {"--ver", "--version,--verbose"},
      {"remind \"\"", "every,tomorrow,status,listen"},
      {"remind every once-in-t", "once-in-two-weeks,once-in-three-months"},
      {"remind tomorrow --f", "--found"},
      {"analytics consent y", "yes"},
      {"scan --qos user-i", "user-initiated,user-interactive"},
      {"scan -q b", "background"},
      {"scan --js", "--json"},
      {"scan /usr/incl", "/usr/include"},
      {"sound pur", "purchase"},
      {"menu x", ""},
  };
  for (const auto& [words, completions] : cases)
    EXPECT_EQ(
        Varnel::Tests::outputOf(
            "/bin/bash -c 'source <(" ORVANE_PROGRAM " completion bash) && COMP_WORDS=(orvane " +
            std::string(words) +
            ") && COMP_CWORD=$((${#COMP_WORDS[@]} - 1)) && _orvane && IFS=, && printf %s "
            "\"${COMPREPLY[*]}\"'"),
        completions)
        << words;
}

}  // namespace
}  // namespace Orvane::Testing
