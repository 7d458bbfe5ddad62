#include "Http.h"

#include <Names.h>
#include <Utf8.h>

#include <algorithm>
#include <charconv>

namespace cimxml {

namespace {

using encoding::sameName;

constexpr std::string_view extension = "http://www.dmtf.org/cim/mapping/http/v1.0";
constexpr std::string_view blanks = " \t";

std::string_view trimmed(std::string_view text) {
    const std::size_t first = text.find_first_not_of(blanks);
    return first != std::string_view::npos ? text.substr(first, text.find_last_not_of(blanks) - first + 1)
                                           : std::string_view();
}

// The parts of a header's value, without blanks around them. They live as long as the text.
std::vector<std::string_view> split(std::string_view text, char separator) {
    std::vector<std::string_view> parts;
    for (std::size_t begin = 0; begin <= text.size();) {
        const std::size_t end = std::min(text.find(separator, begin), text.size());
        parts.push_back(trimmed(text.substr(begin, end - begin)));
        begin = end + 1;
    }
    return parts;
}

std::string_view unquoted(std::string_view text) {
    const bool isQuoted = text.size() >= 2 && text.front() == '"' && text.back() == '"';
    return isQuoted ? text.substr(1, text.size() - 2) : text;
}

// The value of a parameter such as ns=12; empty when there is none.
std::string_view parameterOf(const std::vector<std::string_view>& parts, std::string_view name) {
    for (const std::string_view part : parts) {
        const std::size_t equals = part.find('=');
        if (equals != std::string_view::npos && sameName(trimmed(part.substr(0, equals)), name)) {
            return unquoted(trimmed(part.substr(equals + 1)));
        }
    }
    return {};
}

// Undoes the %XX of a header's value.
std::string percentDecoded(std::string_view text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        unsigned int code = 0;
        const char* const digits = text.data() + i + 1;
        if (text[i] == '%' && i + 2 < text.size() &&
            std::from_chars(digits, digits + 2, code, 16).ptr == digits + 2) {
            result += static_cast<char>(static_cast<unsigned char>(code));
            i += 2;
        } else {
            result += text[i];
        }
    }
    return result;
}

// Decodes up to the first character that base64 does not have.
std::string base64Decoded(std::string_view text) {
    constexpr std::string_view digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string result;
    unsigned int bits = 0;
    unsigned int count = 0;
    for (const char c : text) {
        const std::size_t digit = digits.find(c);
        if (digit == std::string_view::npos) {
            break;
        }
        bits = (bits << 6U | static_cast<unsigned int>(digit)) & 0xFFFFU;
        count += 6;
        if (count >= 8) {
            count -= 8;
            result += static_cast<char>(static_cast<unsigned char>(bits >> count & 0xFFU));
        }
    }
    return result;
}

std::string valueOf(const HttpRequest& request, std::string_view header, const char* otherwise) {
    const std::string* const value = request.find(header);
    return value != nullptr ? *value : otherwise;
}

// The prefix of the extension headers' names. RFC 2774 lets the client choose its two digits.
std::string extensionPrefix(const HttpRequest& request) {
    const std::string man = valueOf(request, "Man", "");
    const std::vector<std::string_view> parts = split(man, ';');
    if (unquoted(parts.front()) != extension) {
        throw HttpError(510, "", "an M-POST request without the extension " + std::string(extension));
    }
    const std::string_view digits = parameterOf(parts, "ns");
    if (digits.size() < 2 || digits.find_first_not_of("0123456789") != std::string_view::npos) {
        throw HttpError(400, "", "the extension's ns is no number of two digits");
    }
    return std::string(digits) + '-';
}

void requireXml(const HttpRequest& request) {
    const std::string type = valueOf(request, "Content-Type", "application/xml");
    const std::vector<std::string_view> parts = split(type, ';');
    const std::string_view charset = parameterOf(parts, "charset");
    const bool isXml = sameName(parts.front(), "application/xml") || sameName(parts.front(), "text/xml");
    const std::string* const encoding = request.find("Content-Encoding");
    if (!isXml || !(charset.empty() || sameName(charset, "utf-8")) ||
        !(encoding == nullptr || sameName(*encoding, "identity"))) {
        throw HttpError(415, "", "the content is not application/xml in UTF-8");
    }
}

void requireAcceptance(const HttpRequest& request) {
    const std::string* const accept = request.find("Accept");
    if (accept == nullptr) {
        return;
    }
    for (const std::string_view range : split(*accept, ',')) {
        const std::string_view type = split(range, ';').front();
        for (const char* const taken : {"*/*", "application/*", "application/xml", "text/*", "text/xml"}) {
            if (sameName(type, taken)) {
                return;
            }
        }
    }
    throw HttpError(406, "", "the client does not accept application/xml");
}

} // namespace

