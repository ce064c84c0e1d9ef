// Writes a design back out as properties: group definitions, then
// specifications, one pass each, and the property of any reference record on
// demand. Every pair is the canonical text of the object's own getProp.
#pragma once

#include <memory>

#include "tsd/Tsd_BaseObj.h"

class Tsd_Design;

class Tsd_Annotator {
public:
    // A null design is a fatal message.
    explicit Tsd_Annotator(Tsd_Design* design);
    virtual ~Tsd_Annotator();
    Tsd_Annotator(const Tsd_Annotator&) = delete;
    Tsd_Annotator& operator=(const Tsd_Annotator&) = delete;

    // The next TIMEGRP definition; false at the end.
    bool getNextGroupProp(const char*& name, const char*& value);
    // The next endpoint spec, then offset, then path control; false at the end.
    bool getNextSpecProp(const char*& name, const char*& value, const char*& scope);
    bool getNextSpecProp(const char*& name, const char*& value);
    // The property that the reference's owner stands for; false for a null or
    // unowned reference or a trashed owner.
    bool getRefProp(Tsd_Ref* ref, const char*& name, const char*& value, const char*& scope);
    bool getRefProp(Tsd_Ref* ref, const char*& name, const char*& value);

    void dump(DumpStream& stream, short indent) const;

private:
    Tsd_Design* m_design;
    std::unique_ptr<Tsd_BaseObjListIter> m_groupIter;
    std::unique_ptr<Tsd_BaseObjListIter> m_endpointSpecIter;
    std::unique_ptr<Tsd_BaseObjListIter> m_offsetSpecIter;
    std::unique_ptr<Tsd_BaseObjListIter> m_pathControlIter;
};
