// Internal helpers shared by every module: the message object of the
// "TSDatabase" domain and the indentation of dump lines.
#pragma once

#include "tsd/host/DumpStream.h"
#include "tsd/host/Messages.h"

#ifndef TSD_VERSION_STRING
#define TSD_VERSION_STRING "unknown"
#endif

// A message object for one message, issued from the current source line.
#define TSD_MSG() MessageManager::createObject("TSDatabase", __FILE__, __LINE__, TSD_VERSION_STRING)

namespace tsd_detail {

// Three blanks per indent level. Levels beyond 31 are printed as 31; a
// negative level as 0.
inline const char* indent(int level) {
    static const char blanks[] = "                                                              "
                                 "                               ";
    static_assert(sizeof blanks - 1 == 93, "31 levels of three blanks");
    if (level < 0)
        level = 0;
    if (level > 31)
        level = 31;
    return blanks + (93 - 3 * level);
}

} // namespace tsd_detail
