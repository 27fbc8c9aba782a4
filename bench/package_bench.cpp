// The package benchmark: our codec against pugixml and tinyxml2, and against the cost of the
// number conversions alone, on four workloads at several sizes, in one run of one program.
// Usage: package_bench [--out=FOLDER] [Google Benchmark flags]
#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "bench/floors.h"
#include "bench/our_package.h"
#include "bench/peers.h"
#include "bench/report.h"
#include "bench/workload.h"
#include "tests/allocation_counter.h"

namespace bench {

namespace {

constexpr Shape kShapes[] = {Shape::kGameState, Shape::kNested, Shape::kTextHeavy,
                             Shape::kAdversarial, Shape::kPlayers};
// Package sizes in MB of 10^6 bytes; the last one is at least 50 MB. The Players package has the
// first size only, and its own 184 bytes.
constexpr double kSizes[] = {0.004, 0.064, 1, 8, 50};
constexpr int kSizeCount = sizeof(kSizes) / sizeof(kSizes[0]);

std::size_t PackageSize(const Workload& workload) {
  if (!workload.Writes()) return workload.hostileText.size();
  Values output(workload.levels, 0, false);
  return static_cast<std::size_t>(OurPackage(workload, output).Measure() - 1);
}

// The workload whose package comes closest to `megabytes`, and not below it at the largest size.
Workload Calibrated(Shape shape, double megabytes) {
  if (shape == Shape::kPlayers) return MakeWorkload(shape, 2);
  const int sample = shape == Shape::kNested ? 20 : 2000;
  double scale =
      sample * megabytes * 1e6 / static_cast<double>(PackageSize(MakeWorkload(shape, sample)));
  for (;;) {
    Workload workload = MakeWorkload(shape, static_cast<int>(std::ceil(scale)));
    const double bytes = static_cast<double>(PackageSize(workload));
    if (bytes >= megabytes * 1e6 * 0.99) return workload;
    scale *= megabytes * 1e6 / bytes * 1.005;
  }
}

// One workload at one size, with every contestant's text and what each is checked against.
struct Instance {
  Instance(Shape shape, double megabytes)
      : workload(Calibrated(shape, megabytes)),
        output(workload.levels, workload.source.TextBytes(), false),
        ours(workload, output),
        checksum(workload.source.Checksum()),
        numbersChecksum(workload.source.Checksum(false)) {
    if (workload.Writes()) {
      package.resize(static_cast<std::size_t>(ours.Measure()));
      ours.Write(package.data(), static_cast<int>(package.size()));
      package.pop_back();
      PugixmlWrite(workload, pugixmlText);
      Tinyxml2Write(workload, printer);
      tinyxml2Text.assign(printer.CStr(), static_cast<std::size_t>(printer.CStrSize() - 1));
    } else {
      package.assign(workload.hostileText.begin(), workload.hostileText.end());
      pugixmlText = tinyxml2Text = workload.hostileText;
    }
    bytes = package.size();
    package.push_back('\0');
    writeBuffer.resize(package.size());
    numbers.resize(workload.FloatCount() * 16);
    numbers.resize(FormatNumbers(workload, numbers.data()));
    scratch.resize(numbers.size() + 16);
  }

