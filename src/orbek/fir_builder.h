#pragma once

#include "orbek/configuration.h"
#include "orbek/fir.h"

namespace Orbek {

/// Makes records from the bytes that they were written as.
///
///     std::ifstream file("alice.fir", std::ios::binary);
///     const Orbek::FIR alice = Orbek::FIRBuilder(configuration).build(file);
class [[gnu::visibility("default")]] FIRBuilder {
public:
    /// Reads the model files of the comparison, if this is the first object of the configuration that
    /// compares. @throws std::exception that names the file and what is wrong with it
    explicit FIRBuilder(const Configuration& configuration);
    FIRBuilder(const FIRBuilder&);
    FIRBuilder& operator=(const FIRBuilder&);
    ~FIRBuilder();

    /// What FIR::serialize() has written; the stream stands behind it then.
    /// @throws std::exception for other bytes, and for the record of another algorithm or version
    FIR build(std::istream & stream) const;
    FIR build(const unsigned char* data, unsigned int size) const;
    /// What FIR::writeTo() has written; moves the pointer behind it. The bytes are not copied, and must
    /// outlive the record.
    FIR build(unsigned char*& memory) const;
    /// A record without features, which is like nobody.
    FIR buildVoidFIR() const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
