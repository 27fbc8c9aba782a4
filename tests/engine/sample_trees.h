// Sample channel trees whose packages are kept as files: each build writes them and must give the
// same bytes, then reads them back into fresh trees that must receive the same values. Built only
// from what the engine offers: the two plug-ins' factories and the engine's typed channels.
#pragma once

#include <cstddef>
#include <vector>

#include "host/d3dx_types.h"
#include "host/vorn_channel.h"

namespace samples {

// How the engine creates channels of the two plug-ins.
struct Factories {
  Vorn_Channel* (*newDirectory)();
  Vorn_Channel* (*newText)();
};

// One entry as "Call each iteration" supplies or receives it.
struct Entry {
  const char* text;
  float value;
  D3DXVECTOR3 vector;
  D3DXMATRIX matrix;
};

struct Sample {
  const char* name;  // the file tests/engine/packages/<name>.pkg
  bool lineFeeds;    // the newline choice: "\n", or "\r\n"
  bool scramble;
};
extern const Sample kSamples[];
extern const std::size_t kSampleCount;

// A sample's tree, owning its channels. Writing, each directory's "Call each iteration" channel
// supplies entry k of its sequence at its k-th call; reading, it records what it received.
class Tree {
 public:
  Tree(const Sample& sample, const Factories& factories);
  ~Tree();
  Tree(const Tree&) = delete;
  Tree& operator=(const Tree&) = delete;

  // The top directory, as a channel: callers reach its members through the plug-in's class.
  Vorn_Channel* Top() const { return top_; }
  // From now on the "Call each iteration" channels supply entries from the first on again.
  void Supply();
  // From now on they record what they receive.
  void Collect();
  // Whether each directory received, in order, the entries that `writer`'s directory supplied,
  // and nothing else; `problem` names the first directory that did not.
  bool Received(const Tree& writer, const char*& problem) const;

  // Set by the tree's "Call each iteration" channels; a test uses them to throw from the walk.
  static void (*onCall)();

  struct Shape;  // what each directory holds

 private:
  class Iteration;
  Vorn_Channel* Directory(Vorn_Channel* parent, const Shape& shape);
  Vorn_Channel* Keep(Vorn_Channel* channel);

  const Factories& factories_;
  Vorn_Channel* top_ = nullptr;
  std::vector<Vorn_Channel*> owned_;
  std::vector<Iteration*> iterations_;
};

}  // namespace samples
