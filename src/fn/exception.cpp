#include "fn/exception.h"

#include <cstdio>
#include <cstring>
#include <ostream>

FNException::FNException(const char* message, const char* file, int line, const char* typeId) noexcept
    : typeId_(typeId) {
    init_msg(file, line, message);
}

FNException::~FNException() = default;

void FNException::init_msg(const char* file, int line, const char* message) noexcept {
    file_ = file;
    line_ = line;
    const std::size_t length = message ? strnlen(message, maxMessageLength) : 0;
    if (length > 0) std::memmove(message_, message, length);
    message_[length] = '\0';
}

const char* FNException::what() const noexcept {
    if (message_[0] == '\0')
        std::snprintf(message_, sizeof message_, "[%s]: No description.", typeId_ ? typeId_ : "");
    return message_;
}

void FNException::print(std::ostream& stream) const noexcept {
    try {
        // Inserting a null C string sets the stream's bad bit; the insertions that follow are then without
        // effect.
        stream << "Exception[" << typeId_ << "]: " << what() << " in " << file() << " line " << line_;
    } catch (...) {
        // The stream was told to throw on failure. Its state tells the same, and printing must not throw.
    }
}

std::ostream& operator<<(std::ostream& stream, const FNException& exception) {
    exception.print(stream);
    return stream;
}
