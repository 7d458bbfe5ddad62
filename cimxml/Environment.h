// What every step of an operation works with.
#pragma once

#include "Checked.h"
#include "Schema.h"

#include <EmbeddedBroker.h>

#include <string>

namespace cimxml {

struct Environment {
    oxahv::EmbeddedBroker& broker;
    oxahv::Request& request; // owns all CMPI objects that are made on the way
    Schema schema;
    std::string nameSpace; // of the operation
    std::string hostName;  // of this server, as paths name it
};

} // namespace cimxml
