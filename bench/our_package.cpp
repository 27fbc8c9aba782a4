#include "bench/our_package.h"

#include <cstring>
#include <stdexcept>
#include <string>

#include "host/callback_channel.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"

namespace bench {

namespace {

using Link = Lum_DataPackage::Link;

std::shared_ptr<ChannelLibrary> Load(const GUID& type) {
  std::string error;
  auto library = ChannelLibrary::Open(ExecutableFolder(), type, error);
  if (!library) throw std::runtime_error(error);
  return library;
}

}  // namespace

// One directory per level, each inside an entry of the one above, with its Tag, Count,
// "currrent index", a data channel per field and its "Call each iteration" channel.
struct OurPackage::Tree {
  struct Directory {
    Lum_DataPackage* directory;
    Lum_ValueChannel* index;
    std::vector<Vorn_Channel*> data;
  };

  Tree(const Workload& workload, const ChannelLibrary& directories, const ChannelLibrary& texts)
      : workload(workload) {
    for (const Level& level : workload.levels) {
      Directory& made = levels.emplace_back();
      made.directory = static_cast<Lum_DataPackage*>(Own(directories.CreateChannel()));
      Attach(made.directory, Link::kTagLink, Own(texts.CreateChannel()));
      static_cast<Lum_StringChannel*>(made.directory->GetChild(Link::kTagLink))
          ->SetString(level.tag);
      Attach(made.directory, Link::kCountLink,
             Own(new Lum_ValueChannel(static_cast<float>(level.fanOut))));
      made.index = new Lum_ValueChannel();
      Attach(made.directory, Link::kCurrentIndexLink, Own(made.index));
      for (const Field& field : level.fields) {
        Vorn_Channel* channel = field.kind == Kind::kText     ? Own(texts.CreateChannel())
                                : field.kind == Kind::kValue  ? Own(new Lum_ValueChannel())
                                : field.kind == Kind::kVector ? Own(new Lum_VectorChannel())
                                                              : Own(new Lum_MatrixChannel());
        channel->SetChannelName(field.name);
        Attach(made.directory, Link::kDataLink, channel);
        made.data.push_back(channel);
      }
      if (levels.size() > 1) {
        Attach(levels[levels.size() - 2].directory, Link::kSubDirectoriesLink, made.directory);
      }
    }
  }

  Vorn_Channel* Own(ChannelHandle channel) {
    if (!channel) throw std::runtime_error("a channel library could not make a channel");
    owned.push_back(std::move(channel));
    return owned.back().get();
  }
  Vorn_Channel* Own(Vorn_Channel* channel) { return Own(ChannelHandle(channel, ChannelDeleter{})); }

  static void Attach(Vorn_Channel* parent, int link, Vorn_Channel* child) {
    if (!parent->AttachChild(link, child)) throw std::runtime_error("a link refused a child");
  }

  // Calls `call(level, entry)` once per entry of each level, as "Call each iteration" does.
  template <typename Call>
  void OnEachEntry(Call call) {
    for (int l = 0; l < static_cast<int>(levels.size()); ++l) {
      auto* channel = new Lum_CallbackChannel([this, l, call] { call(l, Entry(l)); });
      Attach(levels[static_cast<std::size_t>(l)].directory, Link::kCallEachIterationLink,
             Own(channel));
    }
  }

  // The entry being handled at `level`, from the "currrent index" of each directory on its path.
  std::size_t Entry(int level) const {
    std::size_t entry = 0;
    for (int l = 0; l <= level; ++l) {
      const Level& shape = workload.levels[static_cast<std::size_t>(l)];
      entry = ChildEntry(shape, entry,
                         static_cast<int>(levels[static_cast<std::size_t>(l)].index->GetValue()));
    }
    return entry;
  }

  const Workload& workload;
  std::vector<ChannelHandle> owned;
  std::vector<Directory> levels;
};

OurPackage::OurPackage(const Workload& workload, Values& output) {
  const auto directories = Load(kDataDirectoryGuid);
  const auto texts = Load(kStringChannelGuid);
  writer_ = std::make_unique<Tree>(workload, *directories, *texts);
  reader_ = std::make_unique<Tree>(workload, *directories, *texts);

  Tree& writer = *writer_;
  writer.OnEachEntry([&writer, &workload](int level, std::size_t entry) {
    const Level& shape = workload.levels[static_cast<std::size_t>(level)];
    const float* floats = workload.source.Floats(level, entry);
    int texts = 0;
    for (std::size_t f = 0; f < shape.fields.size(); ++f) {
      Vorn_Channel* channel = writer.levels[static_cast<std::size_t>(level)].data[f];
      switch (shape.fields[f].kind) {
        case Kind::kText:
          static_cast<Lum_StringChannel*>(channel)->SetString(
              workload.source.Text(level, entry, texts++).data());
          break;
        case Kind::kValue:
          static_cast<Lum_ValueChannel*>(channel)->SetValue(floats[0]);
          break;
        case Kind::kVector:
          static_cast<Lum_VectorChannel*>(channel)->SetVector({floats[0], floats[1], floats[2]});
          break;
        case Kind::kMatrix: {
          D3DXMATRIX matrix;
          std::memcpy(&matrix, floats, sizeof(matrix));
          static_cast<Lum_MatrixChannel*>(channel)->SetMatrix(matrix);
          break;
        }
      }
      floats += FloatCount(shape.fields[f].kind);
    }
  });

  Tree& reader = *reader_;
  reader.OnEachEntry([&reader, &workload, &output](int level, std::size_t entry) {
    const Level& shape = workload.levels[static_cast<std::size_t>(level)];
    if (entry >= shape.entries) return;  // more entries than written: the checksum tells
    float* floats = output.Floats(level, entry);
    int texts = 0;
    for (std::size_t f = 0; f < shape.fields.size(); ++f) {
      Vorn_Channel* channel = reader.levels[static_cast<std::size_t>(level)].data[f];
      switch (shape.fields[f].kind) {
        case Kind::kText:
          output.SetText(level, entry, texts++,
                         static_cast<Lum_StringChannel*>(channel)->GetString());
          break;
        case Kind::kValue:
          floats[0] = static_cast<Lum_ValueChannel*>(channel)->GetValue();
          break;
        case Kind::kVector: {
          const D3DXVECTOR3 vector = static_cast<Lum_VectorChannel*>(channel)->GetVector();
          floats[0] = vector.x;
          floats[1] = vector.y;
          floats[2] = vector.z;
          break;
        }
        case Kind::kMatrix: {
          const D3DXMATRIX matrix = static_cast<Lum_MatrixChannel*>(channel)->GetMatrix();
          std::memcpy(floats, &matrix, sizeof(matrix));
          break;
        }
      }
      floats += FloatCount(shape.fields[f].kind);
    }
  });
}

OurPackage::~OurPackage() = default;

int OurPackage::Measure() {
  return writer_->levels[0].directory->WriteToBuffer(nullptr, 0, true, false);
}

int OurPackage::Write(char* buffer, int size) {
  return writer_->levels[0].directory->WriteToBuffer(buffer, size, true, false);
}

int OurPackage::Read(char* text, int size) {
  return reader_->levels[0].directory->ReadFromBuffer(text, size, true, false);
}

}  // namespace bench
