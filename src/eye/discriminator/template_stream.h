#pragma once

#include "fn/vector.h"

#include <fstream>
#include <iosfwd>
#include <string>

/// The files of the float discriminators: a magic word, numbers as text, " , ", a name of at most 27
/// characters, a line feed, and behind it vectors as packages.

namespace Eye::Implementation {

/// Reads such a file for the discriminator of class `name`. All failures are FNEBadFormat.
class TemplateReader {
public:
    TemplateReader(std::istream& stream, const std::string& name, const std::string& magic);

    /// The next number of the text.
    int readInt();
    float readFloat();
    double readDouble();
    /// A number that counts something.
    std::size_t readCount();
    /// The name, and with it the end of the text.
    std::string readName();

    /// The next vector, of `size` elements. Memory grows with what has arrived.
    template <class T> FNVector<T> readVector(std::size_t size);
    /// The next vector, of any size.
    template <class T> FNVector<T> readVector();

    [[noreturn]] static void failCorrupt();

private:
    std::istream& stream_;
};

/// Writes such a file.
class TemplateWriter {
public:
    TemplateWriter(std::ostream& stream, const std::string& magic);
    TemplateWriter& number(int value);
    TemplateWriter& number(std::size_t value);
    TemplateWriter& number(float value);
    TemplateWriter& number(double value);
    /// @throws FNEBadArg for a name that is too long or has a line feed
    TemplateWriter& name(const std::string& name);
    template <class T> TemplateWriter& vector(const FNVector<T>& values);

private:
    std::ostream& stream_;
};

/// Opens `directory`/`file` for the discriminator of class `name` and hands it to `read`, whose failures get
/// the path added. @throws FNEIOError if it cannot be opened; FNEBadFormat
template <class Read>
auto readTemplate(const std::string& directory, const std::string& file, const std::string& name, Read read) {
    const std::string path = directory + "/" + file;
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, name + ": error opening template file `" + path + "'.");
    try {
        return read(stream);
    } catch (const FNException& e) {
        FN_THROW(FNEBadFormat, e.what() + std::string(" (`") + path + "')");
    }
}

} // namespace Eye::Implementation
