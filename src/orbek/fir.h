#pragma once

#include "orbek/counted_ptr.h"

#include <cstddef>
#include <iosfwd>
#include <string>

namespace Orbek {

/// A biometric record: what the comparison algorithm knows of a person. Immutable.
///
/// Comes from a FIRBuilder, a Population or an enrollment. Records are kept as the bytes that serialize()
/// writes, and made from them again by a FIRBuilder. Copies are handles on the same record.
class [[gnu::visibility("default")]] FIR {
public:
    FIR(const FIR&);
    FIR& operator=(const FIR&);
    ~FIR();

    /// Bytes that serialize() writes.
    std::size_t size() const;
    void serialize(std::ostream & stream) const;
    /// @param memory size() bytes
    void serialize(unsigned char* memory) const;
    /// Writes the flat form, for use inside one process only, and moves the pointer behind it: a 32-bit count
    /// of features, and features of a fixed size each.
    /// @param memory flatSize() bytes
    void writeTo(unsigned char*& memory) const;
    /// Bytes that writeTo() writes.
    std::size_t flatSize() const;
    /// Label of the algorithm and of the form of its features.
    std::string version() const;

    /// Whether both are handles on the same record. Two records of equal bytes are different ones.
    bool operator==(const FIR& other) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    explicit FIR(const CountedPtr<Implementation>& implementation);
    CountedPtr<Implementation> implementation_;
};

[[gnu::visibility("default")]] std::ostream& operator<<(std::ostream& stream, const FIR& fir);

} // namespace Orbek
