#include "bench/report.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <ctime>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>

namespace bench {

namespace {

// The targets the codec is measured against, at every size. Small packages, below a megabyte,
// must beat the fastest peer by kSmallOverPeer in both directions.
constexpr double kWriteOverPeer = 3;
constexpr double kWriteOverFloor = 2.0 / 3;
constexpr double kReadOverPeer = 2;
constexpr double kSmallOverPeer = 3;
constexpr double kReadOverFloor = 0.5;
constexpr double kFlatScaling = 1.25;
constexpr double kLargeBytes = 0.99e6;  // from here on a package counts as large

bool IsSmall(double bytes) { return bytes < kLargeBytes; }

class Table {
 public:
  explicit Table(const std::vector<const Figures*>& figures) : figures_(figures) {}

  const Figures* Find(const std::string& workload, int size, Contestant contestant, Op op) const {
    for (const Figures* f : figures_) {
      if (f->workload == workload && f->size == size && f->contestant == contestant &&
          f->op == op && !f->seconds.empty()) {
        return f;
      }
    }
    return nullptr;
  }
  double Speed(const std::string& workload, int size, Contestant contestant, Op op) const {
    const Figures* f = Find(workload, size, contestant, op);
    return f ? f->MegabytesPerSecond() : NAN;
  }
  double FastestPeer(const std::string& workload, int size, Op op) const {
    return std::fmax(Speed(workload, size, Contestant::kPugixml, op),
                     Speed(workload, size, Contestant::kTinyxml2, op));
  }
  // Time per byte at the largest size over that at the first large one (1 MB).
  double Scaling(const std::string& workload, int largest, Contestant contestant, Op op) const {
    const int first = FirstLarge(workload);
    if (first < 0 || largest <= first) return NAN;
    return Speed(workload, first, contestant, op) / Speed(workload, largest, contestant, op);
  }
  int FirstLarge(const std::string& workload) const {
    for (int size = 0; size <= Largest(workload); ++size) {
      const Figures* f = Find(workload, size, Contestant::kOurs, Op::kRead);
      if (f && !IsSmall(f->bytes)) return size;
    }
    return -1;
  }
  int Largest(const std::string& workload) const {
    int largest = -1;
    for (const Figures* f : figures_) {
      if (f->workload == workload && !f->seconds.empty()) largest = std::max(largest, f->size);
    }
    return largest;
  }

