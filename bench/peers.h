// The general XML libraries on the same workloads, used as their users use them: pugixml builds
// the document and saves it to memory, tinyxml2 streams it through its printer; each parses its
// own text and extracts every value into the same output array, numbers through the C library
// (snprintf "%g", strtof). Their documents have the package's elements, attributes, indentation
// and contents, so that their texts come within a few bytes of ours.
#pragma once

#include <tinyxml2.h>
#include <pugixml.hpp>
#include <string>

#include "bench/workload.h"

namespace bench {

void PugixmlWrite(const Workload& workload, std::string& text);
// False when the text has more entries than the workload.
bool PugixmlRead(const Workload& workload, const std::string& text, Values& output);

// Indents with tabs, as the package does.
class TabPrinter : public tinyxml2::XMLPrinter {
 protected:
  void PrintSpace(int depth) override;
};

void Tinyxml2Write(const Workload& workload, TabPrinter& printer);
bool Tinyxml2Read(const Workload& workload, const std::string& text, Values& output);

}  // namespace bench
