#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "tests/datapack/run_datapack.h"

namespace {

namespace fs = std::filesystem;

constexpr char kPlayersJson[] = R"({
  "header": "",
  "lineBreaks": "LF",
  "encoding": "UTF-8",
  "directory": {
    "name": "Players",
    "data": [{"name": "Name", "type": "Txt"}, {"name": "Score", "type": "Val"}],
    "directories": [],
    "entries": [{"values": ["Ann", 12.5]}, {"values": ["Bob", 7.0]}]
  }
}
)";

// A one-directory JSON whose only data channel has this type and whose entries hold these values.
std::string OneChannel(const std::string& type, const std::vector<std::string>& values,
                       const std::string& name = "D", const std::string& header = "") {
  std::string entries;
  for (const std::string& value : values)
    entries += std::string(entries.empty() ? "" : ",\n") + "  {\"values\": [" + value + "]}";
  return "{\"header\": \"" + header + "\",\n \"directory\": {\"name\": \"" + name +
         "\", \"data\": [{\"name\": \"v\", \"type\": \"" + type + "\"}],\n \"entries\": [\n" +
         entries + "]}}\n";
}

TEST(DatapackCliTest, UsageAndHelp) {
  const struct {
    std::vector<std::string> arguments;
    int status;
    const char* out;  // expected in standard output
    const char* err;  // expected in standard error
  } cases[] = {
      {{"--help"}, 0, "Usage: datapack [OPTIONS] SUBCOMMAND", ""},
      {{"show", "--help"}, 0, "--scrambled", ""},
      {{"pack", "--help"}, 0, "--force", ""},
      {{"scramble", "--help"}, 0, "-o,--output", ""},
      {{"unscramble", "--help"}, 0, "Decrypt", ""},
      {{"demo", "--help"}, 0, "Players demo", ""},
      {{"check", "--help"}, 0, "--strict", ""},
      {{"diff", "--help"}, 0, "--plain", ""},
      {{"--version"}, 0, "datapack 1.", ""},
      {{}, 2, "", "datapack: A subcommand is required"},
      {{"frobnicate"}, 2, "", "datapack: unknown subcommand \"frobnicate\""},
      {{"--plugin-dir", "x", "frobnicate"}, 2, "", "unknown subcommand \"frobnicate\""},
      {{"show", "x.pkg", "--bogus"}, 2, "", "datapack: The following argument was not expected"},
      {{"show", "x.pkg", "--plain", "--scrambled"}, 2, "", "datapack: --scrambled excludes"},
      {{"pack", "a.json", "b.json"}, 2, "", "b.json"},
      {{"scramble", "-o"}, 2, "", "datapack: --output: 1 required"},
      {{"diff", "a.pkg"}, 2, "", "datapack: B is required"},
  };
  for (const auto& c : cases) {
    const RunResult result = RunDatapack(c.arguments);
    const std::string shown = testing::PrintToString(c.arguments);
    EXPECT_EQ(result.status, c.status) << shown;
    EXPECT_NE(result.out.find(c.out), std::string::npos) << shown << result.out;
    EXPECT_NE(result.err.find(c.err), std::string::npos) << shown << result.err;
  }
}

TEST(DatapackCliTest, DemoPacksScramblesAndReadsBack) {
  const RunResult result = RunDatapack({"demo"});
  EXPECT_EQ(result.status, 0) << result.err;
  EXPECT_NE(result.out.find("184 bytes with its NUL"), std::string::npos) << result.out;
  EXPECT_NE(result.out.find("Count now 2"), std::string::npos) << result.out;
  EXPECT_NE(result.out.find("1      Bob      7"), std::string::npos) << result.out;
}

