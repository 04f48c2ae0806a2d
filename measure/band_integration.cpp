// SPDX-License-Identifier: MIT
#include "measure/band_integration.h"

#include "VXDSPAPI.h"
#include "measure/band_tables.h"

namespace vxcomn {
namespace {

// The smaller of the last bin and a frequency's place among the bins, or -1 if that is no place.
float binOf(float hz, float binsPerHertz, int halfSize) {
    const float bin = hz * binsPerHertz;
    if (!(bin >= 0.0F)) return -1.0F;
    return static_cast<double>(bin) < static_cast<double>(halfSize) ? bin : static_cast<float>(halfSize);
}

int ceilingOf(float bin) {
    const int floor = static_cast<int>(bin);
    return static_cast<float>(floor) < bin ? floor + 1 : floor;
}

// Kept: a centre that falls exactly on a bin reads 0, since both factors vanish.
float interpolated(const float *power, float bin) {
    const int floor = static_cast<int>(bin), ceiling = ceilingOf(bin);
    return (static_cast<float>(ceiling) - bin) * power[floor] + (bin - static_cast<float>(floor)) * power[ceiling];
}

// The integral of the linearly interpolated spectrum from one place to another.
float integral(const float *power, int halfSize, float low, float high) {
    const int a = static_cast<int>(low), b = static_cast<int>(high);
    const auto fa = static_cast<float>(a), fb = static_cast<float>(b);
    if (a == b) {
        const float middle = (low + high) / 2.0F;
        const float above = power[a < halfSize ? a + 1 : a];  // at the last bin the width is 0, and nothing lies behind it
        return ((middle - fa) * above + ((fa + 1.0F) - middle) * power[a]) * (high - low);
    }
    const int c = ceilingOf(low), d = ceilingOf(high);
    const auto fc = static_cast<float>(c), fd = static_cast<float>(d);
    const float middleLow = (fc + low) / 2.0F, middleHigh = (fb + high) / 2.0F;
    float result = 0.0F;
    if (c != a) result += ((fc - middleLow) * power[a] + (middleLow - fa) * power[c]) * (fc - low) / (fc - fa);
    if (d != b) result += (high - fb) * ((fd - middleHigh) * power[b] + (middleHigh - fb) * power[d]) / (fd - fb);
    for (int k = c; k < b; ++k) result += (power[k] + power[k + 1]) / 2.0F;
    return result;
}

}  // namespace

void integrateBands(const float *power, int halfSize, const float *edges, const float *centres, int tableSize, float *bands,
                    int sampleRate, bool integrate) noexcept {
    if (halfSize < 1 || sampleRate < 1) return;
    const float binsPerHertz = static_cast<float>(2.0 * halfSize) / static_cast<float>(sampleRate);
    for (int i = 0; i + 1 < tableSize; ++i) {
        if (integrate) {
            const float low = binOf(edges[i], binsPerHertz, halfSize), high = binOf(edges[i + 1], binsPerHertz, halfSize);
            if (low >= 0.0F && high >= 0.0F) bands[i] = integral(power, halfSize, low, high);
        } else {
            const float bin = binOf(centres[i], binsPerHertz, halfSize);
            if (bin >= 0.0F) bands[i] = interpolated(power, bin);
        }
    }
}

}  // namespace vxcomn

using namespace vxcomn;

VXCOMN_EXTERN_C_BEGIN

int32_t VXDSPAPI_RTA_CalcSpectrum(const float *power, int32_t fftSize, float *bands, int32_t sampleRate, int32_t bandsPerOctave,
                                  int32_t integrate) {
    const float *edges = nullptr, *centres = nullptr;
    int size = 0;
    BandTables::select(bandsPerOctave, &edges, &centres, &size);
    integrateBands(power, fftSize / 2, edges, centres, size, bands, sampleRate, integrate != 0);
    return size;
}

void VXDSPAPI_RTA_FFTToBands(const float *power, int32_t halfSize, const float *edges, const float *centres, int32_t tableSize,
                             float *bands, int32_t sampleRate, int32_t integrate) {
    integrateBands(power, halfSize, edges, centres, tableSize, bands, sampleRate, integrate != 0);
}

VXCOMN_EXTERN_C_END
