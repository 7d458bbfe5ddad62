#include "check/LostTexts.h"

#include <HVLogger.h>

#include <atomic>

namespace oxahv::runner {

namespace {

// What the library's wide setters trace, at the level code of messages.
constexpr const char* lostText = "Failed to convert the data to Multi byte";
constexpr int messageLevel = 6000;

std::atomic<std::size_t> lost{0};

} // namespace

void countLostTexts() {
    HVLog::HVLogger::setSink([](const HVLog::Message& message) {
        const bool isOnce = message.channel == HVLog::Channel::trace; // each message comes on both channels
        lost += isOnce && message.text.find(lostText) != std::string::npos ? 1 : 0;
    });
    HVLog::HVLogger::setThreshold(messageLevel);
}

std::size_t takeLostTexts() {
    return lost.exchange(0);
}

} // namespace oxahv::runner
