#include "fn/sign_value_vector.h"

#include "fn/byte_order.h"
#include "fn/numeric/sign_bits.h"

#include <algorithm>
#include <string>

namespace Fn {

template <class T>
SignValueVector<T>::SignValueVector(std::uint32_t n)
    : n_(n), fullBytes_(n / 8), restBits_(n % 8), bits_(byteCount()) {
    std::fill_n(bits_.getExclusive(), byteCount(), static_cast<unsigned char>(0));
}

template <class T>
SignValueVector<T>::SignValueVector(std::uint32_t n, const FNRMem<unsigned char>& bits)
    : n_(n), fullBytes_(n / 8), restBits_(n % 8), bits_(bits, 0, byteCount()) {
    if (restBits_ != 0 && bytes()[fullBytes_] >> restBits_ != 0)
        bits_.getExclusive()[fullBytes_] &= static_cast<unsigned char>((1 << restBits_) - 1);
}

template <class T> SignValueVector<T>::SignValueVector(const Package& package) : SignValueVector(0) {
    const auto& cores = package.cores();
    if (cores.size() != 2 || cores.front().size() != 4)
        FN_THROW(FNEBadArg, "SignValueVector: construction from invalid package");
    const std::uint32_t n = loadUInt32(cores.front().data());
    const std::uint64_t expected = n / 8 + (n % 8 != 0), found = cores.back().size();
    if (found != expected)
        FN_THROW(FNEBadArg, "SignValueVector: construction from package: the size [" + std::to_string(n) +
                                "] of the vector contradicts the number of bytes found in the package."
                                "( expected:" +
                                std::to_string(expected) + ", found:" + std::to_string(found) + ")");
    *this = SignValueVector(n, cores.back());
}

template <class T> SignValueVector<T>::operator Package() const {
    Package::Core count(4);
    storeUInt32(n_, count.getExclusive());
    return Package(std::list<Package::Core>{count, bits_});
}

template <class T> T SignValueVector<T>::operator*(const SignValueVector& other) const {
    if (n_ != other.n_)
        FN_THROW(FNEBadArg, "Fn::SignValueVector::dotProduct: inequal sizes of vectors " +
                                std::to_string(n_) + " and " + std::to_string(other.n_) + "!");
    const std::uint32_t different = Numeric::differingBits(bytes(), other.bytes(), byteCount());
    return static_cast<T>(std::int64_t{n_} - 2 * std::int64_t{different});
}

template <class T> bool SignValueVector<T>::operator==(const SignValueVector& other) const noexcept {
    return n_ == other.n_ && std::equal(bytes(), bytes() + byteCount(), other.bytes());
}

template <class T> void SVVectorSequentialBuilder<T>::throwFull() {
    FN_THROW(FNEOutOfRange, "SVVectorSequentialBuilder: written past the end of the vector");
}

template class SignValueVector<int>;
template class SVVectorSequentialBuilder<int>;

} // namespace Fn
