// The benchmark program: measures each row, and hands the times to Google Benchmark as counters of that row.
//
// The logger's two functions are defined here and do nothing, so that each trace point pays for its texts and
// for two calls through the dynamic linker. So are the heap's entry points, which count.
//
// A row is measured in rounds. Each takes one slice of time of the operation and one of its floor, right
// after each other, and of each the shortest slice counts: whatever else the machine does hits both alike,
// and a short slice is likely to be spared.
#include "HVLogger.h"
#include "Rows.h"

#include <algorithm>
#include <atomic>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <limits>
#include <thread>

// The silent logger

void HVLog::HVLogger::logLevelMessage(const char* /*function*/, const char* /*file*/, int /*line*/,
                                      const std::string& /*category*/, int /*level*/, char* /*reserved*/,
                                      int /*reserved1*/, int /*reserved2*/, const std::string& /*text*/) {}

void HVLog::HVLogger::traceLevelMessage(const char* /*function*/, const char* /*file*/, int /*line*/,
                                        const std::string& /*category*/, int /*level*/, char* /*reserved*/,
                                        int /*reserved1*/, int /*reserved2*/, const std::string& /*text*/) {}

// The counting heap. `operator new` ends here too.

namespace {

thread_local std::size_t blocksTaken = 0;

} // namespace

extern "C" {

// The C library's own heap, under names that it keeps for this purpose.
void* __libc_malloc(std::size_t size);                    // NOLINT(bugprone-reserved-identifier,cert-*)
void* __libc_calloc(std::size_t nmemb, std::size_t size); // NOLINT(bugprone-reserved-identifier,cert-*)
void* __libc_realloc(void* ptr, std::size_t size);        // NOLINT(bugprone-reserved-identifier,cert-*)

void* malloc(std::size_t size) {
    ++blocksTaken;
    return __libc_malloc(size);
}

void* calloc(std::size_t nmemb, std::size_t size) {
    ++blocksTaken;
    return __libc_calloc(nmemb, size);
}

void* realloc(void* ptr, std::size_t size) {
    ++blocksTaken;
    return __libc_realloc(ptr, size);
}

} // extern "C"

namespace {

// Nanoseconds on a clock. A thread's own clock stands still while the machine does something else, which long
// slices need; what two threads gain shows on the wall clock alone.
double now(clockid_t clock) {
    timespec time{};
    clock_gettime(clock, &time);
    return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
}

double timeOf(const rows::Run& run, std::size_t calls, clockid_t clock) {
    const double start = now(clock);
    run(calls);
    return now(clock) - start;
}

// Shorter than what a scheduler gives, longer by far than reading the clock takes.
constexpr double sliceLength = 100'000;

std::size_t callsPerSlice(const rows::Run& run) {
    std::size_t calls = 1;
    while (timeOf(run, calls, CLOCK_THREAD_CPUTIME_ID) < sliceLength) {
        calls *= 2;
    }
    return calls;
}

// Actively, since waking a thread takes longer than a slice; but the thread that is waited for may need this
// very processor.
void waitFor(const std::atomic<bool>& flag) {
    constexpr unsigned int patience = 1024;
    for (unsigned int i = 1; !flag; ++i) {
        if (i % patience == 0) {
            std::this_thread::yield();
        }
    }
}

// One side of a row, and its shortest slice.
class Side {
public:
    Side(const rows::Run& run, double units) : run_(run), units_(units), calls_(callsPerSlice(run)) {}

    double perUnit() const { return shortest_ / (static_cast<double>(calls_) * units_); }

    double measure() {
        const double time = timeOf(run_, calls_, CLOCK_THREAD_CPUTIME_ID);
        shortest_ = std::min(shortest_, time);
        return time;
    }

private:
    const rows::Run& run_;
    double units_;
    std::size_t calls_;
    double shortest_ = std::numeric_limits<double>::infinity();
};

// One side of a row on two threads: a slice on each of them, one after the other and at once. Where a stack
// and a thread's buffers lie makes a few percent of difference, so both ways take the same steps on both
// threads.
class TwoThreads {
public:
    TwoThreads(const rows::Run& run, double units) : run_(run), units_(units), calls_(callsPerSlice(run)) {}

    double inTurn() const { return perUnit(inTurn_); }
    double atOnce() const { return perUnit(atOnce_); }

    double measure() {
        double inTurn = slice();
        std::atomic<bool> ready{false};
        std::atomic<bool> go{false};
        std::atomic<bool> finished{false};
        std::thread other([&] {
            slice(); // warms the thread's own heap and buffers
            inTurn += slice();
            ready = true;
            waitFor(go);
            slice();
            finished = true;
        });
        waitFor(ready);
        const double start = now(CLOCK_MONOTONIC);
        go = true;
        slice();
        waitFor(finished);
        const double atOnce = now(CLOCK_MONOTONIC) - start;
        other.join();
        inTurn_ = std::min(inTurn_, inTurn);
        atOnce_ = std::min(atOnce_, atOnce);
        return inTurn + atOnce;
    }

private:
    double perUnit(double time) const { return time / (2 * static_cast<double>(calls_) * units_); }
    [[gnu::noinline]] double slice() { return timeOf(run_, calls_, CLOCK_MONOTONIC); }

