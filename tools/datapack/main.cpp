// datapack: packs channel trees described in JSON into DataDirectory packages, shows, checks and
// compares stored packages, and scrambles them, all through the plug-in as the engine loads it.
#include <CLI/CLI.hpp>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <new>
#include <sstream>
#include <string>

#include "tools/datapack/commands.h"
#include "tools/datapack/file_io.h"
#include "tools/datapack/input_error.h"

namespace {

constexpr int kBadInput = 1;
constexpr int kBadUsage = 2;
constexpr const char* kSubcommands[] = {"demo", "scramble", "unscramble", "show",
                                        "pack", "check",    "diff"};

void PrintError(const std::string& message) {
  std::istringstream lines(message);
  for (std::string line; std::getline(lines, line);)
    std::fprintf(stderr, "datapack: %s\n", line.c_str());
}

void AddScramble(CLI::App& app, const char* name, const char* description,
                 datapack::ScrambleOptions& options) {
  CLI::App* command = app.add_subcommand(name, description);
  command->add_option("IN", options.input, "Input file; standard input when absent or \"-\"");
  command->add_option("-o,--output", options.output, "Output file; standard output when absent");
}

// --scrambled and --plain override what the first bytes say.
void AddScrambling(CLI::App& command, datapack::Scrambling& scrambling) {
  CLI::Option* scrambled = command.add_flag_callback(
      "--scrambled", [&] { scrambling = datapack::Scrambling::kScrambled; },
      "The package is scrambled, whatever its first bytes say");
  CLI::Option* plain = command.add_flag_callback(
      "--plain", [&] { scrambling = datapack::Scrambling::kPlain; },
      "The package is not scrambled");
  scrambled->excludes(plain);
}

// The first word that is not an option nor an option's value, when it names no subcommand.
const char* UnknownSubcommand(int argc, char** argv) {
  for (int i = 1; i < argc; ++i) {
    const std::string_view argument = argv[i];
    if (argument == "--plugin-dir") {
      ++i;
      continue;
    }
    if (argument.starts_with("-")) continue;
    for (const char* known : kSubcommands) {
      if (argument == known) return nullptr;
    }
    return argv[i];
  }
  return nullptr;
}

}  // namespace

int main(int argc, char** argv) {
  datapack::HandleSignals();
  CLI::App app(
      "Packs channel trees into DataDirectory packages; shows, checks and compares stored "
      "packages.",
      "datapack");
  app.require_subcommand(1);
  app.set_version_flag("--version", std::string("datapack ") + DATAPACK_VERSION);
  app.add_option("--plugin-dir", datapack::pluginDir,
                 "Where the channel plug-ins are, when neither beside the program nor in its "
                 "install layout")
      ->envname("DATAPACK_PLUGIN_DIR");
  app.footer(
      "Exit status: 0 on success, 1 on bad input, 2 on bad usage; check and diff: 0 same "
      "or sound, 1 different or findings, 2 trouble.");

  datapack::DemoOptions demoOptions;
  CLI::App* demo = app.add_subcommand(
      "demo", "Runs the Players demo: packs a small tree, scrambles it, reads it back");
  demo->add_option("-o,--output", demoOptions.output, "Also saves the demo package there");

  datapack::ScrambleOptions scramble;
  datapack::ScrambleOptions unscramble;
  unscramble.undo = true;
  AddScramble(app, "scramble", "Scrambles bytes as the plug-in's Encrypt does", scramble);
  AddScramble(app, "unscramble", "Undoes scramble, as the plug-in's Decrypt does", unscramble);

  datapack::ShowOptions show;
  CLI::App* showCommand =
      app.add_subcommand("show", "Shows what a stored package hands the engine");
  showCommand->add_option("FILE", show.file, "The package; standard input when absent or \"-\"");
  AddScrambling(*showCommand, show.scrambling);
  showCommand->add_flag("--json", show.json, "Prints the package as JSON, as pack reads it");

  datapack::PackOptions pack;
  CLI::App* packCommand =
      app.add_subcommand("pack", "Writes the package a JSON description asks for");
  packCommand->add_option("FILE", pack.file, "The JSON; standard input when absent or \"-\"");
  packCommand->add_option("-o,--output", pack.output, "Output file; standard output when absent");
  packCommand->add_flag("--crlf", pack.crlf, "Breaks lines with CR LF whatever the JSON says");
  packCommand->add_flag("--scramble", pack.scramble, "Scrambles the package");
  packCommand->add_flag("--force", pack.force,
                        "Writes what the package cannot carry instead of refusing it");

  datapack::CheckOptions check;
  CLI::App* checkCommand = app.add_subcommand(
      "check", "Lists what the engine's reader would change or drop, with line, column and path");
  checkCommand->add_option("FILE", check.file, "The package; standard input when absent or \"-\"");
  AddScrambling(*checkCommand, check.scrambling);
  checkCommand->add_flag("--strict", check.strict, "Fails on warnings too");

  datapack::DiffOptions diff;
  CLI::App* diffCommand =
      app.add_subcommand("diff", "Lists the values, entries and structure that differ, by path");
  diffCommand->add_option("A", diff.before, "The first package")->required();
  diffCommand->add_option("B", diff.after, "The second package")->required();
  AddScrambling(*diffCommand, diff.scrambling);

  if (const char* unknown = UnknownSubcommand(argc, argv)) {
    std::fprintf(stderr, "datapack: unknown subcommand \"%s\"; datapack --help lists them\n",
                 unknown);
    return kBadUsage;
  }
  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& success) {
    return app.exit(success);
  } catch (const CLI::ParseError& error) {
    if (error.get_exit_code() == 0) return app.exit(error);  // --help, --version
    PrintError(error.what());
    std::fprintf(stderr, "datapack: %s --help tells more\n",
                 app.get_subcommands().empty()
                     ? "datapack"
                     : ("datapack " + app.get_subcommands().front()->get_name()).c_str());
    return kBadUsage;
  }

  // check and diff keep 1 for what they find: trouble is 2 there.
  const int trouble = *checkCommand || *diffCommand ? kBadUsage : kBadInput;
  int status = 0;
  try {
    if (*demo) datapack::Demo(demoOptions);
    if (app.got_subcommand("scramble")) datapack::Scramble(scramble);
    if (app.got_subcommand("unscramble")) datapack::Scramble(unscramble);
    if (*showCommand) datapack::Show(show);
    if (*packCommand) datapack::Pack(pack);
    if (*checkCommand) status = datapack::Check(check);
    if (*diffCommand) status = datapack::Diff(diff);
  } catch (const datapack::InputError& error) {
    PrintError(error.what());
    return trouble;
  } catch (const std::bad_alloc&) {
    PrintError("out of memory");
    return trouble;
  }
  // What went to standard output through stdio (the demo) must have arrived too.
  if (std::fflush(stdout) != 0 || std::ferror(stdout)) {
    PrintError(std::string("cannot write standard output: ") + std::strerror(errno));
    return trouble;
  }
  return status;
}
