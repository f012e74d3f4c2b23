#include "fn/message/dialog.h"

#include "fn/time_stamp.h"

#include <iostream>
#include <mutex>
#include <type_traits>

namespace {

void writeLine(std::ostream& stream, const char* kind, const std::string& message) {
    static std::mutex& oneLineAtATime = *new std::mutex; // messages come until the very end of the process
    const std::lock_guard lock(oneLineAtATime);
    stream << "[" + Fn::TimeStamp::now().localAsString() + "]" + kind + message << std::endl;
}

constinit std::mutex sinkMutex; // nothing of it is destroyed at the end of the process
static_assert(std::is_trivially_destructible_v<std::mutex>);

FNCountedPtr<FNDialog::Body>& sink() {
    static auto& current = *new FNCountedPtr<FNDialog::Body>;
    return current;
}

} // namespace

FNCountedPtr<FNDialog::Body> FNDialog::get() {
    const std::lock_guard lock(sinkMutex);
    if (!sink()) sink() = FNCountedPtr<Body>(new FNStdDialog);
    return sink();
}

void FNDialog::set(const FNCountedPtr<Body>& body) {
    FNCountedPtr<Body> old; // goes after the lock: its destructor may have something to say
    const std::lock_guard lock(sinkMutex);
    old = sink();
    sink() = body ? body : FNCountedPtr<Body>(new FNStdDialog);
}

void FNStdDialog::log(const std::string& message) {
    writeLine(std::clog, "", message);
}
void FNStdDialog::info(const std::string& message) {
    writeLine(std::cout, "Info: ", message);
}
void FNStdDialog::warn(const std::string& message) {
    writeLine(std::cerr, "Warning: ", message);
}
void FNStdDialog::error(const std::string& message) {
    writeLine(std::cerr, "Error: ", message);
}