    const rows::Run& run_;
    double units_;
    std::size_t calls_;
    double inTurn_ = std::numeric_limits<double>::infinity();
    double atOnce_ = std::numeric_limits<double>::infinity();
};

double allocationsOf(const rows::Run& run, double units) {
    constexpr std::size_t calls = 16;
    const std::size_t before = blocksTaken;
    run(calls);
    return static_cast<double>(blocksTaken - before) / (calls * units);
}

void measure(benchmark::State& state, const rows::Row& row) {
    Side operation(row.operation, row.units);
    Side floor(row.floor, row.floorUnits);
    for ([[maybe_unused]] auto round : state) {
        state.SetIterationTime((operation.measure() + floor.measure()) / 1e9);
    }
    state.counters["ns"] = operation.perUnit();
    state.counters["floor_ns"] = floor.perUnit();
    state.counters["at_most_floor"] = row.atMostFloor;
    state.counters["over_floor"] = row.overFloor;
    state.counters["at_most_baseline"] = row.atMostBaseline;
    if (!row.isGrowth()) {
        state.counters["allocations"] = allocationsOf(row.operation, row.units);
        state.counters["allocations_at_most"] =
            row.allocationsOverFloor < 0
                ? row.allocations
                : allocationsOf(row.floor, row.floorUnits) + row.allocationsOverFloor;
    }
    state.SetLabel(row.floorName);
}

// What a second thread brings to a row and to its floor.
void measureGain(benchmark::State& state, const rows::Row& row) {
    TwoThreads operation(row.operation, row.units);
    TwoThreads floor(row.floor, row.units);
    for ([[maybe_unused]] auto round : state) {
        state.SetIterationTime((operation.measure() + floor.measure()) / 1e9);
    }
    state.counters["one_ns"] = operation.inTurn();
    state.counters["two_ns"] = operation.atOnce();
    state.counters["floor_one_ns"] = floor.inTurn();
    state.counters["floor_two_ns"] = floor.atOnce();
    state.SetLabel(row.floorName);
}

// A measurement of a row, as Google Benchmark takes it.
class RowBenchmark : public benchmark::Fixture {
public:
    using Measurement = void(benchmark::State& state, const rows::Row& row);

    RowBenchmark(const std::string& name, Measurement* measurement, const rows::Row& row)
        : measurement_(measurement), row_(row) {
        SetName(name.c_str());
    }

private:
    void BenchmarkCase(benchmark::State& state) override { measurement_(state, row_); }

    Measurement* measurement_;
    const rows::Row& row_;
};

void add(const std::string& name, RowBenchmark::Measurement* measurement, const rows::Row& row,
         std::size_t rounds) {
    benchmark::internal::RegisterBenchmarkInternal(new RowBenchmark(name, measurement, row))
        ->UseManualTime()
        ->Iterations(static_cast<benchmark::IterationCount>(rounds));
}

// An option of our own, `--name=number`; the others are Google Benchmark's.
std::size_t option(int& argc, char** argv, const std::string& name, std::size_t otherwise) {
    const std::string start = "--" + name + '=';
    char** const found = std::find_if(argv + 1, argv + argc, [&start](const char* argument) {
        return std::strncmp(argument, start.c_str(), start.size()) == 0;
    });
    if (found == argv + argc) {
        return otherwise;
    }
    const std::size_t value = std::strtoull(*found + start.size(), nullptr, 10);
    std::move(found + 1, argv + argc, found);
    --argc;
    return value;
}

} // namespace

int main(int argc, char** argv) {
    if (std::setlocale(LC_CTYPE, "C.UTF-8") == nullptr) {
        return EXIT_FAILURE;
    }
    const std::size_t rounds = option(argc, argv, "rounds", 100);
    const std::size_t large = option(argc, argv, "large-mib", 64);
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return EXIT_FAILURE;
    }
    const std::vector<rows::Row> table = rows::all(large << 20U);
    for (const rows::Row& row : table) {
        // A slice of the growing rows takes a fraction of a second.
        add(row.name, measure, row, row.isGrowth() ? std::min<std::size_t>(rounds, 3) : rounds);
    }
    for (const rows::Row& row : table) {
        if (row.onTwoThreads) {
            // Two processors are free at once more seldom than one.
            add("two threads: " + row.name, measureGain, row, 3 * rounds);
        }
    }
    benchmark::RunSpecifiedBenchmarks();
    return EXIT_SUCCESS;
}
