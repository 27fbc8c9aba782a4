// Bytes decide a tree and its values; the tree is written (measured first, then into a buffer of
// exactly the measured size) and read into a twin. Every value the format carries must come back:
// floats as their six significant digits give them, counts as written, texts byte for byte.
#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "codec/number_format.h"
#include "codec/number_scan.h"
#include "fuzz/fuzz_input.h"
#include "fuzz/fuzz_tree.h"

namespace {

using Link = Lum_DataPackage::Link;

constexpr std::string_view kNameLetters =
    "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_.-";
enum Kind { kText, kValue, kVector, kMatrix, kOther, kEmptyPosition, kKinds };

struct DataShape {
  Kind kind;
  std::string name;
};

struct DirectoryShape {
  std::string name;  // empty: no Tag child
  std::vector<DataShape> data;
  std::vector<int> subs;  // indices into the list of directories; -1 for an empty position

  bool HoldsNothing() const {
    for (const DataShape& data : data) {
      if (data.kind < kOther) return false;
    }
    for (int sub : subs) {
      if (sub >= 0) return false;
    }
    return true;
  }
};

// Names are unique and none begins with another: the format cannot tell such directories apart.
int Describe(FuzzInput& input, std::vector<DirectoryShape>& shapes, int depth) {
  const int index = static_cast<int>(shapes.size());
  shapes.push_back({"D" + std::to_string(index) + "_" + input.Text(6, kNameLetters), {}, {}});
  const int data = input.Below(4);
  for (int i = 0; i < data; ++i) {
    const auto kind = static_cast<Kind>(input.Below(kKinds - 1));
    shapes[index].data.push_back({kind, "v" + std::to_string(index) + "_" + std::to_string(i) +
                                            input.Text(4, kNameLetters)});
  }
  const int subs = depth < 3 ? input.Below(2) : 0;
  for (int i = 0; i < subs; ++i) {
    const int sub = input.Below(5) == 0 ? -1 : Describe(input, shapes, depth + 1);
    shapes[index].subs.push_back(sub);
  }
  return index;
}

// What the package carries of a float.
float Carried(float value) {
  char text[numbers::kMaxFloatText];
  const std::size_t length = numbers::FormatFloat(value, text);
  float read = 0;
  numbers::ScanFloat(text, text + length, read);
  return read;
}

void AppendFloats(std::string& record, const float* values, int count, bool carried) {
  for (int i = 0; i < count; ++i) {
    const float value = carried ? Carried(values[i]) : values[i];
    record.append(reinterpret_cast<const char*>(&value), sizeof(value));
  }
}

// A text the format carries: no NUL, no "</", no whitespace at either end.
std::string CarriedText(FuzzInput& input) {
  std::string text;
  const int length = input.Below(24);
  for (int i = 0; i < length; ++i) {
    char c = static_cast<char>(input.Byte());
    if (c == '\0' || (c == '/' && !text.empty() && text.back() == '<')) c = '|';
    text += c;
  }
  const auto white = [](char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; };
  if (!text.empty() && white(text.front())) text.front() = 'w';
  if (!text.empty() && white(text.back())) text.back() = 'w';
  return text;
}

// One tree of the description: its channels, and per directory the entries it wrote or read.
class Twin {
 public:
  explicit Twin(const std::vector<DirectoryShape>& shapes)
      : shapes_(shapes), nodes_(shapes.size()) {
    for (std::size_t i = 0; i < shapes.size(); ++i)
      Build(static_cast<int>(i));
    AttachSubDirectories();
  }

  Lum_DataPackage& Top() { return *nodes_[0].directory; }
  Lum_ValueChannel& TopCount() { return *nodes_[0].count; }
  std::vector<std::string>& Entries(int directory) { return nodes_[directory].entries; }

  // Writing: each directory takes its entries' values and its sub-directories' counts from
  // `values`, which restarts for every pass so that both passes write the same package.
  void Supply(FuzzInput& values) {
    for (std::size_t i = 0; i < nodes_.size(); ++i) {
      nodes_[i].callEachIteration->SetCallback([this, i, &values] { SupplyEntry(i, values); });
    }
  }

  void Collect() {
    for (std::size_t i = 0; i < nodes_.size(); ++i) {
      nodes_[i].callEachIteration->SetCallback(
          [this, i] { nodes_[i].entries.push_back(Record(i, false)); });
    }
  }

  void ForgetEntries() {
    for (Node& node : nodes_)
      node.entries.clear();
  }

 private:
  struct Node {
    Lum_DataPackage* directory = nullptr;
    Lum_ValueChannel* count = nullptr;
    Lum_CallbackChannel* callEachIteration = nullptr;
    std::vector<Vorn_Channel*> data;
    std::vector<std::string> entries;
  };

  void Build(int index) {
    const DirectoryShape& shape = shapes_[index];
    Node& node = nodes_[index];
    node.directory = tree_.Directory(shape.name.c_str());
    node.count = tree_.Attach(node.directory, Link::kCountLink, tree_.Make<Lum_ValueChannel>());
    node.callEachIteration = tree_.Attach(node.directory, Link::kCallEachIterationLink,
                                          tree_.Make<Lum_CallbackChannel>());
    for (const DataShape& data : shape.data) {
      Vorn_Channel* channel = nullptr;
      switch (data.kind) {
        case kText:
          channel = tree_.Text(data.name);
          break;
        case kValue:
          channel = tree_.Make<Lum_ValueChannel>();
          break;
        case kVector:
          channel = tree_.Make<Lum_VectorChannel>();
          break;
        case kMatrix:
          channel = tree_.Make<Lum_MatrixChannel>();
          break;
        case kOther:
          channel = tree_.Make<Lum_CallbackChannel>();
          break;
        default:
          break;
      }
      const int position = node.directory->GetChildLinkPositionCount(Link::kDataLink);
      if (channel) channel->SetChannelName(data.name.c_str());
      if (!node.directory->SetChildAtLinkPosition(Link::kDataLink, position, channel)) {
        Fail("a data position refused a child");
      }
      node.data.push_back(channel);
    }
  }