 private:
  std::vector<const Figures*> figures_;
};

std::string Number(double value, const char* format = "%.1f") {
  if (std::isnan(value)) return "-";
  char text[64];
  std::snprintf(text, sizeof(text), format, value);
  return text;
}

std::string Json(double value) {
  return std::isnan(value) || value < 0 ? "null" : Number(value, "%.6g");
}

std::string Quoted(const std::string& text) {
  std::string quoted = "\"";
  for (char c : text) {
    if (c == '"' || c == '\\') quoted += '\\';
    quoted += c;
  }
  return quoted + "\"";
}

std::string Verdict(double value, double target) {
  if (std::isnan(value)) return "-";
  return Number(value, "%.2f") + (value >= target ? " met" : " MISSED");
}

// A package size as people say it: 184 B, 4.0 KB, 1.0 MB.
std::string Size(double bytes) {
  if (bytes < 1e3) return Number(bytes, "%.0f B");
  if (IsSmall(bytes)) return Number(bytes / 1e3, "%.1f KB");
  return Number(bytes / 1e6, "%.1f MB");
}

std::string Megabytes(double bytes) {
  if (bytes < 0) return "-";
  return Number(bytes / 1e6, "%.1f") + " MB";
}

}  // namespace

const char* ContestantName(Contestant contestant) {
  static constexpr const char* kNames[] = {"ours", "pugixml", "tinyxml2", "floor"};
  return kNames[static_cast<int>(contestant)];
}

const char* OpName(Op op) { return op == Op::kWrite ? "write" : "read"; }

double Figures::Median() const {
  std::vector<double> sorted = seconds;
  std::sort(sorted.begin(), sorted.end());
  const std::size_t n = sorted.size();
  return n % 2 ? sorted[n / 2] : (sorted[n / 2 - 1] + sorted[n / 2]) / 2;
}

Machine ThisMachine() {
  Machine machine;
  std::ifstream cpuinfo("/proc/cpuinfo");
  for (std::string line; std::getline(cpuinfo, line);) {
    if (line.rfind("model name", 0) == 0 && machine.cpu.empty()) {
      machine.cpu = line.substr(line.find(':') + 2);
    }
    if (line.rfind("processor", 0) == 0) ++machine.cores;
  }
  if (machine.cores == 0) machine.cores = static_cast<int>(std::thread::hardware_concurrency());
  // Figures of the engine's processor mode must not pass for those of the usual build.
  if constexpr (sizeof(void*) == 4) machine.cpu += ", 32-bit build";
  const std::time_t now = std::time(nullptr);
  char date[32];
  std::strftime(date, sizeof(date), "%Y-%m-%d %H:%M UTC", std::gmtime(&now));
  machine.date = date;
  return machine;
}

void Report(const std::vector<Figures>& all, const std::vector<std::string>& workloads,
            const Machine& machine, const std::string& folder) {
  std::vector<const Figures*> pointers;
  for (const Figures& f : all)
    pointers.push_back(&f);
  const Table table(pointers);
  std::ostringstream out;
  const auto line = [&out](const char* format, auto... values) {
    char text[512];
    std::snprintf(text, sizeof(text), format, values...);
    out << text << '\n';
  };

  line("Machine: %s, %d cores; %s", machine.cpu.c_str(), machine.cores, machine.date.c_str());
  line("MB = 10^6 bytes of our package text, the byte count of every contestant of a workload;");
  line("each time is the median of the repetitions, CPU time per operation.");
  line("");
  line("== Throughput, MB/s");
  line("%-12s %9s %-5s %8s %8s %8s %8s %10s %10s %10s", "workload", "size", "op", "ours", "pugixml",
       "tinyxml2", "floor", "ours/peer", "ours/floor", "ours alloc");
  for (const std::string& w : workloads) {
    for (int size = 0; size <= table.Largest(w); ++size) {
      for (Op op : {Op::kWrite, Op::kRead}) {
        const Figures* ours = table.Find(w, size, Contestant::kOurs, op);
        if (!ours) continue;
        const double speed = ours->MegabytesPerSecond();
        line("%-12s %9s %-5s %8s %8s %8s %8s %10s %10s %10s", w.c_str(), Size(ours->bytes).c_str(),
             OpName(op), Number(speed).c_str(),
             Number(table.Speed(w, size, Contestant::kPugixml, op)).c_str(),
             Number(table.Speed(w, size, Contestant::kTinyxml2, op)).c_str(),
             Number(table.Speed(w, size, Contestant::kFloor, op)).c_str(),
             Number(speed / table.FastestPeer(w, size, op), "%.2f").c_str(),
             Number(speed / table.Speed(w, size, Contestant::kFloor, op), "%.2f").c_str(),
             Number(ours->allocations, "%.0f").c_str());
      }
    }
  }

  line("");
  line("== Small packages: time per operation, microseconds (peers build or parse their document)");
  line("%-12s %9s %-5s %9s %9s %9s %9s %10s", "workload", "size", "op", "ours", "pugixml",
       "tinyxml2", "floor", "peer/ours");
  for (const std::string& w : workloads) {
    for (int size = 0; size <= table.Largest(w); ++size) {
      for (Op op : {Op::kWrite, Op::kRead}) {
        const Figures* ours = table.Find(w, size, Contestant::kOurs, op);
        if (!ours || !IsSmall(ours->bytes)) continue;
        std::string cells[4];
        int i = 0;
        double fastestPeer = NAN;
        for (Contestant c : kContestants) {
          const Figures* f = table.Find(w, size, c, op);
          cells[i++] = f ? Number(f->Median() * 1e6, "%.2f") : "-";
          if (f && (c == Contestant::kPugixml || c == Contestant::kTinyxml2)) {
            fastestPeer = std::fmin(std::isnan(fastestPeer) ? INFINITY : fastestPeer, f->Median());
          }
        }
        line("%-12s %9s %-5s %9s %9s %9s %9s %10s", w.c_str(), Size(ours->bytes).c_str(),
             OpName(op), cells[0].c_str(), cells[1].c_str(), cells[2].c_str(), cells[3].c_str(),
             Number(fastestPeer / ours->Median(), "%.2f").c_str());
      }
    }
  }

  line("");
  line("== Peak heap of a first operation on the largest package, above what existed before");
  line("   (reads: the text exists already; writes: the output text counts)");
  line("%-12s %7s %-5s %16s %16s %16s", "workload", "MB", "op", "ours", "pugixml", "tinyxml2");
  for (const std::string& w : workloads) {
    const int largest = table.Largest(w);
    for (Op op : {Op::kWrite, Op::kRead}) {
      const Figures* ours = table.Find(w, largest, Contestant::kOurs, op);
      if (!ours) continue;
      std::string cells[3];
      int i = 0;
      for (Contestant c : {Contestant::kOurs, Contestant::kPugixml, Contestant::kTinyxml2}) {
        const Figures* f = table.Find(w, largest, c, op);
        cells[i++] =
            f ? Megabytes(f->peakHeap) + " " + Number(f->peakHeap / f->bytes, "%.2fx") : "-";
      }
      line("%-12s %7.1f %-5s %16s %16s %16s", w.c_str(), ours->bytes / 1e6, OpName(op),
           cells[0].c_str(), cells[1].c_str(), cells[2].c_str());
    }
  }

  line("");
  line("== Allocations per operation on the largest package");
  line("%-12s %-5s %10s %10s %10s", "workload", "op", "ours", "pugixml", "tinyxml2");
  for (const std::string& w : workloads) {
    const int largest = table.Largest(w);
    for (Op op : {Op::kWrite, Op::kRead}) {
      if (!table.Find(w, largest, Contestant::kOurs, op)) continue;
      std::string cells[3];
      int i = 0;
      for (Contestant c : {Contestant::kOurs, Contestant::kPugixml, Contestant::kTinyxml2}) {
        const Figures* f = table.Find(w, largest, c, op);
        cells[i++] = f ? Number(f->allocations, "%.0f") : "-";
      }
      line("%-12s %-5s %10s %10s %10s", w.c_str(), OpName(op), cells[0].c_str(), cells[1].c_str(),
           cells[2].c_str());
    }
  }

  line("");
  line("== Scaling: time per byte at the largest size over that at 1 MB (flat is 1.00)");
  line("%-12s %-5s %13s %8s %8s %8s %8s", "workload", "op", "MB", "ours", "pugixml", "tinyxml2",
       "floor");
  for (const std::string& w : workloads) {
    const int largest = table.Largest(w);
    for (Op op : {Op::kWrite, Op::kRead}) {
      const int first = table.FirstLarge(w);
      const Figures* small = table.Find(w, first, Contestant::kOurs, op);
      const Figures* large = table.Find(w, largest, Contestant::kOurs, op);
      if (!small || !large || largest <= first) continue;
      const std::string sizes = Number(small->bytes / 1e6) + " -> " + Number(large->bytes / 1e6);
      line("%-12s %-5s %13s %8s %8s %8s %8s", w.c_str(), OpName(op), sizes.c_str(),
           Number(table.Scaling(w, largest, Contestant::kOurs, op), "%.2f").c_str(),
           Number(table.Scaling(w, largest, Contestant::kPugixml, op), "%.2f").c_str(),
           Number(table.Scaling(w, largest, Contestant::kTinyxml2, op), "%.2f").c_str(),
           Number(table.Scaling(w, largest, Contestant::kFloor, op), "%.2f").c_str());
    }
  }

  line("");
  line("== Targets at every size: ratios of throughput, the same as of time per operation; below");
  line("   1 MB both directions must reach %.0f times the fastest peer; scaling of ours over",
       kSmallOverPeer);
  line("   1 MB to the largest size, the worse of write and read");
  line("%-12s %9s %14s %16s %14s %14s %8s %14s", "workload", "size", "write/peer",
       "write/floor>=.67", "read/peer", "read/floor>=.5", "allocs", "scaling<=1.25");
  std::ostringstream targets;
  for (const std::string& w : workloads) {
    const int largest = table.Largest(w);
    for (int size = 0; size <= largest; ++size) {
      const Figures* any = table.Find(w, size, Contestant::kOurs, Op::kRead);
      if (!any) continue;
      const bool small = IsSmall(any->bytes);
      const auto ratio = [&](Op op, bool floor) {
        const double ours = table.Speed(w, size, Contestant::kOurs, op);
        return ours / (floor ? table.Speed(w, size, Contestant::kFloor, op)
                             : table.FastestPeer(w, size, op));
      };
      double allocations = 0;
      for (Op op : {Op::kWrite, Op::kRead}) {
        if (const Figures* f = table.Find(w, size, Contestant::kOurs, op))
          allocations += f->allocations;
      }
      double scaling = NAN;
      if (size == largest) {
        for (Op op : {Op::kWrite, Op::kRead}) {
          const double s = table.Scaling(w, largest, Contestant::kOurs, op);
          if (!std::isnan(s)) scaling = std::isnan(scaling) ? s : std::fmax(scaling, s);
        }
      }
      const double writeTarget = small ? kSmallOverPeer : kWriteOverPeer;
      const double readTarget = small ? kSmallOverPeer : kReadOverPeer;
      const double ratios[4] = {ratio(Op::kWrite, false), ratio(Op::kWrite, true),
                                ratio(Op::kRead, false), ratio(Op::kRead, true)};
      line("%-12s %9s %14s %16s %14s %14s %8s %14s", w.c_str(), Size(any->bytes).c_str(),
           (Verdict(ratios[0], writeTarget) +
            (std::isnan(ratios[0]) ? "" : Number(writeTarget, "/%.0f")))
               .c_str(),
           Verdict(ratios[1], kWriteOverFloor).c_str(),
           (Verdict(ratios[2], readTarget) + Number(readTarget, "/%.0f")).c_str(),
           Verdict(ratios[3], kReadOverFloor).c_str(),
           allocations == 0 ? "0 met" : (Number(allocations, "%.0f") + " MISSED").c_str(),
           (std::isnan(scaling)
                ? "-"
                : Number(scaling, "%.2f") + (scaling <= kFlatScaling ? " met" : " MISSED"))
               .c_str());
      targets << (targets.tellp() > 0 ? ",\n    " : "") << "{\"workload\": " << Quoted(w)
              << ", \"size\": " << size << ", \"bytes\": " << Json(any->bytes)
              << ", \"write_over_peer\": " << Json(ratios[0])
              << ", \"write_over_peer_target\": " << writeTarget
              << ", \"write_over_floor\": " << Json(ratios[1])
              << ", \"read_over_peer\": " << Json(ratios[2])
              << ", \"read_over_peer_target\": " << readTarget
              << ", \"read_over_floor\": " << Json(ratios[3])
              << ", \"allocations\": " << Json(allocations) << ", \"scaling\": " << Json(scaling)
              << "}";
    }
  }
  for (const Figures& f : all) {
    if (!f.error.empty()) {
      line("ERROR %s %s %s: %s", f.workload.c_str(), ContestantName(f.contestant), OpName(f.op),
           f.error.c_str());
    }
  }
  std::fputs(out.str().c_str(), stdout);
  if (folder.empty()) return;
  std::ofstream(folder + "/results.txt") << out.str();

  std::ofstream json(folder + "/results.json");
  json << "{\n  \"machine\": {\"cpu\": " << Quoted(machine.cpu) << ", \"cores\": " << machine.cores
       << ", \"date\": " << Quoted(machine.date) << "},\n"
       << "  \"units\": {\"bytes\": \"our package's size, for every contestant\", "
          "\"megabyte\": 1000000, \"seconds\": \"CPU time per operation, one a repetition\", "
          "\"peak_heap_bytes\": \"above the heap before a first operation\"},\n"
       << "  \"targets\": {\"write_over_peer\": " << kWriteOverPeer
       << ", \"write_over_floor\": " << Json(kWriteOverFloor)
       << ", \"read_over_peer\": " << kReadOverPeer << ", \"small_over_peer\": " << kSmallOverPeer
       << ", \"read_over_floor\": " << kReadOverFloor << ", \"scaling\": " << kFlatScaling
       << "},\n  \"figures\": [";
  for (std::size_t i = 0; i < all.size(); ++i) {
    const Figures& f = all[i];
    json << (i ? "," : "") << "\n    {\"workload\": " << Quoted(f.workload)
         << ", \"size\": " << f.size << ", \"contestant\": " << Quoted(ContestantName(f.contestant))
         << ", \"op\": " << Quoted(OpName(f.op)) << ", \"bytes\": " << Json(f.bytes)
         << ", \"own_bytes\": " << Json(f.ownBytes) << ", \"seconds\": [";
    for (std::size_t r = 0; r < f.seconds.size(); ++r)
      json << (r ? ", " : "") << Json(f.seconds[r]);
    json << "], \"megabytes_per_second\": "
         << Json(f.seconds.empty() ? NAN : f.MegabytesPerSecond())
         << ", \"allocations_per_op\": " << Json(f.allocations)
         << ", \"peak_heap_bytes\": " << Json(f.peakHeap)
         << ", \"error\": " << (f.error.empty() ? "null" : Quoted(f.error)) << "}";
  }
  json << "\n  ],\n  \"targets_by_size\": [\n    " << targets.str() << "\n  ]\n}\n";

  // One block a workload and operation: package MB, then MB/s of each contestant.
  std::ofstream data(folder + "/throughput.dat");
  for (const std::string& w : workloads) {
    for (Op op : {Op::kWrite, Op::kRead}) {
      if (!table.Find(w, 0, Contestant::kOurs, op)) continue;
      data << "# " << w << ' ' << OpName(op) << "\n";
      for (int size = 0; size <= table.Largest(w); ++size) {
        const Figures* ours = table.Find(w, size, Contestant::kOurs, op);
        if (!ours) continue;
        data << ours->bytes / 1e6;
        for (Contestant c : kContestants) {
          const double speed = table.Speed(w, size, c, op);
          data << ' ' << (std::isnan(speed) ? std::string("NaN") : Number(speed, "%.2f"));
        }
        data << '\n';
      }
      data << "\n\n";
    }
  }
  // One block a workload: package MB, then ours over the fastest peer and over the floor, writing
  // and reading.
  std::ofstream ratios(folder + "/ratios.dat");
  for (const std::string& w : workloads) {
    if (table.Largest(w) < 1) continue;
    ratios << "# " << w << " ratios\n";
    for (int size = 0; size <= table.Largest(w); ++size) {
      const Figures* ours = table.Find(w, size, Contestant::kOurs, Op::kRead);
      if (!ours) continue;
      ratios << ours->bytes / 1e6;
      for (Op op : {Op::kWrite, Op::kRead}) {
        const double speed = table.Speed(w, size, Contestant::kOurs, op);
        for (const double other :
             {table.FastestPeer(w, size, op), table.Speed(w, size, Contestant::kFloor, op)}) {
          const double ratio = speed / other;
          ratios << ' ' << (std::isnan(ratio) ? std::string("NaN") : Number(ratio, "%.3f"));
        }
      }
      ratios << '\n';
    }
    ratios << "\n\n";
  }
  std::ofstream(folder + "/chart-title.gp")
      << "machine = "
      << Quoted(machine.cpu + ", " + std::to_string(machine.cores) + " cores, " + machine.date)
      << "\n";
}

}  // namespace bench
