#include "Host.h"

#include <algorithm>
#include <charconv>
#include <dirent.h>
#include <fstream>
#include <initializer_list>
#include <memory>
#include <string_view>
#include <system_error>

namespace {

bool isNumber(const std::string& text) {
    return !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
}

std::optional<unsigned long long> numberIn(const std::string& text) {
    unsigned long long number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isWhole = error == std::errc() && end == text.data() + text.size();
    return isWhole ? std::optional(number) : std::nullopt;
}

// Reads the next line. A stream keeps to itself what is thrown below it; here lack of memory is let through,
// and a file that cannot be read has no lines.
bool readLine(std::ifstream& file, std::string& text) {
    try {
        file.exceptions(std::ios_base::badbit);
        return static_cast<bool>(std::getline(file, text));
    } catch (const std::ios_base::failure&) {
        text.clear();
        return false;
    }
}

struct CloseFolder {
    void operator()(DIR* folder) const { ::closedir(folder); }
};

// The value of a line KEY=VALUE or KEY: VALUE unit in a file, without blanks around it.
std::string valueOf(std::ifstream file, const std::string& key) {
    for (std::string line; readLine(file, line);) {
        if (line.rfind(key, 0) == 0) {
            const std::size_t begin = line.find_first_not_of(" \t", key.size());
            return begin != std::string::npos ? line.substr(begin, line.find_last_not_of(" \t") + 1 - begin)
                                              : "";
        }
    }
    return "";
}

// A shell's word without the quotes around it, of either kind.
std::string unquoted(const std::string& word) {
    const bool isQuoted =
        word.size() > 1 && word.front() == word.back() && (word.front() == '"' || word.front() == '\'');
    return isQuoted ? word.substr(1, word.size() - 2) : word;
}

// Of /proc/meminfo's "123 kB" the number.
std::optional<unsigned long long> kibibytes(const std::string& text) {
    return numberIn(text.substr(0, text.find(' ')));
}

} // namespace

std::string Host::line(const std::string& path) const {
    std::ifstream file(root_ + path);
    std::string text;
    readLine(file, text);
    return text;
}

std::optional<unsigned long long> Host::number(const std::string& path) const {
    return numberIn(line(path));
}

std::vector<std::string> Host::entries(const std::string& path) const {
    std::vector<std::string> names;
    // std::filesystem's iterator would end the process where memory runs out.
    const std::unique_ptr<DIR, CloseFolder> folder(::opendir((root_ + path).c_str()));
    while (const dirent* const entry = folder != nullptr ? ::readdir(folder.get()) : nullptr) {
        const std::string_view name(entry->d_name);
        if (name != "." && name != "..") {
            names.emplace_back(name);
        }
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string Host::name() const {
    return line("/proc/sys/kernel/hostname");
}

std::string Host::operatingSystemName() const {
    const std::string name = unquoted(valueOf(std::ifstream(root_ + "/etc/os-release"), "PRETTY_NAME="));
    return name.empty() ? "Linux" : name;
}

OperatingSystem Host::operatingSystem() const {
    const std::string memory = root_ + "/proc/meminfo";
    OperatingSystem system;
    system.name = operatingSystemName();
    system.kernelVersion = line("/proc/sys/kernel/osrelease");
    if (const auto seconds = numberIn(valueOf(std::ifstream(root_ + "/proc/stat"), "btime "))) {
        system.bootTime = static_cast<std::time_t>(*seconds);
    }
    const std::vector<std::string> processes = entries("/proc");
    system.processes = static_cast<unsigned int>(std::count_if(processes.begin(), processes.end(), isNumber));
    system.totalMemory = kibibytes(valueOf(std::ifstream(memory), "MemTotal:"));
    system.freeMemory = kibibytes(valueOf(std::ifstream(memory), "MemFree:"));
    system.totalSwap = kibibytes(valueOf(std::ifstream(memory), "SwapTotal:"));
    return system;
}

std::vector<std::string> Host::ethernetPortNames() const {
    constexpr unsigned long long ethernet = 1; // ARPHRD_ETHER
    std::vector<std::string> names = entries("/sys/class/net");
    const auto isOther = [&](const std::string& name) {
        return number("/sys/class/net/" + name + "/type") != ethernet;
    };
    names.erase(std::remove_if(names.begin(), names.end(), isOther), names.end());
    return names;
}

EthernetPort Host::ethernetPort(const std::string& name) const {
    constexpr unsigned long long permanent = 0; // NET_ADDR_PERM
    const std::string folder = "/sys/class/net/" + name + '/';
    EthernetPort port;
    port.name = name;
    port.address = line(folder + "address");
    port.address.erase(std::remove(port.address.begin(), port.address.end(), ':'), port.address.end());
    port.isAddressPermanent = number(folder + "addr_assign_type") == permanent;
    port.state = line(folder + "operstate");
    port.alias = line(folder + "ifalias");
    port.canWakeSystem = !line(folder + "device/power/wakeup").empty();
    const std::string duplex = line(folder + "duplex");
    if (duplex == "full" || duplex == "half") {
        port.isFullDuplex = duplex == "full";
    }
    if (const auto megabits = number(folder + "speed")) {
        port.speed = *megabits * 1'000'000;
    }
    port.maximumTransmissionUnit = number(folder + "mtu");
    return port;
}

std::vector<LoadAverage> Host::loadAverages() const {
    const std::string text = line("/proc/loadavg"); // "0.20 0.18 0.12 1/80 11206"
    std::vector<LoadAverage> averages;
    const char* position = text.data();
    const char* const end = position + text.size();
    for (const unsigned short minutes : std::initializer_list<unsigned short>{1, 5, 15}) {
        double processes = 0;
        const auto [behind, error] = std::from_chars(position, end, processes);
        if (error != std::errc()) {
            break;
        }
        averages.push_back({minutes, processes});
        position = behind != end ? behind + 1 : end;
    }
    return averages;
}
