#include "cmp/portrait/sharpness.h"

#include "img/contrast.h"
#include "img/histogram_equalizer.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace Cmp::Portrait {

namespace {

constexpr unsigned int side = 80, orientations = 6;
constexpr double waveNumber = std::numbers::pi / 1.6, sigma = 2 * std::numbers::pi;

/// Rows and columns of the grid.
constexpr unsigned int firstPlace = 10, spacing = 5, places = 13;

/// Percentiles 1 to 99 of the median over ordinary portraits.
constexpr std::array percentiles{
    0.000495757f, 0.000539258f, 0.000559154f, 0.000583935f, 0.000603624f, 0.000619602f, 0.000634664f,
    0.000643723f, 0.000653229f, 0.000664503f, 0.000673002f, 0.000681615f, 0.000687922f, 0.00069991f,
    0.000708444f, 0.00071643f,  0.000728562f, 0.00073593f,  0.00074421f,  0.000755861f, 0.000760423f,
    0.000765939f, 0.000771515f, 0.000780715f, 0.000789613f, 0.000794547f, 0.000801773f, 0.000806966f,
    0.000816618f, 0.000820473f, 0.000828297f, 0.000834165f, 0.000843364f, 0.00084909f,  0.00085669f,
    0.000862555f, 0.000868805f, 0.000875197f, 0.000883131f, 0.000890147f, 0.000897023f, 0.000906665f,
    0.000915216f, 0.000921041f, 0.000925854f, 0.000934082f, 0.00094171f,  0.000949233f, 0.000956428f,
    0.000960857f, 0.000966835f, 0.000973366f, 0.000978355f, 0.000986591f, 0.000994162f, 0.00100028f,
    0.0010068f,   0.00101371f,  0.0010195f,   0.00103272f,  0.00104088f,  0.00105027f,  0.00105661f,
    0.0010652f,   0.00107747f,  0.00108652f,  0.00109773f,  0.00110471f,  0.00111712f,  0.00112865f,
    0.00113915f,  0.00115174f,  0.00116132f,  0.00117369f,  0.00118776f,  0.00119721f,  0.00120492f,
    0.00122011f,  0.00123405f,  0.00124892f,  0.00126278f,  0.00127941f,  0.00130211f,  0.0013195f,
    0.00133521f,  0.00135503f,  0.00136547f,  0.00138827f,  0.00142257f,  0.00145362f,  0.00149133f,
    0.0015143f,   0.00156043f,  0.00159676f,  0.00162982f,  0.00167052f,  0.00172357f,  0.00181412f,
    0.00193987f,
};
static_assert(percentiles.size() == 99);

std::vector<std::uint32_t> gridColumns() {
    std::vector<std::uint32_t> columns;
    for (unsigned int i = 0; i < places; ++i) columns.push_back(firstPlace + i * spacing);
    return columns;
}

} // namespace

SharpnessMeter::SharpnessMeter() : bank_(side, side, {{waveNumber, gridColumns()}}, orientations, sigma, 0) {}

float SharpnessMeter::operator()(const FNImage<float>& window) const {
    const auto responses = bank_.respond(Img::normalizeContrast(imgEqualizeHistogram(window, -1, 1)));
    std::array<float, std::size_t{places} * places> differences;
    for (unsigned int i = 0; i < differences.size(); ++i) {
        const unsigned int x = firstPlace + i % places * spacing, y = firstPlace + i / places * spacing;
        float least = responses(0, 0, x, y), greatest = least;
        for (unsigned int a = 1; a < orientations; ++a) {
            least = std::min(least, responses(0, a, x, y));
            greatest = std::max(greatest, responses(0, a, x, y));
        }
        differences[i] = (std::sqrt(greatest) - std::sqrt(least)) / (side * side);
    }
    const auto median = differences.begin() + (differences.size() - 1) / 2;
    std::nth_element(differences.begin(), median, differences.end());
    return shareBelow(*median);
}

float SharpnessMeter::shareBelow(float median) {
    const auto next = std::upper_bound(percentiles.begin(), percentiles.end(), median);
    return static_cast<float>(next - percentiles.begin() + 1) / 100;
}

} // namespace Cmp::Portrait
