// A design that records what trim() reports, and helpers to fill designs.
#pragma once

#include "TsdTestSupport.h"

#include <string>
#include <utility>
#include <vector>

namespace tsd_test {

class RecordingDesign : public Tsd_Design {
public:
    using Tsd_Design::Tsd_Design;

    std::vector<std::pair<Tsd_BaseObj*, TrimReason>> trashed;

protected:
    void reportObjTrashed(Tsd_BaseObj* obj, TrimReason reason) override {
        trashed.emplace_back(obj, reason);
    }
};

// Gives `holder` a fresh reference record and returns it.
inline NamedRef* attachRef(Tsd_BaseObj* holder, const std::string& element = "elem",
                           int* destroyed = nullptr) {
    auto* ref = new NamedRef(element, destroyed);
    ref->setOwner(holder);
    return ref;
}

} // namespace tsd_test
