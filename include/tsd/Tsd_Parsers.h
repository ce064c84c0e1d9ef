// The parser adaptors: they turn constraint text into database objects by
// overriding the callbacks of the host's constraint parsers, looking every
// named group up through the builder they serve.
#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "tsd/Tsd_Groups.h"
#include "tsd/Tsd_Specs.h"
#include "tsd/host/LogicalConstraintParser.h"
#include "tsd/host/NetConstraintParser.h"

class Tsd_Builder;

// The OFFSET feature reducer. A reference pin, a register clock edge and a
// missing offset value are handled by the library itself: the reducer
// removes them from the text, remembers them, and hands the parser a reduced
// text without them.
class Tsd_OffsetBonusParser {
public:
    Tsd_OffsetBonusParser() = default;

    // True when the text held special features and a reduced text was made.
    bool reduceOffset(const char* text);

    const char* getReducedText() const { return m_reduced.c_str(); }
    // The pin that followed REFERENCE_PIN; empty when none.
    const std::string& getRefPin() const { return m_refPin; }
    // EDGE_RISING or EDGE_FALLING when given; EDGE_ANY otherwise.
    Tsd_UserGroup::Edge getRegEdge() const { return m_regEdge; }
    // False when the OFFSET was written without a value.
    bool hasValue() const { return m_hasValue; }

    // The two switches, read from the environment when the library is loaded:
    // QOR_TSD_NO_SPECIAL_PARSER disables the reducer, QOR_TSD_DEBUG_SPECIAL_PARSER
    // turns its report on.
    static bool isDisabled();
    static bool isDebugEnabled();

private:
    void reset();

    std::string m_reduced;
    std::string m_refPin;
    Tsd_UserGroup::Edge m_regEdge = Tsd_UserGroup::EDGE_ANY;
    bool m_hasValue = true;
};

// Turns one TIMEGRP, TIMESPEC, OFFSET, ENABLE or DISABLE definition into one
// object, left in the parser for the builder to take.
class Tsd_SpecGroupParser : public LogicalConstraintParser {
public:
    explicit Tsd_SpecGroupParser(Tsd_Builder* builder);
    ~Tsd_SpecGroupParser() override;
    Tsd_SpecGroupParser(const Tsd_SpecGroupParser&) = delete;
    Tsd_SpecGroupParser& operator=(const Tsd_SpecGroupParser&) = delete;

    // Parses after the OFFSET reduction; true when the text could NOT be parsed.
    bool parse2(const char* text);

    Tsd_Spec* getNewSpec() const { return m_newSpec; }
    void setNewSpec(Tsd_Spec* spec) { m_newSpec = spec; }
    Tsd_UserGroup* getNewGroup() const { return m_newGroup; }
    void setNewGroup(Tsd_UserGroup* group) { m_newGroup = group; }
    const char* getBadToken() const { return m_badToken.get(); }
    int getBadOffset() const { return m_badOffset; }
    void clearError();

    static Tsd_UserGroup::Edge convertPrefEdge(ParserEdge edge);
    static bool addInclude(Tsd_UserGroup* group,
                           const std::vector<std::pair<const char*, ParserEdge>>& includes,
                           Tsd_Builder* builder);
    static bool addExclude(Tsd_UserGroup* group, const std::vector<const char*>& names,
                           Tsd_Builder* builder);
    static bool addFromToThru(Tsd_DelayPath* path, bool hasFrom, bool hasTo,
                              const std::vector<const char*>& names, Tsd_Builder* builder);
    // Fills what every OFFSET has: direction, value, valid time, before/after,
    // clock, HIGH/LOW and what the reducer removed.
    static bool addBaseOffset(Tsd_Offset* offset, bool in, double value, const double* dataValid,
                              bool before, const char* clockName, const char* highLow,
                              Tsd_Builder* builder, const Tsd_OffsetBonusParser* bonus);

