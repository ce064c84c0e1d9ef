#include "tsd/host/Messages.h"

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

MessageSink* g_sink = nullptr;

int& debugTraceState() {
    // -1: not decided yet; read the environment on first use.
    static int state = -1;
    if (state < 0)
        state = std::getenv("TSD_DEBUG_TRACE") != nullptr ? 1 : 0;
    return state;
}

MessageSink& currentSink() {
    static StderrMessageSink fallback;
    return g_sink != nullptr ? *g_sink : fallback;
}

} // namespace

const char* messageSeverityName(MessageSeverity severity) {
    switch (severity) {
    case MessageSeverity::Error:
        return "error";
    case MessageSeverity::Fatal:
        return "fatal error";
    case MessageSeverity::InternalError:
        return "internal error";
    case MessageSeverity::Status:
        return "status";
    case MessageSeverity::Debug:
        return "debug";
    }
    return "message";
}

void StderrMessageSink::deliver(const MessageRecord& record) {
    std::string text = record.text;
    if (!text.empty() && text.back() == '\n')
        text.pop_back();
    std::fprintf(stderr, "%s: %s: %s\n", record.domain.c_str(),
                 messageSeverityName(record.severity), text.c_str());
    std::fflush(stderr);
}

Message::Message(const char* domain, const char* sourceFile, int line, const char* revision)
    : m_domain(domain ? domain : ""), m_sourceFile(sourceFile ? sourceFile : ""), m_line(line),
      m_revision(revision ? revision : "") {}

void Message::deliver(MessageSeverity severity, int code, const char* format, va_list args) const {
    MessageRecord record;
    record.severity = severity;
    record.domain = m_domain;
    record.text = vformatMessage(format, args);
    record.fatalCode = code;
    record.sourceFile = m_sourceFile;
    record.line = m_line;
    currentSink().deliver(record);
}

void Message::error(const char* format, ...) const {
    va_list args;
    va_start(args, format);
    deliver(MessageSeverity::Error, 0, format, args);
    va_end(args);
}

void Message::fatal(int code, const char* format, ...) const {
    va_list args;
    va_start(args, format);
    deliver(MessageSeverity::Fatal, code, format, args);
    va_end(args);
    // The sink returned: the run ends here with the message's code.
    std::fflush(nullptr);
    std::exit(code);
}

void Message::internalError(const char* format, ...) const {
    va_list args;
    va_start(args, format);
    deliver(MessageSeverity::InternalError, 0, format, args);
    va_end(args);
}

void Message::status(const char* format, ...) const {
    va_list args;
    va_start(args, format);
    deliver(MessageSeverity::Status, 0, format, args);
    va_end(args);
}

Message MessageManager::createObject(const char* domain, const char* sourceFile, int line,
                                     const char* revision) {
    return Message(domain, sourceFile, line, revision);
}

void MessageManager::debugTrace(const char* format, ...) {
    if (!debugTraceEnabled())
        return;
    MessageRecord record;
    record.severity = MessageSeverity::Debug;
    record.domain = "TSDatabase";
    va_list args;
    va_start(args, format);
    record.text = vformatMessage(format, args);
    va_end(args);
    currentSink().deliver(record);
}

void MessageManager::setDebugTrace(bool on) {
    debugTraceState() = on ? 1 : 0;
}

bool MessageManager::debugTraceEnabled() {
    return debugTraceState() == 1;
}

MessageSink* MessageManager::setSink(MessageSink* sink) {
    MessageSink* previous = g_sink;
    g_sink = sink;
    return previous;
}

MessageSink* MessageManager::getSink() {
    return g_sink;
}
