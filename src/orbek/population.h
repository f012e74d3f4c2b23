#pragma once

#include "orbek/configuration.h"
#include "orbek/fir.h"

#include <cstddef>
#include <iosfwd>
#include <string>
#include <vector>

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

    std::size_t size() const;
    /// In the order of the records, which is that of append().
    std::vector<std::string> ids() const;

    /// Writes all records with their ids; the manual tells the form.
    /// @throws std::exception if that fails
    void save(std::ostream & stream) const;
    /// To a file, which is there whole or as it was. @throws std::exception naming the file
    void save(const std::string& fileName) const;
    /// What save() has written. Reads no further than that.
    /// @throws std::exception for other bytes, and for records of another algorithm than the configuration's
    static Population load(const Configuration& configuration, std::istream& stream);
    /// From a file, which holds nothing else. @throws std::exception naming the file
    static Population load(const Configuration& configuration, const std::string& fileName);

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
