#include "tsd/Tsd_BaseObj.h"

#include "internal/Tsd_Report.h"

Tsd_Ref::~Tsd_Ref() = default;

bool Tsd_Ref::isEqual(const Tsd_Ref* /*other*/) const {
    return false;
}

void Tsd_Ref::dump(DumpStream& stream, short indent) const {
    stream << tsd_detail::indent(indent)
           << (m_owner != nullptr ? "owner defined" : "owner undefined") << DumpStream::endl;
}

void Tsd_Ref::setOwner(Tsd_BaseObj* newOwner) {
    if (newOwner == nullptr)
        TSD_MSG().fatal(2, "Tsd_Ref::setOwner() called with a NULL owner.\n");
    if (m_owner != nullptr)
        m_owner->trimRef(this, false);
    m_owner = nullptr;
    newOwner->addRef(this);
    m_owner = newOwner;
}

Tsd_BaseObj& Tsd_Ref::requireOwner(const char* operation) const {
    // The owner queries and trimming have no meaning for an unowned record;
    // a clear fatal message beats a null dereference.
    if (m_owner == nullptr)
        TSD_MSG().fatal(2, "Tsd_Ref::%s() called on a reference without owner.\n", operation);
    return *m_owner;
}

void Tsd_Ref::trimWith(bool report) {
    requireOwner(report ? "trim" : "trimNoReport").trimRef(this, report);
    delete this;
}

void Tsd_Ref::trim() {
    trimWith(true);
}

void Tsd_Ref::trimNoReport() {
    trimWith(false);
}

bool Tsd_Ref::isTIG() const {
    return requireOwner("isTIG").getTIGGroup() != nullptr;
}

bool Tsd_Ref::isSync() const {
    return requireOwner("isSync").getSyncGroup() != nullptr;
}

bool Tsd_Ref::isTNM() const {
    return requireOwner("isTNM").getTNMGroup() != nullptr;
}

bool Tsd_Ref::isThru() const {
    return requireOwner("isThru").getThruGroup() != nullptr;
}

const char* Tsd_Ref::getTIGid() const {
    return requireOwner("getTIGid").getTIGid();
}

const char* Tsd_Ref::getUserString() const {
    return m_owner != nullptr ? m_owner->getUserString() : "UNOWNED";
}

void Tsd_Ref::copyTo(Tsd_Ref* copy) const {
    if (copy == nullptr)
        return;
    Tsd_BaseObj& owner = requireOwner("copyTo");
    if (copy->m_owner != nullptr)
        copy->m_owner->trimRef(copy, false);
    owner.addRef(copy);
    copy->m_owner = &owner;
}

bool Tsd_Ref::isRedundant(const Tsd_Ref* other) const {
    Tsd_RefListIter iter(&requireOwner("isRedundant"));
    while (Tsd_Ref* held = iter.next())
        if (held->isEqual(other))
            return true;
    return false;
}
