#include "check/Unloading.h"

#include <cstdlib>
#include <cstring>
#include <cxxabi.h>
#include <dlfcn.h>
#include <elf.h>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <link.h>
#include <memory>
#include <string_view>
#include <vector>

namespace oxahv::runner {

namespace {

// The parts of a library's file that say whether it can be unloaded.
class ElfFile {
public:
    explicit ElfFile(const std::string& file) {
        std::ifstream stream(file, std::ios::binary);
        bytes_.assign(std::istreambuf_iterator<char>(stream), {});
        const auto header = at<ElfW(Ehdr)>(0);
        if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0) {
            return;
        }
        for (std::size_t i = 0; i < header.e_shnum; ++i) {
            sections_.push_back(at<ElfW(Shdr)>(header.e_shoff + i * header.e_shentsize));
        }
    }

    // The symbols of which a process has one for all its libraries.
    std::vector<std::string> uniqueSymbols() const {
        std::vector<std::string> names;
        each<ElfW(Sym)>(SHT_DYNSYM, [&](const ElfW(Sym) & symbol, const ElfW(Shdr) & section) {
            const unsigned int binding = symbol.st_info >> 4U;
            if (binding == STB_GNU_UNIQUE && symbol.st_shndx != SHN_UNDEF &&
                section.sh_link < sections_.size()) {
                names.push_back(textAt(sections_[section.sh_link].sh_offset + symbol.st_name));
            }
        });
        return names;
    }

    bool isNeverUnloaded() const {
        bool is = false;
        each<ElfW(Dyn)>(SHT_DYNAMIC, [&](const ElfW(Dyn) & entry, const ElfW(Shdr) & /*section*/) {
            is = is || (entry.d_tag == DT_FLAGS_1 && (entry.d_un.d_val & DF_1_NODELETE) != 0);
        });
        return is;
    }

private:
    // Zeros where the file is too short.
    template <class Record>
    Record at(std::size_t offset) const {
        Record record = {};
        if (offset <= bytes_.size() && bytes_.size() - offset >= sizeof record) {
            std::memcpy(&record, bytes_.data() + offset, sizeof record);
        }
        return record;
    }
    std::string textAt(std::size_t offset) const {
        return offset < bytes_.size() ? std::string(bytes_.data() + offset,
                                                    ::strnlen(bytes_.data() + offset, bytes_.size() - offset))
                                      : "";
    }
    template <class Record, class Take>
    void each(unsigned int type, const Take& take) const {
        for (const ElfW(Shdr) & section : sections_) {
            for (std::size_t i = 0; section.sh_type == type && i < section.sh_size / sizeof(Record); ++i) {
                take(at<Record>(section.sh_offset + i * sizeof(Record)), section);
            }
        }
    }

    std::vector<char> bytes_;
    std::vector<ElfW(Shdr)> sections_;
};

std::string demangled(const std::string& symbol) {
    int status = 0;
    const std::unique_ptr<char, void (*)(void*)> name(
        abi::__cxa_demangle(symbol.c_str(), nullptr, nullptr, &status), std::free);
    return status == 0 ? name.get() : symbol;
}

bool isMapped(const std::string& file) {
    std::ifstream maps("/proc/self/maps");
    for (std::string line; std::getline(maps, line);) {
        if (line.size() > file.size() &&
            line.compare(line.size() - file.size() - 1, std::string::npos, ' ' + file) == 0) {
            return true;
        }
    }
    return false;
}

std::string causeOf(const ElfFile& file) {
    if (file.isNeverUnloaded()) {
        return "it is linked with -z nodelete";
    }
    const std::vector<std::string> symbols = file.uniqueSymbols();
    if (symbols.empty()) {
        return "another library that is still loaded needs it, or a thread has still to destroy an object of "
               "it";
    }
    constexpr std::size_t most = 4;
    std::string text = "it exports unique symbols, to which other libraries bind: ";
    for (std::size_t i = 0; i < symbols.size() && i < most; ++i) {
        text += (i > 0 ? ", " : "") + demangled(symbols[i]);
    }
    text += symbols.size() > most ? " and " + std::to_string(symbols.size() - most) + " more" : "";
    return text + "; link it with a version script that exports the _Create_ functions alone";
}

} // namespace

std::string whyStillMapped(const std::string& library) {
    const std::string file = std::filesystem::canonical(library);
    void* const handle = ::dlopen(std::filesystem::absolute(library).c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (handle != nullptr) {
        ::dlclose(handle);
    }
    return handle != nullptr || isMapped(file) ? causeOf(ElfFile(file)) : "";
}

} // namespace oxahv::runner
