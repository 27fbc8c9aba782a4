#include "tools/datapack/package_model.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using datapack::Entries;
using datapack::Kind;
using datapack::Shape;
using datapack::Table;

// Zones of players: each zone a text and a number, each player a text, a vector and a matrix.
Shape Zones() {
  Shape players{
      "Players", {{"Name", Kind::kText}, {"At", Kind::kVector}, {"M", Kind::kMatrix}}, {}};
  return {"Zones", {{"Title", Kind::kText}, {"Id", Kind::kValue}}, {players}};
}

struct Zone {
  std::string title;
  std::vector<std::string> players;
};

void Add(Table& zones, const Zone& zone, float id) {
  Table& players = zones.Directory(0);
  for (std::size_t i = 0; i < zone.players.size(); ++i) {
    const float f = static_cast<float>(i);
    const D3DXMATRIX matrix{{{f, 0, 0, 0}, {0, f, 0, 0}, {0, 0, f, 0}, {0, 0, 0, id}}};
    players.Add(0, std::string_view(zone.players[i]));
    players.Add(1, D3DXVECTOR3{f, id, -f});
    players.Add(2, &matrix);
    players.EndEntry();
  }
  zones.Add(0, std::string_view(zone.title));
  zones.Add(1, id);
  zones.EndEntry();
}

// Texts keep every byte, a NUL within one included, and each entry finds its own sub-entries:
// none, one or several, after others or before.
TEST(PackageModelTest, EntriesGiveBackWhatWasAddedWhereverTheyStand) {
  using namespace std::string_literals;
  const std::vector<Zone> zones = {
      {"north", {"ann", "", "bo"}},
      {"", {}},
      {"a\0b"s, {"x\0"s}},
      {std::string(300, 'z'), {"cy", "di", "ed", "fo"}},
  };
  Table table(Zones());
  for (int pass = 0; pass < 2; ++pass) {
    // Cleared, a table is filled again from its start.
    table.Clear();
    for (std::size_t z = 0; z < zones.size(); ++z)
      Add(table, zones[z], static_cast<float>(z) + 0.5f);
    const Entries all = table.All();
    ASSERT_EQ(all.size(), zones.size());
    for (std::size_t z = 0; z < zones.size(); ++z) {
      const float id = static_cast<float>(z) + 0.5f;
      EXPECT_EQ(std::get<std::string_view>(all[z].Value(0)), zones[z].title) << z;
      EXPECT_STREQ(all[z].Text(0), zones[z].title.c_str()) << z;
      EXPECT_EQ(std::get<float>(all[z].Value(1)), id) << z;
      const Entries players = all[z].Directory(0);
      ASSERT_EQ(players.size(), zones[z].players.size()) << z;
      for (std::size_t p = 0; p < players.size(); ++p) {
        const float f = static_cast<float>(p);
        EXPECT_EQ(std::get<std::string_view>(players[p].Value(0)), zones[z].players[p]);
        const auto at = std::get<D3DXVECTOR3>(players[p].Value(1));
        EXPECT_EQ(at.x, f);
        EXPECT_EQ(at.y, id);
        EXPECT_EQ(at.z, -f);
        const D3DXMATRIX& matrix = *std::get<const D3DXMATRIX*>(players[p].Value(2));
        EXPECT_EQ(matrix.m[2][2], f);
        EXPECT_EQ(matrix.m[3][3], id);
      }
    }
  }
}

}  // namespace
