// Time values and the specification classes.
#pragma once

#include <cstdint>

#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Groups.h"

#include <memory>
#include <variant>

// A number and its unit. Every time quantity of the specifications is one;
// conversions go through picoseconds, and frequency units convert to times by
// their reciprocal.
struct Tsd_TimeValue {
    enum Units : std::int32_t {
        UNITS_PS = 0,
        UNITS_NS = 1,
        UNITS_US = 2,
        UNITS_MS = 3,
        UNITS_GHZ = 4,
        UNITS_MHZ = 5,
        UNITS_KHZ = 6,
    };

    double value;
    Units units;

    Tsd_TimeValue() : value(0.0), units(UNITS_PS) {}
    Tsd_TimeValue(double v, Units u) : value(v), units(u) {}

    double getValue(Units target) const;
    double getPicoSeconds() const { return getValue(UNITS_PS); }
    void changeUnits(Units target);
    // Number, separator, unit word ("10:nS"); valid until the next getString.
    const char* getString(const char* separator) const;

    // "pS", "nS", "uS", "mS", "GHz", "MHz", "kHz"; null outside the table.
    static const char* getUnitWord(Units units);
    // True for GHz, MHz and kHz.
    static bool isFrequency(Units units);
};

// The canonical text of a number: "%.9f" without trailing zeros or point.
// Valid until the next call.
const char* formatNumber(double d);

// The base of every specification: its TSid (null for offsets and net-level
// specifications) and a scope text that callers may attach.
class Tsd_Spec : public Tsd_BaseObj {
public:
    ~Tsd_Spec() override;

    Tsd_Spec* getSpec() override { return this; }

    const char* getTSid() const { return m_tsid.get(); }
    void setTSid(const char* tsid);
    const char* getScope() const { return m_scope.get(); }
    void setScope(const char* scope) { m_scope.set(scope); }

protected:
    explicit Tsd_Spec(const char* tsid);
    Tsd_Spec(const Tsd_Spec& other);

private:
    Tsd_String m_tsid;
    Tsd_String m_scope;
};

// A specification of the paths between endpoints (delay paths and periods).
// Its delay is a time value or a TSid link: another endpoint spec's delay
// multiplied or divided by a factor.
class Tsd_EndpointSpec : public Tsd_Spec {
public:
    struct LinkData {
        Tsd_EndpointSpec* spec; // null while the linked TSid is not yet found
        bool multiply;          // true: x factor; false: / factor
        double factor;
    };

    ~Tsd_EndpointSpec() override;

    Tsd_EndpointSpec* getEndpointSpec() override { return this; }
    void dump(DumpStream& stream, short indent) const override;
    // True for a timing-ignored path; the first operation behind the base's.
    virtual bool isIgnored() const;

    // The effective delay, following the link chain. Only for specs whose
    // checkLink() is 0; a broken chain is a fatal message.
    Tsd_TimeValue getDelayValue() const;
    bool hasDelayValue() const { return std::holds_alternative<Tsd_TimeValue>(m_delayOrLink); }
    void setDelayValue(const Tsd_TimeValue& delay);
    void setLinkData(Tsd_EndpointSpec* spec, bool multiply, double factor);
    bool isLinked() const { return std::holds_alternative<LinkData>(m_delayOrLink); }
    Tsd_EndpointSpec* getLinkedSpec() const;
    bool isLinkMultiplied() const;
    double getLinkFactor() const;
    const LinkData* getLinkData() const { return std::get_if<LinkData>(&m_delayOrLink); }

    bool hasPriority() const { return m_priority != -1; }
    int getPriority() const { return m_priority; }
    void setPriority(int priority) {
        m_priority = priority;
        m_priorityWrittenAsNone = false;
    }
    void clearPriority() { setPriority(-1); }
    // A priority of -1 as the constraint text wrote it. It reads as no
    // priority like any -1, but is written back and dumped, so that the
    // text keeps it; setPriority and clearPriority forget it.
    void setWrittenPriority(int priority) {
        setPriority(priority);
        m_priorityWrittenAsNone = priority == -1;
    }
    // A priority to write: one that is set, or -1 as written.
    bool hasWrittenPriority() const { return hasPriority() || m_priorityWrittenAsNone; }

    Tsd_TIGGroup* getIgnoreGroup() const { return m_ignoreGroup; }
    void setIgnoreGroup(Tsd_TIGGroup* group) { m_ignoreGroup = group; }