  // Once every directory exists: sub-directories, with their empty positions.
  void AttachSubDirectories() {
    for (std::size_t i = 0; i < shapes_.size(); ++i) {
      for (std::size_t j = 0; j < shapes_[i].subs.size(); ++j) {
        const int sub = shapes_[i].subs[j];
        if (!nodes_[i].directory->SetChildAtLinkPosition(
                Link::kSubDirectoriesLink, static_cast<int>(j),
                sub >= 0 ? nodes_[static_cast<std::size_t>(sub)].directory : nullptr)) {
          Fail("a sub-directory position refused a directory");
        }
      }
    }
  }

  void SupplyEntry(std::size_t index, FuzzInput& values) {
    const DirectoryShape& shape = shapes_[index];
    Node& node = nodes_[index];
    for (std::size_t j = 0; j < shape.data.size(); ++j) {
      Vorn_Channel* channel = node.data[j];
      switch (shape.data[j].kind) {
        case kText:
          static_cast<Lum_StringChannel*>(channel)->SetString(CarriedText(values).c_str());
          break;
        case kValue:
          static_cast<Lum_ValueChannel*>(channel)->SetValue(values.Float());
          break;
        case kVector:
          static_cast<Lum_VectorChannel*>(channel)->SetVector(
              {values.Float(), values.Float(), values.Float()});
          break;
        case kMatrix: {
          D3DXMATRIX matrix;
          for (auto& row : matrix.m) {
            for (float& value : row)
              value = values.Float();
          }
          static_cast<Lum_MatrixChannel*>(channel)->SetMatrix(matrix);
          break;
        }
        default:
          break;
      }
    }
    for (int sub : shape.subs) {
      if (sub >= 0) nodes_[sub].count->SetValue(static_cast<float>(values.Below(3)));
    }
    // An entry that holds nothing is written like an empty directory, and read as one.
    if (!(shape.HoldsNothing() && node.count->GetValue() == 1.0f)) {
      node.entries.push_back(Record(index, true));
    }
  }

  std::string Record(std::size_t index, bool carried) {
    const DirectoryShape& shape = shapes_[index];
    std::string record;
    for (std::size_t j = 0; j < shape.data.size(); ++j) {
      Vorn_Channel* channel = nodes_[index].data[j];
      switch (shape.data[j].kind) {
        case kText: {
          const char* text = static_cast<Lum_StringChannel*>(channel)->GetString();
          record += std::string(text) + '\0';
          break;
        }
        case kValue: {
          const float value = static_cast<Lum_ValueChannel*>(channel)->GetValue();
          AppendFloats(record, &value, 1, carried);
          break;
        }
        case kVector: {
          const D3DXVECTOR3 vector = static_cast<Lum_VectorChannel*>(channel)->GetVector();
          const float values[] = {vector.x, vector.y, vector.z};
          AppendFloats(record, values, 3, carried);
          break;
        }
        case kMatrix: {
          const D3DXMATRIX matrix = static_cast<Lum_MatrixChannel*>(channel)->GetMatrix();
          float values[16];
          std::memcpy(values, &matrix, sizeof(values));
          AppendFloats(record, values, 16, carried);
          break;
        }
        default:
          break;
      }
    }
    return record;
  }

  const std::vector<DirectoryShape>& shapes_;
  FuzzTree tree_;
  std::vector<Node> nodes_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  FuzzInput input(data, size);
  std::vector<DirectoryShape> shapes;
  Describe(input, shapes, 0);
  if (input.Flag()) shapes[0].name.clear();  // the top may go without a Tag: "Noname"
  const bool lineFeeds = input.Flag();
  const bool scramble = input.Flag();
  const int topCount = input.Below(3);
  std::string header = input.Text(12, "abc <>&;\"=/\t\n");
  for (char& c : header)
    c = c == '<' ? '(' : c;
  const std::string_view values = input.Rest();

  Twin writer(shapes);
  Lum_DataPackage& top = writer.Top();
  top.SetString(header.c_str());
  writer.TopCount().SetValue(static_cast<float>(topCount));
  const auto* valueBytes = reinterpret_cast<const std::uint8_t*>(values.data());
  FuzzInput measuring(valueBytes, values.size());
  writer.Supply(measuring);
  const int required = top.WriteToBuffer(nullptr, 0, lineFeeds, scramble);
  Check(required > 0, "no size measured");

  writer.ForgetEntries();
  FuzzInput writing(valueBytes, values.size());
  writer.Supply(writing);
  const auto buffer = std::make_unique<char[]>(static_cast<std::size_t>(required));
  Check(top.WriteToBuffer(buffer.get(), required, lineFeeds, scramble) == required,
        "the second pass needs another size");

  Twin reader(shapes);
  reader.Collect();
  reader.Top().ReadFromBuffer(buffer.get(), required, !lineFeeds, scramble);
  for (std::size_t i = 0; i < shapes.size(); ++i) {
    Check(reader.Entries(static_cast<int>(i)) == writer.Entries(static_cast<int>(i)),
          "entries read differ from entries written");
  }
  Check(reader.TopCount().GetValue() == static_cast<float>(writer.Entries(0).size()),
        "Count differs from the entries written");
  return 0;
}
