// datapack: packs channel trees described in JSON into DataDirectory packages, shows stored
// packages, and scrambles them, all through the plug-in as the engine loads it.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <new>
#include <sstream>
#include <string>

#include "tools/datapack/commands.h"
#include "tools/datapack/input_error.h"

namespace {

constexpr int kBadInput = 1;
constexpr int kBadUsage = 2;

void AddScramble(CLI::App& app, const char* name, const char* description,
                 datapack::ScrambleOptions& options) {
  CLI::App* command = app.add_subcommand(name, description);
  command->add_option("IN", options.input, "Input file; standard input when absent or \"-\"");
  command->add_option("-o,--output", options.output, "Output file; standard output when absent");
}

void PrintError(const std::string& message) {
  std::istringstream lines(message);
  for (std::string line; std::getline(lines, line);)
    std::fprintf(stderr, "datapack: %s\n", line.c_str());
}

}  // namespace

int main(int argc, char** argv) {
  CLI::App app("Packs channel trees into DataDirectory packages and shows stored packages.",
               "datapack");
  app.require_subcommand(1);
  app.footer("Exit status: 0 on success, 1 on bad input, 2 on bad usage.");

  CLI::App* demo = app.add_subcommand(
      "demo", "Runs the Players demo: packs a small tree, scrambles it, reads it back");

  datapack::ScrambleOptions scramble;
  datapack::ScrambleOptions unscramble;
  unscramble.undo = true;
  AddScramble(app, "scramble", "Scrambles bytes as the plug-in's Encrypt does", scramble);
  AddScramble(app, "unscramble", "Undoes scramble, as the plug-in's Decrypt does", unscramble);

  datapack::ShowOptions show;
  CLI::App* showCommand =
      app.add_subcommand("show", "Shows what a stored package hands the engine");
  showCommand->add_option("FILE", show.file, "The package; \"-\" for standard input")->required();
  showCommand->add_flag("--scrambled", show.scrambled, "The package is scrambled");
  showCommand->add_flag("--json", show.json, "Prints the package as JSON, as pack reads it");

  datapack::PackOptions pack;
  CLI::App* packCommand =
      app.add_subcommand("pack", "Writes the package a JSON description asks for");
  packCommand->add_option("FILE", pack.file, "The JSON; \"-\" for standard input")->required();
  packCommand->add_option("-o,--output", pack.output, "Output file; standard output when absent");
  packCommand->add_flag("--crlf", pack.crlf, "Breaks lines with CR LF whatever the JSON says");
  packCommand->add_flag("--scramble", pack.scramble, "Scrambles the package");
  packCommand->add_flag("--force", pack.force,
                        "Writes what the package cannot carry instead of refusing it");

  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    return app.exit(error) == 0 ? 0 : kBadUsage;
  }

  try {
    if (*demo) datapack::Demo();
    if (app.got_subcommand("scramble")) datapack::Scramble(scramble);
    if (app.got_subcommand("unscramble")) datapack::Scramble(unscramble);
    if (*showCommand) datapack::Show(show);
    if (*packCommand) datapack::Pack(pack);
  } catch (const datapack::InputError& error) {
    PrintError(error.what());
    return kBadInput;
  } catch (const std::bad_alloc&) {
    PrintError("out of memory");
    return kBadInput;
  }
  return 0;
}
