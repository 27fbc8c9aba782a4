#include "tools/datapack/commands.h"

#include <algorithm>
#include <climits>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <optional>
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

std::string pluginDir;

namespace {

// The plug-in scrambles lengths an int can count.
void CheckScramblable(const std::string& bytes, const std::string& name) {
  if (bytes.size() >= INT_MAX) throw InputError(name + ": too large to scramble");
}

// Places in a text as messages give them. Line starts are found once, when first needed.
class Places {
 public:
  Places(std::string name, std::string_view text) : name_(std::move(name)), text_(text) {}

  std::string At(std::size_t offset) { return name_ + ":" + LineColumn(offset) + ": "; }

  std::string LineColumn(std::size_t offset) {
    if (starts_.empty()) {
      starts_.push_back(0);
      for (std::size_t at = text_.find('\n'); at != std::string_view::npos;
           at = text_.find('\n', at + 1))
        starts_.push_back(at + 1);
    }
    offset = std::min(offset, text_.size());
    const auto line = std::upper_bound(starts_.begin(), starts_.end(), offset) - 1;
    return std::to_string(line - starts_.begin() + 1) + ":" + std::to_string(offset - *line + 1);
  }

 private:
  std::string name_;
  std::string_view text_;
  std::vector<std::size_t> starts_;
};

// Text that holds no package: for check, a finding like any other.
class NotAPackage : public InputError {
 public:
  using InputError::InputError;
};

// A stored package as the engine's reader receives it.
struct Loaded {
  std::string file;
  std::string name;
  std::string text;          // unscrambled, cut at the first NUL
  std::size_t afterNul = 0;  // the bytes past that NUL, which no reader sees
  ReadResult result;
};

Loaded Load(const std::string& file, Scrambling scrambling, const Plugins& plugins,
            const EntrySink& sink = nullptr) {
  Loaded loaded;
  loaded.file = file;
  loaded.name = StreamName(file, true);
  loaded.text = ReadInput(file);
  const bool scrambled =
      scrambling == Scrambling::kScrambled ||
      (scrambling == Scrambling::kDetect && LooksScrambled(loaded.text, plugins));
  if (scrambled) {
    CheckScramblable(loaded.text, loaded.name);
    plugins.Decrypt(loaded.text.data(), static_cast<int>(loaded.text.size()));
  }
  const std::size_t nul = loaded.text.find('\0');
  if (nul != std::string::npos) {
    loaded.afterNul = loaded.text.size() - nul - 1;
    loaded.text.resize(nul);  // the reader stops there
  }
  try {
    loaded.result = ReadPackage(plugins, loaded.text, sink);
  } catch (const StructureError& error) {
    Places places(loaded.name, loaded.text);
    std::string message = places.At(error.offset()) + error.what();
    if (nul != std::string::npos) {
      message += " (the reader stops at the NUL byte at " + places.LineColumn(nul) + ")";
    }
    throw NotAPackage(message);
  }
  loaded.result.package.scrambled = scrambled;
  return loaded;
}

// Findings of check, in the order met.
struct Finding {
  std::size_t offset;
  bool warning;
  std::string message;
};

// Where writing again what the reader took first differs from the text. A file is read again for
// the comparison rather than held beside the package written again; the text comes back only when
// they differ, to place the finding.
std::optional<std::size_t> WrittenAgainDiffers(Loaded& loaded, const Plugins& plugins) {
  const std::size_t size = loaded.text.size();
  const bool reread = !IsStandardStream(loaded.file);
  if (reread) std::string().swap(loaded.text);
  std::string again = WritePackage(plugins, loaded.result.package, false);
  if (!reread) {
    const auto differs =
        std::mismatch(again.begin(), again.end(), loaded.text.begin(), loaded.text.end());
    if (differs.first == again.end() && differs.second == loaded.text.end()) return std::nullopt;
    return static_cast<std::size_t>(differs.second - loaded.text.begin());
  }
  // The file as it stands: scrambled, the bytes written again are scrambled to match.
  if (loaded.result.package.scrambled) {
    plugins.Encrypt(again.data(), static_cast<int>(again.size()));
  }
  std::optional<std::size_t> at;
  std::ifstream file(loaded.file, std::ios::binary);
  std::vector<char> chunk(1 << 16);
  std::size_t done = 0;
  while (!at && done < size) {
    file.read(chunk.data(), static_cast<std::streamsize>(std::min(chunk.size(), size - done)));
    const auto read = static_cast<std::size_t>(file.gcount());
    if (read == 0) {
      at = done;
      break;
    }
    for (std::size_t i = 0; i < read && !at; ++i) {
      if (done + i >= again.size() || again[done + i] != chunk[i]) at = done + i;
    }
    done += read;
  }
  if (!at && again.size() != size) at = std::min(again.size(), size);
  if (at) {
    std::string().swap(again);
    loaded.text = ReadInput(loaded.file);
    if (loaded.result.package.scrambled) {
      plugins.Decrypt(loaded.text.data(), static_cast<int>(loaded.text.size()));
    }
    loaded.text.resize(std::min(loaded.text.size(), size));
  }
  return at;
}

std::vector<Finding> Findings(Loaded& loaded, const Plugins& plugins) {
  std::vector<Finding> findings;
  for (const Note& note : loaded.result.notes)
    findings.push_back({note.offset, note.warning, note.message});
  for (const Shortfall& shortfall : FindShortfalls(loaded.result))
    findings.push_back({shortfall.offset, false, shortfall.message});
  const std::string_view text = loaded.text;
  if (loaded.afterNul > 0) {
    findings.push_back(
        {text.size(), false,
         Counted(loaded.afterNul, "byte", "bytes") + " after a NUL byte, where the reader stops"});
  }
  if (findings.empty()) {
    if (const auto at = WrittenAgainDiffers(loaded, plugins)) {
      findings.push_back({*at, true,
                          "written again, the package differs from here on (numbers written "
                          "otherwise, or spacing)"});
    }
  }
  std::stable_sort(findings.begin(), findings.end(),
                   [](const Finding& a, const Finding& b) { return a.offset < b.offset; });
  return findings;
}

// The differences between two packages, by path.
class Differ {
 public:
  // `top` is the path of the top directory.
  Differ(Output& out, std::string top) : out_(out), path_(std::move(top)) {}
  bool different = false;

