// The public package operations. Each sets up the shared state, runs the walk on this directory
// and leaves the state to the next operation.
#include <algorithm>
#include <cstring>

#include "codec/cleanup.h"
#include "plugin/data_package.h"

namespace {

// A missing buffer or a negative size holds nothing.
unsigned int UsableSize(const char* buffer, int size) {
  return buffer && size > 0 ? static_cast<unsigned int>(size) : 0u;
}

}  // namespace

int Lum_DataPackage::WriteToBuffer(char* buffer, int size, bool newlineChoice, bool scramble) {
  // The state is shared: an operation started from inside another would wreck it.
  if (busy) return 0;
  busy = true;
  const unsigned int usable = UsableSize(buffer, size);
  RunThenCleanUp(
      [&] {
        SetBuffer(buffer, usable);
        write = true;
        fileNoTxtChan = newlineChoice;
        treeDepth = 0;
        requiredSize = 1;
        WriteHeader();
        ReadWriteDirectory(false);
        if (scramble) Encrypt(buffer, std::min(requiredSize, static_cast<int>(usable)));
      },
      [] { busy = false; });
  return requiredSize;
}

int Lum_DataPackage::ReadFromBuffer(char* buffer, int size, bool newlineChoice, bool unscramble) {
  if (busy) return 0;
  busy = true;
  const unsigned int usable = UsableSize(buffer, size);
  RunThenCleanUp(
      [&] {
        SetBuffer(buffer, usable);
        write = false;
        fileNoTxtChan = newlineChoice;
        treeDepth = 0;
        if (unscramble) Decrypt(buffer, static_cast<int>(usable));
        EndTextAtNul();
        ReadWriteDirectory(false);
      },
      [] { busy = false; });
  return bufferCursor;
}

// The directory's own string, verbatim, unless it is too long for the scratch text.
void Lum_DataPackage::WriteHeader() {
  const char* header = GetString();
  if (!header) header = "";
  const std::size_t length = std::strlen(header);
  if (length >= sizeof(tmp)) return;
  std::memcpy(tmp, header, length + 1);
  BufferAppend(static_cast<int>(length));
}
