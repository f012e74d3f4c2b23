#pragma once

#include "orbek/configuration.h"
#include "orbek/fir.h"

namespace Orbek {

/// Named records to search in. Copies share them: a change through one is seen through all. Nobody may change
/// a population while a thread searches it.
class [[gnu::visibility("default")]] Population {
public:
    /// An empty one. @throws std::exception if the comparison's model files cannot be read
    explicit Population(const Configuration& configuration);
    Population(const Population&);
    Population& operator=(const Population&);
    ~Population();

    /// An id may come more than once. @throws std::exception for a record of another algorithm
    void append(const FIR& fir, const std::string& id);
    /// Removes the first record of that id, if there is one.
    void remove(const std::string& id);
    /// The first record of that id. @throws std::exception if there is none
    FIR get(const std::string& id) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
