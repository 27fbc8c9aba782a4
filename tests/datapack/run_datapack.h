// Runs the datapack program built beside the test, as a user runs it from a shell, and collects
// what it prints.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

struct RunResult {
  int status = -1;
  std::string out;
  std::string err;
};

// `input` goes to the program's standard input.
RunResult RunDatapack(const std::vector<std::string>& arguments, const std::string& input = "");

// A folder of the test's own, emptied for each test that asks for it.
std::filesystem::path ScratchFolder();

std::string ReadBytes(const std::filesystem::path& path);
void WriteBytes(const std::filesystem::path& path, const std::string& bytes);

// The Players package of the demo, as stored.
inline constexpr char kPlayersPackage[] =
    "\n<Players id=\"0\">\n\t<Name Type=\"Txt\"> Ann </Name>\n\t<Score Type=\"Val\"> 12.5 </Score>"
    "\n</Players>\n<Players id=\"1\">\n\t<Name Type=\"Txt\"> Bob </Name>"
    "\n\t<Score Type=\"Val\"> 7 </Score>\n</Players>";
