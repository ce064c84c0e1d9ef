// Message reporting for the timing-specification database.
//
// The library never prints by itself: every error, fatal error, internal
// error, status line and debug trace goes through a message object made by
// MessageManager::createObject and ends up in the installed MessageSink.
// Formats are printf formats plus one conversion, "%z", which takes a
// zero-terminated 16-bit (char16_t) string.
#pragma once

#include <cstdarg>
#include <memory>
#include <string>

enum class MessageSeverity { Error, Fatal, InternalError, Status, Debug };

// Text of a severity as the default sink prints it ("error", "fatal error"...).
const char* messageSeverityName(MessageSeverity severity);

// One delivered message.
struct MessageRecord {
    MessageSeverity severity = MessageSeverity::Status;
    std::string domain;     // always "TSDatabase" for the library's own messages
    std::string text;       // the formatted text, UTF-8, exactly as formatted
    int fatalCode = 0;      // the exit code of a fatal message; 0 otherwise
    std::string sourceFile; // the issuing source file
    int line = 0;           // and line
};

// Where messages go. A sink receives every message as a record; the default
// sink writes one message per line to stderr. After a fatal message has been
// delivered the process exits with its code, unless deliver() does not return
// (a test sink may throw to keep fatal paths inside the process).
class MessageSink {
public:
    virtual ~MessageSink() = default;
    virtual void deliver(const MessageRecord& record) = 0;
};

// The sink used when none is installed: "TSDatabase: error: text" on stderr.
class StderrMessageSink : public MessageSink {
public:
    void deliver(const MessageRecord& record) override;
};

// A message object: one message of one domain from one source location.
class Message {
public:
    Message(const char* domain, const char* sourceFile, int line, const char* revision);

    void error(const char* format, ...) const;
    [[noreturn]] void fatal(int code, const char* format, ...) const;
    void internalError(const char* format, ...) const;
    void status(const char* format, ...) const;

    const std::string& domain() const { return m_domain; }
    const std::string& revision() const { return m_revision; }

private:
    void deliver(MessageSeverity severity, int code, const char* format, va_list args) const;

    std::string m_domain;
    std::string m_sourceFile;
    int m_line;
    std::string m_revision;
};

class MessageManager {
public:
    static Message createObject(const char* domain, const char* sourceFile, int line,
                                const char* revision);

    // Debug trace: discarded unless switched on with setDebugTrace(true) or
    // by the environment variable TSD_DEBUG_TRACE (any value).
    static void debugTrace(const char* format, ...);
    static void setDebugTrace(bool on);
    static bool debugTraceEnabled();

    // Installs a sink (null restores the default) and returns the previous one.
    // The sink is not owned.
    static MessageSink* setSink(MessageSink* sink);
    static MessageSink* getSink();
};

// Installs a sink for the lifetime of the guard.
class ScopedMessageSink {
public:
    explicit ScopedMessageSink(MessageSink* sink) : m_previous(MessageManager::setSink(sink)) {}
    ~ScopedMessageSink() { MessageManager::setSink(m_previous); }
    ScopedMessageSink(const ScopedMessageSink&) = delete;
    ScopedMessageSink& operator=(const ScopedMessageSink&) = delete;

private:
    MessageSink* m_previous;
};

// printf-style formatting with "%z" for a char16_t string. This is the one
// formatter of the library: every message path goes through it.
std::string vformatMessage(const char* format, va_list args);
std::string formatMessage(const char* format, ...);

// Formats into a buffer held by the formatter; valid until the next call.
const char* formatString(const char* format, ...);

// Formats and "translates" (the catalogue is the identity) into a newly
// allocated 16-bit string owned by the caller.
std::unique_ptr<char16_t[]> translateMessage(const char* domain, const char* format, ...);

// Conversions between UTF-8 and the 16-bit strings of "%z" (UTF-16; invalid
// input becomes U+FFFD, never read past the terminator).
std::string utf16ToUtf8(const char16_t* text);
std::u16string utf8ToUtf16(const char* text);
std::unique_ptr<char16_t[]> copyWide(const char16_t* text);
