#include "tools/datapack/demo.h"

#include <cstdio>
#include <string>
#include <vector>

#include "host/callback_channel.h"
#include "host/channel_library.h"
#include "host/value_channel.h"
#include "plugin/data_package.h"

namespace datapack {
namespace {

using Link = Lum_DataPackage::Link;

struct PlayerEntry {
  std::string name;
  float score;
};

// The engine side of one Players directory: the channels on its links, owned here.
class PlayersTree {
 public:
  PlayersTree(const ChannelLibrary& directories, const ChannelLibrary& texts)
      : directory_(directories.CreateChannel()),
        tag_(texts.CreateChannel()),
        name_(texts.CreateChannel()) {
    tag().SetString("Players");
    name_->SetChannelName("Name");
    score_.SetChannelName("Score");
    Directory().AttachChild(Link::kTagLink, tag_.get());
    Directory().AttachChild(Link::kCountLink, &count_);
    Directory().AttachChild(Link::kCurrentIndexLink, &index_);
    Directory().AttachChild(Link::kDataLink, name_.get());
    Directory().AttachChild(Link::kDataLink, &score_);
    Directory().AttachChild(Link::kCallEachIterationLink, &callEachIteration_);
  }

  Lum_DataPackage& Directory() { return *static_cast<Lum_DataPackage*>(directory_.get()); }

  // Writing: the channel fills entry i from "currrent index" before it is packed.
  void Supply(const std::vector<PlayerEntry>& entries) {
    count_.SetValue(static_cast<float>(entries.size()));
    callEachIteration_.SetCallback([this, &entries] {
      const PlayerEntry& entry = entries[static_cast<std::size_t>(index_.GetValue())];
      text(*name_).SetString(entry.name.c_str());
      score_.SetValue(entry.score);
    });
  }

  // Reading: the channel takes each entry once it has been read.
  void Collect(std::vector<PlayerEntry>& entries) {
    callEachIteration_.SetCallback([this, &entries] {
      entries.push_back({text(*name_).GetString(), score_.GetValue()});
    });
  }

  float Count() { return count_.GetValue(); }

 private:
  static Lum_StringChannel& text(Vorn_Channel& channel) {
    return static_cast<Lum_StringChannel&>(channel);
  }
  Lum_StringChannel& tag() { return text(*tag_); }

  ChannelHandle directory_;
  ChannelHandle tag_;
  ChannelHandle name_;
  Lum_ValueChannel count_;
  Lum_ValueChannel index_;
  Lum_ValueChannel score_;
  Lum_CallbackChannel callEachIteration_;
};

void PrintText(const std::string& text) {
  std::size_t start = 0;
  for (;;) {
    const std::size_t end = text.find('\n', start);
    std::printf("  | %s\n", text.substr(start, end - start).c_str());
    if (end == std::string::npos) break;
    start = end + 1;
  }
}

void PrintBytes(const std::vector<char>& bytes, std::size_t count) {
  std::printf("  |");
  for (std::size_t i = 0; i < count && i < bytes.size(); ++i) {
    std::printf(" %02x", static_cast<unsigned char>(bytes[i]));
  }
  std::printf(" ...\n");
}

}  // namespace

std::string RunDemo(const Plugins& plugins) {
  const ChannelLibrary& directories = *plugins.directories;
  const ChannelLibrary& texts = *plugins.texts;
  const ChannelType& type = directories.Type();
  std::printf("Plug-in     %s\n", directories.Path().c_str());
  std::printf("Type        %s, %s, code %d\n\n", type.typeName, GuidToString(type.typeGuid).c_str(),
              static_cast<int>(type.typeCode));

  const std::vector<PlayerEntry> players = {{"Ann", 12.5f}, {"Bob", 7.0f}};
  PlayersTree writer(directories, texts);
  writer.Supply(players);
  const int size = plugins.WriteToBuffer(writer.Directory(), nullptr, 0, true, false);
  std::vector<char> package(static_cast<std::size_t>(size));
  plugins.WriteToBuffer(writer.Directory(), package.data(), size, true, false);
  std::printf("Package     %d bytes with its NUL, LF line breaks, empty header:\n", size);
  PrintText(package.data());
  std::string plain(package.data());

  plugins.WriteToBuffer(writer.Directory(), package.data(), size, true, true);
  std::printf("\nScrambled   the same %d bytes, the first 24:\n", size);
  PrintBytes(package, 24);

  std::vector<PlayerEntry> received;
  PlayersTree reader(directories, texts);
  reader.Collect(received);
  const int advanced = plugins.ReadFromBuffer(reader.Directory(), package.data(), size, true, true);
  std::printf("\nRead back   %d bytes unscrambled and read, Count now %g\n", advanced,
              static_cast<double>(reader.Count()));
  std::printf("  %-6s %-8s %s\n", "entry", "Name", "Score");
  for (std::size_t i = 0; i < received.size(); ++i) {
    std::printf("  %-6zu %-8s %g\n", i, received[i].name.c_str(),
                static_cast<double>(received[i].score));
  }
  return plain;
}

}  // namespace datapack