  Workload workload;
  Values output;
  OurPackage ours;
  std::uint64_t checksum;
  std::uint64_t numbersChecksum;
  std::vector<char> package;  // ours, with its NUL: what our reader reads
  std::size_t bytes = 0;      // without the NUL
  std::string pugixmlText;
  std::string tinyxml2Text;
  std::string numbers;  // the floors' number texts
  // Where writers write, kept from one operation to the next as a caller would keep it.
  std::vector<char> writeBuffer;
  std::string pugixmlOutput;
  TabPrinter printer;
  std::vector<char> scratch;
};

std::unique_ptr<Instance> current;
Shape currentShape;
int currentSize = -1;

// Benchmarks run in registration order, so one instance at a time is alive.
Instance& Get(Shape shape, int size) {
  if (!current || currentShape != shape || currentSize != size) {
    current.reset();
    current = std::make_unique<Instance>(shape, kSizes[size]);
    currentShape = shape;
    currentSize = size;
  }
  return *current;
}

std::map<std::string, Figures> figures;
std::vector<std::string> order;

// Heap bytes the operation takes above those before it, at its peak.
template <typename Operation>
double PeakHeap(Operation operation) {
  const std::size_t before = allocation_counter::LiveBytes();
  allocation_counter::ResetPeak();
  operation();
  return static_cast<double>(allocation_counter::PeakBytes() - before);
}

bool ReadBack(Instance& in, bool numbersOnly) {
  const bool right = numbersOnly ? in.output.Checksum(false) == in.numbersChecksum
                                 : in.output.Checksum() == in.checksum;
  in.output.Poison();
  return right;
}

// A contestant's operation: a first one with objects of its own, whose peak heap is measured,
// then the timed one, and the untimed check of what the timed one gave.
struct Task {
  std::function<bool()> first;
  std::function<void()> run;
  std::function<bool()> check;
};

// A task whose first run is the timed one, on the same objects.
template <typename Run, typename Check>
Task FirstAsTimed(Run run, Check check) {
  return {[run, check] {
            run();
            return check();
          },
          run, check};
}

Task WriteTask(Instance& in, Contestant contestant) {
  switch (contestant) {
    case Contestant::kOurs: {
      auto result = std::make_shared<int>(0);
      return {
          [&in] {
            const int size = in.ours.Measure();
            std::vector<char> buffer(static_cast<std::size_t>(size));
            return in.ours.Write(buffer.data(), size) == size && buffer == in.package;
          },
          [&in, result] {
            *result = in.ours.Write(in.writeBuffer.data(), static_cast<int>(in.writeBuffer.size()));
            benchmark::DoNotOptimize(in.writeBuffer.data());
          },
          [&in, result] {
            return *result == static_cast<int>(in.package.size()) && in.writeBuffer == in.package;
          }};
    }
    case Contestant::kPugixml:
      return {[&in] {
                std::string text;
                PugixmlWrite(in.workload, text);
                return text == in.pugixmlText;
              },
              [&in] {
                PugixmlWrite(in.workload, in.pugixmlOutput);
                benchmark::DoNotOptimize(in.pugixmlOutput.data());
              },
              [&in] { return in.pugixmlOutput == in.pugixmlText; }};
    case Contestant::kTinyxml2:
      return {[&in] {
                TabPrinter printer;
                Tinyxml2Write(in.workload, printer);
                return in.tinyxml2Text == printer.CStr();
              },
              [&in] {
                Tinyxml2Write(in.workload, in.printer);
                benchmark::DoNotOptimize(in.printer.CStr());
              },
              [&in] { return in.tinyxml2Text == in.printer.CStr(); }};
    case Contestant::kFloor:
      return FirstAsTimed(
          [&in] {
            const std::size_t length = FormatNumbers(in.workload, in.scratch.data());
            std::memcpy(in.writeBuffer.data(), in.package.data(), in.bytes);
            benchmark::DoNotOptimize(length);
            benchmark::DoNotOptimize(in.writeBuffer.data());
          },
          [&in] {
            return std::memcmp(in.scratch.data(), in.numbers.data(), in.numbers.size()) == 0 &&
                   std::memcmp(in.writeBuffer.data(), in.package.data(), in.bytes) == 0;
          });
  }
  return {};
}

using PeerRead = bool (*)(const Workload&, const std::string&, Values&);

Task ReadTask(Instance& in, Contestant contestant) {
  const auto checkAll = [&in] { return ReadBack(in, false); };
  switch (contestant) {
    case Contestant::kOurs:
      return FirstAsTimed(
          [&in] {
            benchmark::DoNotOptimize(
                in.ours.Read(in.package.data(), static_cast<int>(in.package.size())));
          },
          checkAll);
    case Contestant::kPugixml:
    case Contestant::kTinyxml2: {
      // Each read parses into a document of its own.
      const bool pugixml = contestant == Contestant::kPugixml;
      const PeerRead read = pugixml ? PugixmlRead : Tinyxml2Read;
      const std::string& text = pugixml ? in.pugixmlText : in.tinyxml2Text;
      auto parsed = std::make_shared<bool>(false);
      return FirstAsTimed(
          [&in, &text, read, parsed] { *parsed = read(in.workload, text, in.output); },
          [checkAll, parsed] { return checkAll() && *parsed; });
    }
    case Contestant::kFloor:
      return FirstAsTimed(
          [&in] {
            ParseNumbers(in.workload, in.numbers.data(), in.numbers.size(), in.output);
            CopyTexts(in.workload, in.output);
            benchmark::DoNotOptimize(CountTags(in.package.data(), in.bytes));
          },
          [&in] { return ReadBack(in, false); });
  }
  return {};
}

const std::string& OwnText(const Instance& in, Contestant contestant) {
  static const std::string none;
  return contestant == Contestant::kPugixml    ? in.pugixmlText
         : contestant == Contestant::kTinyxml2 ? in.tinyxml2Text
                                               : none;
}

void Run(benchmark::State& state, const std::string& name, Shape shape, int size,
         Contestant contestant, Op op) {
  Instance& in = Get(shape, size);
  Figures& f = figures[name];
  f.bytes = static_cast<double>(in.bytes);
  const std::string& own = OwnText(in, contestant);
  f.ownBytes = own.empty() ? f.bytes : static_cast<double>(own.size());
  Task task = op == Op::kWrite ? WriteTask(in, contestant) : ReadTask(in, contestant);
  // GoogleBenchmark calls this more than once; the first call measures and checks a first run.
  if (f.allocations < 0) {
    in.output.Poison();
    bool right = false;
    const double peak = PeakHeap([&] { right = task.first(); });
    if (contestant != Contestant::kFloor) f.peakHeap = peak;
    if (!right) f.error = "the first run gave a wrong result";
  }
  if (!f.error.empty()) {
    state.SkipWithError(f.error.c_str());
    return;
  }

  // Pausing the timer for the check costs more than a small operation: each timed iteration
  // runs a batch of about a megabyte's worth of operations, and the last one is checked.
  f.batch =
      static_cast<int>(std::max<std::size_t>(1, 1000000 / std::max<std::size_t>(in.bytes, 1)));
  std::size_t allocations = 0;
  for (auto _ : state) {
    const std::size_t before = allocation_counter::Count();
    for (int i = 0; i < f.batch; ++i) {
      in.output.Rewind();
      task.run();
    }
    benchmark::ClobberMemory();
    allocations += allocation_counter::Count() - before;
    state.PauseTiming();
    const bool right = task.check();
    state.ResumeTiming();
    if (!right) {
      f.error = "a timed run gave a wrong result";
      state.SkipWithError(f.error.c_str());
      break;
    }
  }
  const auto iterations = std::max<benchmark::IterationCount>(state.iterations(), 1);
  f.allocations = static_cast<double>(allocations) / static_cast<double>(iterations) / f.batch;
  state.SetBytesProcessed(static_cast<std::int64_t>(iterations) * f.batch *
                          static_cast<std::int64_t>(in.bytes));
  state.counters["allocs"] = f.allocations;
}

std::string SizeName(double megabytes) {
  char name[32];
  if (megabytes < 1) {
    std::snprintf(name, sizeof(name), "%gKB", megabytes * 1000);
  } else {
    std::snprintf(name, sizeof(name), "%gMB", megabytes);
  }
  return name;
}

void Register() {
  for (Shape shape : kShapes) {
    for (int size = 0; size < (shape == Shape::kPlayers ? 1 : kSizeCount); ++size) {
      for (Op op : {Op::kWrite, Op::kRead}) {
        if (op == Op::kWrite && shape == Shape::kAdversarial)
          continue;  // hostile texts are read only
        for (Contestant contestant : kContestants) {
          char name[128];
          std::snprintf(name, sizeof(name), "%s/%s/%s/%s", ShapeName(shape),
                        shape == Shape::kPlayers ? "184B" : SizeName(kSizes[size]).c_str(),
                        ContestantName(contestant), OpName(op));
          Figures& f = figures[name];
          f.workload = ShapeName(shape);
          f.size = size;
          f.contestant = contestant;
          f.op = op;
          order.push_back(name);
          benchmark::RegisterBenchmark(name, [name = std::string(name), shape, size, contestant,
                                              op](benchmark::State& state) {
            Run(state, name, shape, size, contestant, op);
          })->Unit(benchmark::kMillisecond);
        }
      }
    }
  }
}

// Keeps every repetition's time and shows progress as it goes.
class Collector : public benchmark::BenchmarkReporter {
 public:
  bool ReportContext(const Context&) override { return true; }
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& run : runs) {
      if (run.run_type != Run::RT_Iteration) continue;
      const std::string name = run.run_name.function_name;
      Figures& f = figures[name];
      if (run.error_occurred) {
        std::fprintf(stderr, "%-40s error: %s\n", name.c_str(), run.error_message.c_str());
        continue;
      }
      const double seconds =
          run.cpu_accumulated_time / static_cast<double>(run.iterations) / f.batch;
      f.seconds.push_back(seconds);
      std::fprintf(stderr, "%-40s %9.2f ms %9.1f MB/s %6lld iterations\n", name.c_str(),
                   seconds * 1e3, f.bytes / 1e6 / seconds, static_cast<long long>(run.iterations));
    }
  }
};

}  // namespace

}  // namespace bench