    // Number of problems on the link chain from this spec (zero divisors,
    // an ignored end, a cycle); reported when `report` is true.
    int checkLink(bool report) const;

protected:
    // A null TSid is a fatal message.
    explicit Tsd_EndpointSpec(const char* tsid);
    Tsd_EndpointSpec(const Tsd_EndpointSpec& other);

    // The delay part of a property value (10:nS, TS02*2); null when there is
    // neither delay nor link. Valid until the next call.
    const char* getDelayPropString() const;

private:
    friend class tsd_detail::LinkGraph;

    const Tsd_TimeValue* delay() const { return std::get_if<Tsd_TimeValue>(&m_delayOrLink); }
    const LinkData* link() const { return getLinkData(); }

    // Held in this object, at most one of the two.
    std::variant<std::monostate, Tsd_TimeValue, LinkData> m_delayOrLink;
    std::int32_t m_priority;
    // This spec's node in the link graph being built, tagged with that
    // graph; read only through it.
    mutable std::int32_t m_graphNode = 0;
    mutable std::uint64_t m_graphTag = 0;
    Tsd_TIGGroup* m_ignoreGroup;
    bool m_priorityWrittenAsNone = false;
};

// "TS02*2", or with a separator "TS02 * 2"; null for a pending link.
// Valid until the next call.
const char* formatLink(const Tsd_EndpointSpec::LinkData* link, const char* separator);

class Tsd_PathThruIter;

// A FROM/THRU/TO maximum-delay specification, a timing-ignored path (TIG)
// or a data-path-only path.
class Tsd_DelayPath : public Tsd_EndpointSpec {
public:
    explicit Tsd_DelayPath(const char* tsid);
    Tsd_DelayPath(const Tsd_DelayPath& other);
    Tsd_DelayPath& operator=(const Tsd_DelayPath&) = delete;
    ~Tsd_DelayPath() override;

    Tsd_DelayPath* getDelayPath() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;
    bool isIgnored() const override { return m_ignored; }

    Tsd_TermGroup* getStart() const { return m_start; }
    void setStart(Tsd_TermGroup* group) { m_start = group; }
    Tsd_TermGroup* getEnd() const { return m_end; }
    void setEnd(Tsd_TermGroup* group) { m_end = group; }
    void addThru(Tsd_ThruGroup* group);
    bool removeThru(Tsd_ThruGroup* group);

    void setIgnored() { m_ignored = true; }
    void clearIgnored() { m_ignored = false; }
    bool isDataPathOnly() const { return m_dataPathOnly; }
    void setDataPathOnly() { m_dataPathOnly = true; }
    void clearDataPathOnly() { m_dataPathOnly = false; }

    // Null when the path has no THRU group left.
    std::unique_ptr<Tsd_PathThruIter> createThruIter() const;

private:
    friend class Tsd_PathThruIter;

    Tsd_TermGroup* m_start = nullptr;
    Tsd_TermGroup* m_end = nullptr;
    Tsd_BaseObjList m_thruGroups{10};
    bool m_ignored = false;
    bool m_dataPathOnly = false;
};

// Walks the THRU groups of a path in order.
class Tsd_PathThruIter : public Tsd_BaseObjListIter {
public:
    explicit Tsd_PathThruIter(const Tsd_DelayPath* path);
    Tsd_ThruGroup* next();
};

// A PERIOD specification: the period (a time, a frequency or a link), an
// optional duty cycle, phase shift and input jitter.
class Tsd_Period : public Tsd_EndpointSpec {
public:
    explicit Tsd_Period(const char* tsid);
    Tsd_Period(const Tsd_Period& other);
    Tsd_Period& operator=(const Tsd_Period&) = delete;
    ~Tsd_Period() override;

    Tsd_Period* getPeriod() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    Tsd_TermGroup* getPeriodGroup() const { return m_periodGroup; }
    void setPeriodGroup(Tsd_TermGroup* group) { m_periodGroup = group; }

    bool hasDutyCycle() const { return m_dutyCycleValue != nullptr || m_dutyCyclePercent != 0.0; }
    bool isDutyCyclePercent() const { return m_dutyCyclePercent != 0.0; }
    double getDutyCyclePercent() const { return m_dutyCyclePercent; }
    bool dutyCycleHigh() const { return m_dutyCycleHigh; }
    Tsd_TimeValue getDutyCycleValue() const;
    void setDutyCycleValue(const Tsd_TimeValue& value, bool high);
    void setDutyCyclePercent(double percent, bool high);

