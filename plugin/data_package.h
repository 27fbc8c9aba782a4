// The DataDirectory channel: a string channel that declares six child links and packs the tree
// below it into one package text, or fills the tree back from one.
#pragma once

#include <initializer_list>
#include <string_view>

#include "host/d3dx_types.h"
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
  static constexpr int kMaxReadEntries = 9999;
  static constexpr int kMaxTabs = 1023;
  static constexpr int kMaxNesting = kMaxTabs;  // directories on one path of a walk

  Lum_DataPackage();
  Lum_DataPackage(const Lum_DataPackage& other);
  Lum_DataPackage& operator=(const Lum_DataPackage& other);
  ~Lum_DataPackage() override;

  // Packs the tree into `buffer` and returns the size the whole package needs, its NUL included;
  // a result above `size` means it did not fit. newlineChoice: true for "\n", false for "\r\n".
  int WriteToBuffer(char* buffer, int size, bool newlineChoice, bool scramble);
  // Fills the tree from the package in `buffer` and returns how far reading advanced.
  int ReadFromBuffer(char* buffer, int size, bool newlineChoice, bool unscramble);
  void WriteHeader();
  int ReadWriteDirectory(bool unused);
  void Encrypt(char* data, int length);
  void Decrypt(char* data, int length);

 private:
  friend class DataPackageTestAccess;

  // The members below are exported with the class, and plug-ins built against these
  // declarations find them by their decorated names: their signatures stay as they are. Members
  // that only help them are static and take standard types.

  // Package buffer and cursor.
  void SetBuffer(char* buffer, unsigned int size);
  int BufferAppend(int length);
  const char* GetTabs();
  const char* GetNewline();
  static void EndTextAtNul();
  static void AppendPieces(std::initializer_list<std::string_view> pieces);
  static std::string_view Newline();
  static std::string_view Indentation();

  // Scanning.
  struct DelimiterMemo;
  static DelimiterMemo* MemoFor(std::string_view pattern);
  static const char* Find(std::string_view pattern);
  static void ForgetSearches();
  void MoveCursorAfter(const char* pattern);
  char* GetStringBefore(const char* delimiter);
  bool IsWhiteSpace(char c);
  bool MoveCursorBeforeTag(char* name);
  int GetItemType(char* name);
  static void MovePast(std::string_view pattern);
  static void CutStringBefore(std::string_view delimiter, char* text);
  static std::string_view TextBefore(std::string_view delimiter);
  static const char* SkipWhiteSpace(const char* p);
  static bool SearchTag(const char* name, int& failsFrom);

  // Element tags.
  bool XML_OpeningTag(char* name);
  bool XML_OpeningIDTag(char* name, int id);
  void XML_ClosingTag(char* name);
  void XML_StringTag(char* name, char* text);
  void XML_ValueTag(char* name, float& value);
  void XML_VectorTag(char* name, D3DXVECTOR3& vector);
  void XML_MatrixTag(char* name, D3DXMATRIX& matrix);
  static void WriteTypedElement(std::string_view name, std::string_view type,
                                std::string_view value);
  static bool ReadTypedElementName(const char* name);
  static bool IsPlainName(std::string_view name);

  // Directory walk.
  void TakeTagName();
  bool OpenEntry(int index, int entryCount);
  void ReadWriteData();
  void ReadWriteSubDirectories();
  bool IsBeingWalked() const;
  struct TagSearchMemo;
  TagSearchMemo& TagSearchMemoSlot() const;
  int& TagSearchFailsFrom();
  void ForgetTagSearch();
  static bool PackageTooLarge();

  char tagName[kTextLength] = {};

  // One package operation at a time, shared by every DataDirectory in the process.
  static const char* bufferStart;
  static const char* bufferEnd;
  static const char* textEnd;  // reading: bufferEnd, or the first NUL before it
  static int bufferCursor;     // distance from bufferStart; while writing it may pass bufferEnd
  static int requiredSize;
  static int treeDepth;
  static bool write;
  static bool fileNoTxtChan;
  static bool busy;
  static char tmp[kTextLength];
  static char tmp2[kTextLength];
  static char strg[kTextLength];
  static char strg2[kTextLength];
  static char tabsBuffer[kMaxTabs + 1];
  static char newlineBuffer[3];
  static char stringBeforeBuffer[kTextLength];
  static const Lum_DataPackage* walkPath[kMaxNesting];
  static int walkDepth;

  // What one read has learnt about its text, so that no search runs over the same stretch again
  // and again: where each delimiter next occurs, and where each directory's tag search fails.
  struct DelimiterMemo {
    int from;   // the memo answers searches starting from here...
    int found;  // ...up to here, with this occurrence; -1: none from `from` on
  };
  struct TagSearchMemo {
    const Lum_DataPackage* directory;
    unsigned int read;
    int failsFrom;
  };
  static constexpr int kTagSearchMemos = 256;  // indexed by the top 8 bits of a hash
  static DelimiterMemo delimiterMemo[4];       // "<", ">", "</", "Type="
  static TagSearchMemo tagSearchMemo[kTagSearchMemos];
  static unsigned int readSerial;
};
