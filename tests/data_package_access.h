// The test-only view into a DataDirectory's private parts: the shared codec state and the
// primitives the package operations are built from.
#pragma once

#include <string>

#include "plugin/data_package.h"

class DataPackageTestAccess {
 public:
  using Package = Lum_DataPackage;

  static char* TagName(Package& directory) { return directory.tagName; }

  // The state an entry point sets up before its walk.
  static void StartWriting(char* buffer, unsigned int size, bool lineFeeds = true) {
    Package::SetBuffer(buffer, size);
    Package::write = true;
    Package::fileNoTxtChan = lineFeeds;
    Package::treeDepth = 0;
    Package::requiredSize = 1;
  }
  // Reads `text` as it stands, up to its NUL.
  static void StartReading(std::string& text) {
    Package::SetBuffer(text.data(), static_cast<unsigned int>(text.size()));
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

  static int BufferAppend(int length) { return Package::BufferAppend(length); }
  static const char* GetTabs() { return Package::GetTabs(); }
  static const char* GetNewline() { return Package::GetNewline(); }

  static void MoveCursorAfter(const char* pattern) { Package::MoveCursorAfter(pattern); }
  static std::string GetStringBefore(const char* delimiter) {
    return Package::GetStringBefore(delimiter);
  }
  static bool IsWhiteSpace(char c) { return Package::IsWhiteSpace(c); }
  static bool MoveCursorBeforeTag(const char* name) { return Package::MoveCursorBeforeTag(name); }
  static int GetItemType(const char* name) { return Package::GetItemType(name); }
  static bool SearchTag(const char* name, int& failsFrom) {
    return Package::SearchTag(name, failsFrom);
  }

  static bool XML_OpeningTag(const char* name) { return Package::XML_OpeningTag(name); }
  static bool XML_OpeningIDTag(const char* name, int id) {
    return Package::XML_OpeningIDTag(name, id);
  }
  static void XML_ClosingTag(const char* name) { Package::XML_ClosingTag(name); }
  static void XML_StringTag(const char* name, char* text) { Package::XML_StringTag(name, text); }
  static void XML_ValueTag(const char* name, float& value) { Package::XML_ValueTag(name, value); }
  static void XML_VectorTag(const char* name, D3DXVECTOR3& vector) {
    Package::XML_VectorTag(name, vector);
  }
  static void XML_MatrixTag(const char* name, D3DXMATRIX& matrix) {
    Package::XML_MatrixTag(name, matrix);
  }
};