TEST(DatapackCliTest, ShowsThePlayersPackageAsOutlineAndJson) {
  const fs::path file = ScratchFolder() / "players.pkg";
  WriteBytes(file, kPlayersPackage);
  const RunResult outline = RunDatapack({"show", file.string()});
  EXPECT_EQ(outline.status, 0) << outline.err;
  EXPECT_EQ(outline.out,
            "header: \"\"\nline breaks: LF\nPlayers: 2 entries\n"
            "  entry 0\n    Name (Txt): \"Ann\"\n    Score (Val): 12.5\n"
            "  entry 1\n    Name (Txt): \"Bob\"\n    Score (Val): 7\n");
  const RunResult json = RunDatapack({"show", "-", "--json"}, kPlayersPackage);
  EXPECT_EQ(json.status, 0) << json.err;
  EXPECT_EQ(json.out, kPlayersJson);

  const RunResult packed = RunDatapack({"pack", "-"}, kPlayersJson);
  EXPECT_EQ(packed.status, 0) << packed.err;
  EXPECT_EQ(packed.out, kPlayersPackage);
}

// A chain of directories this deep, one value at each level.
std::string Chain(int depth) {
  std::string shape;
  std::string entry;
  for (int level = depth - 1; level >= 0; --level) {
    const std::string name = "L" + std::to_string(level);
    shape = "{\"name\": \"" + name + "\", \"data\": [{\"name\": \"v\", \"type\": \"Val\"}], " +
            "\"directories\": [" + shape + "]";
    entry = "{\"values\": [" + std::to_string(level) + "]" +
            (entry.empty() ? "" : ", \"directories\": [[" + entry + "]]") + "}";
    if (level > 0) shape += "}";
  }
  return "{\"directory\": " + shape + ", \"entries\": [" + entry + "]}}";
}

// The package's own indentation grows by a tab a level; its JSON must not grow by more.
TEST(DatapackCliTest, DeepNestingShowsAsJsonNoLargerThanItsPackage) {
  const RunResult packed = RunDatapack({"pack", "-"}, Chain(300));
  ASSERT_EQ(packed.status, 0) << packed.err;
  const RunResult json = RunDatapack({"show", "-", "--json"}, packed.out);
  ASSERT_EQ(json.status, 0) << json.err;
  EXPECT_LT(json.out.size(), packed.out.size());
  const RunResult again = RunDatapack({"pack", "-"}, json.out);
  EXPECT_EQ(again.status, 0) << again.err;
  EXPECT_EQ(again.out, packed.out);
}

TEST(DatapackCliTest, BadInputNamesTheFileAndPlace) {
  const fs::path folder = ScratchFolder();
  const std::string scrambled = RunDatapack({"scramble"}, kPlayersPackage).out;
  const struct {
    const char* command;
    std::string contents;  // empty: no such file
    const char* message;
  } cases[] = {
      {"show", "", "cannot read "},
      {"show", "hello", ":1:5: no package: the text does not end with a closing tag"},
      {"show", "\n<D>\n\t<v Type=\"Val\"> 1 </v>\n</E>", ":4:1: expected </D>, found \"</E>\""},
      {"show", std::string(kPlayersPackage).substr(0, 50),
       ":4:2: the text ends before the directory does"},
      {"show", std::string("\n<D>\n\t<v Type=\"Val\"> 1 </v>") + '\0' + "\n</D>",
       ":3:23: the text ends before the directory does (the reader stops at the NUL byte at 3:23)"},
      {"show", std::string("\x89PNG\r\n\x1a\n\0\0\0\rIHDR", 16),
       "no package: the text does not end with a closing tag (the reader stops at the NUL"},
      {"show", "\n<D>\n\t<v Type=\"Val\"> 1 </w>\n</D>", ":3:19: expected </v>, found \"</w>\""},
      {"show", "\n<D>\n\t<v Type=\"Int\"> 1 </v>\n</D>", ":3:2: unknown element type \"Int\"\""},
      {"show", "\n<D id=\"x\">\n</D>", ":2:1: an entry id that is not a number"},
      {"pack", "", "cannot read "},
      {"pack", "{\"directory\": {\"name\": \"D\",\n  \"entries\": [{]}}",
       ":2:16: syntax error while parsing object key"},
      {"pack", "{\"directory\": {\"name\": \"D\"},\n \"colour\": 1}",
       ":2:12: unknown key \"colour\""},
      {"pack", "{\"directory\": {}}", ":1:15: a directory without a \"name\""},
      {"pack", "{\"header\": \"\"}", ":1:1: no \"directory\""},
      {"pack",
       "{\"directory\": {\"name\": \"D\", \"directories\": [{\"name\": \"S\", \"entries\": []}]}}",
       ":1:70: D.S: a sub-directory's entries stand in each entry of its parent"},
      {"pack", "{\"directory\": {\"name\": \"D\", \"entries\": [{\"values\": [1]}]}}",
       ":1:52: D[0]: expected 0 items"},
      {"pack", OneChannel("Vec", {"[1, 2, 3]", "[1, 2]"}), ":5:15: D[1].v: expected 3 items"},
      {"pack", OneChannel("Val", {"\"12\""}), ":4:15: D[0].v: expected a number, \"inf\""},
      {"pack", OneChannel("Mat", {"[[1,2,3,4],[1,2,3,4],[1,2,3,4],[1,2,3]]"}),
       ":4:46: D[0].v: expected 4 items"},
      {"pack", OneChannel("Val", {"1", "1e39"}), ":5:15: D[1].v: a number beyond the range"},
      {"pack", OneChannel("Int", {"1"}), ":2:60: D: the type is \"Txt\", \"Val\""},
      {"pack", "{\"encoding\": \"Latin-1\", \"directory\": {\"name\": \"\u20ac\"}}",
       ":1:47: holds a character beyond Latin-1"},
  };
  int number = 0;
  for (const auto& c : cases) {
    const fs::path file = folder / ("input" + std::to_string(++number));
    if (!c.contents.empty()) WriteBytes(file, c.contents);
    const RunResult result = RunDatapack({c.command, file.string()});
    EXPECT_EQ(result.status, 1) << file;
    EXPECT_EQ(result.out, "") << file;
    EXPECT_NE(result.err.find(file.string()), std::string::npos) << file << "\n" << result.err;
    EXPECT_NE(result.err.find(c.message), std::string::npos) << file << "\n" << result.err;
  }
}

