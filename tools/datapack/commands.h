// The subcommands. Each throws InputError for what the user handed it; the message is complete.
#pragma once

#include <string>

namespace datapack {

struct ScrambleOptions {
  std::string input;
  std::string output;
  bool undo = false;
};

struct ShowOptions {
  std::string file;
  bool scrambled = false;
  bool json = false;
};

struct PackOptions {
  std::string file;
  std::string output;
  bool crlf = false;
  bool scramble = false;
  bool force = false;
};

void Demo();
void Scramble(const ScrambleOptions& options);
void Show(const ShowOptions& options);
void Pack(const PackOptions& options);

}  // namespace datapack
