// The rows of the benchmark's table: each operation of the library, the floor that it is held against, and
// the same operation in the naive build.
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
    Run naive; // empty where there is none
    Run floor; // empty where the naive build alone is the measure
    std::string floorName;
    // How many units of work, of which a time is told, one call of the operation and of the floor does.
    double units = 1;
    double floorUnits = 1;
    // Goals; 0 stands for none.
    double atMostFloor = 0;           // the operation's time, in times of the floor's
    double overFloor = 0;             // nanoseconds that the operation may take beyond the floor
    double timesFaster = 0;           // the naive build's time, in times of the operation's
    double allocations = -1;          // blocks of memory per unit, at most; -1 when nothing is said
    double allocationsOverFloor = -1; // the same, beyond the floor's

    // Whether it tells what a unit costs in a large input: its floor is the same operation on a small one.
    bool isGrowth() const { return floorUnits != units; }

    // What the operation and its naive twin result in, as text; empty where there is no twin.
    std::function<std::string()> result;
    std::function<std::string()> naiveResult;
};

// All rows, in the order of the table. `large` is how many characters the growing ones grow to.
std::vector<Row> all(std::size_t large);

} // namespace rows
