/**
 * @file
 * The one export macro of this project's libraries.
 *
 * Every library here is built with hidden symbols; what is part of a public interface carries `TK_EXPORT`,
 * and a private step of an exported class `TK_HIDDEN`.
 */
#pragma once

/** Makes a class, function or object visible to other shared objects. */
#define TK_EXPORT __attribute__((visibility("default")))

/** Keeps a private member of an exported class inside its library. */
#define TK_HIDDEN __attribute__((visibility("hidden")))
