#include "tsd/host/LogicalConstraintParser.h"

#include "host/ConstraintLexer.h"

using namespace tsd_constraint;

namespace {

ParserEdge edgeOf(Keyword keyword) {
    switch (keyword) {
    case KW_RISING:
        return PARSER_EDGE_RISING;
    case KW_FALLING:
        return PARSER_EDGE_FALLING;
    case KW_TRANSHI:
        return PARSER_EDGE_TRANSHI;
    case KW_TRANSLO:
        return PARSER_EDGE_TRANSLO;
    default:
        return PARSER_EDGE_NONE;
    }
}

bool isEdge(const Token& t) {
    return t.type == TokenType::Word && edgeOf(t.keyword) != PARSER_EDGE_NONE;
}

// One definition: reads it whole, then calls exactly one callback. Every
// member returns false on failure, with the reader's error set for a syntax
// error and unset when a callback answered false.
class LogicalGrammar {
public:
    LogicalGrammar(LogicalConstraintParser& parser, Reader& reader) : p(parser), r(reader) {}

    bool definition() {
        const Token& first = r.tok();
        if (!r.checkGap(first, Gap::Lead))
            return false;
        if (first.type == TokenType::End || first.type == TokenType::Semicolon)
            return r.fail(CONSTRAINT_ERR_EMPTY, first);
        if (first.type != TokenType::Word)
            return r.unexpected(first);
        switch (first.keyword) {
        case KW_TIMEGRP:
            return timegrp(first);
        case KW_TIMESPEC:
            return timespec(first);
        case KW_OFFSET:
            r.advance();
            return offset(first, nullptr);
        case KW_ENABLE:
        case KW_DISABLE:
            return enable(first);
        default:
            return r.unexpected(first);
        }
    }

private:
    // TIMEGRP name = members ;  or  TIMEGRP pads OFFSET = ... ;
    // A '=' after the name makes it a group definition (so "TIMEGRP A=OFFSET ;"
    // defines A with the member OFFSET); without it, OFFSET must follow.
    bool timegrp(const Token& first) {
        r.advance();
        const char* name = nullptr;
        if (!r.readName(Gap::Normal, name))
            return false;
        const Token& t = r.tok();
        bool definition = false;
        for (std::uint8_t i = 0; i < t.sepCount; ++i)
            definition = definition || t.sepChar[i] == '=';
        if (!definition) {
            if (!r.checkGap(t, Gap::Normal))
                return false;
            if (!r.at(KW_OFFSET))
                return r.fail(CONSTRAINT_ERR_EXPECTED_EQUALS, t);
            r.advance();
            return offset(first, name);
        }
        if (!r.checkGap(t, Gap::GroupDefinition))
            return false;

        // An edge keyword or EXCEPT is a keyword only when a name follows it;
        // the word after one is always a name.
        bool excluding = false;
        Gap endGap = Gap::Checked; // until a member is read, the '=' stands before the ';'
        for (bool firstMember = true;; firstMember = false) {
            const Token& m = r.tok();
            if (!r.isName(m))
                break;
            if ((!firstMember && !r.checkGap(m, Gap::Normal)) || !r.checkNotEmpty(m))
                return false;
            const bool nameFollows = r.isName(r.peek());
            endGap = Gap::Normal;
            if (!excluding && isEdge(m) && nameFollows) {
                r.advance();
                const char* member = nullptr;
                if (!r.readName(Gap::Normal, member))
                    return false;
                r.includes.emplace_back(member, edgeOf(m.keyword));
            } else if (!excluding && Reader::isKeyword(m, KW_EXCEPT) && nameFollows) {
                r.advance();
                excluding = true;
            } else if (excluding && (isEdge(m) || Reader::isKeyword(m, KW_EXCEPT)) && nameFollows) {
                // Excluded groups carry no edge, and EXCEPT comes once.
                return r.fail(CONSTRAINT_ERR_UNEXPECTED_TOKEN, m);
            } else {
                if (excluding)
                    r.excludes.push_back(r.text(m));
                else
                    r.includes.emplace_back(r.text(m), PARSER_EDGE_NONE);
                r.advance();
            }
        }
        if (!r.readTerminator(endGap))
            return false;
        const ConstraintHandle h = r.handle(ConstraintHandle::KIND_TIMEGRP, first);
        return p.cb_timegrp(name, r.includes, r.excludes, &h);
    }

