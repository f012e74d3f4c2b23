#include "fn/matrix_solve.h"

#include "fn/matrix_text.h"
#include "fn/numeric/lapack.h"
#include "fn/numeric/work_space.h"

#include <algorithm>

namespace Fn::MKL {
namespace {

using MatrixText::check;
using Numeric::Lapack;
using Numeric::WorkSpace;

const std::string illegal = " had an illegal value";

} // namespace

template <class T> void invert(Matrix<T>& m) {
    const std::size_t n = m.rows();
    if (n != m.cols()) FN_THROW(FNEBadArg, "Cannot invert non-square matrix");
    if (n == 0) return;
    const std::string start = "invert(): the ", singular = "Attempt to invert singular matrix";
    std::vector<int> pivots(n);
    T* const a = m.getExclusive();
    check(Lapack<T>::getrf(n, n, a, pivots.data()), start, "-th argument of ?getrf" + illegal, singular);
    std::vector<T> work(64 * n);
    check(Lapack<T>::getri(n, a, pivots.data(), work.data(), work.size()), start,
          "-th argument of ?getri" + illegal, singular);
}

template <class T> void gesv(Matrix<T>& a, Matrix<T>& b) {
    const std::size_t n = a.rows();
    if (n != a.cols()) FN_THROW(FNEBadArg, "Cannot exactly solve for non-square coefficient matrix");
    if (n != b.rows()) FN_THROW(FNEBadArg, "Row sizes of coefficient and target matrix do not match");
    if (n == 0) return;
    std::vector<int> pivots(n);
    check(Lapack<T>::gesv(n, b.cols(), a.getExclusive(), pivots.data(), b.getExclusive()), "invert(): the ",
          "-th argument of ?gesv" + illegal, "Cannot solve for singular coefficient matrix");
}

template <class T> void gels(Matrix<T>& a, Matrix<T>& b) {
    if (a.size() == 0) return b.fill(0);
    const std::string start = "mkl_gels(): the ", argument = "-th argument of ?gels" + illegal;
    const std::string singular = "Cannot solve for singular coefficient matrix";
    T *const elements = a.getExclusive(), *const target = b.getExclusive();
    const auto call = [&](T* work, std::size_t size) {
        return Lapack<T>::gels(a.rows(), a.cols(), b.cols(), elements, target, work, size);
    };
    WorkSpace<T> work;
    check(work.query(call), start, argument + " upon worksize query", singular);
    check(work.run(call), start, argument, singular);
}

template <class T> void gelsd(Matrix<T>& a, Matrix<T>& b) {
    if (a.size() == 0) return b.fill(0);
    const std::string start = "mkl_gelsd(): the ", argument = "-th argument of ?gelsd" + illegal;
    const std::string failure = "gelsd failed to converge";
    T *const elements = a.getExclusive(), *const target = b.getExclusive();
    std::vector<T> singularValues(std::min(a.rows(), a.cols()));
    std::vector<int> integerWork(1);
    const auto call = [&](T* work, std::size_t size) {
        return Lapack<T>::gelsd(a.rows(), a.cols(), b.cols(), elements, target, singularValues.data(), work,
                                size, integerWork.data());
    };
    WorkSpace<T> work;
    check(work.query(call), start, argument + " upon worksize query", failure);
    integerWork.resize(static_cast<std::size_t>(std::max(1, integerWork[0])));
    check(work.run(call), start, argument, failure);
}

template void invert(Matrix<float>&);
template void invert(Matrix<double>&);
template void gesv(Matrix<float>&, Matrix<float>&);
template void gesv(Matrix<double>&, Matrix<double>&);
template void gels(Matrix<float>&, Matrix<float>&);
template void gels(Matrix<double>&, Matrix<double>&);
template void gelsd(Matrix<float>&, Matrix<float>&);
template void gelsd(Matrix<double>&, Matrix<double>&);

} // namespace Fn::MKL
