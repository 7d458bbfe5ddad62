// The rows of the benchmark's table: each operation of the library beside its floor, which is what the
// hardware, the C library or the bare CMPI calls make it cost at least.
#pragma once

#include <benchmark/benchmark.h>
#include <cstddef>
#include <functional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace rows {

// Runs something n times.
using Run = std::function<void(std::size_t n)>;

template <class Function>
Run repeat(Function function) {
    return [function = std::move(function)](std::size_t n) {
        for (; n != 0; --n) {
            if constexpr (std::is_void_v<std::invoke_result_t<const Function&>>) {
                function();
            } else {
                benchmark::DoNotOptimize(function());
            }
        }
    };
}

struct Row {
    std::string name;
    Run operation;
    std::string floorName;
    Run floor;
    // How many units of work one call of the operation and of the floor does: the table shows the time of a
    // unit.
    double units = 1;
    double floorUnits = 1;
    // Whether it is measured on two threads as well, since it allocates or shares something.
    bool onTwoThreads = false;

    // Goals; 0 means that there is none.
    double atMostFloor = 0;           // the operation's time, in times of the floor's
    double overFloor = 0;             // nanoseconds that the operation may take beyond the floor
    double atMostBaseline = 0;        // the operation's time, in times of the baseline's, when there is one
    double allocations = -1;          // blocks of memory per unit, at most; -1 for no goal
    double allocationsOverFloor = -1; // the same, beyond the floor's

    // Whether it compares a unit of a large input with one of a small input.
    bool isGrowth() const { return floorUnits != units; }
};

// All rows, in the order of the table. `large` is how many characters the growing ones grow to.
std::vector<Row> all(std::size_t large);

} // namespace rows
