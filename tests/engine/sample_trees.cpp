#include "tests/engine/sample_trees.h"

#include <cstring>

#include "host/matrix_channel.h"
#include "host/string_channel/string_channel.h"
#include "host/value_channel.h"
#include "host/vector_channel.h"

namespace samples {

const Sample kSamples[] = {
    {"players", true, false},
    {"players_crlf", false, false},
    {"all_kinds_scrambled", true, true},
    {"nested_crlf", false, false},
};
const std::size_t kSampleCount = sizeof(kSamples) / sizeof(kSamples[0]);

void (*Tree::onCall)() = nullptr;

namespace {

// The links of a DataDirectory.
constexpr int kTag = 0, kCount = 1, kCurrentIndex = 2, kData = 3, kSubDirectories = 4,
              kCallEachIteration = 5;

bool SameEntry(const Entry& a, const Entry& b) {
  return std::strcmp(a.text, b.text) == 0 && a.value == b.value &&
         std::memcmp(&a.vector, &b.vector, sizeof(a.vector)) == 0 &&
         std::memcmp(&a.matrix, &b.matrix, sizeof(a.matrix)) == 0;
}

}  // namespace

// A directory as a sample has it: its Tag and Count, which data channels it holds (a null name:
// none of that kind), and what its entries carry.
struct Tree::Shape {
  const char* tag;
  float count;
  const char* textName;
  const char* valueName;
  const char* vectorName;
  const char* matrixName;
  const char* const* texts;  // entry k carries texts[k % textCount]
  int textCount;
  const float* values;  // and values[k % valueCount]
  int valueCount;
  float seed;  // and a vector and a matrix made from the seed and k, with few digits
};

class Tree::Iteration : public Vorn_Channel {
 public:
  Iteration(const Shape& shape, Vorn_Channel* text, Vorn_Channel* value, Vorn_Channel* vector,
            Vorn_Channel* matrix)
      : shape_(shape), text_(text), value_(value), vector_(vector), matrix_(matrix) {}

  void CallChannel() override {
    if (Tree::onCall) Tree::onCall();
    if (supply_) {
      const Entry entry = Expected(calls_++);
      if (text_) static_cast<Lum_StringChannel*>(text_)->SetString(entry.text);
      if (value_) static_cast<Lum_ValueChannel*>(value_)->SetValue(entry.value);
      if (vector_) static_cast<Lum_VectorChannel*>(vector_)->SetVector(entry.vector);
      if (matrix_) static_cast<Lum_MatrixChannel*>(matrix_)->SetMatrix(entry.matrix);
      return;
    }
    Record entry{};
    if (text_) {
      const char* text = static_cast<Lum_StringChannel*>(text_)->GetString();
      std::strncpy(entry.text, text ? text : "", sizeof(entry.text) - 1);
    }
    entry.entry.text = entry.text;
    if (value_) entry.entry.value = static_cast<Lum_ValueChannel*>(value_)->GetValue();
    if (vector_) entry.entry.vector = static_cast<Lum_VectorChannel*>(vector_)->GetVector();
    if (matrix_) entry.entry.matrix = static_cast<Lum_MatrixChannel*>(matrix_)->GetMatrix();
    received_.push_back(entry);
  }

  // What entry k carries: only the kinds the directory holds, the rest left zero.
  Entry Expected(int k) const {
    Entry entry{};
    entry.text = text_ ? shape_.texts[k % shape_.textCount] : "";
    if (value_) entry.value = shape_.values[k % shape_.valueCount];
    if (vector_) entry.vector = {static_cast<float>(k) + 0.5f, -shape_.seed, 0.125f};
    if (matrix_) {
      for (int row = 0; row < 4; ++row)
        for (int column = 0; column < 4; ++column)
          entry.matrix.m[row][column] =
              shape_.seed + static_cast<float>(row) - 0.5f * static_cast<float>(column + k);
    }
    return entry;
  }

  bool Received(int written, const char*& problem) const {
    if (received_.size() != static_cast<std::size_t>(written)) {
      problem = shape_.tag;  // another number of entries
      return false;
    }
    for (int k = 0; k < written; ++k) {
      Record entry = received_[k];
      entry.entry.text = entry.text;
      if (!SameEntry(entry.entry, Expected(k))) {
        problem = shape_.tag;
        return false;
      }
    }
    return true;
  }

  void Supply() {
    supply_ = true;
    calls_ = 0;
  }
  void Collect() { supply_ = false; }
  int Written() const { return calls_; }

