// The test-only view into a DataDirectory's private parts: the shared codec state and the
// primitives the package operations are built from.
#pragma once

#include <string>

#include "plugin/data_package.h"

class DataPackageTestAccess {
 public:
  using Package = Lum_DataPackage;

  static char* TagName(Package& directory) { return directory.tagName; }

  // The codec's members work on the state every DataDirectory shares: any one will do.
  static Package& Any() {
    static Package* const any = new Package;
    return *any;
  }

  // The state an entry point sets up before its walk.
  static void StartWriting(char* buffer, unsigned int size, bool lineFeeds = true) {
    Any().SetBuffer(buffer, size);
    Package::write = true;
    Package::fileNoTxtChan = lineFeeds;
    Package::treeDepth = 0;
    Package::requiredSize = 1;
  }
  // Reads `text` as it stands, up to its NUL.
  static void StartReading(std::string& text) {
    Any().SetBuffer(text.data(), static_cast<unsigned int>(text.size()));
    Package::write = false;
    Package::treeDepth = 0;
    Package::EndTextAtNul();
  }

  static int& Cursor() { return Package::bufferCursor; }
  static int& RequiredSize() { return Package::requiredSize; }
  static int& TreeDepth() { return Package::treeDepth; }
  static bool& LineFeeds() { return Package::fileNoTxtChan; }
  static char* Tmp() { return Package::tmp; }
  static const char* BufferEnd() { return Package::bufferEnd; }

  static int BufferAppend(int length) { return Any().BufferAppend(length); }
  static const char* GetTabs() { return Any().GetTabs(); }
  static const char* GetNewline() { return Any().GetNewline(); }

  static void MoveCursorAfter(const char* pattern) { Any().MoveCursorAfter(pattern); }
  static std::string GetStringBefore(const char* delimiter) {
    return Any().GetStringBefore(delimiter);
  }
  static bool IsWhiteSpace(char c) { return Any().IsWhiteSpace(c); }
  static bool MoveCursorBeforeTag(const char* name) {
    return Any().MoveCursorBeforeTag(const_cast<char*>(name));
  }
  static int GetItemType(const char* name) { return Any().GetItemType(const_cast<char*>(name)); }
  static bool SearchTag(const char* name, int& failsFrom) {
    return Package::SearchTag(name, failsFrom);
  }

  static bool XML_OpeningTag(const char* name) {
    return Any().XML_OpeningTag(const_cast<char*>(name));
  }
  static bool XML_OpeningIDTag(const char* name, int id) {
    return Any().XML_OpeningIDTag(const_cast<char*>(name), id);
  }
  static void XML_ClosingTag(const char* name) { Any().XML_ClosingTag(const_cast<char*>(name)); }
  static void XML_StringTag(const char* name, char* text) {
    Any().XML_StringTag(const_cast<char*>(name), text);
  }
  static void XML_ValueTag(const char* name, float& value) {
    Any().XML_ValueTag(const_cast<char*>(name), value);
  }
  static void XML_VectorTag(const char* name, D3DXVECTOR3& vector) {
    Any().XML_VectorTag(const_cast<char*>(name), vector);
  }
  static void XML_MatrixTag(const char* name, D3DXMATRIX& matrix) {
    Any().XML_MatrixTag(const_cast<char*>(name), matrix);
  }
};
