// The reader's delimiter searches against a byte-by-byte search, on texts that end right before
// an inaccessible page: a search that reads one byte too far faults.
#include "codec/pattern_search.h"

#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <string>
#include <string_view>

#include "tests/guarded_buffer.h"

namespace {

const char* Naive(const char* p, const char* end, std::string_view pattern) {
  for (; p < end; ++p) {
    if (std::string_view(p, pattern.size()) == pattern) return p;
  }
  return nullptr;
}

// Texts of the delimiters' own bytes, so that partial matches abound, of every length around
// the sixteen-byte steps.
std::string RandomText(std::mt19937& random, std::size_t length) {
  static constexpr char kBytes[] = "<>/Type=xT \n";
  std::string text;
  for (std::size_t i = 0; i < length; ++i)
    text += kBytes[random() % (sizeof(kBytes) - 1)];
  return text;
}

TEST(PatternSearchTest, FindsWhatAByteByByteSearchFinds) {
  std::mt19937 random(7);
  for (std::size_t length = 0; length <= 70; ++length) {
    for (int round = 0; round < 20; ++round) {
      const GuardedBuffer text(RandomText(random, length));
      const char* const readable = text.data() + text.size();
      for (std::string_view pattern : {"<", ">", "</", "Type="}) {
        for (std::size_t from = 0; from <= length; ++from) {
          const char* const p = text.data() + from;
          if (static_cast<std::size_t>(readable - p) < pattern.size()) continue;
          const char* const lastStart = readable - pattern.size() + 1;
          // Searches up to the last start, and up to a few bytes before it.
          for (const char* end : {lastStart, p + (lastStart - p) / 2, p}) {
            SCOPED_TRACE(std::string(p, readable) + " / " + std::string(pattern));
            EXPECT_EQ(pattern_search::Find(p, end, readable, pattern), Naive(p, end, pattern));
            EXPECT_EQ(pattern_search::FindFar(p, end, pattern), Naive(p, end, pattern));
          }
          const bool room = readable - p >= static_cast<std::ptrdiff_t>(15 + pattern.size());
          EXPECT_EQ(pattern_search::FindInNextSixteen(p, readable, pattern),
                    room ? Naive(p, p + 16, pattern) : nullptr);
        }
      }
    }
  }
}

TEST(PatternSearchTest, SkipsWhiteSpaceUpToItsEnd) {
  // Whitespace runs on both sides of the sixteen-byte steps, ending in another byte or at the
  // end of the text.
  for (std::size_t run = 0; run <= 40; ++run) {
    std::string white;
    for (std::size_t i = 0; i < run; ++i)
      white += " \t\r\n"[i % 4];
    for (const std::string& text :
         {white, white + "\v", white + "x  ", white + std::string(1, '\0'), white + "\xa0" + white,
          white + "\f" + white}) {
      const GuardedBuffer guarded(text);
      const char* const end = guarded.data() + guarded.size();
      for (const auto skip : {pattern_search::SkipWhiteSpace, pattern_search::SkipIndentation}) {
        EXPECT_EQ(skip(guarded.data(), end), guarded.data() + run) << run;
        EXPECT_EQ(skip(guarded.data(), guarded.data() + run / 2), guarded.data() + run / 2);
      }
    }
  }
}

TEST(PatternSearchTest, ComparesFewBytesAsSameBytesDoes) {
  // Eight readable bytes on both sides, differing at every place or nowhere, for every length.
  const std::string base = "Position";
  for (std::size_t length = 0; length <= 8; ++length) {
    for (std::size_t differs = 0; differs <= 8; ++differs) {
      std::string other = base;
      if (differs < 8) other[differs] = static_cast<char>(other[differs] ^ 0x80);
      const GuardedBuffer a(base);
      const GuardedBuffer b(other);
      EXPECT_EQ(pattern_search::SameFewBytes(a.data(), b.data(), length),
                pattern_search::SameBytes(a.data(), b.data(), length))
          << length << " " << differs;
      EXPECT_EQ(pattern_search::SameBytes(a.data(), b.data(), length), differs >= length);
    }
  }
}

TEST(PatternSearchTest, MeasuresTextsInAFieldAsStrlenDoes) {
  // Lengths on both sides of the sixteen-byte step, in the field and elsewhere.
  char field[64];
  for (std::size_t length = 0; length < sizeof(field); ++length) {
    std::memset(field, 'n', sizeof(field));
    field[length] = '\0';
    EXPECT_EQ(pattern_search::TextLength(field, field), length);
    const GuardedBuffer elsewhere(std::string(field, length + 1));
    EXPECT_EQ(pattern_search::TextLength(elsewhere.data(), field), length);
  }
}

TEST(PatternSearchTest, StoresShortTextsWhole) {
  // Read from a guarded copy of exactly the text, into a field full of another text: nothing
  // past the text is read, and the field holds it, its NUL, and nothing of the old one.
  const std::string text = "abcdefghijklmno";
  for (std::size_t length = 0; length < 16; ++length) {
    char field[32];
    std::memset(field, 'x', sizeof(field));
    const GuardedBuffer source(text.substr(0, length));
    pattern_search::StoreShortText(field, source.data(), length);
    EXPECT_EQ(std::string(field), text.substr(0, length));
    EXPECT_EQ(pattern_search::TextLength(field, field), length);
    EXPECT_EQ(field[16], 'x') << length;
  }
}

}  // namespace
