// What one run measured, and the table, JSON file and chart data made of it.
#pragma once

#include <string>
#include <vector>

namespace bench {

enum class Contestant { kOurs, kPugixml, kTinyxml2, kFloor };
enum class Op { kWrite, kRead };
constexpr Contestant kContestants[] = {Contestant::kOurs, Contestant::kPugixml,
                                       Contestant::kTinyxml2, Contestant::kFloor};
const char* ContestantName(Contestant contestant);
const char* OpName(Op op);

// One contestant doing one operation on one workload at one size.
struct Figures {
  std::string workload;
  int size = 0;  // index into the run's sizes, smallest first
  Contestant contestant = Contestant::kOurs;
  Op op = Op::kWrite;
  double bytes = 0;             // our package's size, the byte count of every contestant
  double ownBytes = 0;          // the size of the contestant's own text
  std::vector<double> seconds;  // per operation, one a repetition
  int batch = 1;                // operations a timed iteration runs, so that small ones show
  double allocations = -1;      // per timed operation
  double peakHeap = -1;         // heap bytes above those before a first, untimed operation
  std::string error;

  double Median() const;
  double MegabytesPerSecond() const { return seconds.empty() ? 0 : bytes / 1e6 / Median(); }
};

struct Machine {
  std::string cpu;
  int cores = 0;
  std::string date;
};
Machine ThisMachine();

// Prints the tables to stdout and writes results.json, results.txt, throughput.dat, ratios.dat
// and chart-title.gp into `folder`, unless it is empty.
void Report(const std::vector<Figures>& figures, const std::vector<std::string>& workloads,
            const Machine& machine, const std::string& folder);

}  // namespace bench
