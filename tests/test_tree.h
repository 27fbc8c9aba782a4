// Channel trees for codec tests, built the way the engine builds them, and the package operations
// run on them the way callers run them.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "host/callback_channel.h"
#include "host/channel_library.h"
#include "host/matrix_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"
#include "plugin/data_package.h"

// Owns every channel it creates; children are attached as the engine attaches them.
class TestTree {
 public:
  using Link = Lum_DataPackage::Link;

  // A DataDirectory from the plug-in library; with a tag, a Tag child holding it.
  Lum_DataPackage* Directory(const char* tag = nullptr);
  Lum_DataPackage* SubDirectory(Lum_DataPackage* parent, const char* tag);
  Lum_ValueChannel* Count(Lum_DataPackage* directory, float count);
  Lum_ValueChannel* CurrentIndex(Lum_DataPackage* directory);
  Lum_CallbackChannel* CallEachIteration(Lum_DataPackage* directory, std::function<void()> call);

  Lum_StringChannel* Text(Lum_DataPackage* directory, const char* name, const char* text = "");
  Lum_ValueChannel* Value(Lum_DataPackage* directory, const char* name, float value = 0.0f);
  Lum_VectorChannel* Vector(Lum_DataPackage* directory, const char* name, D3DXVECTOR3 vector = {});
  Lum_MatrixChannel* Matrix(Lum_DataPackage* directory, const char* name, D3DXMATRIX matrix = {});

  // Any channel, owned by the tree, attached nowhere yet.
  template <typename Channel, typename... Arguments>
  Channel* Make(Arguments&&... arguments) {
    auto* channel = new Channel(std::forward<Arguments>(arguments)...);
    owned_.push_back(ChannelHandle(channel, ChannelDeleter{}));
    return channel;
  }
  // Attaches or fails the test.
  template <typename Channel>
  Channel* Attach(Vorn_Channel* parent, int link, Channel* child) {
    if (!parent->AttachChild(link, child)) ReportRefusal(link);
    return child;
  }

 private:
  static void ReportRefusal(int link);

  std::vector<ChannelHandle> owned_;
};

// Writes the package twice, measuring first, into a buffer of exactly the measured size; returns
// the text without its NUL.
std::string WritePackage(Lum_DataPackage& directory, bool lineFeeds = true, bool scramble = false);

// Reads `package` from a buffer of exactly its bytes, with no NUL and no readable byte after
// them; returns the result.
int ReadPackage(Lum_DataPackage& directory, const std::string& package, bool unscramble = false);

D3DXMATRIX MatrixOf(float first, float step);
bool operator==(const D3DXVECTOR3& a, const D3DXVECTOR3& b);
bool operator==(const D3DXMATRIX& a, const D3DXMATRIX& b);