    bool timespec(const Token& first) {
        r.advance();
        const char* tsid = nullptr;
        if (!r.readName(Gap::Normal, tsid))
            return false;
        const Token& body = r.tok();
        if (!r.checkGap(body, Gap::Definition))
            return false;
        if (body.type == TokenType::Word) {
            switch (body.keyword) {
            case KW_PERIOD:
                return period(first, tsid);
            case KW_FROM:
            case KW_THRU:
            case KW_TO:
            case KW_TIG:
                return path(first, tsid);
            case KW_DROP_SPEC: {
                r.advance();
                if (!r.readTerminator())
                    return false;
                const ConstraintHandle h = r.handle(ConstraintHandle::KIND_TIMESPEC, first);
                return p.cb_tspec_drop_spec(tsid, &h);
            }
            default:
                break;
            }
        }
        if (r.startsDelay(body))
            return path(first, tsid); // a delay without groups
        if (body.type == TokenType::Word || body.type == TokenType::Bad)
            return r.unexpected(body);
        return r.fail(CONSTRAINT_ERR_EXPECTED_VALUE, body);
    }

    // One FROM, THRU or TO keyword and the group name after it.
    bool pathPoint(Gap& gap) {
        if (!r.checkGap(r.tok(), gap))
            return false;
        r.advance();
        const char* name = nullptr;
        if (!r.readName(Gap::Normal, name))
            return false;
        r.names.push_back(name);
        gap = Gap::Normal;
        return true;
    }

    // [FROM name] {THRU name} [TO name] (delay [DATAPATHONLY] | TIG) [PRIORITY n]
    bool path(const Token& first, const char* tsid) {
        bool hasFrom = false, hasTo = false;
        Gap gap = Gap::Checked; // the '=' before the first word was checked
        if (r.at(KW_FROM)) {
            if (!pathPoint(gap))
                return false;
            hasFrom = true;
        }
        while (r.at(KW_THRU))
            if (!pathPoint(gap))
                return false;
        if (r.at(KW_TO)) {
            if (!pathPoint(gap))
                return false;
            hasTo = true;
        }

        int priority = LogicalConstraintParser::kNoPriority;
        if (r.at(KW_TIG)) {
            if (!r.checkGap(r.tok(), gap))
                return false;
            r.advance();
            if (r.at(KW_PRIORITY) && !readPriorityOption(priority))
                return false;
            if (!r.readTerminator())
                return false;
            const ConstraintHandle h = r.handle(ConstraintHandle::KIND_TIMESPEC, first);
            return p.cb_tspec_tig(tsid, hasFrom, hasTo, r.names, priority, &h);
        }

        Delay delay;
        if (!r.readDelay(gap, kDelaySpec, delay))
            return false;
        bool dataPathOnly = false, hasPriority = false;
        for (;;) {
            const Token& t = r.tok();
            if (Reader::isKeyword(t, KW_DATAPATHONLY)) {
                if (!r.checkGap(t, Gap::Normal))
                    return false;
                if (dataPathOnly)
                    return r.fail(CONSTRAINT_ERR_DUPLICATE, t);
                dataPathOnly = true;
                r.advance();
            } else if (Reader::isKeyword(t, KW_PRIORITY)) {
                if (hasPriority) {
                    if (!r.checkGap(t, Gap::Normal))
                        return false;
                    return r.fail(CONSTRAINT_ERR_DUPLICATE, t);
                }
                if (!readPriorityOption(priority))
                    return false;
                hasPriority = true;
            } else {
                break;
            }
        }
        if (!r.readTerminator())
            return false;
        const ConstraintHandle h = r.handle(ConstraintHandle::KIND_TIMESPEC, first);
        return p.cb_tspec_maxdelay(tsid, hasFrom, hasTo, r.names, delay.link, delay.multiply,
                                   delay.valueOrFactor, delay.isTime, priority, dataPathOnly, &h);
    }

    // At PRIORITY: the keyword and its number.
    bool readPriorityOption(int& priority) {
        if (!r.checkGap(r.tok(), Gap::Normal))
            return false;
        r.advance();
        return r.readPriority(Gap::Normal, priority);
    }

