#include "tools/datapack/structure_finder.h"

#include <cstdlib>
#include <optional>

#include "codec/pattern_search.h"
#include "codec/white_space.h"
#include "plugin/data_package.h"
#include "tools/datapack/format_limits.h"
#include "tools/datapack/json_mapping.h"

namespace datapack {
namespace {

constexpr std::string_view kTypeAttribute = "Type=\"";
constexpr std::string_view kIdAttribute = "id=\"";

std::string_view Trim(std::string_view text) {
  while (!text.empty() && IsWhiteSpaceChar(text.front()))
    text.remove_prefix(1);
  while (!text.empty() && IsWhiteSpaceChar(text.back()))
    text.remove_suffix(1);
  return text;
}

std::string Quoted(std::string_view text) {
  constexpr std::size_t kShown = 40;
  return "\"" + std::string(text.substr(0, kShown)) + (text.size() > kShown ? "...\"" : "\"");
}

struct Tag {
  std::size_t offset = 0;  // of its "<"
  std::size_t end = 0;     // just after its ">"
  bool closing = false;
  std::string_view name;
  std::optional<Kind> kind;  // set on the opening tag of a data element
  bool hasId = false;
  std::size_t id = 0;
};

// One directory of the tree as far as the text has shown it.
struct Layout {
  bool named = false;
  bool filled = false;  // an entry has shown what every entry holds
  std::string name;
  std::vector<DataSlot> data;
  std::vector<Layout> directories;

  Shape ToShape() const {
    Shape shape{name, data, {}};
    for (const Layout& sub : directories)
      shape.directories.push_back(sub.ToShape());
    return shape;
  }
};

class Parser {
  static constexpr std::size_t npos = std::string_view::npos;

 public:
  Parser(std::string_view text, std::size_t at) : text_(text), at_(at), runStart_(at) {}

  std::size_t At() const { return at_; }
  bool AtEnd() {
    SkipSpace();
    return at_ == text_.size();
  }

  // The next tag, if a tag comes next; the parser stays where it is.
  std::optional<Tag> Peek() {
    SkipSpace();
    if (at_ == text_.size() || text_[at_] != '<') return std::nullopt;
    return ReadTag(at_);
  }

  const std::vector<datapack::Note>& Notes() const { return notes_; }
  std::optional<std::size_t> FirstBreak(bool crlf) const { return firstBreak[crlf]; }

  // Adds the directory element ahead, and those inside it, to Found().
  void Directory(Layout& layout, int depth = 1) {
    const Tag open = Take();
    if (open.closing || open.kind) Fail(open, "expected a directory element");
    if (depth > Lum_DataPackage::kMaxNesting) {
      Fail(open.offset, "nested deeper than 1023 directories, which no writer packs");
    }
    const std::size_t pathLength = path_.size();
    path_ += (path_.empty() ? "" : ".") + ShownName(open.name);
    Notice(open.offset, false, NameProblem(open.name, true));
    if (!layout.named) {
      layout.name = std::string(open.name);
      layout.named = true;
    } else if (open.name != layout.name) {
      Fail(open, "expected the directory " + Quoted(layout.name) + " as in the entries before");
    }
    const std::size_t index = found_.size();
    found_.push_back({open.offset, 0, 0});
    std::uint32_t entries = 0;
    if (!open.hasId) {
      const std::optional<Tag> next = Peek();
      if (next && next->closing && next->name == open.name) {
        Take();  // an empty element: it tells nothing of what an entry holds
      } else {
        EntryContents(layout, entries++, depth);
        Close(open.name);
      }
    } else {
      for (Tag tag = open;;) {
        if (tag.id != entries) {
          Notice(tag.offset, true,
                 "id " + std::to_string(tag.id) + " on entry " + std::to_string(entries) +
                     ": ids are not read, and the writer numbers entries from 0");
        }
        EntryContents(layout, entries++, depth);
        Close(open.name);
        const std::optional<Tag> next = Peek();
        if (!next || next->closing || next->kind || !next->hasId || next->name != open.name) break;
        tag = Take();
      }
      if (entries > static_cast<std::uint32_t>(Lum_DataPackage::kMaxReadEntries)) {
        Notice(open.offset, false, EntryCountProblem(entries));
      }
    }
    found_[index].entries = entries;
    found_[index].end = static_cast<std::uint32_t>(found_.size());
    path_.resize(pathLength);
  }

  std::vector<FoundDirectory>& Found() { return found_; }

 private:
  [[noreturn]] static void Fail(std::size_t offset, const std::string& message) {
    throw StructureError(offset, message);
  }
  [[noreturn]] void Fail(const Tag& tag, const std::string& message) const {
    Fail(tag.offset, message + ", found " + Quoted(text_.substr(tag.offset, tag.end - tag.offset)));
  }

  // Indentation runs long in deep packages: it is skipped sixteen bytes at a step.
  void SkipSpace() {
    const char* const start = text_.data() + at_;
    const char* const end = pattern_search::SkipIndentation(start, text_.data() + text_.size());
    at_ += static_cast<std::size_t>(end - start);
  }

