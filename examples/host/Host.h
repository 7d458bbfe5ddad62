// What the provider knows of this machine, read from the kernel's files. No CMPI here.
//
// A Host may be used by any number of threads at once: it keeps nothing but the place of the files.
#pragma once

#include <ctime>
#include <optional>
#include <string>
#include <vector>

struct OperatingSystem {
    std::string name;          // as its makers write it, for example "Debian GNU/Linux 12 (bookworm)"
    std::string kernelVersion; // for example "6.1.0-13-amd64"
    std::optional<std::time_t> bootTime;
    std::optional<unsigned int> processes;
    std::optional<unsigned long long> totalMemory; // KiB
    std::optional<unsigned long long> freeMemory;  // KiB
    std::optional<unsigned long long> totalSwap;   // KiB
};

struct EthernetPort {
    std::string name;    // for example "eth0"
    std::string address; // twelve hexadecimal digits
    bool isAddressPermanent = false;
    std::string state; // the kernel's word: "up", "down", "unknown", …
    std::string alias; // what the administrator calls it, any text; mostly empty
    bool canWakeSystem = false;
    std::optional<bool> isFullDuplex;
    std::optional<unsigned long long> speed; // bits per second
    std::optional<unsigned long long> maximumTransmissionUnit;
};

// How many processes were ready to run, on average.
struct LoadAverage {
    unsigned short minutes; // over how long a time
    double processes;
};

class Host {
public:
    // `root` is put in front of every path: tests show a machine of their own.
    explicit Host(std::string root = "") : root_(std::move(root)) {}

    std::string name() const;
    std::string operatingSystemName() const;
    OperatingSystem operatingSystem() const;
    // Sorted. Interfaces that are no Ethernet are left out.
    std::vector<std::string> ethernetPortNames() const;
    EthernetPort ethernetPort(const std::string& name) const;
    std::vector<LoadAverage> loadAverages() const;

private:
    std::string line(const std::string& path) const;
    std::optional<unsigned long long> number(const std::string& path) const;
    std::vector<std::string> entries(const std::string& path) const;

    std::string root_;
};
