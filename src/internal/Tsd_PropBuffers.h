// The two property-buffer pairs: every group class's getProp writes into one
// pair, every specification class's getProp into the other, so a returned
// property stays valid until the next getProp of the same family.
#pragma once

#include "tsd/Tsd_StaticBuf.h"

namespace tsd_detail {

struct PropBuffers {
    Tsd_StaticBuf name{32, 16};
    Tsd_StaticBuf value{256, 32};

    // Copies a property in and hands it out: getProp's usual ending.
    bool set(const char* propName, const char* text, const char*& nameOut, const char*& valueOut) {
        name.copy(propName);
        value.copy(text);
        return handOut(nameOut, valueOut);
    }

    // Hands out both texts through getProp's out arguments.
    bool handOut(const char*& nameOut, const char*& valueOut) const {
        nameOut = name.getBuffer();
        valueOut = value.getBuffer();
        return true;
    }
};

PropBuffers& groupPropBuffers();
PropBuffers& specPropBuffers();

} // namespace tsd_detail
