#include "tools/datapack/commands.h"

#include <climits>
#include <cstdio>
#include <string_view>

#include "plugin/data_package.h"
#include "tools/datapack/channel_tree.h"
#include "tools/datapack/demo.h"
#include "tools/datapack/file_io.h"
#include "tools/datapack/format_limits.h"
#include "tools/datapack/input_error.h"
#include "tools/datapack/json_mapping.h"
#include "tools/datapack/outline.h"
#include "tools/datapack/package_reader.h"

namespace datapack {
namespace {

// The plug-in scrambles lengths an int can count.
void CheckScramblable(const std::string& bytes, const std::string& name) {
  if (bytes.size() >= INT_MAX) throw InputError(name + ": too large to scramble");
}

std::string At(const std::string& name, std::string_view text, std::size_t offset) {
  return name + ":" + LineAndColumn(text, offset) + ": ";
}

// Scrambled bytes are mostly not text; a plain package is.
bool LooksScrambled(std::string_view text) {
  for (char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte < 0x20 && c != '\n' && c != '\r' && c != '\t') return true;
  }
  return false;
}

}  // namespace

void Demo() { RunDemo(LoadPlugins()); }

void Scramble(const ScrambleOptions& options) {
  std::string bytes = ReadInput(options.input);
  CheckScramblable(bytes, StreamName(options.input, true));
  const int length = static_cast<int>(bytes.size());
  Lum_DataPackage scrambler;
  if (options.undo) {
    scrambler.Decrypt(bytes.data(), length);
  } else {
    scrambler.Encrypt(bytes.data(), length);
  }
  WriteOutput(options.output, bytes);
}

void Show(const ShowOptions& options) {
  const std::string name = StreamName(options.file, true);
  std::string text = ReadInput(options.file);
  if (options.scrambled) {
    CheckScramblable(text, name);
    Lum_DataPackage().Decrypt(text.data(), static_cast<int>(text.size()));
  }
  text.resize(std::min(text.size(), text.find('\0')));  // the reader stops at a NUL
  const Plugins plugins = LoadPlugins();
  ReadResult result;
  try {
    result = ReadPackage(plugins, text);
  } catch (const StructureError& error) {
    const bool hint = !options.scrambled && LooksScrambled(text);
    throw InputError(At(name, text, error.offset()) + error.what() +
                     (hint ? " (a scrambled package needs --scrambled)" : ""));
  }
  for (const Shortfall& shortfall : FindShortfalls(result)) {
    std::fprintf(stderr, "datapack: %swarning: %s\n", At(name, text, shortfall.offset).c_str(),
                 shortfall.message.c_str());
  }
  WriteOutput("", options.json ? PackageToJson(result.package) : PackageOutline(result.package));
}

void Pack(const PackOptions& options) {
  const std::string name = StreamName(options.file, true);
  const std::string text = ReadInput(options.file);
  Package package;
  try {
    package = PackageFromJson(text);
  } catch (const JsonError& error) {
    throw InputError(At(name, text, error.OffsetIn(text)) + error.what());
  }
  if (options.crlf) package.crlf = true;

  const auto refuse = [&](const std::vector<Problem>& problems) {
    std::string message;
    for (const Problem& problem : problems) {
      const std::size_t offset = JsonError(problem.pointer, "").OffsetIn(text);
      message += At(name, text, offset) + problem.message + "\n";
    }
    throw InputError(message + "the package cannot carry this; --force writes it all the same");
  };
  if (!options.force) {
    if (const std::vector<Problem> problems = CheckLimits(package); !problems.empty()) {
      refuse(problems);
    }
  }
  const Plugins plugins = LoadPlugins();
  std::string package_bytes = WritePackage(plugins, package, false);
  if (!options.force) {
    if (const auto problem = CheckReadBack(plugins, package, package_bytes)) refuse({*problem});
  }
  if (options.scramble) package_bytes = WritePackage(plugins, package, true);
  WriteOutput(options.output, package_bytes);
}

}  // namespace datapack