  // Goes one step further down the path for as long as it lives. Paths grow with depth: a path
  // made afresh at each level would cost memory with the square of the depth.
  class Step {
   public:
    Step(Differ& differ, std::string_view more) : path_(differ.path_), size_(path_.size()) {
      path_ += more;
    }
    ~Step() { path_.resize(size_); }
    Step(const Step&) = delete;
    Step& operator=(const Step&) = delete;

   private:
    std::string& path_;
    std::size_t size_;
  };

  void Report(const std::string& path, const std::string& before, const std::string& after) {
    different = true;
    out_ << path << ": " << before << " \u2192 " << after << "\n";
  }

  // Whether the two directories' names and data channels allow comparing their entries.
  bool Shapes(const Shape& a, const Shape& b) {
    if (a.name != b.name) {
      Report(path_, "directory \"" + ShownName(a.name) + "\"",
             "directory \"" + ShownName(b.name) + "\"");
      return false;
    }
    const auto slot = [](const Shape& shape, std::size_t j) {
      return j < shape.data.size() ? ShownName(shape.data[j].name) + " (" +
                                         std::string(KindName(shape.data[j].kind)) + ")"
                                   : std::string("nothing");
    };
    for (std::size_t j = 0; j < std::max(a.data.size(), b.data.size()); ++j) {
      if (j >= a.data.size() || j >= b.data.size() || a.data[j] != b.data[j]) {
        Report(path_ + ".data[" + std::to_string(j) + "]", slot(a, j), slot(b, j));
      }
    }
    return true;
  }

  void EntryCounts(std::size_t before, std::size_t after) {
    if (before != after) {
      Report(path_, Counted(before, "entry", "entries"), Counted(after, "entry", "entries"));
    }
  }

  // Two entries at the path.
  void EntryValues(const Shape& a, Entry aEntry, const Shape& b, Entry bEntry) {
    for (std::size_t j = 0; j < std::min(a.data.size(), b.data.size()); ++j) {
      if (a.data[j] != b.data[j]) continue;
      const std::string before = ValueText(aEntry.Value(j));
      const std::string after = ValueText(bEntry.Value(j));
      if (before != after) Report(Below(a.data[j].name), before, after);
    }
    const std::size_t subs = std::max(a.directories.size(), b.directories.size());
    for (std::size_t k = 0; k < subs; ++k) {
      if (k >= a.directories.size() || k >= b.directories.size()) {
        const Shape& only = k < a.directories.size() ? a.directories[k] : b.directories[k];
        Report(Below(only.name), k < a.directories.size() ? "a directory" : "nothing",
               k < a.directories.size() ? "nothing" : "a directory");
        continue;
      }
      const Step step(*this, "." + ShownName(a.directories[k].name));
      Directory(a.directories[k], aEntry.Directory(k), b.directories[k], bEntry.Directory(k));
    }
  }