const std::string* HttpRequest::find(std::string_view header) const {
    const auto found = std::find_if(headers.begin(), headers.end(),
                                    [&](const auto& candidate) { return sameName(candidate.first, header); });
    return found != headers.end() ? &found->second : nullptr;
}

CimHeaders::CimHeaders(const HttpRequest& request) : request_(request) {
    if (request.method == "M-POST") {
        prefix_ = extensionPrefix(request);
    } else if (request.method != "POST") {
        throw HttpError(405, "", "only POST and M-POST requests carry CIM operations");
    }
    requireXml(request);
    requireAcceptance(request);
    const std::string* const operation = find("CIMOperation");
    if (operation == nullptr) {
        throw HttpError(400, "header-mismatch", "there is no header CIMOperation");
    }
    if (!sameName(trimmed(*operation), "MethodCall")) {
        throw HttpError(400, "unsupported-operation", "CIMOperation is " + *operation);
    }
    const std::string* const version = find("CIMProtocolVersion");
    if (version != nullptr && trimmed(*version).substr(0, 2) != "1.") {
        throw HttpError(501, "unsupported-protocol-version", "CIMProtocolVersion is " + *version);
    }
}

const std::string* CimHeaders::find(const std::string& name) const {
    return request_.find(prefix_ + name);
}

std::string CimHeaders::decoded(const std::string& name) const {
    const std::string* const value = find(name);
    return value != nullptr ? percentDecoded(trimmed(*value)) : "";
}

void CimHeaders::requireSingle(std::string_view method, std::string_view object) const {
    const std::string announced = decoded("CIMMethod");
    if (find("CIMBatch") != nullptr || !sameName(announced, method)) {
        throw HttpError(400, "header-mismatch",
                        "CIMMethod is '" + announced + "', the operation " + std::string(method));
    }
    // Of an instance's path the keys follow, which may be written in more than one way.
    const std::string target = decoded("CIMObject");
    const bool isSame = sameName(std::string_view(target).substr(0, object.size()), object) &&
                        (target.size() == object.size() || target[object.size()] == '.');
    if (!isSame) {
        throw HttpError(400, "header-mismatch",
                        "CIMObject is '" + target + "', the operation's target " + std::string(object));
    }
}

void CimHeaders::requireBatch() const {
    if (find("CIMBatch") == nullptr || find("CIMMethod") != nullptr || find("CIMObject") != nullptr) {
        throw HttpError(400, "header-mismatch", "a multiple request is announced by CIMBatch alone");
    }
}

Headers CimHeaders::ofAnswer() const {
    Headers headers = {{"Content-Type", "application/xml; charset=\"utf-8\""},
                       {"Cache-Control", "no-cache"},
                       {prefix_ + "CIMOperation", "MethodResponse"}};
    if (!prefix_.empty()) {
        headers.emplace_back("Ext", "");
        headers.emplace_back("Man", std::string(extension) + "; ns=" + prefix_.substr(0, prefix_.size() - 1));
    }
    return headers;
}

std::string userOf(const HttpRequest& request) {
    constexpr std::string_view scheme = "Basic ";
    const std::string header = valueOf(request, "Authorization", "");
    if (!sameName(std::string_view(header).substr(0, scheme.size()), scheme)) {
        return "";
    }
    const std::string decoded = base64Decoded(trimmed(std::string_view(header).substr(scheme.size())));
    const std::string user = decoded.substr(0, decoded.find(':'));
    const bool isText = encoding::isUtf8(user) && user.find('\0') == std::string::npos;
    return isText ? user : "";
}

HttpResponse refusal(const HttpError& error) {
    HttpResponse response;
    response.status = error.status();
    response.headers = {{"Content-Type", "text/plain; charset=\"utf-8\""}};
    if (!error.cimError().empty()) {
        response.headers.emplace_back("CIMError", error.cimError());
    }
    if (error.status() == 405) {
        response.headers.emplace_back("Allow", "POST, M-POST");
    }
    response.body = std::string(error.what()) + '\n';
    response.summary = "refused with status " + std::to_string(error.status()) + ": " + error.what();
    return response;
}

} // namespace cimxml