 private:
  struct Record {
    Entry entry;
    char text[64];
  };
  const Shape& shape_;
  Vorn_Channel* text_;
  Vorn_Channel* value_;
  Vorn_Channel* vector_;
  Vorn_Channel* matrix_;
  bool supply_ = true;
  int calls_ = 0;
  std::vector<Record> received_;
};

namespace {

const char* const kPlayers[] = {"Ann", "Bob"};
const char* const kLabels[] = {"crate", "lamp with shade", "wheel"};
const char* const kParts[] = {"axle", "spoke"};
const char* const kItems[] = {"key"};
const float kScores[] = {12.5f, 7.0f};
const float kWeights[] = {0.5f, 120.0f, 3.25e-5f, 1.5e+07f};
const float kAreas[] = {16.0f, -2.5f};
const float kNever[] = {1.0f};

}  // namespace

Vorn_Channel* Tree::Keep(Vorn_Channel* channel) {
  owned_.push_back(channel);
  return channel;
}

Vorn_Channel* Tree::Directory(Vorn_Channel* parent, const Shape& shape) {
  Vorn_Channel* directory = Keep(factories_.newDirectory());
  if (parent) parent->AttachChild(kSubDirectories, directory);
  Vorn_Channel* tag = Keep(factories_.newText());
  static_cast<Lum_StringChannel*>(tag)->SetString(shape.tag);
  directory->AttachChild(kTag, tag);
  if (shape.count >= 0) directory->AttachChild(kCount, Keep(new Lum_ValueChannel(shape.count)));
  directory->AttachChild(kCurrentIndex, Keep(new Lum_ValueChannel));

  const auto data = [&](const char* name, Vorn_Channel* channel) -> Vorn_Channel* {
    if (!name) return nullptr;
    Keep(channel)->SetChannelName(name);
    directory->AttachChild(kData, channel);
    return channel;
  };
  Vorn_Channel* text = shape.textName ? data(shape.textName, factories_.newText()) : nullptr;
  Vorn_Channel* value = data(shape.valueName, shape.valueName ? new Lum_ValueChannel : nullptr);
  Vorn_Channel* vector = data(shape.vectorName, shape.vectorName ? new Lum_VectorChannel : nullptr);
  Vorn_Channel* matrix = data(shape.matrixName, shape.matrixName ? new Lum_MatrixChannel : nullptr);
  auto* iteration = new Iteration(shape, text, value, vector, matrix);
  Keep(iteration);
  iterations_.push_back(iteration);
  directory->AttachChild(kCallEachIteration, iteration);
  return directory;
}

Tree::Tree(const Sample& sample, const Factories& factories) : factories_(factories) {
  // Name, Count (-1: no Count child), the data channels' names, texts, values, seed.
  using Shape = Tree::Shape;
  static const Shape players = {"Players", 2, "Name",  "Score", nullptr, nullptr,
                                kPlayers,  2, kScores, 2,       0};
  static const Shape things = {"Things", 3, "Label",  "Weight", "Position", "Transform",
                               kLabels,  3, kWeights, 4,        1.5f};
  static const Shape parts = {"Parts", 2, "Name", nullptr, nullptr, nullptr,
                              kParts,  2, kNever, 1,       0};
  static const Shape none = {"Nothing", 0, nullptr, "Never", nullptr, nullptr,
                             kItems,    1, kNever,  1,       0};
  static const Shape regions = {"Regions", 2, "Title", nullptr, nullptr, nullptr,
                                kLabels,   3, kNever,  1,       0};
  static const Shape rooms = {"Rooms", 3, nullptr, "Area", "Centre", nullptr,
                              kItems,  1, kAreas,  2,      20};
  static const Shape items = {"Items", -1, "Label", nullptr, nullptr, nullptr,
                              kItems,  1,  kNever,  1,       0};

  if (std::strncmp(sample.name, "players", 7) == 0) {
    top_ = Directory(nullptr, players);
  } else if (std::strcmp(sample.name, "all_kinds_scrambled") == 0) {
    top_ = Directory(nullptr, things);
    Directory(top_, parts);
    Directory(top_, none);
    static_cast<Lum_StringChannel*>(top_)->SetString("Saved game, version 1");
  } else {
    top_ = Directory(nullptr, regions);
    Directory(Directory(top_, rooms), items);
  }
}

Tree::~Tree() {
  for (auto it = owned_.rbegin(); it != owned_.rend(); ++it)
    delete *it;
}

void Tree::Supply() {
  for (Iteration* iteration : iterations_)
    iteration->Supply();
}

void Tree::Collect() {
  for (Iteration* iteration : iterations_)
    iteration->Collect();
}

bool Tree::Received(const Tree& writer, const char*& problem) const {
  for (std::size_t i = 0; i < iterations_.size(); ++i) {
    if (!iterations_[i]->Received(writer.iterations_[i]->Written(), problem)) return false;
  }
  return true;
}

}  // namespace samples