    bool hasPhase() const { return m_phase != nullptr; }
    Tsd_TimeValue getPhaseValue() const;
    bool phaseIsPositive() const { return m_phasePositive; }
    // A zero phase is not stored; the sign is recorded either way.
    void setPhase(const Tsd_TimeValue& value, bool positive);

    bool hasInputJitter() const { return m_inputJitter != nullptr; }
    Tsd_TimeValue getInputJitterValue() const;
    void setInputJitter(const Tsd_TimeValue& value);
    void clearInputJitter();

private:
    Tsd_TermGroup* m_periodGroup = nullptr;
    std::unique_ptr<Tsd_TimeValue> m_dutyCycleValue;
    double m_dutyCyclePercent = 0.0;
    std::unique_ptr<Tsd_TimeValue> m_phase;
    std::unique_ptr<Tsd_TimeValue> m_inputJitter;
    bool m_dutyCycleHigh = false;
    bool m_phasePositive = false;
};

// The global OFFSET: data arriving (IN) or leaving (OUT) so much time BEFORE
// or AFTER the edge of a clock, optionally with a data-valid window, a
// register group and edges, or measured at a reference pin.
class Tsd_Offset : public Tsd_Spec {
public:
    Tsd_Offset();
    Tsd_Offset(const Tsd_Offset& other);
    Tsd_Offset& operator=(const Tsd_Offset&) = delete;
    ~Tsd_Offset() override;

    Tsd_Offset* getOffset() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    Tsd_TimeValue getOffsetValue() const;
    bool hasOffsetValue() const { return m_offsetValue != nullptr; }
    void setOffsetValue(const Tsd_TimeValue& value);
    void removeOffsetValue();

    bool isBefore() const { return m_before; }
    void setBefore(bool before) { m_before = before; }
    bool isIn() const { return m_in; }
    void setIn(bool in) { m_in = in; }

    Tsd_ClkGroup* getClockPad() const { return m_clockPad; }
    void setClockPad(Tsd_ClkGroup* group) { m_clockPad = group; }
    Tsd_TermGroup* getRegGroup() const { return m_regGroup; }
    void setRegGroup(Tsd_TermGroup* group) { m_regGroup = group; }

    bool hasDataValid() const { return m_dataValid != nullptr; }
    Tsd_TimeValue getDataValidValue() const;
    void setDataValid(const Tsd_TimeValue& value);
    void clearDataValid();

    Tsd_UserGroup::Edge getRefClockEdge() const { return m_refClockEdge; }
    void setRefClockEdge(Tsd_UserGroup::Edge edge) { m_refClockEdge = edge; }
    Tsd_UserGroup::Edge getRegGroupEdge() const { return m_regGroupEdge; }
    void setRegGroupEdge(Tsd_UserGroup::Edge edge) { m_regGroupEdge = edge; }

    Tsd_ClkGroup* getReferencePin() const { return m_referencePin; }
    void setReferencePin(Tsd_ClkGroup* group) { m_referencePin = group; }

protected:
    // The offset text shared by the three offset classes
    // (IN:2:nS:BEFORE:clk...); valid until the next call.
    const char* getSharedString() const;

private:
    std::unique_ptr<Tsd_TimeValue> m_offsetValue;
    Tsd_ClkGroup* m_clockPad = nullptr;
    Tsd_TermGroup* m_regGroup = nullptr;
    std::unique_ptr<Tsd_TimeValue> m_dataValid;
    bool m_before = true;
    bool m_in = true;
    Tsd_UserGroup::Edge m_refClockEdge = Tsd_UserGroup::EDGE_ANY;
    Tsd_UserGroup::Edge m_regGroupEdge = Tsd_UserGroup::EDGE_ANY;
    Tsd_ClkGroup* m_referencePin = nullptr;
};

// An OFFSET for the pads of one group ("TS_GROUP_BASED_OFFSET").
class Tsd_GroupOffset : public Tsd_Offset {
public:
    Tsd_GroupOffset();
    Tsd_GroupOffset(const Tsd_GroupOffset& other);
    ~Tsd_GroupOffset() override;

    Tsd_GroupOffset* getGroupOffset() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    // The property value with blanks for colons, without a name.
    const char* getUserString() const override;
    void dump(DumpStream& stream, short indent) const override;

    Tsd_TermGroup* getPadGroup() const { return m_padGroup; }
    void setPadGroup(Tsd_TermGroup* group) { m_padGroup = group; }

private:
    Tsd_TermGroup* m_padGroup = nullptr;
};

