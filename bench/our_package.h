// Our package on a workload, used as the engine uses it: a writer tree whose "Call each
// iteration" channels supply each entry's source values from "currrent index", and a reader tree
// whose "Call each iteration" channels store each entry's values into an output array.
#pragma once

#include <memory>
#include <vector>

#include "bench/workload.h"
#include "host/channel_library.h"
#include "plugin/data_package.h"

namespace bench {

class OurPackage {
 public:
  OurPackage(const Workload& workload, Values& output);
  ~OurPackage();
  OurPackage(const OurPackage&) = delete;
  OurPackage& operator=(const OurPackage&) = delete;

  int Measure();  // the buffer size the package needs, NUL included
  int Write(char* buffer, int size);
  int Read(char* text, int size);

 private:
  struct Tree;

  std::unique_ptr<Tree> writer_;
  std::unique_ptr<Tree> reader_;
};

}  // namespace bench
