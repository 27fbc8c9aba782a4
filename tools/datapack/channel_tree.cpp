#include "tools/datapack/channel_tree.h"

#include <climits>
#include <stdexcept>

#include "host/callback_channel.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"
#include "plugin/data_package.h"
#include "tools/datapack/input_error.h"
#include "tools/datapack/progress.h"

namespace datapack {
namespace {

using Link = Lum_DataPackage::Link;

ChannelHandle Owned(Vorn_Channel* channel) { return ChannelHandle(channel, ChannelDeleter{}); }

ChannelHandle Created(const ChannelLibrary& library) {
  ChannelHandle channel = library.CreateChannel();
  if (!channel) throw std::bad_alloc();
  return channel;
}

void Attach(Vorn_Channel& parent, int link, Vorn_Channel& child) {
  if (!parent.AttachChild(link, &child)) {
    throw std::logic_error("the host refused a channel on link " + std::to_string(link));
  }
}

Lum_StringChannel& AsText(Vorn_Channel& channel) {
  return static_cast<Lum_StringChannel&>(channel);
}

}  // namespace

// One DataDirectory with the channels on its links. Writing, `supply` holds the entries to hand
// out; reading, each entry read is added to `table`.
struct ChannelTree::Node {
  ChannelHandle directory;
  ChannelHandle tag;
  Lum_ValueChannel count;
  Lum_ValueChannel index;
  Lum_CallbackChannel callEachIteration;
  std::vector<Kind> kinds;
  std::vector<ChannelHandle> data;
  std::vector<std::unique_ptr<Node>> directories;
  Entries supply;
  Table* table = nullptr;
  std::function<void(Entry)> sink;  // takes each entry, which is then dropped
  Progress* progress = nullptr;     // counts the entries of the top directory
  std::uint64_t handled = 0;

  Node(const Plugins& plugins, const Shape& shape)
      : directory(Created(*plugins.directories)), tag(Created(*plugins.texts)) {
    AsText(*tag).SetString(shape.name.c_str());
    Attach(Directory(), Link::kTagLink, *tag);
    Attach(Directory(), Link::kCountLink, count);
    Attach(Directory(), Link::kCurrentIndexLink, index);
    for (const DataSlot& slot : shape.data) {
      kinds.push_back(slot.kind);
      data.push_back(NewData(plugins, slot.kind));
      data.back()->SetChannelName(slot.name.c_str());
      Attach(Directory(), Link::kDataLink, *data.back());
    }
    for (const Shape& sub : shape.directories) {
      directories.push_back(std::make_unique<Node>(plugins, sub));
      Attach(Directory(), Link::kSubDirectoriesLink, directories.back()->Directory());
    }
    Attach(Directory(), Link::kCallEachIterationLink, callEachIteration);
  }

  Lum_DataPackage& Directory() { return *static_cast<Lum_DataPackage*>(directory.get()); }

  static ChannelHandle NewData(const Plugins& plugins, Kind kind) {
    switch (kind) {
      case Kind::kText:
        return Created(*plugins.texts);
      case Kind::kValue:
        return Owned(new Lum_ValueChannel);
      case Kind::kVector:
        return Owned(new Lum_VectorChannel);
      case Kind::kMatrix:
        break;
    }
    return Owned(new Lum_MatrixChannel);
  }

  // Before the writer packs an entry: its values, and the entries of each sub-directory in it.
  void SupplyEntry() {
    if (progress) progress->Update(++handled);
    const Entry entry = supply[static_cast<std::size_t>(index.GetValue())];
    for (std::size_t i = 0; i < data.size(); ++i)
      SetValue(i, entry);
    for (std::size_t i = 0; i < directories.size(); ++i)
      directories[i]->Supply(entry.Directory(i));
  }

  void Supply(Entries entries) {
    supply = entries;
    count.SetValue(static_cast<float>(entries.size()));
    callEachIteration.SetCallback([this] { SupplyEntry(); });
  }

