// SPDX-License-Identifier: MIT
/*
 * export.h - symbol visibility for libJexJtag.
 *
 * The library is built with hidden visibility; only declarations marked
 * JEXJTAG_API are exported.  Plug-in modules mark their five entry points
 * with JEXJTAG_PLUGIN_EXPORT (see plugin.h).
 */
#ifndef JEXJTAG_EXPORT_H
#define JEXJTAG_EXPORT_H

#if defined(_WIN32)
#  if defined(JEXJTAG_BUILDING_LIBRARY)
#    define JEXJTAG_API __declspec(dllexport)
#  else
#    define JEXJTAG_API __declspec(dllimport)
#  endif
#  define JEXJTAG_PLUGIN_EXPORT __declspec(dllexport)
#else
#  define JEXJTAG_API __attribute__((visibility("default")))
#  define JEXJTAG_PLUGIN_EXPORT __attribute__((visibility("default")))
#endif

#ifdef __cplusplus
#  define JEXJTAG_BEGIN_DECLS extern "C" {
#  define JEXJTAG_END_DECLS }
#else
#  define JEXJTAG_BEGIN_DECLS
#  define JEXJTAG_END_DECLS
#endif

#endif /* JEXJTAG_EXPORT_H */
