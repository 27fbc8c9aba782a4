// The DataDirectory channel: a string channel that declares six child links and packs the tree
// below it into one package text, or fills the tree back from one.
#pragma once

#include "host/export.h"
#include "host/string_channel/string_channel.h"

#if defined(DATA_DIRECTORY_BUILD)
#define DATA_DIRECTORY_API VORN_EXPORT
#else
#define DATA_DIRECTORY_API VORN_IMPORT
#endif

class DATA_DIRECTORY_API Lum_DataPackage : public Lum_StringChannel {
 public:
  // The links a DataDirectory declares, in link order.
  enum Link : int {
    kTagLink = 0,
    kCountLink = 1,
    kCurrentIndexLink = 2,
    kDataLink = 3,
    kSubDirectoriesLink = 4,
    kCallEachIterationLink = 5,
  };
  static constexpr int kLinkCount = 6;
  static constexpr int kTextLength = 2048;  // every name and text field, NUL included

  Lum_DataPackage();
  Lum_DataPackage(const Lum_DataPackage& other);
  Lum_DataPackage& operator=(const Lum_DataPackage& other);
  ~Lum_DataPackage() override;

 private:
  friend class DataPackageTestAccess;

  char tagName[kTextLength] = {};
};
