#include "tables/Hooks.h"

namespace oxahv {

namespace {

constexpr std::size_t anySlot = slotCount;

std::string_view memberOf(std::string_view slot) {
    return slot.substr(slot.find('.') + 1);
}

std::size_t findSlot(std::string_view name) {
    if (name == "*") {
        return anySlot;
    }
    std::size_t found = slotCount;
    std::string tables;
    for (std::size_t i = 0; i < slotCount; ++i) {
        if (slots[i] == name) {
            return i;
        }
        if (memberOf(slots[i]) == name) {
            found = i;
            tables += (tables.empty() ? "" : ", ") + std::string(slots[i]);
        }
    }
    if (found == slotCount) {
        throw BrokerError("there is no slot " + std::string(name));
    }
    if (tables.find(',') != std::string::npos) {
        throw BrokerError("slot " + std::string(name) + " is one of several: " + tables);
    }
    return found;
}

bool strikes(const Fault& fault, unsigned int call) {
    return call >= fault.firstCall && (fault.calls == 0 || call - fault.firstCall < fault.calls);
}

thread_local unsigned int pauses = 0;

} // namespace

Hooks::Pause::Pause() {
    ++pauses;
}

Hooks::Pause::~Pause() {
    --pauses;
}

bool Hooks::isPaused() {
    return pauses > 0;
}

void Hooks::inject(const std::string& slot, const Fault& fault) {
    const std::size_t index = findSlot(slot);
    const std::lock_guard<std::mutex> lock(mutex_);
    injected_.push_back({index, fault});
    update();
}

void Hooks::clearFaults() {
    const std::lock_guard<std::mutex> lock(mutex_);
    injected_.clear();
    update();
}

void Hooks::startRecording() {
    const std::lock_guard<std::mutex> lock(mutex_);
    calls_.clear();
    isRecording_ = true;
    update();
}

std::vector<Call> Hooks::stopRecording() {
    const std::lock_guard<std::mutex> lock(mutex_);
    isRecording_ = false;
    update();
    return std::move(calls_);
}

Fault Hooks::strike(std::size_t slot) {
    Fault result;
    result.code = CMPI_RC_OK;
    const std::lock_guard<std::mutex> lock(mutex_);
    for (Injected& injected : injected_) {
        if (injected.slot == slot || injected.slot == anySlot) {
            ++injected.counted;
            if (strikes(injected.fault, injected.counted)) {
                result.code = injected.fault.code != CMPI_RC_OK ? injected.fault.code : result.code;
                result.yieldsNull = result.yieldsNull || injected.fault.yieldsNull;
                result.stateBits = static_cast<CMPIValueState>(result.stateBits | injected.fault.stateBits);
            }
        }
    }
    return result;
}

void Hooks::record(Call&& call) {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (isRecording_) {
        calls_.push_back(std::move(call));
    }
}

void Hooks::update() {
    active_.store(isRecording_ || !injected_.empty(), std::memory_order_relaxed);
}

} // namespace oxahv
