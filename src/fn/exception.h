#pragma once

#include <exception>
#include <iosfwd>
#include <string>

/// The exception family: the only way in which a failure is reported inside the library.
///
/// Each exception carries a text, the name of the throwing source file without its directory, a line, and the
/// name of its concrete class. Throw with FN_THROW, which fills in file and line:
///
///     if (index >= size) FN_THROW(FNEOutOfRange, "index " + std::to_string(index) + " is beyond the end");

/// Base of the family; abstract.
class FNException : public std::exception {
public:
    static constexpr const char* thisTypeId = "FNException";

    /// Longest text that is kept, in characters; what lies beyond is cut.
    static constexpr std::size_t maxMessageLength = 2047;

    ~FNException() override = 0;

    /// The text. An empty one becomes "[<type id>]: No description." at the first call.
    const char* what() const noexcept override;

    /// Writes "Exception[<type id>]: <text> in <file> line <line>", with no line end. Never throws.
    virtual void print(std::ostream& stream) const noexcept;

    /// The source file, "nofile" if it is not known.
    const char* file() const noexcept { return file_ ? file_ : "nofile"; }
    int line() const noexcept { return line_; }
    /// Name of the concrete class, null only if the thrower passed null.
    const char* typeId() const noexcept { return typeId_; }

    /// Replaces file, line and text; `file` is kept as a pointer and must outlive the exception and its
    /// copies.
    void init_msg(const char* file, int line, const char* message) noexcept;

protected:
    FNException(const char* message, const char* file, int line, const char* typeId) noexcept;
    FNException(const FNException&) = default;
    FNException& operator=(const FNException&) = default;

private:
    mutable char message_[maxMessageLength + 1];
    const char* file_;
    int line_;
    const char* typeId_;
};

/// Same as exception.print(stream).
std::ostream& operator<<(std::ostream& stream, const FNException& exception);

/// A fault of the caller or of the program.
class FNELogic : public FNException {
public:
    static constexpr const char* thisTypeId = "FNELogic";
    using FNException::FNException;
};

/// A failure of the environment or of the data.
class FNERuntime : public FNException {
public:
    static constexpr const char* thisTypeId = "FNERuntime";
    using FNException::FNException;
};

/// An argument or a requested operation is not valid.
class FNEBadArg : public FNELogic {
public:
    static constexpr const char* thisTypeId = "FNEBadArg";
    FNEBadArg(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNELogic(message, file, line, typeId) {}
};

/// An index or value is outside its range.
class FNEOutOfRange : public FNELogic {
public:
    static constexpr const char* thisTypeId = "FNEOutOfRange";
    FNEOutOfRange(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNELogic(message, file, line, typeId) {}
};

/// A call at the wrong time or on a thing that is not set.
class FNEBadFunCall : public FNELogic {
public:
    static constexpr const char* thisTypeId = "FNEBadFunCall";
    FNEBadFunCall(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNELogic(message, file, line, typeId) {}
};

/// Anything else; also what an exception becomes whose type the receiver does not know.
class FNEGeneric : public FNELogic {
public:
    static constexpr const char* thisTypeId = "FNEGeneric";
    FNEGeneric(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNELogic(message, file, line, typeId) {}
};

/// Reading or writing failed.
class FNEIOError : public FNERuntime {
public:
    static constexpr const char* thisTypeId = "FNEIOError";
    FNEIOError(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNERuntime(message, file, line, typeId) {}
};

/// A failure of the operating system or of a resource.
class FNESysError : public FNERuntime {
public:
    static constexpr const char* thisTypeId = "FNESysError";
    FNESysError(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNERuntime(message, file, line, typeId) {}
};

/// Data does not have the expected form.
class FNEBadFormat : public FNERuntime {
public:
    static constexpr const char* thisTypeId = "FNEBadFormat";
    FNEBadFormat(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNERuntime(message, file, line, typeId) {}
};

/// A time limit passed.
class FNETimeOut : public FNERuntime {
public:
    static constexpr const char* thisTypeId = "FNETimeOut";
    FNETimeOut(const char* message, const char* file, int line, const char* typeId = thisTypeId) noexcept
        : FNERuntime(message, file, line, typeId) {}
};

namespace Fn {

/// Throws an `E` with its own type id. Called through FN_THROW.
template <class E> [[noreturn]] void raise(const char* message, const char* file, int line) {
    throw E(message, file, line, E::thisTypeId);
}

template <class E> [[noreturn]] void raise(const std::string& message, const char* file, int line) {
    throw E(message.c_str(), file, line, E::thisTypeId);
}

} // namespace Fn

/// Throws an exception of the given class from here; `message` is a C string (or null) or a std::string.
#define FN_THROW(Type, message) ::Fn::raise<Type>(message, __FILE_NAME__, __LINE__)