// An OFFSET found on nets ("TS_OFFSET"); it owns those nets' references.
class Tsd_NetOffset : public Tsd_Offset {
public:
    Tsd_NetOffset();
    Tsd_NetOffset(const Tsd_NetOffset&) = delete;
    ~Tsd_NetOffset() override;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_NetOffset* getNetOffset() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

private:
    Tsd_RefList m_refs{10};
};

// A net-level TS_PERIOD, TS_MAXDELAY or TS_MAXSKEW; exactly one kind of limit
// is set. It owns the references of the elements that carry it.
class Tsd_NetTiming : public Tsd_Spec {
public:
    Tsd_NetTiming();
    Tsd_NetTiming(const Tsd_NetTiming&) = delete;
    Tsd_NetTiming& operator=(const Tsd_NetTiming&) = delete;
    ~Tsd_NetTiming() override;

    Tsd_RefList* getRefList() override { return &m_refs; }
    Tsd_NetTiming* getNetTiming() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    bool hasPeriod() const { return m_period != nullptr; }
    bool hasMaxDelay() const { return m_maxDelay != nullptr; }
    bool hasMaxSkew() const { return m_maxSkew != nullptr; }
    bool hasInputJitter() const { return m_inputJitter != nullptr; }
    bool hasDutyCycle() const { return m_dutyCycleValue != nullptr || m_dutyCyclePercent != 0.0; }
    bool isDutyCyclePercent() const { return m_dutyCyclePercent != 0.0; }
    bool dutyCycleHigh() const { return m_dutyCycleHigh; }
    double getDutyCyclePercent() const { return m_dutyCyclePercent; }

    Tsd_TimeValue getPeriodValue() const;
    Tsd_TimeValue getMaxDelayValue() const;
    Tsd_TimeValue getMaxSkewValue() const;
    Tsd_TimeValue getInputJitterValue() const;
    Tsd_TimeValue getDutyCycleValue() const;

    void setPeriodValue(const Tsd_TimeValue& value);
    void setMaxDelayValue(const Tsd_TimeValue& value);
    void setMaxSkewValue(const Tsd_TimeValue& value);
    void setDutyCycleValue(const Tsd_TimeValue& value, bool high);
    void setDutyCyclePercent(double percent, bool high);
    void setInputJitter(const Tsd_TimeValue& value);
    void clearInputJitter();

private:
    Tsd_RefList m_refs{10};
    std::unique_ptr<Tsd_TimeValue> m_period;
    std::unique_ptr<Tsd_TimeValue> m_dutyCycleValue;
    double m_dutyCyclePercent = 0.0;
    bool m_dutyCycleHigh = false;
    std::unique_ptr<Tsd_TimeValue> m_maxDelay;
    std::unique_ptr<Tsd_TimeValue> m_maxSkew;
    std::unique_ptr<Tsd_TimeValue> m_inputJitter;
};

// An ENABLE or DISABLE of one named delay.
class Tsd_PathControl : public Tsd_Spec {
public:
    Tsd_PathControl(const char* delayName, bool enabled);
    Tsd_PathControl(const Tsd_PathControl& other);
    Tsd_PathControl& operator=(const Tsd_PathControl&) = delete;
    ~Tsd_PathControl() override;

    Tsd_PathControl* getPathControl() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    const char* getDelayName() const { return m_delayName.get(); }
    bool isEnabled() const { return m_enabled; }

private:
    Tsd_String m_delayName;
    bool m_enabled;
};

// A port timing such as TS_FEEDBACK: a time value and, optionally, the clock
// group on the other side of the port pair. It owns its references.
class Tsd_PortTiming : public Tsd_Spec {
public:
    explicit Tsd_PortTiming(const char* constraintName);
    Tsd_PortTiming(const Tsd_PortTiming&) = delete;
    Tsd_PortTiming& operator=(const Tsd_PortTiming&) = delete;
    ~Tsd_PortTiming() override;

    Tsd_RefList* getRefList() override;
    Tsd_PortTiming* getPortTiming() override { return this; }
    bool getProp(const char*& name, const char*& value) const override;
    void dump(DumpStream& stream, short indent) const override;

    // The keyword without "TS_", e.g. FEEDBACK.
    const char* getConstraintName() const;
    Tsd_TimeValue getConstraintValue() const;
    void setConstraintValue(const Tsd_TimeValue& value);
    Tsd_ClkGroup* getSecondaryGroup() const;
    void setSecondaryGroup(Tsd_ClkGroup* group);

private:
    struct Data;
    std::unique_ptr<Data> m_data;
};
