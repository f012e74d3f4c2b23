#pragma once

#include "fn/deployment/type.h"

#include <list>
#include <string>
#include <vector>

namespace Fn::Deployment {
class Component;
}

namespace Eye::Implementation {

/// Which file a cascaded discriminator reads, and where it stops. Its component has the keys `File` and
/// `Cascade`, a list of numbers of steps with a threshold below each:
///
///     Disc1A.File = is1717da.dat
///     Disc1A.Cascade = 1 2
///     Disc1A.Cascade.1 = -1.9
///     Disc1A.Cascade.2 = -0.6
struct CascadeSettings {
    struct Entry {
        std::string steps; ///< how many support vectors have been seen, a decimal number
        float threshold;   ///< what the decision value has to reach by then
    };

    std::string file; ///< relative to the template path
    /// Empty for the single step of all support vectors at the threshold -99.
    std::vector<Entry> cascade;

    static std::string typeId() { return "Eye::CascadedSvmDiscriminator"; }
    static Fn::Deployment::Type define();
    /// The two properties, for types that hold them under another name.
    static std::list<Fn::Deployment::Property> members();
    static CascadeSettings read(const Fn::Deployment::Component& component);
};

} // namespace Eye::Implementation