    // PERIOD group delay options
    bool period(const Token& first, const char* tsid) {
        r.advance();
        const char* group = nullptr;
        if (!r.readName(Gap::Normal, group))
            return false;
        Delay delay;
        if (!r.readDelay(Gap::Normal, kPeriodSpec, delay))
            return false;
        PeriodOptions o;
        if (!readPeriodOptions(r, true, o))
            return false;
        if (!r.readTerminator())
            return false;
        const ConstraintHandle h = r.handle(ConstraintHandle::KIND_TIMESPEC, first);
        return p.cb_tspec_period(tsid, group, delay.link, delay.multiply, delay.valueOrFactor,
                                 delay.isTime, o.phasePositive, o.phasePs, o.dutyLow, o.dutyTimePs,
                                 o.dutyPercent, o.hasJitter ? &o.jitterPs : nullptr, o.priority,
                                 &h);
    }

    // After OFFSET; `pad` is the pad group of "TIMEGRP pads OFFSET = ...".
    bool offset(const Token& first, const char* pad) {
        OffsetParts o;
        if (!readOffsetBody(r, Gap::Definition, o))
            return false;
        if (!r.readTerminator())
            return false;
        const ConstraintHandle h = r.handle(ConstraintHandle::KIND_OFFSET, first);
        const double* valid = o.hasValid ? &o.validPs : nullptr;
        if (pad == nullptr && o.regGroup == nullptr)
            return p.cb_offset(o.in, o.offsetPs, valid, o.before, o.clock, o.highLow, &h);
        if (pad == nullptr)
            return p.cb_roffset(o.in, o.offsetPs, valid, o.before, o.clock, o.regGroup, o.highLow,
                                &h);
        if (o.regGroup == nullptr)
            return p.cb_toffset(pad, o.in, o.offsetPs, valid, o.before, o.clock, o.highLow, &h);
        return p.cb_troffset(pad, o.in, o.offsetPs, valid, o.before, o.clock, o.regGroup, o.highLow,
                             &h);
    }

    // ENABLE = name ;  DISABLE = ;
    bool enable(const Token& first) {
        const bool on = first.keyword == KW_ENABLE;
        r.advance();
        const Token& t = r.tok();
        if (!r.checkGap(t, Gap::Definition))
            return false;
        const char* name = nullptr;
        Gap endGap = Gap::Checked;
        if (r.isName(t)) {
            if (!r.checkNotEmpty(t))
                return false;
            name = r.text(t);
            r.advance();
            endGap = Gap::Normal;
        }
        if (!r.readTerminator(endGap))
            return false;
        const ConstraintHandle h =
            r.handle(on ? ConstraintHandle::KIND_ENABLE : ConstraintHandle::KIND_DISABLE, first);
        return p.cb_enable(on, name, &h);
    }

    LogicalConstraintParser& p;
    Reader& r;
};

} // namespace

LogicalConstraintParser::LogicalConstraintParser() : m_reader(std::make_unique<Reader>()) {}

LogicalConstraintParser::~LogicalConstraintParser() = default;

bool LogicalConstraintParser::parse(const char* text) {
    tsd_constraint::ReaderLease lease(*m_reader, m_parsing);
    Reader* reader = &lease.get();

    bool ok = reader->start(text);
    if (ok) {
        LogicalGrammar grammar(*this, *reader);
        ok = grammar.definition();
    }
    if (!ok && reader->failed())
        cb_error(reader->errorCode(), reader->errorColumn(), reader->errorToken());
    return !ok;
}

bool LogicalConstraintParser::cb_error(int, int, const char*) {
    return true;
}

bool LogicalConstraintParser::cb_enable(bool, const char*, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_offset(bool, double, const double*, bool, const char*, const char*,
                                        const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_toffset(const char*, bool, double, const double*, bool,
                                         const char*, const char*, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_roffset(bool, double, const double*, bool, const char*,
                                         const char*, const char*, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_troffset(const char*, bool, double, const double*, bool,
                                          const char*, const char*, const char*,
                                          const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_tspec_maxdelay(const char*, bool, bool,
                                                const std::vector<const char*>&, const char*, bool,
                                                double, bool, int, bool, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_tspec_period(const char*, const char*, const char*, bool, double,
                                              bool, bool, double, bool, double, double,
                                              const double*, int, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_tspec_tig(const char*, bool, bool, const std::vector<const char*>&,
                                           int, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_tspec_drop_spec(const char*, const ConstraintHandle*) {
    return true;
}

bool LogicalConstraintParser::cb_timegrp(const char*,
                                         const std::vector<std::pair<const char*, ParserEdge>>&,
                                         const std::vector<const char*>&, const ConstraintHandle*) {
    return true;
}
