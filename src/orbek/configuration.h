#pragma once

#include "orbek/counted_ptr.h"

#include <iosfwd>
#include <string>
#include <vector>

namespace Orbek {

/// Where every use of the library begins: the settings, and the heavy engines that all objects made from one
/// configuration share. An engine is made when the first object needs it, not before.
///
///     Orbek::Configuration configuration("/etc/door/orbek.conf");
///     configuration.setValue("ORBEK.ComparisonAlgorithm.NumberOfThreads", "4");
///
/// Copies are handles on the same configuration; everything made from it keeps it alive. Separate
/// configurations share nothing, not even from the same file. Keys are dotted paths from "ORBEK"; values are
/// texts. Failures are exceptions derived from std::exception.
class [[gnu::visibility("default")]] Configuration {
public:
    /// One key of the configuration.
    struct Setting {
        std::string key;
        std::string type;         ///< "Float", "Alternative<...>" and so on
        std::string defaultValue; ///< text of the value while none is stored
        std::string description;
        bool hasValue; ///< false for a group of keys
    };

    /// A line of the text that a configuration was made from that cannot mean what it says.
    struct Fault {
        int line; ///< the first is 1; of two line ends in a row the second is not counted
        std::string key;
        std::string reason; ///< as "is no key of the configuration"
    };

    /// Opens a configuration file; changes are written back to it in the background. Its faults() go to the
    /// log as warnings, here and in the next.
    /// @throws std::exception naming the file and the line if it cannot be read
    explicit Configuration(const std::string& fileName);
    /// Reads a configuration text; nothing is ever written back.
    explicit Configuration(std::istream & text);
    Configuration(const Configuration&);
    Configuration& operator=(const Configuration&);
    ~Configuration();

    /// Version of the library.
    std::string version() const;
    /// The value of a key as it is stored, or its default; variables such as $INSTALLDIR are not replaced.
    /// @throws std::exception for an unknown key
    std::string getValue(const std::string& key) const;
    /// Stores a value, which may be any text; see checkValue(). It reaches objects that are made later; an
    /// engine that is made already keeps what it read. A default that is not stored yet stays so.
    /// @throws std::exception for an unknown key, and if the file could not be written before
    void setValue(const std::string& key, const std::string& value);
    /// @throws std::exception naming the key for a text that those who read it would refuse or misread
    void checkValue(const std::string& key, const std::string& value) const;
    /// Waits until all changes are in the file. Without it, a file that cannot be written shows in the log,
    /// and at the next use of the configuration.
    /// @throws std::exception naming the file and why it cannot be written; from then on, so does every use
    void flush();
    /// Stores the default as the value of a key, as if setValue() had been called with it.
    void resetToDefault(const std::string& key);

    /// All keys, in the order of the tree: all choices of an alternative, and the present elements of a
    /// container.
    std::vector<Setting> settings() const;
    /// Unknown keys, keys that come twice, and values that are none, in the order of the lines. Texts that
    /// are no configuration at all are refused by the constructors.
    const std::vector<Fault>& faults() const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
