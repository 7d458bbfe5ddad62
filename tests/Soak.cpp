// A long life: sends requests of the library's whole road, REQUESTS of them (soak [REQUESTS]), and fails when
// resident memory grows after the warm-up or a CMPI object outlives its request.
#include "RoadRequest.h"

#include <algorithm>
#include <exception>
#include <fstream>
#include <iostream>
#include <string>
#include <unistd.h>

namespace {

// A leak of a byte per request would show after 256 thousand; the heap itself settles within a few pages.
constexpr long allowedGrowth = 256;  // KiB
constexpr unsigned long warmUp = 10; // a part of so many of the requests

long residentKib() {
    std::ifstream file("/proc/self/statm"); // pages: total, resident, …
    long total = 0;
    long resident = 0;
    file >> total >> resident;
    return resident * (::sysconf(_SC_PAGESIZE) / 1024);
}

int soak(unsigned long requests) {
    oxahv::EmbeddedBroker broker;
    hostRoad(broker);
    long warm = 0;
    long highest = 0;
    for (unsigned long number = 0; number < requests; ++number) {
        if (!roadAnswers(broker, "road-number-" + std::to_string(number))) {
            std::cerr << "soak: request " << number << " failed\n";
            return 1;
        }
        if (number == requests / warmUp) {
            warm = residentKib();
        } else if (number > requests / warmUp && number % 1000 == 0) {
            highest = std::max(highest, residentKib());
        }
    }
    highest = std::max(highest, residentKib());
    const std::size_t alive = broker.liveObjects().total();
    std::cout << "soak: " << requests << " requests; resident after warm-up " << warm << " KiB, at most "
              << highest << " KiB; objects alive " << alive << '\n';
    if (highest - warm > allowedGrowth || alive != 0) {
        std::cerr << "soak: memory grew by more than " << allowedGrowth << " KiB, or objects stayed alive\n";
        return 1;
    }
    return 0;
}

} // namespace

int main(int argc, char** argv) {
    try {
        return soak(argc > 1 ? std::stoul(argv[1]) : 1'000'000);
    } catch (const std::exception& exception) {
        std::cerr << "soak: " << exception.what() << '\n';
        return 2;
    }
}