TEST(DatapackCliTest, RefusesWhatThePackageCannotCarryUnlessForced) {
  const std::string longText(2048, 'x');
  const std::string manyEntries = [] {
    std::string entries = "{\"directory\": {\"name\": \"D\", \"entries\": [{}";
    for (int i = 1; i < 10000; ++i)
      entries += ", {}";
    return entries + "]}}";
  }();
  const std::string siblings =
      "{\"directory\": {\"name\": \"P\", \"directories\": [{\"name\": \"Node\"}, "
      "{\"name\": \"Nodeids\"}],\n \"entries\": [{\"directories\": [[{}, {}], [{}]]}]}}";
  const std::string nested =
      "{\"directory\": {\"name\": \"A\", \"directories\": [{\"name\": \"A\", \"data\": "
      "[{\"name\": \"v\", \"type\": \"Val\"}]}],\n \"entries\": [{\"directories\": [[]]}, "
      "{\"directories\": [[{\"values\": [1]}]]}]}}";
  const struct {
    std::string json;
    std::string message;
  } cases[] = {
      {OneChannel("Txt", {"\"a</b\""}), ":4:15: D[0].v: holds \"</\", where the reader ends"},
      {OneChannel("Txt", {"\"ok\"", "\" padded\""}),
       ":5:15: D[1].v: begins or ends with whitespace"},
      {OneChannel("Txt", {"\"" + longText + "\""}),
       ":4:15: D[0].v: 2048 characters, but the reader"},
      {OneChannel("Val", {"1"}, "a>b"), ":2:24: a>b: holds \">\", which ends its tag early"},
      {OneChannel("Val", {"1"}, "a Type=b"), ":2:24: a Type=b: holds \"Type=\""},
      {OneChannel("Val", {"1"}, "a id=\\\"1\\\""), ":2:24: a id=\"1\": holds 'id=\"', where the"},
      {OneChannel("Val", {"1"}, " D"), ":2:24:  D: begins or ends with whitespace"},
      {OneChannel("Val", {"1"}, ""), ":2:24: : an empty name"},
      {OneChannel("Val", {"1"}, "/D"), ":2:24: /D: begins with \"/\""},
      {OneChannel("Val", {"1"}, "a</b"), ":2:24: a</b: holds \"</\", where the reader looks for"},
      {OneChannel("Val", {"1"}, longText),
       ":2:24: " + std::string(40, 'x') + "...: 2048 characters, but the package keeps only"},
      {OneChannel("Val", {"1"}, "D", "<x"), ":1:12: header: holds a \"<\" without a \">\""},
      {OneChannel("Val", {"1"}, "D", "<D>"), ":1:12: header: holds the tag <D>, where the reader"},
      {OneChannel("Val", {"1"}, "D", longText), ":1:12: header: 2048 characters"},
      {OneChannel("Val", {"1", "2"}, std::string(2041, 'n')),
       ":3:13: " + std::string(40, 'n') + "...: 2 entries, but a tag of this name with id 1"},
      {manyEntries, ":1:40: D: 10000 entries, but the reader takes at most 9999"},
      {siblings, ":2:41: P[0].Nodeids: the reader takes its entries for more entries of \"Node\""},
      {nested, ":2:13: A: 2 entries read back as 1: the reader, searching by name"},
  };
  const fs::path folder = ScratchFolder();
  for (const auto& c : cases) {
    const fs::path file = folder / "refused.json";
    WriteBytes(file, c.json);
    const RunResult refused = RunDatapack({"pack", file.string()});
    EXPECT_EQ(refused.status, 1) << c.json;
    EXPECT_EQ(refused.out, "");
    EXPECT_NE(refused.err.find(file.string() + c.message), std::string::npos) << c.message << "\n"
                                                                              << refused.err;
    EXPECT_NE(refused.err.find("--force writes it all the same"), std::string::npos);
    const RunResult forced = RunDatapack({"pack", file.string(), "--force"});
    EXPECT_EQ(forced.status, 0) << c.message << "\n" << forced.err;
    EXPECT_NE(forced.out, "");
  }
  // Standard input is not held while the package is written, so reading back names no line.
  const RunResult piped = RunDatapack({"pack"}, nested);
  EXPECT_EQ(piped.status, 1);
  EXPECT_NE(piped.err.find("datapack: standard input: A: 2 entries read back as 1"),
            std::string::npos)
      << piped.err;
}

