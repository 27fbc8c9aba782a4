#include "tools/datapack/outline.h"

#include <charconv>
#include <cstdio>

#include "tools/datapack/text_encoding.h"

namespace datapack {

namespace {

// C escapes for what a terminal would not show as it is; bytes of texts that are not UTF-8 as
// hexadecimal escapes.
std::string Escaped(std::string_view text) {
  const bool utf8 = IsUtf8(text);
  std::string out;
  for (char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    switch (c) {
      case '"':
        out += "\\\"";
        break;
      case '\\':
        out += "\\\\";
        break;
      case '\n':
        out += "\\n";
        break;
      case '\r':
        out += "\\r";
        break;
      case '\t':
        out += "\\t";
        break;
      default:
        if (byte < 0x20 || byte == 0x7F || (byte >= 0x80 && !utf8)) {
          char escape[5];
          std::snprintf(escape, sizeof(escape), "\\x%02x", byte);
          out += escape;
        } else {
          out += c;
        }
    }
  }
  return out;
}

std::string Quoted(std::string_view text) { return "\"" + Escaped(text) + "\""; }

// The fewest digits that give the same float back.
std::string Number(float number) {
  char text[32];
  return std::string(text, std::to_chars(text, text + sizeof(text), number).ptr);
}

std::string Numbers(const float* numbers, int count) {
  std::string out;
  for (int i = 0; i < count; ++i)
    out += (i == 0 ? "" : i % 4 == 0 ? ", " : " ") + Number(numbers[i]);
  return out;
}

}  // namespace

std::string ValueText(const Value& value) {
  if (const auto* text = std::get_if<std::string_view>(&value)) return Quoted(*text);
  if (const float* number = std::get_if<float>(&value)) return Number(*number);
  if (const auto* vector = std::get_if<D3DXVECTOR3>(&value)) return Numbers(&vector->x, 3);
  return Numbers(&std::get<const D3DXMATRIX*>(value)->m[0][0], 16);
}

namespace {

void Directory(const Shape& shape, Entries entries, const std::string& indent, Output& out) {
  out << indent << Escaped(shape.name) << ": " << Counted(entries.size(), "entry", "entries")
      << "\n";
  const std::string inner = indent + "    ";
  for (std::size_t i = 0; i < entries.size(); ++i) {
    out << indent << "  entry " << std::to_string(i) << "\n";
    for (std::size_t j = 0; j < shape.data.size(); ++j) {
      out << inner << Escaped(shape.data[j].name) << " (" << KindName(shape.data[j].kind)
          << "): " << ValueText(entries[i].Value(j)) << "\n";
    }
    for (std::size_t k = 0; k < shape.directories.size(); ++k)
      Directory(shape.directories[k], entries[i].Directory(k), inner, out);
  }
}

}  // namespace

std::string Counted(std::size_t count, std::string_view one, std::string_view many) {
  return std::to_string(count) + " " + std::string(count == 1 ? one : many);
}

void WriteOutline(const Package& package, Output& out) {
  out << "header: " << Quoted(package.header) << "\n";
  out << "line breaks: " << (package.crlf ? "CRLF" : "LF") << "\n";
  if (package.scrambled) out << "scrambled\n";
  Directory(package.top, package.entries(), "", out);
}

}  // namespace datapack
