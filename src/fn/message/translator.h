#pragma once

#include <iosfwd>
#include <map>
#include <string>

/// A table of message translations for one language.
///
/// A table file holds entries of the form
///
///     { "key" { "Eng" "text" } { "Ger" "Text" } }    # to the end of the line: a comment
///
/// In a string a backslash protects the next character.
class FNTranslator {
public:
    /// Longest line and longest string of a table, characters.
    static constexpr std::size_t longestLine = 8096;
    static constexpr std::size_t longestString = 1024;

    /// The table of the process, made at first use: the language is the environment variable FNTRANSLANG
    /// ("Eng" if it is not set), the table file the one named by FNTRANSDB, else "/trans.db" if that is
    /// readable.
    static const FNTranslator& getInstance();

    explicit FNTranslator(const std::string& language);

    /// Adds the entries of a table file. What does not fit stops the loading with an error message that names
    /// the file and the line, and what was read up to there stays; a file that cannot be opened is a warning.
    void loadDb(const std::string& fileName);
    void loadDb(std::istream& table, const std::string& fileName);

    /// The translation, or `text` itself if there is none.
    std::string translate(const std::string& text) const;

private:
    std::string language_;
    std::map<std::string, std::string> table_;
};

/// The translation of `text` by the table of the process.
std::string FNTrans(const std::string& text);