int main(int argc, char** argv) {
  using namespace bench;
  // Defaults first, so that the caller's flags win.
  std::vector<char*> arguments = {argv[0]};
  std::string folder;  // no files without --out: a run from the sources left them there
  char repetitions[] = "--benchmark_repetitions=3";
  char minTime[] = "--benchmark_min_time=0.2";
  arguments.push_back(repetitions);
  arguments.push_back(minTime);
  for (int i = 1; i < argc; ++i) {
    if (std::strncmp(argv[i], "--out=", 6) == 0) {
      folder = argv[i] + 6;
    } else {
      arguments.push_back(argv[i]);
    }
  }
  int count = static_cast<int>(arguments.size());
  // pugixml allocates with malloc unless told otherwise: its blocks count as everyone's do.
  pugi::set_memory_management_functions(allocation_counter::Allocate, allocation_counter::Release);
  Register();
  benchmark::Initialize(&count, arguments.data());
  if (benchmark::ReportUnrecognizedArguments(count, arguments.data())) return 1;
  Collector collector;
  benchmark::RunSpecifiedBenchmarks(&collector);
  benchmark::Shutdown();
  current.reset();

  std::vector<Figures> all;
  for (const std::string& name : order) {
    if (!figures[name].seconds.empty() || !figures[name].error.empty())
      all.push_back(figures[name]);
  }
  std::vector<std::string> workloads;
  for (Shape shape : kShapes)
    workloads.push_back(ShapeName(shape));
  Report(all, workloads, ThisMachine(), folder);
  for (const Figures& f : all) {
    if (!f.error.empty()) return 1;
  }
  return 0;
}
