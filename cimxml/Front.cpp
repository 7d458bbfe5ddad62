#include "Front.h"

#include "Environment.h"
#include "Failure.h"
#include "Message.h"
#include "Operations.h"
#include "Xml.h"

#include <Names.h>

namespace cimxml {

namespace {

// The standard's codes are CMPI's first ones; what a provider answers beyond is a plain failure to the
// client.
constexpr CMPIrc lastStandardCode = CMPI_RC_ERR_METHOD_NOT_FOUND;

// "CIM_ERR_NOT_FOUND" and the like.
std::string nameOf(CMPIrc code) {
    return "CIM_" + oxahv::codeName(code).substr(std::string("CMPI_RC_").size());
}

struct ErrorElement {
    CMPIrc code;
    std::string description;
};

ErrorElement errorOf(const CimError& error) {
    const bool isStandard = error.code() > CMPI_RC_OK && error.code() <= lastStandardCode;
    const std::string text = error.what();
    if (isStandard) {
        return {error.code(), text.empty() ? nameOf(error.code()) : text};
    }
    return {CMPI_RC_ERR_FAILED, oxahv::codeName(error.code()) + (text.empty() ? "" : ": " + text)};
}

// Performs one operation, and returns a line on it.
class Performance {
public:
    Performance(oxahv::EmbeddedBroker& broker, const std::string& nameSpace, const HttpRequest& request)
        : broker_(broker), nameSpace_(nameSpace), user_(userOf(request)) {
        const std::string* const host = request.find("Host");
        hostName_ = host != nullptr ? *host : "localhost";
    }

    std::string perform(const Call& call, XmlWriter& writer) const {
        std::string summary = call.name;
        const char* const response = call.isMethod ? "METHODRESPONSE" : "IMETHODRESPONSE";
        writer.element("SIMPLERSP", {}, [&] {
            writer.element(response, {{"NAME", call.name}}, [&] { summary += content(call, writer); });
        });
        return summary;
    }

private:
    // A failure may come after half of the content is written, which is dropped then.
    std::string content(const Call& call, XmlWriter& writer) const {
        XmlWriter content;
        try {
            perform(content, call);
            writer.raw(content.written());
            return content.replacements() == 0 ? ""
                                               : " (" + std::to_string(content.replacements()) +
                                                     " characters that XML does not have became U+FFFD)";
        } catch (const CimError& error) {
            const ErrorElement element = errorOf(error);
            writer.element("ERROR",
                           {{"CODE", std::to_string(element.code)}, {"DESCRIPTION", element.description}});
            return ": " + nameOf(element.code) + ": " + element.description;
        }
    }

    void perform(XmlWriter& writer, const Call& call) const {
        if (!encoding::sameName(call.nameSpace, nameSpace_)) {
            throw CimError(CMPI_RC_ERR_INVALID_NAMESPACE,
                           "there is no namespace " + call.nameSpace + ", only " + nameSpace_);
        }
        oxahv::Request request(broker_);
        request.setContextEntry(CMPIPrincipal, user_);
        Environment environment{broker_, request, Schema(broker_), nameSpace_, hostName_};
        call.isMethod ? performMethod(environment, call, writer)
                      : performOperation(environment, call, writer);
    }

    oxahv::EmbeddedBroker& broker_;
    const std::string& nameSpace_;
    std::string hostName_;
    std::string user_;
};

} // namespace

Front::Front(oxahv::EmbeddedBroker& broker, std::string nameSpace)
    : broker_(broker), nameSpace_(std::move(nameSpace)) {}

HttpResponse Front::answer(const HttpRequest& request) const {
    try {
        return answerMessage(request);
    } catch (const HttpError& error) {
        return refusal(error);
    } catch (const XmlError& error) {
        return refusal(HttpError(400, error.isWellFormed() ? "request-not-valid" : "request-not-well-formed",
                                 error.what()));
    }
}

HttpResponse Front::answerMessage(const HttpRequest& request) const {
    const CimHeaders headers(request);
    const Element root = parseXml(request.body);
    const Message message = readMessage(root, headers);
    const Performance performance(broker_, nameSpace_, request);
    HttpResponse response;
    XmlWriter writer;
    writer.raw("<?xml version=\"1.0\" encoding=\"utf-8\"?>\n");
    const auto performAll = [&] {
        for (const Call& call : message.calls) {
            response.summary += (response.summary.empty() ? "" : "; ") + performance.perform(call, writer);
        }
    };
    writer.element("CIM", {{"CIMVERSION", "2.0"}, {"DTDVERSION", "2.0"}}, [&] {
        writer.element("MESSAGE", {{"ID", message.id}, {"PROTOCOLVERSION", "1.0"}}, [&] {
            message.isMultiple ? writer.element("MULTIRSP", {}, performAll) : performAll();
        });
    });
    response.headers = headers.ofAnswer();
    response.body = writer.written() + '\n';
    return response;
}

} // namespace cimxml