  Tag ReadTag(std::size_t offset) const {
    Tag tag;
    tag.offset = offset;
    tag.closing = text_.substr(offset, 2) == "</";
    const std::size_t start = offset + (tag.closing ? 2 : 1);
    const std::size_t close = text_.find('>', start);
    if (close == npos) Fail(offset, "a tag without its \">\"");
    tag.end = close + 1;
    tag.name = Trim(text_.substr(start, close - start));
    // A data element named "/..." opens with "</" too; a closing tag never has a type.
    if (tag.closing && tag.name.ends_with('"') && tag.name.find(kTypeAttribute) != npos) {
      tag.closing = false;
      tag.name = Trim(text_.substr(offset + 1, close - offset - 1));
    }
    if (tag.closing) return tag;
    if (const std::size_t type = tag.name.rfind(kTypeAttribute); type != npos) {
      std::string_view kind = tag.name.substr(type + kTypeAttribute.size());
      if (kind.empty() || kind.back() != '"' || !KindNamed(kind.substr(0, kind.size() - 1))) {
        Fail(offset, "unknown element type " + Quoted(kind));
      }
      tag.kind = KindNamed(kind.substr(0, kind.size() - 1));
      tag.name = Trim(tag.name.substr(0, type));
    } else if (const std::size_t id = tag.name.find(kIdAttribute); id != npos) {
      const std::string_view number = tag.name.substr(id + kIdAttribute.size());
      if (number.size() < 2 || number.back() != '"' ||
          number.substr(0, number.size() - 1).find_first_not_of("0123456789") != npos) {
        Fail(offset, "an entry id that is not a number: " + Quoted(tag.name));
      }
      tag.hasId = true;
      tag.id = std::strtoull(number.data(), nullptr, 10);
      tag.name = Trim(tag.name.substr(0, id));
    }
    return tag;
  }

  Tag Take() {
    const std::optional<Tag> tag = Peek();
    if (!tag) {
      Fail(at_, at_ == text_.size() ? "the text ends before the directory does"
                                    : "expected a tag, found " + Quoted(text_.substr(at_)));
    }
    NoticeBreak(tag->offset);
    at_ = tag->end;
    runStart_ = at_;
    return *tag;
  }

  // Where the line break before a tag is the first of its kind: LF or CR LF.
  std::optional<std::size_t> firstBreak[2];

  void NoticeBreak(std::size_t tag) {
    if (firstBreak[false] && firstBreak[true]) return;
    // Once LF is known, only a CR starts the other kind.
    if (firstBreak[false] && text_.substr(runStart_, tag - runStart_).find('\r') == npos) return;
    std::size_t at = tag;
    while (at > 0 && text_[at - 1] == '\t')
      --at;
    if (at == 0 || text_[at - 1] != '\n') return;
    const bool crlf = at > 1 && text_[at - 2] == '\r';
    if (!firstBreak[crlf]) firstBreak[crlf] = at - 1;
  }

  void Close(std::string_view name) {
    const Tag tag = Take();
    if (!tag.closing || tag.name != name) Fail(tag, "expected </" + std::string(name) + ">");
  }

  void Notice(std::size_t offset, bool warning, const std::optional<std::string>& problem) {
    if (problem) notes_.push_back({offset, warning, ShownPath(path_) + ": " + *problem});
  }

  // A data element's value runs to the first "</", as the reader takes it.
  void SkipValue(const Tag& open) {
    const std::size_t close = text_.find("</", at_);
    if (close == npos) Fail(open, "a data element without its closing tag");
    const std::string_view value = Trim(text_.substr(at_, close - at_));
    const std::size_t pathLength = path_.size();
    path_ += "." + ShownName(open.name);
    Notice(open.offset, false, NameProblem(open.name, false));
    if (*open.kind == Kind::kText) {
      if (value.size() > Lum_DataPackage::kTextLength - 1)
        Notice(open.offset, false, TextProblem(value));
    } else {
      Notice(open.offset, false, NumbersProblem(value, *open.kind));
    }
    path_.resize(pathLength);
    // A break before the closing tag stands in the whitespace after the value.
    runStart_ =
        value.empty() ? at_ : static_cast<std::size_t>(value.data() + value.size() - text_.data());
    at_ = close;
    Close(open.name);
  }

  // Numbers the reader takes otherwise than written: too few, or text it stops at.
  static std::optional<std::string> NumbersProblem(std::string_view value, Kind kind) {
    const std::size_t expected = kind == Kind::kValue ? 1 : kind == Kind::kVector ? 3 : 16;
    std::size_t count = 0;
    for (std::size_t at = 0; at < value.size();) {
      const std::size_t end = std::min(value.find_first_of(" \t\r\n", at), value.size());
      std::string number(value.substr(at, end - at));
      // A matrix's rows end with a comma right after their last number.
      if (kind == Kind::kMatrix && count % 4 == 3 && count < 15) {
        if (!number.ends_with(',')) return "a matrix row without the \",\" that ends it";
        number.pop_back();
      }
      char* stop = nullptr;
      std::strtof(number.c_str(), &stop);
      if (stop != number.c_str() + number.size()) {
        return "\"" + std::string(number.substr(0, 40)) + "\" does not scan whole as a number";
      }
      ++count;
      at = value.find_first_not_of(" \t\r\n", end);
      if (at == npos) break;
    }
    if (count != expected) {
      return std::to_string(count) + (count == 1 ? " number" : " numbers") +
             " where the reader takes " + std::to_string(expected);
    }
    return std::nullopt;
  }