TEST(DatapackCliTest, ShowWarnsWhereTheReaderTakesFewerEntriesThanTheTextHolds) {
  const std::string package =
      "\n<P>\n\t<d>\n\t\t<v Type=\"Val\"> 1 </v>\n\t</d>\n\t<did id=\"0\">\n\t</did>"
      "\n\t<did id=\"1\">\n\t</did>\n</P>";
  const RunResult result = RunDatapack({"show", "-"}, package);
  EXPECT_EQ(result.status, 0) << result.err;
  EXPECT_NE(result.err.find("standard input:3:2: warning: the text holds 1 entry of P[0].d, "
                            "the reader takes 2"),
            std::string::npos)
      << result.err;
  EXPECT_NE(result.err.find("standard input:6:2: warning: the text holds 2 entries of "
                            "P[0].did, the reader takes 0"),
            std::string::npos)
      << result.err;

  // Entries the reader does not take are passed over whole, however much they hold: Q still
  // gets its own place.
  std::string skipped = "\n<T>\n";
  for (const char* id : {"0", "1"}) {
    skipped += std::string("\t<P id=\"") + id +
               "\">\n\t\t<d>\n\t\t\t<v Type=\"Val\"> 1 </v>\n\t\t</d>"
               "\n\t\t<did id=\"0\">\n\t\t\t<s>\n\t\t\t</s>\n\t\t</did>"
               "\n\t\t<did id=\"1\">\n\t\t\t<s>\n\t\t\t</s>\n\t\t</did>\n\t</P>\n";
  }
  skipped +=
      "\t<Q>\n\t\t<e>\n\t\t\t<w Type=\"Val\"> 2 </w>\n\t\t</e>\n\t\t<eid id=\"0\">"
      "\n\t\t</eid>\n\t</Q>\n</T>";
  const RunResult past = RunDatapack({"show", "-"}, skipped);
  EXPECT_EQ(past.status, 0) << past.err;
  for (const char* warning :
       {":3:2: warning: the text holds 2 entries of T[0].P, the reader takes 1",
        ":29:2: warning: the text holds 1 entry of T[0].Q, the reader takes 0"}) {
    EXPECT_NE(past.err.find(warning), std::string::npos) << past.err;
  }
}

