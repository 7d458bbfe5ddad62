// The front of a broker for CIM clients: HTTP requests in, HTTP responses out. It knows no sockets.
#pragma once

#include "Http.h"

#include <EmbeddedBroker.h>

#include <string>

namespace cimxml {

// Answers CIM operations (DSP0200) in CIM-XML (DSP0201) from the providers and the declared classes of a
// broker. Every function may be called on any number of threads at once.
class Front {
public:
    // `nameSpace` is the only one there is. The broker must outlive this object.
    Front(oxahv::EmbeddedBroker& broker, std::string nameSpace);

    // The response to a request. Whatever the request holds, it throws nothing but std::bad_alloc.
    HttpResponse answer(const HttpRequest& request) const;

private:
    HttpResponse answerMessage(const HttpRequest& request) const;

    oxahv::EmbeddedBroker& broker_;
    std::string nameSpace_;
};

} // namespace cimxml
