#include "fn/message/translator.h"

#include "fn/message/dialog.h"

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <optional>

#include <unistd.h>

namespace {

struct Token {
    enum Kind { open, close, string, bad } kind;
    std::string text;
};

Token quotedString(const std::string& line, std::size_t& position) {
    std::string text;
    while (++position < line.size()) {
        char c = line[position];
        if (c == '"') {
            ++position;
            return {Token::string, text};
        }
        if (c == '\\') {
            if (++position == line.size() || !std::strchr("\"\\bfnrtv", line[position])) break;
            c = line[position];
        }
        if (text.size() == FNTranslator::longestString) break;
        text += c;
    }
    return {Token::bad, {}};
}

/// The token at `position`, nothing at the end of the line or at a comment.
std::optional<Token> nextToken(const std::string& line, std::size_t& position) {
    position = line.find_first_not_of(" \t\r", position);
    if (position == std::string::npos || line[position] == '#') return {};
    switch (line[position]) {
    case '{':
        ++position;
        return Token{Token::open, {}};
    case '}':
        ++position;
        return Token{Token::close, {}};
    case '"':
        return quotedString(line, position);
    default:
        return Token{Token::bad, {}};
    }
}

/// Follows the entries of a table token by token.
class EntryParser {
public:
    EntryParser(const std::string& language, std::map<std::string, std::string>& table)
        : language_(language), table_(table) {}

    /// @return whether the token fits.
    bool accept(const Token& token) {
        switch (state_) {
        case beforeEntry:
            return step(token, Token::open, beforeKey);
        case beforeKey:
            key_ = token.text;
            return step(token, Token::string, inEntry);
        case inEntry:
            return token.kind == Token::close ? step(token, Token::close, beforeEntry)
                                              : step(token, Token::open, beforeLanguage);
        case beforeLanguage:
            entryLanguage_ = token.text;
            return step(token, Token::string, beforeText);
        case beforeText:
            if (token.kind == Token::string && entryLanguage_ == language_) table_[key_] = token.text;
            return step(token, Token::string, afterText);
        case afterText:
            return step(token, Token::close, inEntry);
        }
        return false;
    }

private:
    enum State { beforeEntry, beforeKey, inEntry, beforeLanguage, beforeText, afterText };

    bool step(const Token& token, Token::Kind expected, State next) {
        if (token.kind != expected) return false;
        state_ = next;
        return true;
    }

    const std::string& language_;
    std::map<std::string, std::string>& table_;
    State state_ = beforeEntry;
    std::string key_, entryLanguage_;
};

/// Reads one line without its end. @return false at the end of the file; `fits` tells whether it was short
/// enough.
bool readLine(std::istream& table, std::string& line, bool& fits) {
    line.clear();
    fits = true;
    for (int c = table.get(); c != std::char_traits<char>::eof(); c = table.get()) {
        if (c == '\n') return true;
        if (line.size() == FNTranslator::longestLine) {
            fits = false;
            return true;
        }
        line += static_cast<char>(c);
    }
    return !line.empty();
}

} // namespace

FNTranslator::FNTranslator(const std::string& language) : language_(language), table_{{"Foo", "Bar"}} {}

const FNTranslator& FNTranslator::getInstance() {
    static const FNTranslator instance = [] {
        const char* const language = std::getenv("FNTRANSLANG");
        FNTranslator translator(language ? language : "Eng");
        if (const char* const file = std::getenv("FNTRANSDB")) {
            translator.loadDb(file);
        } else if (access("/trans.db", R_OK) == 0) {
            translator.loadDb("/trans.db");
        }
        return translator;
    }();
    return instance;
}

void FNTranslator::loadDb(const std::string& fileName) {
    std::ifstream table(fileName);
    if (!table) {
        FNDialog::warn("Tessarin I18N: Could not open file: " + fileName + " for reading");
        return;
    }
    loadDb(table, fileName);
}

void FNTranslator::loadDb(std::istream& table, const std::string& fileName) {
    EntryParser parser(language_, table_);
    std::string line;
    bool fits = true;
    for (int number = 1; readLine(table, line, fits); ++number) {
        std::size_t position = 0;
        bool accepted = fits;
        while (accepted) {
            const auto token = nextToken(line, position);
            if (!token) break;
            accepted = parser.accept(*token);
        }
        if (!accepted) {
            FNDialog::error("Parser error in " + fileName + " line " + std::to_string(number));
            return;
        }
    }
}

std::string FNTranslator::translate(const std::string& text) const {
    const auto entry = table_.find(text);
    return entry == table_.end() ? text : entry->second;
}

std::string FNTrans(const std::string& text) {
    return FNTranslator::getInstance().translate(text);
}