  void EntryContents(Layout& layout, std::size_t index, int depth) {
    const std::size_t pathLength = path_.size();
    path_ += "[" + std::to_string(index) + "]";
    Contents(layout, depth);
    path_.resize(pathLength);
  }

  // One entry: its data elements, then its sub-directories.
  void Contents(Layout& layout, int depth) {
    const std::size_t start = at_;
    std::vector<DataSlot> data;
    for (std::optional<Tag> next = Peek(); next && next->kind; next = Peek()) {
      Take();
      data.push_back({std::string(next->name), *next->kind});
      SkipValue(*next);
    }
    if (!layout.filled) {
      layout.data = data;
    } else if (data != layout.data) {
      Fail(start, "an entry of " + Quoted(layout.name) +
                      " holds other data elements than the entries before it");
    }
    std::size_t subs = 0;
    for (std::optional<Tag> next = Peek(); next && !next->closing; next = Peek()) {
      if (!layout.filled) {
        layout.directories.emplace_back();
      } else if (subs == layout.directories.size()) {
        Fail(*next, "an entry of " + Quoted(layout.name) +
                        " holds more sub-directories than the entries before it");
      }
      Directory(layout.directories[subs++], depth + 1);
    }
    if (layout.filled && subs != layout.directories.size()) {
      Fail(at_, "an entry of " + Quoted(layout.name) +
                    " holds fewer sub-directories than the entries before it");
    }
    layout.filled = true;
  }

  std::string_view text_;
  std::size_t at_;
  std::size_t runStart_;  // of the whitespace before the next tag
  std::string path_;
  std::vector<datapack::Note> notes_;
  std::vector<FoundDirectory> found_;
};

}  // namespace

Structure FindStructure(std::string_view text) {
  // The text ends with the closing tag of its directory; the header may hold anything.
  std::size_t end = text.size();
  while (end > 0 && IsWhiteSpaceChar(text[end - 1]))
    --end;
  if (end == 0) throw StructureError(0, "no package: the text is empty");
  const std::size_t close = text.rfind("</", end - 1);
  if (text[end - 1] != '>' || close == std::string_view::npos) {
    throw StructureError(end - 1, "no package: the text does not end with a closing tag");
  }
  const std::string_view name = Trim(text.substr(close + 2, end - 1 - (close + 2)));
  const bool crlf = close >= 2 && text.substr(close - 2, 2) == "\r\n";

  // The directory starts at the first opening tag of that name from which the whole rest reads. A
  // header may hold such tags too, but not many: trying each of a great many would take time
  // that grows with the square of the text.
  constexpr int kAttempts = 16;
  int attempts = 0;
  std::optional<StructureError> furthest;
  std::optional<std::size_t> firstOpening;
  for (std::size_t at = text.find('<'); at < close && attempts < kAttempts;
       at = text.find('<', at + 1)) {
    Parser parser(text, at);
    try {
      const std::optional<Tag> tag = parser.Peek();
      if (tag && !tag->closing && !firstOpening) firstOpening = at;
      if (!tag || tag->closing || tag->kind || tag->name != name) continue;
      ++attempts;
      Layout layout;
      parser.Directory(layout);
      if (!parser.AtEnd()) throw StructureError(parser.At(), "text after the directory's end");
      std::string_view header = text.substr(0, at);
      const std::string_view newline = crlf ? "\r\n" : "\n";
      if (header.ends_with(newline)) header.remove_suffix(newline.size());
      Structure structure{std::string(header), crlf, layout.ToShape(), std::move(parser.Found()),
                          parser.Notes()};
      // The reader takes either line break; writing again gives one kind only.
      if (const auto other = parser.FirstBreak(!crlf)) {
        structure.notes.push_back({*other, true,
                                   std::string("mixed line breaks: ") + (crlf ? "LF" : "CR LF") +
                                       " in a package of " + (crlf ? "CR LF" : "LF") +
                                       " line breaks"});
      }
      return structure;
    } catch (const StructureError& error) {
      if (!furthest || error.offset() > furthest->offset()) furthest = error;
    }
  }
  if (furthest) throw *furthest;
  // The last closing tag closes no directory: what the first opening tag starts says why, as a
  // text cut short does.
  if (firstOpening) {
    Parser parser(text, *firstOpening);
    Layout layout;
    parser.Directory(layout);
  }
  throw StructureError(close, "no opening tag for the closing tag </" + std::string(name) + ">");
}

}  // namespace datapack
