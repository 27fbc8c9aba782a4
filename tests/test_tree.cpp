#include "tests/test_tree.h"

#include <gtest/gtest.h>

#include "tests/guarded_buffer.h"
#include "tests/plugins.h"

void TestTree::ReportRefusal(int link) { ADD_FAILURE() << "attaching to link " << link; }

Lum_DataPackage* TestTree::Directory(const char* tag) {
  owned_.push_back(plugins::DataDirectoryLibrary()->CreateChannel());
  auto* directory = static_cast<Lum_DataPackage*>(owned_.back().get());
  if (tag) Attach(directory, Link::kTagLink, Make<Lum_StringChannel>())->SetString(tag);
  return directory;
}

Lum_DataPackage* TestTree::SubDirectory(Lum_DataPackage* parent, const char* tag) {
  return Attach(parent, Link::kSubDirectoriesLink, Directory(tag));
}

Lum_ValueChannel* TestTree::Count(Lum_DataPackage* directory, float count) {
  return Attach(directory, Link::kCountLink, Make<Lum_ValueChannel>(count));
}

Lum_ValueChannel* TestTree::CurrentIndex(Lum_DataPackage* directory) {
  return Attach(directory, Link::kCurrentIndexLink, Make<Lum_ValueChannel>(-1.0f));
}

Lum_CallbackChannel* TestTree::CallEachIteration(Lum_DataPackage* directory,
                                                 std::function<void()> call) {
  return Attach(directory, Link::kCallEachIterationLink,
                Make<Lum_CallbackChannel>(std::move(call)));
}

template <typename Channel, typename Value>
Channel* NamedData(TestTree& tree, Lum_DataPackage* directory, const char* name, Value value) {
  auto* channel = tree.Make<Channel>(value);
  channel->SetChannelName(name);
  return tree.Attach(directory, TestTree::Link::kDataLink, channel);
}

Lum_StringChannel* TestTree::Text(Lum_DataPackage* directory, const char* name, const char* text) {
  auto* channel = Make<Lum_StringChannel>();
  channel->SetChannelName(name);
  channel->SetString(text);
  return Attach(directory, Link::kDataLink, channel);
}

Lum_ValueChannel* TestTree::Value(Lum_DataPackage* directory, const char* name, float value) {
  return NamedData<Lum_ValueChannel>(*this, directory, name, value);
}

Lum_VectorChannel* TestTree::Vector(Lum_DataPackage* directory, const char* name,
                                    D3DXVECTOR3 vector) {
  return NamedData<Lum_VectorChannel>(*this, directory, name, vector);
}

Lum_MatrixChannel* TestTree::Matrix(Lum_DataPackage* directory, const char* name,
                                    D3DXMATRIX matrix) {
  return NamedData<Lum_MatrixChannel>(*this, directory, name, matrix);
}

std::string WritePackage(Lum_DataPackage& directory, bool lineFeeds, bool scramble) {
  const int size = directory.WriteToBuffer(nullptr, 0, lineFeeds, false);
  std::string buffer(static_cast<std::size_t>(size), '?');
  EXPECT_EQ(directory.WriteToBuffer(buffer.data(), size, lineFeeds, scramble), size);
  buffer.pop_back();  // the NUL, scrambled or not
  return buffer;
}

int ReadPackage(Lum_DataPackage& directory, const std::string& package, bool unscramble) {
  const GuardedBuffer buffer(package);
  return directory.ReadFromBuffer(buffer.data(), buffer.size(), true, unscramble);
}

D3DXMATRIX MatrixOf(float first, float step) {
  D3DXMATRIX matrix;
  for (int i = 0; i < 16; ++i)
    matrix.m[i / 4][i % 4] = first + step * static_cast<float>(i);
  return matrix;
}

bool operator==(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return a.x == b.x && a.y == b.y && a.z == b.z;
}

bool operator==(const D3DXMATRIX& a, const D3DXMATRIX& b) {
  for (int i = 0; i < 16; ++i) {
    if (a.m[i / 4][i % 4] != b.m[i / 4][i % 4]) return false;
  }
  return true;
}
