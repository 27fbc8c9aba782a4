// Any bytes, read into a tree that holds every kind of channel: reading must end, stay inside the
// buffer, and leave counts that make sense.
#include <cstdint>
#include <cstring>
#include <memory>

#include "fuzz/fuzz_tree.h"

namespace {

using Link = Lum_DataPackage::Link;

struct ReadTree {
  FuzzTree tree;
  Lum_DataPackage* top = tree.Directory("Items");
  Lum_ValueChannel* count = tree.Attach(top, Link::kCountLink, tree.Make<Lum_ValueChannel>());
  Lum_ValueChannel* index =
      tree.Attach(top, Link::kCurrentIndexLink, tree.Make<Lum_ValueChannel>());
  std::vector<Lum_ValueChannel*> counts{count};
  int calls = 0;

  ReadTree() {
    tree.Attach(top, Link::kDataLink, tree.Text("Name"));
    tree.Attach(top, Link::kDataLink, tree.Make<Lum_ValueChannel>())->SetChannelName("Score");
    tree.Attach(top, Link::kDataLink, tree.Make<Lum_VectorChannel>())->SetChannelName("Pos");
    tree.Attach(top, Link::kDataLink, tree.Make<Lum_MatrixChannel>())->SetChannelName("M");
    tree.Attach(top, Link::kDataLink, tree.Make<Lum_CallbackChannel>())->SetChannelName("Other");
    tree.Attach(top, Link::kCallEachIterationLink, tree.Make<Lum_CallbackChannel>())
        ->SetCallback([this] { ++calls; });
    // Sub-directories with equal and with different names, nested.
    Lum_DataPackage* items = SubDirectory(top, "Items");
    Lum_DataPackage* tags = SubDirectory(top, "Tags");
    SubDirectory(tags, "Tags");
    SubDirectory(items, "Deep");
    tree.Attach(tags, Link::kDataLink, tree.Text("Tag"));
  }

  Lum_DataPackage* SubDirectory(Lum_DataPackage* parent, const char* name) {
    Lum_DataPackage* sub = tree.Attach(parent, Link::kSubDirectoriesLink, tree.Directory(name));
    counts.push_back(tree.Attach(sub, Link::kCountLink, tree.Make<Lum_ValueChannel>()));
    tree.Attach(sub, Link::kDataLink, tree.Make<Lum_ValueChannel>())->SetChannelName("V");
    return sub;
  }
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static ReadTree tree;
  for (int choice = 0; choice < 4; ++choice) {
    // Exactly the input's bytes: a read past them is caught.
    const auto buffer = std::make_unique<char[]>(size);
    if (size > 0) std::memcpy(buffer.get(), data, size);
    tree.calls = 0;
    const int advanced = tree.top->ReadFromBuffer(buffer.get(), static_cast<int>(size),
                                                  (choice & 1) != 0, (choice & 2) != 0);
    Check(advanced >= 0 && static_cast<std::size_t>(advanced) <= size, "read past its text");
    Check(tree.count->GetValue() == static_cast<float>(tree.calls),
          "Count is not the entries read");
    for (Lum_ValueChannel* count : tree.counts) {
      const float entries = count->GetValue();
      Check(entries >= 0 && entries <= 9999 &&
                entries == static_cast<float>(static_cast<int>(entries)),
            "a Count that no read can give");
    }
  }
  return 0;
}
