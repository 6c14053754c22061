// `veltrane bench --floor`: the bare-GL replica draws the effect's own picture (the bench stops
// when it does not), and every row gets its floor times.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "cli_runner.h"

namespace {

TEST(BenchFloor, ReplicaDrawsTheRendersPictureForEveryLayout) {
  CliRun run = runCli({"bench", "--plugin", VELTRANE_MODULE_PATH, "--sizes", "96x54", "--cuts",
                       "1,3,8", "--repeat", "1", "--warmup", "0", "--floor", "--json"});
  ASSERT_EQ(run.status, 0) << run.err;
  nlohmann::json rows = nlohmann::json::parse(run.out)["results"];
  ASSERT_EQ(rows.size(), 6u);
  for (const nlohmann::json& row : rows) {
    EXPECT_GT(row["floorMs"].get<double>(), 0.0) << row;
    EXPECT_GT(row["floorCpuMs"].get<double>(), 0.0) << row;
    // Layer rows show other pictures than the replica's own source; only own rows compare.
    EXPECT_EQ(row.contains("floorDifference"), row["inputs"] == "own") << row;
    if (row["inputs"] == "own") {
      EXPECT_LE(row["floorDifference"].get<int>(), 8) << row;
    }
  }
}

}  // namespace
