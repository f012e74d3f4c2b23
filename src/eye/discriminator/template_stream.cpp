#include "eye/discriminator/template_stream.h"

#include <istream>
#include <limits>
#include <ostream>

namespace Eye::Implementation {
namespace {

const std::string separator = " , ";
constexpr std::size_t longestName = 27;

template <class T> T readNumber(std::istream& stream) {
    T value;
    if (!(stream >> value)) TemplateReader::failCorrupt();
    return value;
}

} // namespace

TemplateReader::TemplateReader(std::istream& stream, const std::string& name, const std::string& magic)
    : stream_(stream) {
    std::string found(magic.size(), '\0');
    if (!stream.read(found.data(), static_cast<std::streamsize>(found.size())) || found != magic)
        FN_THROW(FNEBadFormat, name + ": Data file format mismatch!");
}

int TemplateReader::readInt() {
    return readNumber<int>(stream_);
}

float TemplateReader::readFloat() {
    return readNumber<float>(stream_);
}

double TemplateReader::readDouble() {
    return readNumber<double>(stream_);
}

std::size_t TemplateReader::readCount() {
    const int count = readInt();
    if (count < 0) failCorrupt();
    return static_cast<std::size_t>(count);
}

std::string TemplateReader::readName() {
    char skipped[3], name[longestName + 1];
    if (!stream_.read(skipped, sizeof skipped) || !stream_.getline(name, sizeof name) || stream_.eof())
        failCorrupt();
    return name;
}

template <class T> FNVector<T> TemplateReader::readVector() {
    try {
        return FNVector<T>(Fn::Package(stream_));
    } catch (const FNException&) {
        failCorrupt();
    }
}

template <class T> FNVector<T> TemplateReader::readVector(std::size_t size) {
    const FNVector<T> values = readVector<T>();
    if (values.size() != size) failCorrupt();
    return values;
}

void TemplateReader::failCorrupt() {
    FN_THROW(FNEBadFormat, "Found corrupt template file");
}

TemplateWriter::TemplateWriter(std::ostream& stream, const std::string& magic) : stream_(stream) {
    stream_ << magic;
}

TemplateWriter& TemplateWriter::number(int value) {
    stream_ << ' ' << value;
    return *this;
}

TemplateWriter& TemplateWriter::number(std::size_t value) {
    stream_ << ' ' << value;
    return *this;
}

TemplateWriter& TemplateWriter::number(float value) {
    const auto digits = stream_.precision(std::numeric_limits<float>::max_digits10);
    stream_ << ' ' << value;
    stream_.precision(digits);
    return *this;
}

TemplateWriter& TemplateWriter::number(double value) {
    const auto digits = stream_.precision(std::numeric_limits<double>::max_digits10);
    stream_ << ' ' << value;
    stream_.precision(digits);
    return *this;
}

TemplateWriter& TemplateWriter::name(const std::string& name) {
    if (name.size() > longestName || name.find('\n') != std::string::npos)
        FN_THROW(FNEBadArg, "Name of a template with more than 27 characters or a line feed: " + name);
    stream_ << separator << name << '\n';
    return *this;
}

template <class T> TemplateWriter& TemplateWriter::vector(const FNVector<T>& values) {
    Fn::Package(values).write(stream_);
    return *this;
}

template FNVector<float> TemplateReader::readVector<float>(std::size_t);
template FNVector<double> TemplateReader::readVector<double>();
template TemplateWriter& TemplateWriter::vector(const FNVector<float>&);
template TemplateWriter& TemplateWriter::vector(const FNVector<double>&);

} // namespace Eye::Implementation