  // Two directories' entries at the path.
  void Directory(const Shape& a, Entries aEntries, const Shape& b, Entries bEntries) {
    if (!Shapes(a, b)) return;
    EntryCounts(aEntries.size(), bEntries.size());
    for (std::size_t i = 0; i < std::min(aEntries.size(), bEntries.size()); ++i) {
      const Step step(*this, "[" + std::to_string(i) + "]");
      EntryValues(a, aEntries[i], b, bEntries[i]);
    }
  }

 private:
  std::string Below(std::string_view name) const { return path_ + "." + ShownName(name); }

  Output& out_;
  std::string path_;
};

}  // namespace

namespace {

// What the reader needs at the least: a last tag, ending the text or the text before a NUL.
bool EndsWithTag(std::string_view text) {
  text = text.substr(0, text.find('\0'));
  const std::size_t last = text.find_last_not_of(" \t\r\n");
  return last != std::string_view::npos && text[last] == '>';
}

}  // namespace

bool LooksScrambled(std::string_view bytes, const Plugins& plugins) {
  // Plain packages are text; scrambling shifts byte i by an amount that runs through every value
  // from i = 12 on, so that about one byte in eight of a scrambled text lands among the control
  // bytes. The first 268 bytes see every amount.
  constexpr std::size_t kLooked = 268;
  std::string start(bytes.substr(0, kLooked));
  const auto controls = [](std::string_view text) {
    return std::count_if(text.begin(), text.end(), [](char c) {
      const auto byte = static_cast<unsigned char>(c);
      return (byte < 0x20 && c != '\n' && c != '\r' && c != '\t') || byte == 0x7F;
    });
  };
  const auto asItStands = controls(start);
  plugins.Decrypt(start.data(), static_cast<int>(start.size()));
  const auto unscrambled = controls(start);
  if (asItStands != unscrambled || bytes.size() > kLooked) return unscrambled < asItStands;
  // A short package may look like text both ways: then only one way ends with a tag, but for one
  // chance in a few hundred.
  std::string whole(bytes);
  plugins.Decrypt(whole.data(), static_cast<int>(whole.size()));
  return EndsWithTag(whole) && !EndsWithTag(bytes);
}

void Demo(const DemoOptions& options) {
  const std::string package = RunDemo(LoadPlugins(pluginDir));
  if (!options.output.empty()) WriteOutput(options.output, package);
}

void Scramble(const ScrambleOptions& options) {
  const Plugins plugins = LoadPlugins(pluginDir);
  const auto scrambled = [&] {
    std::string bytes = ReadInput(options.input);
    CheckScramblable(bytes, StreamName(options.input, true));
    const int length = static_cast<int>(bytes.size());
    if (options.undo) {
      plugins.Decrypt(bytes.data(), length);
    } else {
      plugins.Encrypt(bytes.data(), length);
    }
    return bytes;
  };
  if (SameFile(options.input, options.output)) {
    WriteOutput(options.output, scrambled(), options.input);
    return;
  }
  // The output is open before the input is read: a slow input, a pipe say, is interrupted with
  // the temporary file already there, and its removal is what a user sees.
  Output out(options.output);
  out << scrambled();
  out.Commit();
}

void Show(const ShowOptions& options) {
  const Plugins plugins = LoadPlugins(pluginDir);
  Loaded loaded = Load(options.file, options.scrambling, plugins);
  Places places(loaded.name, loaded.text);
  for (const Shortfall& shortfall : FindShortfalls(loaded.result)) {
    std::fprintf(stderr, "datapack: %swarning: %s\n", places.At(shortfall.offset).c_str(),
                 shortfall.message.c_str());
  }
  if (loaded.afterNul > 0) {
    std::fprintf(stderr, "datapack: %swarning: %s after a NUL byte, where the reader stops\n",
                 places.At(loaded.text.size()).c_str(),
                 Counted(loaded.afterNul, "byte", "bytes").c_str());
  }
  // The package is printed from what was read. (Assigning an empty string would keep the room.)
  std::string().swap(loaded.text);
  Output out("");
  if (options.json) {
    WritePackageJson(loaded.result.package, out);
  } else {
    WriteOutline(loaded.result.package, out);
  }
  out.Commit();
}

