// A broker with the road provider in the program, and requests to it.
#pragma once

#include "EmbeddedBroker.h"
#include "RoadProvider.h"

#include <string>

inline void hostRoad(oxahv::EmbeddedBroker& broker) {
    oxahv::ProviderFactories factories;
    factories.instance = Road_Create_InstanceMI;
    broker.host("Road", factories);
}

// Whether a request for the road of a name is answered with that name.
inline bool roadAnswers(oxahv::EmbeddedBroker& broker, const std::string& name) {
    using TK::ProviderUtilities;
    oxahv::Request request(broker);
    CMPIObjectPath* const path = request.objectPath("root/x", "Road");
    ProviderUtilities::setKeyProperty(path, "Name", name);
    ProviderUtilities::setKeyProperty(path, "Number", 7U);
    const oxahv::Reply reply = request.getInstance(path);
    std::string answer;
    return reply.ok() && reply.instances.size() == 1 &&
           ProviderUtilities::getProperty(reply.instances[0], "Wide", answer, false) && answer == name;
}
