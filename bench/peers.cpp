#include "bench/peers.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace bench {

namespace {

constexpr std::size_t kContentRoom = 4096;  // the longest text a package reads back, and more

// A data element's content as the package has it: the value between two spaces.
const char* Content(Kind kind, const float* f, std::string_view text, char* out) {
  const auto d = [f](int i) { return static_cast<double>(f[i]); };
  switch (kind) {
    case Kind::kText:
      out[0] = ' ';
      std::memcpy(out + 1, text.data(), text.size());
      std::memcpy(out + 1 + text.size(), " ", 2);
      break;
    case Kind::kValue:
      std::snprintf(out, kContentRoom, " %g ", d(0));
      break;
    case Kind::kVector:
      std::snprintf(out, kContentRoom, " %g %g %g ", d(0), d(1), d(2));
      break;
    case Kind::kMatrix:
      std::snprintf(out, kContentRoom, " %g %g %g %g, %g %g %g %g, %g %g %g %g, %g %g %g %g ", d(0),
                    d(1), d(2), d(3), d(4), d(5), d(6), d(7), d(8), d(9), d(10), d(11), d(12),
                    d(13), d(14), d(15));
      break;
  }
  return out;
}

// Walks the workload's entries in document order, handing each element to `document`.
template <typename Document>
void WriteLevel(const Workload& workload, int l, std::size_t parent, Document& document,
                char* content) {
  const Level& level = workload.levels[static_cast<std::size_t>(l)];
  if (!level.inText) return;
  for (int i = 0; i < level.fanOut; ++i) {
    const std::size_t entry = ChildEntry(level, parent, i);
    document.Open(level.tag, level.fanOut == 1 ? -1 : i);
    const float* floats = workload.source.Floats(l, entry);
    int texts = 0;
    for (const Field& field : level.fields) {
      const std::string_view text =
          field.kind == Kind::kText ? workload.source.Text(l, entry, texts++) : "";
      document.Element(field.name, TypeName(field.kind),
                       Content(field.kind, floats, text, content));
      floats += FloatCount(field.kind);
    }
    if (l + 1 < static_cast<int>(workload.levels.size()))
      WriteLevel(workload, l + 1, entry, document, content);
    document.Close();
  }
}

bool IsSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

// Stores one element's content; a missing element reads as zeros or the empty text.
void Extract(Kind kind, const char* content, float* floats, Values& output, int level,
             std::size_t entry, int text) {
  char* end = nullptr;
  switch (kind) {
    case Kind::kText: {
      const char* first = content;
      const char* last = content + std::strlen(content);
      while (first < last && IsSpace(*first))
        ++first;
      while (last > first && IsSpace(last[-1]))
        --last;
      output.SetText(level, entry, text,
                     std::string_view(first, static_cast<std::size_t>(last - first)));
      return;
    }
    case Kind::kValue:
    case Kind::kVector:
    case Kind::kMatrix:
      for (int i = 0; i < FloatCount(kind); ++i) {
        floats[i] = std::strtof(content, &end);
        content = end;
        if (*content == ',') ++content;
      }
      return;
  }
}

// Visits the elements named by each level below `node`, as the package reader looks for them:
// by name, in order. Adapter supplies First(node, name), Next(element, name) and Text(element,
// name), the content of a child element or "".
template <typename Adapter, typename Node>
bool ReadLevel(const Workload& workload, int l, std::size_t parent, Node node, Values& output) {
  const Level& level = workload.levels[static_cast<std::size_t>(l)];
  int i = 0;
  for (auto element = Adapter::First(node, level.tag); element;
       element = Adapter::Next(element, level.tag), ++i) {
    const std::size_t entry = ChildEntry(level, parent, i);
    if (i >= level.fanOut || entry >= level.entries) return false;
    float* floats = output.Floats(l, entry);
    int texts = 0;
    for (const Field& field : level.fields) {
      Extract(field.kind, Adapter::Text(element, field.name), floats, output, l, entry,
              field.kind == Kind::kText ? texts++ : 0);
      floats += FloatCount(field.kind);
    }
    if (l + 1 < static_cast<int>(workload.levels.size()) &&
        !ReadLevel<Adapter>(workload, l + 1, entry, element, output)) {
      return false;
    }
  }
  return true;
}

class PugixmlDocument {
 public:
  explicit PugixmlDocument(pugi::xml_node root) : node_(root) {}
  void Open(const char* tag, int id) {
    node_ = node_.append_child(tag);
    if (id >= 0) node_.append_attribute("id").set_value(id);
  }
  void Element(const char* name, const char* type, const char* content) {
    pugi::xml_node element = node_.append_child(name);
    element.append_attribute("Type").set_value(type);
    element.append_child(pugi::node_pcdata).set_value(content);
  }
  void Close() { node_ = node_.parent(); }

