#pragma once

#include "cmp/portrait/characteristics.h"
#include "fn/deployment/component.h"

namespace Cmp::Portrait {

/// Tells what a portrait is like: whether eyes and mouth are open, how old the person looks, how sharp the
/// picture is, and much more.
///
///     const Cmp::Portrait::Analyzer analyzer(component);
///     const Cmp::Portrait::Characteristics portrait = analyzer.analyze(face);   // costs nothing yet
///     if (portrait.mouthClosed() > 0.5f) ...                                     // computed here
///
/// Model files and filters are loaded when a measure first needs them, so a missing file shows at that
/// measure. Copies share everything; any number of threads may use one.
class Analyzer {
public:
    /// What somebody else has measured, in pixels from the middle between the eyes.
    struct AdditionalAnnotations {
        float chin, crown, ear0, ear1;
    };

    explicit Analyzer(const Fn::Deployment::Component& component);
    Analyzer(const Analyzer&);
    Analyzer& operator=(const Analyzer&);
    ~Analyzer();

    static std::string typeId() { return "Cmp::Portrait::Analyzer"; }
    static Fn::Deployment::Type define();

    /// Reads now what would be read when it is first needed. @throws FNEIOError, FNEGeneric naming the file
    void readAll() const;

    /// In colour if the image is.
    Characteristics analyze(const Face& face) const;
    Characteristics analyzeColor(const Face& face) const;
    Characteristics analyzeGrayScale(const Face& face) const;

    /// With the extent of the head as it is told instead of estimated.
    Characteristics analyze(const Face& face, const AdditionalAnnotations& annotations) const;
    Characteristics analyzeColor(const Face& face, const AdditionalAnnotations& annotations) const;
    Characteristics analyzeGrayScale(const Face& face, const AdditionalAnnotations& annotations) const;

    class Implementation;

private:
    FNCountedPtr<const Implementation> implementation_;
};

} // namespace Cmp::Portrait