TEST(DatapackCliTest, ScramblingIsUndoneByteForByteThroughFilesAndStreams) {
  const fs::path folder = ScratchFolder();
  std::mt19937 random(7);
  std::size_t comparedBytes = 0;
  for (std::size_t length : {0u, 1u, 12u, 255u, 70000u}) {
    std::string bytes(length, '\0');
    for (char& byte : bytes)
      byte = static_cast<char>(random() % 256);
    if (length >= 4) bytes.replace(0, 4, "\r\n\x1a\0", 4);  // what text-mode streams would eat
    WriteBytes(folder / "plain", bytes);
    const RunResult scrambled = RunDatapack(
        {"scramble", (folder / "plain").string(), "-o", (folder / "scrambled").string()});
    EXPECT_EQ(scrambled.status, 0) << scrambled.err;
    EXPECT_EQ(scrambled.out, "");
    const std::string scrambledBytes = ReadBytes(folder / "scrambled");
    EXPECT_EQ(scrambledBytes.size(), length);
    if (length > 0) {
      EXPECT_NE(scrambledBytes, bytes);
    }
    const RunResult back = RunDatapack({"unscramble"}, scrambledBytes);
    EXPECT_EQ(back.status, 0) << back.err;
    EXPECT_EQ(back.out, bytes) << length;
    comparedBytes += length;
  }
  EXPECT_EQ(comparedBytes, 70268u);

  // The amounts added to the first bytes, and the same bytes as pack --scramble writes.
  const RunResult zeros = RunDatapack({"scramble", "-"}, std::string(6, '\0'));
  EXPECT_EQ(zeros.out, std::string("\x02\x01\x02\xff\xfc\x01", 6));
  const std::string packed = RunDatapack({"pack", "-"}, kPlayersJson).out;
  EXPECT_EQ(RunDatapack({"pack", "-", "--scramble"}, kPlayersJson).out,
            RunDatapack({"scramble"}, packed).out);
}

TEST(DatapackCliTest, OutputFilesAreReplacedWholeOrNotAtAll) {
  const fs::path folder = ScratchFolder();
  const fs::path good = folder / "good.json";
  const fs::path bad = folder / "bad.json";
  const fs::path output = folder / "out.pkg";
  WriteBytes(good, kPlayersJson);
  WriteBytes(bad, OneChannel("Txt", {"\"a</b\""}));
  WriteBytes(output, "old contents");

  EXPECT_EQ(RunDatapack({"pack", bad.string(), "-o", output.string()}).status, 1);
  EXPECT_EQ(ReadBytes(output), "old contents");
  EXPECT_EQ(RunDatapack({"scramble", (folder / "missing").string(), "-o", output.string()}).status,
            1);
  EXPECT_EQ(ReadBytes(output), "old contents");

  EXPECT_EQ(RunDatapack({"pack", good.string(), "-o", output.string()}).status, 0);
  EXPECT_EQ(ReadBytes(output), kPlayersPackage);
  std::vector<std::string> names;
  for (const auto& entry : fs::directory_iterator(folder))
    names.push_back(entry.path().filename().string());
  std::sort(names.begin(), names.end());
  EXPECT_EQ(names, (std::vector<std::string>{"bad.json", "good.json", "out.pkg"}));

  const fs::path nowhere = folder / "no such folder" / "out.pkg";
  const RunResult failed = RunDatapack({"pack", good.string(), "-o", nowhere.string()});
  EXPECT_EQ(failed.status, 1);
  EXPECT_NE(failed.err.find("cannot write " + nowhere.string()), std::string::npos) << failed.err;
}

}  // namespace

