#include "tsd/host/NetConstraintParser.h"

#include "host/ConstraintLexer.h"

using namespace tsd_constraint;

namespace {

// One net-level value: reads it whole, then calls exactly one callback.
// Returns false on failure, with the reader's error set for a syntax error
// and unset when the callback answered false.
bool netDefinition(NetConstraintParser& p, Reader& r) {
    const Token& first = r.tok();
    if (!r.checkGap(first, Gap::Lead))
        return false;
    if (first.type == TokenType::End || first.type == TokenType::Semicolon)
        return r.fail(CONSTRAINT_ERR_EMPTY, first);
    if (first.type != TokenType::Word)
        return r.unexpected(first);
    const Keyword keyword = first.keyword;
    Quantity q;
    switch (keyword) {
    case KW_PERIOD: {
        r.advance();
        if (!r.readQuantity(Gap::Definition, kPeriodSpec, q))
            return false;
        PeriodOptions o;
        if (!readPeriodOptions(r, false, o) || !r.readTerminator())
            return false;
        return p.cb_period(q.value, o.dutyLow, o.dutyTimePs, o.dutyPercent,
                           o.hasJitter ? &o.jitterPs : nullptr);
    }
    case KW_MAXDELAY:
    case KW_MAXSKEW:
        r.advance();
        if (!r.readQuantity(Gap::Definition, kDurationSpec, q) || !r.readTerminator())
            return false;
        return keyword == KW_MAXDELAY ? p.cb_maxdelay(q.value) : p.cb_maxskew(q.value);
    case KW_OFFSET: {
        r.advance();
        OffsetParts o;
        if (!readOffsetBody(r, Gap::Definition, o) || !r.readTerminator())
            return false;
        return p.cb_offset(o.in, o.offsetPs, o.hasValid ? &o.validPs : nullptr, o.before, o.clock,
                           o.regGroup, o.highLow);
    }
    case KW_FEEDBACK: {
        // FEEDBACK = time kind group ; the kind is any word (NET in practice).
        r.advance();
        if (!r.readQuantity(Gap::Definition, kSignedTimeSpec, q))
            return false;
        const char* kind = nullptr;
        const char* group = nullptr;
        if (!r.readName(Gap::Normal, kind) || !r.readName(Gap::Normal, group) ||
            !r.readTerminator())
            return false;
        return p.cb_portpair("FEEDBACK", q.value, kind, group);
    }
    default:
        return r.unexpected(first);
    }
}

} // namespace

NetConstraintParser::NetConstraintParser() : m_reader(std::make_unique<Reader>()) {}

NetConstraintParser::~NetConstraintParser() = default;

bool NetConstraintParser::parse(const char* text) {
    tsd_constraint::ReaderLease lease(*m_reader, m_parsing);
    Reader* reader = &lease.get();

    bool ok = reader->start(text) && netDefinition(*this, *reader);
    if (!ok && reader->failed())
        cb_error(reader->errorCode(), reader->errorToken());
    return !ok;
}

bool NetConstraintParser::cb_error(int, const char*) {
    return true;
}

bool NetConstraintParser::cb_offset(bool, double, const double*, bool, const char*, const char*,
                                    const char*) {
    return true;
}

bool NetConstraintParser::cb_period(double, bool, double, double, const double*) {
    return true;
}

bool NetConstraintParser::cb_maxdelay(double) {
    return true;
}

bool NetConstraintParser::cb_maxskew(double) {
    return true;
}

bool NetConstraintParser::cb_portpair(const char*, double, const char*, const char*) {
    return true;
}
