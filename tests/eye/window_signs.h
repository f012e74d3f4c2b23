#pragma once

#include "eye/discriminator/sod_conversion.h"
#include "eye/gabor/responses.h"
#include "fn/image.h"
#include "fn/sign_value_vector.h"

#include <vector>

/// Signs of a single window of any number of points in trained order, by the plain form.
inline Fn::SignValueVector<int> windowSigns(const FNImage<unsigned short>& patch, FNGridPos pos,
                                            std::uint32_t columns, std::uint32_t rows) {
    namespace Gabor = Eye::Gabor;
    Gabor::Responses r(6, columns, rows);
    Gabor::Plain::computeResponses(Gabor::kernelRep<6>(), patch.row(pos.y) + pos.x, patch.w(), 2, r);
    namespace Conversion = Eye::Implementation::GSodConversion;
    Fn::SVVectorSequentialBuilder<int> builder(
        static_cast<std::uint32_t>(Conversion::trainedSize(columns, rows, 6)));
    std::vector<std::int32_t> codes(16);
    for (std::uint32_t x = 0; x < columns; ++x)
        for (std::uint32_t y = 0; y < rows; ++y)
            for (unsigned d = 0; d < 6; ++d) {
                Gabor::Plain::compareInWindow(r, d, y, codes.data());
                for (unsigned bit = 0; bit < 10; ++bit) {
                    const bool needsRight = bit < 6, needsDown = bit >= 2 && bit < 8;
                    if ((x + 1 == columns && needsRight) || (y + 1 == rows && needsDown)) continue;
                    builder.setNextSign(codes[x] >> bit & 1);
                }
            }
    return builder.vector();
}
