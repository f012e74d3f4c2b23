#pragma once

#include "cmp/face/face.h"
#include "cmp/fir.h"
#include "cmp/sample.h"

#include <span>

namespace Cmp {

/// Of the samples that a builder holds.
struct Quality {
    float mean = 0;    ///< of the samples, 0 to 1
    long duration = 0; ///< of the streams that they came from, milliseconds

    Quality() = default;
    Quality(float mean_, long duration_) : mean(mean_), duration(duration_) {}
    /// A list of both. @throws FNEBadArg
    explicit Quality(const Fn::Package& package);
    explicit operator Fn::Package() const;
};

/// Makes a record from samples of one person; one enrolment at a time.
///
///     Cmp::RecordBuilder builder = algorithm.createRecordBuilder();
///     builder.pushSample(sample);
///     const Cmp::FIR record = builder.generate();
class RecordBuilder {
public:
    class Body {
    public:
        virtual ~Body() = default;
        /// The whole state. @throws FNEBadFunCall if the algorithm has no such form, as this one does
        virtual Fn::Package createMemento() const;
        virtual void setMemento(const Fn::Package& package);
        /// @return a handle of the sample, or -1 if it was not taken
        virtual int pushSample(const Sample& sample) = 0;
        virtual void removeSample(int handle) = 0;
        virtual Quality quality() const = 0;
        /// Of the best sample; an empty one where samples are not rated.
        virtual Face bestFace() const = 0;
        /// @throws FNEBadFunCall without any sample
        virtual FIR generate() = 0;
        virtual void clear() = 0;
        /// Bytes of the package of a record, as far as that is fixed.
        virtual std::size_t dumpSize() const = 0;
        virtual std::size_t numberOfSamples() const = 0;

        /// A record from its package form. @throws FNEBadArg if it is another algorithm's or version's
        virtual FIR create(const Fn::Package& package) const = 0;
        /// The same from the package's bytes.
        virtual FIR createFromBytes(std::span<const unsigned char> package) const {
            return create(Fn::Package(package.data(), package.size()));
        }
        /// A record from its flat form, which must outlive it; moves the pointer behind it.
        virtual FIR createFromMemento(unsigned char*& memory) const = 0;
        /// A record without features.
        virtual FIR createVoid() const = 0;
    };

    explicit RecordBuilder(const FNCountedPtr<Body>& body) : body_(body) {}
    Body* operator->() const { return &*body_; }

private:
    FNCountedPtr<Body> body_;
};

} // namespace Cmp
