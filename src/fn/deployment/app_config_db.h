#pragma once

#include "fn/callback/functor.h"

#include <iosfwd>
#include <map>
#include <string>
#include <vector>

/// A flat store of text keys and text values: the storage under the configuration tree. Keys consist of
/// letters, digits and the characters _ . * - < > , :
///
/// A configuration file has one pair a line, `key = value`; the value is the trimmed rest of the line,
/// without quoting. Lines that begin with "#" and empty lines are skipped. If a key comes twice, the first
/// one stands.
class AppConfigDB {
public:
    /// What one line of a configuration text says.
    struct Line {
        int number;
        std::string key, value;
    };

    virtual ~AppConfigDB() = default;

    /// The four operations throw FNEBadArg for a key with invalid characters.
    virtual bool exists(const std::string& key) const = 0;
    /// @throws FNEBadArg for a key that is not there
    virtual std::string get(const std::string& key) const = 0;
    virtual void set(const std::string& key, const std::string& value) = 0;
    /// A key that is not there is no error.
    virtual void remove(const std::string& key) = 0;
    /// Reads the backing store again.
    virtual void refresh() = 0;
    /// A text for messages.
    virtual std::string name() const { return "Unnamed"; }
    /// Waits until every change is in the backing store. @throws FNEIOError if one cannot get there
    virtual void flush() {}

    /// The lines that the database was last read from, in their order; not all have an effect.
    const std::vector<Line>& lines() const { return lines_; }

    /// @throws FNEBadArg if a character of the key is not a key character.
    void checkKey(const char* key) const;
    static bool validKeyChar(char c);
    /// The text up to its first NUL without the characters that are not valid in a key.
    static std::string makeCompatibleKey(const std::string& text);

protected:
    using Pairs = std::map<std::string, std::string>;

    /// Parses one line, and hands its pair, if it has one, to `sink`. @throws FNEIOError
    void parseLine(int lineNumber, const std::string& text,
                   const Fn::Functor2<std::string, std::string>& sink) const;
    /// All lines of a configuration text that say something. A line ends at LF or CR, and one more of these
    /// behind it belongs to the end.
    /// @throws FNEIOError
    std::vector<Line> parseLines(std::istream& text) const;
    /// The pairs that count: the first of each key.
    static Pairs firstPairs(const std::vector<Line>& lines);
    /// What lines() gives from now on. @param lines with values as they are meant
    void setLines(std::vector<Line> lines) { lines_ = std::move(lines); }
    /// The value of a key, or the failure for a missing one.
    static const std::string& find(const Pairs& pairs, const std::string& key);

private:
    std::vector<Line> lines_;
};

/// Kept in memory only. Has no lock: a database that several threads change needs one outside.
class AppVolatileConfigDB final : public AppConfigDB {
public:
    AppVolatileConfigDB() = default;
    /// Reads a configuration text. @throws FNEIOError
    explicit AppVolatileConfigDB(std::istream& text);

    bool exists(const std::string& key) const override;
    std::string get(const std::string& key) const override;
    void set(const std::string& key, const std::string& value) override;
    void remove(const std::string& key) override;
    void refresh() override {}

private:
    Pairs pairs_;
};
