#pragma once

#include "fn/package.h"

#include <string>

namespace Cmp {

/// A biometric record: what a comparison algorithm knows of a person. Immutable; copies share it.
///
/// Two byte forms: the package, for stores and peers; and the flat form, which is for use inside one process
/// only, in the order of bytes of the machine: a 32-bit count of features, and the features.
class FIR {
public:
    class Body {
    public:
        virtual ~Body() = default;
        virtual Fn::Package serialize() const = 0;
        /// Writes the flat form, and moves the pointer behind it.
        virtual void createMemento(unsigned char*& memory) const = 0;
        /// Bytes of the flat form.
        virtual std::size_t mementoSize() const = 0;
        /// Label of the algorithm and of the form of its features.
        virtual std::string version() const = 0;
    };

    explicit FIR(const FNCountedPtr<Body>& body) : body_(body) {}

    Fn::Package serialize() const { return body_->serialize(); }
    explicit operator Fn::Package() const { return serialize(); }
    void createMemento(unsigned char*& memory) const { body_->createMemento(memory); }
    std::size_t mementoSize() const { return body_->mementoSize(); }
    std::string version() const { return body_->version(); }

    const FNCountedPtr<Body>& body() const { return body_; }

private:
    FNCountedPtr<Body> body_;
};

} // namespace Cmp
