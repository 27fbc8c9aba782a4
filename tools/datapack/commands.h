// The subcommands. Each throws InputError for what the user handed it; the message is complete.
#pragma once

#include <string>
#include <string_view>

#include "tools/datapack/plugins.h"

namespace datapack {

// How a package's scrambling is decided: from its first bytes, or as the user says.
enum class Scrambling { kDetect, kScrambled, kPlain };

struct DemoOptions {
  std::string output;  // where the package goes too; none when empty
};

struct ScrambleOptions {
  std::string input;
  std::string output;
  bool undo = false;
};

struct ShowOptions {
  std::string file;
  Scrambling scrambling = Scrambling::kDetect;
  bool json = false;
};

struct PackOptions {
  std::string file;
  std::string output;
  bool crlf = false;
  bool scramble = false;
  bool force = false;
};

struct CheckOptions {
  std::string file;
  Scrambling scrambling = Scrambling::kDetect;
  bool strict = false;
};

struct DiffOptions {
  std::string before;
  std::string after;
  Scrambling scrambling = Scrambling::kDetect;
};

// Where --plugin-dir or DATAPACK_PLUGIN_DIR points; empty when nowhere.
extern std::string pluginDir;

void Demo(const DemoOptions& options);
void Scramble(const ScrambleOptions& options);
void Show(const ShowOptions& options);
void Pack(const PackOptions& options);
// The exit status: 0 when the package reads back as written, 1 when not.
int Check(const CheckOptions& options);
// The exit status: 0 when the packages hold the same, 1 when they differ.
int Diff(const DiffOptions& options);

// The rule that tells a scrambled package from a plain one, by its first bytes.
bool LooksScrambled(std::string_view bytes, const Plugins& plugins);

}  // namespace datapack
