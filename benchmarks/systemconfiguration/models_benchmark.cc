// How fast the models read and write, beside a bare loop over the words and beside Augeas.
//
// Timed is the operation alone: making the stream and freeing the model are not. A line of the result tells
// lines per second, and for the models and the bare loops how many allocations each line costs.
#include <benchmark/benchmark.h>

#include <ctime>
#include <ostream>
#include <sstream>
#include <string>
#include <vector>

#include "allocation_counter.h"
#include "augeas_tree.h"
#include "sample_files.h"
#include "systemconfiguration/systemconfiguration.h"

namespace {

using SystemConfiguration::NSSConfiguration;
using SystemConfiguration::PAMPolicy;
using TextOf = std::string (*)(int lines);

// Of this thread, so that whatever else the machine does at the time counts little.
double ProcessorSeconds() {
  timespec time{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9;
}

// Runs and times one operation, and adds up what it allocates.
class Meter {
 public:
  explicit Meter(benchmark::State& state) : state_(state) {}
  Meter(const Meter&) = delete;
  Meter& operator=(const Meter&) = delete;

  template <class Operation>
  void Measure(const Operation& operation) {
    const std::size_t before = AllocationCount();
    const double begin = ProcessorSeconds();
    operation();
    const double end = ProcessorSeconds();
    allocations_ += AllocationCount() - before;
    state_.SetIterationTime(end - begin);
  }

  ~Meter() {
    const double lines = static_cast<double>(state_.iterations()) * static_cast<double>(state_.range(0));
    state_.SetItemsProcessed(static_cast<std::int64_t>(lines));
    state_.counters["allocations/line"] = static_cast<double>(allocations_) / lines;
  }

 private:
  benchmark::State& state_;
  std::size_t allocations_ = 0;
};

int Lines(const benchmark::State& state) {
  return static_cast<int>(state.range(0));
}

template <class Model>
Model MakeModel();

template <>
PAMPolicy MakeModel() {
  return PAMPolicy("benchmark");
}

template <>
NSSConfiguration MakeModel() {
  return NSSConfiguration();
}

template <class Model, TextOf textOf>
void Read(benchmark::State& state) {
  const std::string text = textOf(Lines(state));
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    std::istringstream stream(text);
    Model model = MakeModel<Model>();
    meter.Measure([&] { stream >> model; });
  }
}

template <TextOf textOf>
void ReadWords(benchmark::State& state) {
  const std::string text = textOf(Lines(state));
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    std::istringstream stream(text);
    std::string word;
    meter.Measure([&] {
      while (stream >> word) benchmark::DoNotOptimize(word.data());
    });
  }
}

void ReadAugeas(benchmark::State& state, const char* lens, TextOf textOf) {
  const std::string text = textOf(Lines(state));
  AugeasTree tree(lens);
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    meter.Measure([&] { tree.Store(text); });
  }
}

template <class Model, TextOf textOf>
Model ReadModel(const benchmark::State& state) {
  std::istringstream stream(textOf(Lines(state)));
  Model model = MakeModel<Model>();
  stream >> model;
  return model;
}

template <class Model, TextOf textOf>
void Write(benchmark::State& state) {
  const Model model = ReadModel<Model, textOf>(state);
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    std::ostringstream stream;
    meter.Measure([&] { stream << model; });
  }
}

// The words of the lines that the model writes, each line flushed, as the model does.
template <class Model, TextOf textOf>
void WriteWords(benchmark::State& state) {
  std::ostringstream written;
  written << ReadModel<Model, textOf>(state);
  const std::vector<std::vector<std::string>> lines = WordsOfLines(written.str());
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    std::ostringstream stream;
    meter.Measure([&] {
      for (const std::vector<std::string>& words : lines) {
        for (const std::string& word : words) stream << word << ' ';
        stream << std::endl;
      }
    });
  }
}

void WriteAugeas(benchmark::State& state, const char* lens, TextOf textOf) {
  AugeasTree tree(lens);
  tree.Store(textOf(Lines(state)));
  Meter meter(state);
  for ([[maybe_unused]] auto iteration : state) {
    meter.Measure([&] { tree.Retrieve(); });
  }
}

void AtEachSize(benchmark::internal::Benchmark* benchmark) {
  benchmark->Arg(20)->Arg(200)->Arg(20'000)->UseManualTime()->Unit(benchmark::kMicrosecond);
}

// Augeas reads a line in the same time whatever the file's length, but the time to write one grows with it.
void AtEachSizeOfAugeas(benchmark::internal::Benchmark* benchmark) {
  benchmark->Arg(20)->Arg(200)->Arg(20'000)->Iterations(3)->UseManualTime()->Unit(benchmark::kMicrosecond);
}

void AtSmallSizesOfAugeas(benchmark::internal::Benchmark* benchmark) {
  benchmark->Arg(20)->Arg(200)->Arg(2'000)->Iterations(3)->UseManualTime()->Unit(benchmark::kMicrosecond);
}

BENCHMARK(ReadWords<PolicyOf>)->Name("policy/read/words")->Apply(AtEachSize);
BENCHMARK(Read<PAMPolicy, PolicyOf>)->Name("policy/read/model")->Apply(AtEachSize);
BENCHMARK_CAPTURE(ReadAugeas, policy, "Pam.lns", PolicyOf)
    ->Name("policy/read/augeas")
    ->Apply(AtEachSizeOfAugeas);
BENCHMARK(WriteWords<PAMPolicy, PolicyOf>)->Name("policy/write/words")->Apply(AtEachSize);
BENCHMARK(Write<PAMPolicy, PolicyOf>)->Name("policy/write/model")->Apply(AtEachSize);
BENCHMARK_CAPTURE(WriteAugeas, policy, "Pam.lns", PolicyOf)
    ->Name("policy/write/augeas")
    ->Apply(AtSmallSizesOfAugeas);

BENCHMARK(ReadWords<SwitchOf>)->Name("switch/read/words")->Apply(AtEachSize);
BENCHMARK(Read<NSSConfiguration, SwitchOf>)->Name("switch/read/model")->Apply(AtEachSize);
BENCHMARK_CAPTURE(ReadAugeas, switch, "Nsswitch.lns", SwitchOf)
    ->Name("switch/read/augeas")
    ->Apply(AtEachSizeOfAugeas);
BENCHMARK(WriteWords<NSSConfiguration, SwitchOf>)->Name("switch/write/words")->Apply(AtEachSize);
BENCHMARK(Write<NSSConfiguration, SwitchOf>)->Name("switch/write/model")->Apply(AtEachSize);
BENCHMARK_CAPTURE(WriteAugeas, switch, "Nsswitch.lns", SwitchOf)
    ->Name("switch/write/augeas")
    ->Apply(AtSmallSizesOfAugeas);

}  // namespace