 private:
  pugi::xml_node node_;
};

class StringWriter : public pugi::xml_writer {
 public:
  explicit StringWriter(std::string& text) : text_(text) {}
  void write(const void* data, std::size_t size) override {
    text_.append(static_cast<const char*>(data), size);
  }

 private:
  std::string& text_;
};

struct PugixmlAdapter {
  static pugi::xml_node First(pugi::xml_node node, const char* name) { return node.child(name); }
  static pugi::xml_node Next(pugi::xml_node node, const char* name) {
    return node.next_sibling(name);
  }
  static const char* Text(pugi::xml_node node, const char* name) {
    return node.child(name).child_value();
  }
};

class Tinyxml2Document {
 public:
  explicit Tinyxml2Document(tinyxml2::XMLPrinter& printer) : printer_(printer) {}
  void Open(const char* tag, int id) {
    printer_.OpenElement(tag);
    if (id >= 0) printer_.PushAttribute("id", id);
  }
  void Element(const char* name, const char* type, const char* content) {
    printer_.OpenElement(name);
    printer_.PushAttribute("Type", type);
    printer_.PushText(content);
    printer_.CloseElement();
  }
  void Close() { printer_.CloseElement(); }

 private:
  tinyxml2::XMLPrinter& printer_;
};

struct Tinyxml2Adapter {
  static const tinyxml2::XMLElement* First(const tinyxml2::XMLNode* node, const char* name) {
    return node->FirstChildElement(name);
  }
  static const tinyxml2::XMLElement* Next(const tinyxml2::XMLElement* element, const char* name) {
    return element->NextSiblingElement(name);
  }
  static const char* Text(const tinyxml2::XMLElement* element, const char* name) {
    const tinyxml2::XMLElement* child = element->FirstChildElement(name);
    const char* text = child ? child->GetText() : nullptr;
    return text ? text : "";
  }
};

}  // namespace

void PugixmlWrite(const Workload& workload, std::string& text) {
  char content[kContentRoom];
  pugi::xml_document document;
  PugixmlDocument builder(document);
  WriteLevel(workload, 0, 0, builder, content);
  text.clear();
  StringWriter writer(text);
  document.save(writer, "\t", pugi::format_indent | pugi::format_no_declaration);
}

bool PugixmlRead(const Workload& workload, const std::string& text, Values& output) {
  pugi::xml_document document;
  if (!document.load_buffer(text.data(), text.size())) return false;
  return ReadLevel<PugixmlAdapter>(workload, 0, 0, pugi::xml_node(document), output);
}

void TabPrinter::PrintSpace(int depth) {
  for (int i = 0; i < depth; ++i)
    Putc('\t');
}

void Tinyxml2Write(const Workload& workload, TabPrinter& printer) {
  char content[kContentRoom];
  printer.ClearBuffer();
  Tinyxml2Document builder(printer);
  WriteLevel(workload, 0, 0, builder, content);
}

bool Tinyxml2Read(const Workload& workload, const std::string& text, Values& output) {
  tinyxml2::XMLDocument document;
  if (document.Parse(text.data(), text.size()) != tinyxml2::XML_SUCCESS) return false;
  return ReadLevel<Tinyxml2Adapter>(workload, 0, 0,
                                    static_cast<const tinyxml2::XMLNode*>(&document), output);
}

}  // namespace bench