    bool cb_error(int code, int column, const char* token) override;
    bool cb_enable(bool enable, const char* delayName, const ConstraintHandle* handle) override;
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* highLow, const ConstraintHandle* handle) override;
    bool cb_toffset(const char* padGroup, bool in, double offsetPs, const double* validPs,
                    bool before, const char* clock, const char* highLow,
                    const ConstraintHandle* handle) override;
    bool cb_roffset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                    const char* regGroup, const char* highLow,
                    const ConstraintHandle* handle) override;
    bool cb_troffset(const char* padGroup, bool in, double offsetPs, const double* validPs,
                     bool before, const char* clock, const char* regGroup, const char* highLow,
                     const ConstraintHandle* handle) override;
    bool cb_tspec_maxdelay(const char* tsid, bool hasFrom, bool hasTo,
                           const std::vector<const char*>& groups, const char* linkTsid,
                           bool multiply, double valueOrFactor, bool isTime, int priority,
                           bool dataPathOnly, const ConstraintHandle* handle) override;
    bool cb_tspec_period(const char* tsid, const char* group, const char* linkTsid, bool multiply,
                         double valueOrFactor, bool isTime, bool phasePositive, double phasePs,
                         bool dutyLow, double dutyTimePs, double dutyPercent,
                         const double* inputJitterPs, int priority,
                         const ConstraintHandle* handle) override;
    bool cb_tspec_tig(const char* tsid, bool hasFrom, bool hasTo,
                      const std::vector<const char*>& groups, int priority,
                      const ConstraintHandle* handle) override;
    bool cb_tspec_drop_spec(const char* tsid, const ConstraintHandle* handle) override;
    bool cb_timegrp(const char* name,
                    const std::vector<std::pair<const char*, ParserEdge>>& includes,
                    const std::vector<const char*>& excludes,
                    const ConstraintHandle* handle) override;

private:
    // The member a TIMEGRP definition names, found as the builder answers.
    static Tsd_PredefGroup* findMember(Tsd_UserGroup* group, const char* name,
                                       Tsd_Builder* builder);
    // Leaves `spec` as the parse's result; whoever takes it owns it.
    void store(std::unique_ptr<Tsd_Spec> spec);
    // Fills an offset, looks up its pad and register groups (when named) and
    // keeps it when everything was found.
    bool makeOffset(std::unique_ptr<Tsd_Offset> offset, const char* padGroup, const char* regGroup,
                    bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                    const char* highLow);
    // Sets the delay or the link of a period or delay path from the decoded value.
    void setDelayOrLink(Tsd_EndpointSpec* spec, const char* linkTsid, bool multiply,
                        double valueOrFactor, bool isTime) const;

    Tsd_UserGroup* m_newGroup = nullptr;
    Tsd_Spec* m_newSpec = nullptr;
    Tsd_Builder* m_builder;
    Tsd_String m_badToken;
    int m_badOffset = -1;
    std::unique_ptr<Tsd_OffsetBonusParser> m_bonusParser;
};

// Turns the value of one net-level reference property (TS_PERIOD,
// TS_MAXDELAY, TS_MAXSKEW, TS_OFFSET, TS_FEEDBACK) into a net timing, a net
// offset or a port timing.
class Tsd_NetParser : public NetConstraintParser {
public:
    explicit Tsd_NetParser(Tsd_Builder* builder);
    ~Tsd_NetParser() override;
    Tsd_NetParser(const Tsd_NetParser&) = delete;
    Tsd_NetParser& operator=(const Tsd_NetParser&) = delete;

    // Parses after the OFFSET reduction; true when the text could NOT be parsed.
    bool parse2(const char* text);

    Tsd_Spec* getNewSpec() const { return m_newSpec; }
    void setNewSpec(Tsd_Spec* spec) { m_newSpec = spec; }
    const char* getBadToken() const { return m_badToken.get(); }
    void clearError() { m_badToken.set(nullptr); }

    bool cb_error(int code, const char* token) override;
    bool cb_offset(bool in, double offsetPs, const double* validPs, bool before, const char* clock,
                   const char* regGroup, const char* highLow) override;
    bool cb_period(double periodPs, bool dutyLow, double dutyTimePs, double dutyPercent,
                   const double* inputJitterPs) override;
    bool cb_maxdelay(double delayPs) override;
    bool cb_maxskew(double skewPs) override;
    bool cb_portpair(const char* constraintName, double valuePs, const char* kind,
                     const char* group) override;

private:
    void store(std::unique_ptr<Tsd_Spec> spec);

    Tsd_Spec* m_newSpec = nullptr;
    Tsd_Builder* m_builder;
    Tsd_String m_badToken;
    std::unique_ptr<Tsd_OffsetBonusParser> m_bonusParser;
};