namespace {

TEST(DatapackCliTest, CheckListsWhatTheReaderWouldChangeAndDiffComparesByPath) {
  const std::string players = kPlayersPackage;
  const auto replaced = [&](const std::string& from, const std::string& to) {
    std::string text = players;
    return text.replace(text.find(from), from.size(), to);
  };
  const struct {
    std::string package;
    int status;  // without --strict
    int strictStatus;
    const char* finding;  // expected in standard output
  } checks[] = {
      {players, 0, 0, ""},
      {replaced("12.5", "12.5x"), 1, 1, "4:2: error: Players[0].Score: \"12.5x\" does not scan"},
      {replaced("12.5", "1 2"), 1, 1, "4:2: error: Players[0].Score: 2 numbers where the reader"},
      {replaced("Ann", std::string(2048, 'a')), 1, 1,
       "3:2: error: Players[0].Name: 2048 characters, but the reader takes"},
      {replaced("id=\"1\"", "id=\"7\""), 0, 1,
       "6:1: warning: Players: id 7 on entry 1: ids are not read"},
      {replaced("</Name>\n", "</Name>\r\n"), 0, 1,
       "3:32: warning: mixed line breaks: CR LF in a package of LF"},
      // Inside a value, just before its closing tag, after LF is known.
      {replaced(" Ann </Name>", " Ann\r\n</Name>"), 0, 1,
       "3:24: warning: mixed line breaks: CR LF in a package of LF"},
      {players + std::string(1, '\0') + "tail", 1, 1,
       ":9:11: error: 4 bytes after a NUL byte, where the reader stops"},
      {replaced("12.5", "12.50"), 0, 1, "warning: written again, the package differs"},
      {"\n<P>\n\t<d>\n\t\t<v Type=\"Val\"> 1 </v>\n\t</d>\n\t<did id=\"0\">\n\t</did>"
       "\n\t<did id=\"1\">\n\t</did>\n</P>",
       1, 1, "3:2: error: the text holds 1 entry of P[0].d, the reader takes 2"},
      {"hello", 1, 1, "standard input:1:5: no package"},
  };
  for (const auto& c : checks) {
    const RunResult checked = RunDatapack({"check"}, c.package);
    EXPECT_EQ(checked.status, c.status) << c.finding << "\n" << checked.out << checked.err;
    EXPECT_NE(checked.out.find(c.finding), std::string::npos) << checked.out << checked.err;
    EXPECT_EQ(RunDatapack({"check", "--strict", "-"}, c.package).status, c.strictStatus)
        << c.finding;
  }

  // pack refuses what check finds in the package it would write.
  const RunResult refused =
      RunDatapack({"pack"}, OneChannel("Txt", {"\"" + std::string(2048, 'a') + "\""}, "Players"));
  EXPECT_NE(refused.err.find("4:15: Players[0].v: 2048 characters, but the reader takes"),
            std::string::npos)
      << refused.err;

  const fs::path folder = ScratchFolder();
  const fs::path before = folder / "before.pkg";
  const fs::path after = folder / "after.pkg";
  WriteBytes(before, players);
  const struct {
    std::string after;
    int status;
    std::string out;
  } diffs[] = {
      {players, 0, ""},
      {RunDatapack({"scramble"}, players).out, 0, ""},
      {replaced("> 7 <", "> 8 <"), 1, "Players[1].Score: 7 \u2192 8\n"},
      {replaced("Bob", "Bo"), 1, "Players[1].Name: \"Bob\" \u2192 \"Bo\"\n"},
      {"\n<Players>\n\t<Name Type=\"Txt\"> Ann </Name>\n\t<Score Type=\"Val\"> 12.5 </Score>\n"
       "</Players>",
       1, "Players: 2 entries \u2192 1 entry\n"},
      {"hdr" + players, 1, "header: \"\" \u2192 \"hdr\"\n"},
  };
  for (const auto& c : diffs) {
    WriteBytes(after, c.after);
    const RunResult compared = RunDatapack({"diff", before.string(), after.string()});
    EXPECT_EQ(compared.status, c.status) << c.out << compared.err;
    EXPECT_EQ(compared.out, c.out);
  }
  const RunResult missing = RunDatapack({"diff", before.string(), (folder / "none").string()});
  EXPECT_EQ(missing.status, 2);
  EXPECT_NE(missing.err.find("datapack: cannot read"), std::string::npos) << missing.err;

  // A NUL in a name cannot be written even by force, and the message shows where it stands.
  const RunResult nul = RunDatapack({"pack", "--force"}, OneChannel("Val", {"1"}, "A\\u0000B"));
  EXPECT_EQ(nul.status, 1);
  EXPECT_NE(nul.err.find(":2:24: A\\x00B: holds a NUL character"), std::string::npos) << nul.err;
  EXPECT_EQ(nul.out, "");
}

}  // namespace
