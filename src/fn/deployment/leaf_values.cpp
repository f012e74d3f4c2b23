#include "fn/deployment/leaf_values.h"

#include <locale>
#include <sstream>

namespace Fn::Deployment {
namespace {

[[noreturn]] void throwInvalid(const std::string& text, const char* inWords) {
    FN_THROW(FNEGeneric, "Converting from invalid string [" + text + "] to " + inWords);
}

} // namespace

Type None::define() {
    return Type(typeId(), "Feature disabled", "", false);
}
Type Bool::define() {
    return Type(typeId(), "A boolean value (true or false).", False, true);
}
Type String::define() {
    return Type(typeId(), "A string of characters.", "", true);
}
Type EncryptedString::define() {
    return Type(typeId(), "A string of characters which is stored encrypted.", "", true);
}

bool Bool::stringToValue(const std::string& text) {
    if (text == True) return true;
    if (text == False) return false;
    throwInvalid(text, "bool");
}

template <class T> T Number<T>::stringToValue(const std::string& text) {
    std::istringstream stream(text);
    stream.imbue(std::locale::classic()); // the host application may have set another one
    stream.exceptions(std::ios::failbit | std::ios::badbit);
    try {
        T value;
        stream >> value;
        return value;
    } catch (const std::ios::failure&) {
        throwInvalid(text, NumberTraits<T>::inWords);
    }
}

template <class T> std::string Number<T>::valueToString(T value) {
    std::ostringstream stream;
    stream.imbue(std::locale::classic());
    stream << value;
    return stream.str();
}

template struct Number<std::int32_t>;
template struct Number<std::uint32_t>;
template struct Number<std::int64_t>;
template struct Number<std::uint64_t>;
template struct Number<float>;

} // namespace Fn::Deployment