  // After the reader has filled an entry: its values. Each sub-directory has added its entries
  // meanwhile.
  void CollectEntry() {
    if (progress) progress->Update(++handled);
    for (std::size_t i = 0; i < data.size(); ++i)
      AddValue(i);
    table->EndEntry();
    if (sink) {
      sink(table->All()[table->size() - 1]);
      table->Clear();
    }
  }

  void Collect(Table& into) {
    table = &into;
    callEachIteration.SetCallback([this] { CollectEntry(); });
    for (std::size_t k = 0; k < directories.size(); ++k)
      directories[k]->Collect(into.Directory(k));
  }

  void SetValue(std::size_t i, const Entry& entry) {
    Vorn_Channel& channel = *data[i];
    const Value value = entry.Value(i);
    switch (kinds[i]) {
      case Kind::kText:
        AsText(channel).SetString(entry.Text(i));
        break;
      case Kind::kValue:
        static_cast<Lum_ValueChannel&>(channel).SetValue(std::get<float>(value));
        break;
      case Kind::kVector:
        static_cast<Lum_VectorChannel&>(channel).SetVector(std::get<D3DXVECTOR3>(value));
        break;
      case Kind::kMatrix:
        static_cast<Lum_MatrixChannel&>(channel).SetMatrix(*std::get<const D3DXMATRIX*>(value));
        break;
    }
  }

  void AddValue(std::size_t i) {
    Vorn_Channel& channel = *data[i];
    switch (kinds[i]) {
      case Kind::kText: {
        const char* text = AsText(channel).GetString();
        table->Add(i, std::string_view(text ? text : ""));
        return;
      }
      case Kind::kValue:
        table->Add(i, static_cast<Lum_ValueChannel&>(channel).GetValue());
        return;
      case Kind::kVector:
        table->Add(i, static_cast<Lum_VectorChannel&>(channel).GetVector());
        return;
      case Kind::kMatrix:
        break;
    }
    const D3DXMATRIX matrix = static_cast<Lum_MatrixChannel&>(channel).GetMatrix();
    table->Add(i, &matrix);
  }
};

ChannelTree::ChannelTree(const Plugins& plugins, const Shape& top)
    : plugins_(plugins), top_(std::make_unique<Node>(plugins, top)) {}

ChannelTree::~ChannelTree() = default;

std::string ChannelTree::Write(const std::string& header, Entries entries, bool crlf,
                               bool scramble) {
  Lum_DataPackage& directory = top_->Directory();
  directory.SetString(header.c_str());
  top_->Supply(entries);
  // Measuring and writing both hand out every entry.
  Progress progress("writing the package", 2 * entries.size());
  top_->progress = &progress;
  top_->handled = 0;
  const int size = plugins_.WriteToBuffer(directory, nullptr, 0, !crlf, false);
  if (size <= 0 || size == INT_MAX) {
    top_->progress = nullptr;
    throw InputError("the package is too large to be written");
  }
  std::string buffer(static_cast<std::size_t>(size), '\0');
  const bool whole =
      plugins_.WriteToBuffer(directory, buffer.data(), size, !crlf, scramble) == size;
  top_->progress = nullptr;
  if (!whole) {
    throw std::logic_error("the package changed size between measuring and writing");
  }
  buffer.pop_back();  // the NUL, scrambled or not
  return buffer;
}

void ChannelTree::Read(std::string& text, bool crlf, Table& into,
                       const std::function<void(Entry)>& sink, std::size_t expected) {
  if (text.size() >= INT_MAX) throw InputError("the package is too large to be read");
  into.Clear();
  top_->Collect(into);
  top_->sink = sink;
  Progress progress("reading the package", expected);
  top_->progress = &progress;
  top_->handled = 0;
  plugins_.ReadFromBuffer(top_->Directory(), text.data(), static_cast<int>(text.size() + 1), !crlf,
                          false);
  top_->progress = nullptr;
}

std::string WritePackage(const Plugins& plugins, const Package& package, bool scramble) {
  return ChannelTree(plugins, package.top)
      .Write(package.header, package.entries(), package.crlf, scramble);
}

}  // namespace datapack
