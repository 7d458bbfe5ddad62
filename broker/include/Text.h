/**
 * @file
 * CMPI's codes, types, values and paths as texts, and the error of the broker's C++ interface.
 *
 * All texts are UTF-8. Everything here is thread-safe.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>

#include "TKExport.h"

#include <stdexcept>
#include <string>

namespace oxahv {

/** What hosting, loading, class declarations and path texts throw; `what()` is one line for a person. */
class TK_EXPORT BrokerError : public std::runtime_error {
public:
    /** An error with a message. @param message the line; copied. */
    explicit BrokerError(const std::string& message);
    /** Copies the message. */
    BrokerError(const BrokerError&) = default;
    /** Copies the message. */
    BrokerError& operator=(const BrokerError&) = default;
    ~BrokerError() override;
};

/** @name Texts */
/** @{ */
/** The name of a CMPI return code, as "CMPI_RC_ERR_NOT_FOUND"; "CMPI_RC_<number>" for one that has none.
 * Thread-safe. */
TK_EXPORT std::string codeName(CMPIrc code);
/** The return code of a name, with or without "CMPI_RC_", or of a decimal number. @throws BrokerError for any
 * other name. */
TK_EXPORT CMPIrc codeFromName(const std::string& name);
/** The CIM name of a CMPI type, as "uint32", "string" or "datetime"; that of an array's elements for an
 * array. */
TK_EXPORT std::string typeName(CMPIType type);
/** A value as MOF writes it: numbers, `TRUE`, texts and date/times in quotes, arrays in braces, paths as
 * texts, `NULL`. */
TK_EXPORT std::string valueText(const CMPIData& data);
/** The path as text, `namespace:Class.Key="text",Number=3`: what objectPathFromText reads. Empty for a
 * foreign handle. */
TK_EXPORT std::string pathText(const CMPIObjectPath* path);
/** @} */

} // namespace oxahv
