/**
 * @file
 * The platform that the CMPI headers are used on.
 *
 * An includer may name it beforehand; on Linux it need not.
 */
#ifndef CMPIPL_H
#define CMPIPL_H

#if !defined(CMPI_PLATFORM_LINUX_GENERIC_GNU) && defined(__linux__) && defined(__GNUC__)
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#error "These headers describe CMPI on Linux: define CMPI_PLATFORM_LINUX_GENERIC_GNU."
#endif

#ifdef __cplusplus
#define CMPI_EXTERN_C extern "C"
#else
#define CMPI_EXTERN_C
#endif

/** Makes a provider's factory function visible to the CIM server in a library that is built with hidden
 * symbols. */
#define CMPI_EXPORT __attribute__((visibility("default")))

#endif
