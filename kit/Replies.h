/**
 * @file
 * oxahv::Instances and oxahv::Names, where a provider puts its results one by one.
 */
#pragma once

#include "Operation.h"

namespace oxahv {

/** Takes the paths of a reply. Each goes to the client at once; nothing is collected. */
class Names {
public:
    Names(const Names&) = delete;
    Names& operator=(const Names&) = delete;
    /** Returns a path to the client. @throws Refusal with the broker's status */
    void add(const Path& path);
};

/**
 * Takes the instances of a reply. Each goes to the client at once; nothing is collected. What the client gets
 * depends on the request: the instance, its name, or nothing when it is not the one asked for.
 */
class Instances {
public:
    Instances(const Instances&) = delete;
    Instances& operator=(const Instances&) = delete;
    /** Returns an instance to the client. @throws Refusal with the broker's status */
    void add(const Instance& instance);
    /** Whether the client has all that it wants: a loop may then end early. */
    bool isComplete() const;
};

} // namespace oxahv