void Pack(const PackOptions& options) {
  const std::string name = StreamName(options.file, true);
  std::string text;
  Package package;
  // A regular file is parsed as it is read; any trouble, and it is read whole for the message.
  std::optional<Package> streamed;
  std::error_code error;
  const bool regular =
      !IsStandardStream(options.file) && std::filesystem::is_regular_file(options.file, error);
  if (regular && std::filesystem::file_size(options.file, error) <= kLargestInput) {
    streamed = PackageFromJsonFile(options.file);
  }
  if (streamed) {
    package = std::move(*streamed);
  } else {
    text = ReadInput(options.file);
    try {
      package = PackageFromJson(text);
    } catch (const JsonError& error) {
      throw InputError(Places(name, text).At(error.OffsetIn(text)) + error.what());
    }
  }
  if (options.crlf) package.crlf = true;
  if (options.scramble) package.scrambled = true;

  const auto refuse = [&](const std::vector<Problem>& problems, bool forceable) {
    if (text.empty() && regular) text = ReadInput(options.file);
    Places places(name, text);
    std::string message;
    for (const Problem& problem : problems) {
      // A stream's text is gone by the last check, the one that reads the package back: its
      // message names the path without a line.
      message +=
          (text.empty() ? name + ": " : places.At(JsonError(problem.pointer, "").OffsetIn(text))) +
          problem.message + "\n";
    }
    throw InputError(message + (forceable ? "the package cannot carry this; --force writes it all "
                                            "the same"
                                          : "the package cannot carry this"));
  };
  std::vector<Problem> problems = CheckLimits(package);
  if (!options.force && !problems.empty()) refuse(problems, true);
  std::erase_if(problems, [](const Problem& problem) { return problem.forceable; });
  if (!problems.empty()) refuse(problems, false);
  // The package needs the room: a file can be read again for a message, and a stream's last
  // message can do without its line.
  std::string().swap(text);

  const Plugins plugins = LoadPlugins(pluginDir);
  std::string bytes = WritePackage(plugins, package, false);
  if (!options.force) {
    if (const auto problem = CheckReadBack(plugins, package, bytes)) refuse({*problem}, true);
  }
  const bool scramble = package.scrambled;
  package = Package();
  if (scramble) {
    // The amount each byte is shifted by depends only on its place: the NUL the plug-in
    // scrambles last changes nothing before it.
    CheckScramblable(bytes, name);
    plugins.Encrypt(bytes.data(), static_cast<int>(bytes.size()));
  }
  WriteOutput(options.output, bytes, options.file);
}

int Check(const CheckOptions& options) {
  const Plugins plugins = LoadPlugins(pluginDir);
  const std::string name = StreamName(options.file, true);
  Loaded loaded;
  try {
    loaded = Load(options.file, options.scrambling, plugins);
  } catch (const NotAPackage& error) {
    Output out("");
    out << error.what() << "\n";
    out.Commit();
    return 1;
  }
  const std::vector<Finding> findings = Findings(loaded, plugins);
  Places places(loaded.name, loaded.text);
  Output out("");
  bool failed = false;
  for (const Finding& finding : findings) {
    failed = failed || !finding.warning || options.strict;
    out << places.At(finding.offset) << (finding.warning ? "warning: " : "error: ")
        << finding.message << "\n";
  }
  out.Commit();
  return failed ? 1 : 0;
}

int Diff(const DiffOptions& options) {
  const Plugins plugins = LoadPlugins(pluginDir);
  Loaded before = Load(options.before, options.scrambling, plugins);
  std::string().swap(before.text);
  const Package& a = before.result.package;
  const Entries aEntries = a.entries();
  Output out("");
  Differ differ(out, ShownName(a.top.name));
  // The second package's entries are compared as they are read, and dropped.
  std::size_t count = 0;
  bool comparable = false;
  const auto compare = [&](const Shape& top, Entry entry) {
    if (count == 0) comparable = differ.Shapes(a.top, top);
    if (comparable && count < aEntries.size()) {
      const Differ::Step step(differ, "[" + std::to_string(count) + "]");
      differ.EntryValues(a.top, aEntries[count], top, entry);
    }
    ++count;
  };
  const Loaded after = Load(options.after, options.scrambling, plugins, compare);
  const Package& b = after.result.package;
  if (count == 0) comparable = differ.Shapes(a.top, b.top);
  if (comparable) differ.EntryCounts(aEntries.size(), count);
  if (a.header != b.header) differ.Report("header", ValueText(a.header), ValueText(b.header));
  if (a.crlf != b.crlf) {
    differ.Report("line breaks", a.crlf ? "CRLF" : "LF", b.crlf ? "CRLF" : "LF");
  }
  out.Commit();
  return differ.different ? 1 : 0;
}

}  // namespace datapack
