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

// A band whose ends are summed up, with the whole steps between bins `from` and `to` still to be added.
struct OpenBand {
    float sum;
    int from, to;
};

// The integral of the linearly interpolated spectrum from one place to another, but for the whole steps in between.
OpenBand openIntegral(const float *power, int halfSize, float low, float high) {
    const int a = static_cast<int>(low), b = static_cast<int>(high);
    const auto fa = static_cast<float>(a), fb = static_cast<float>(b);
    if (a == b) {
        const float middle = (low + high) / 2.0F;
        const float above = power[a < halfSize ? a + 1 : a];  // at the last bin the width is 0, and nothing lies behind it
        return {((middle - fa) * above + ((fa + 1.0F) - middle) * power[a]) * (high - low), 0, 0};
    }
    // The formula divides both pieces by the distance of their bins, which is 1.
    const int c = ceilingOf(low), d = ceilingOf(high);
    const auto fc = static_cast<float>(c), fd = static_cast<float>(d);
    const float middleLow = (fc + low) / 2.0F, middleHigh = (fb + high) / 2.0F;
    float sum = 0.0F;
    if (c != a) sum += ((fc - middleLow) * power[a] + (middleLow - fa) * power[c]) * (fc - low);
    if (d != b) sum += (high - fb) * ((fd - middleHigh) * power[b] + (middleHigh - fb) * power[d]);
    return {sum, c, b};
}

float closed(const float *power, const OpenBand &band) {
    float sum = band.sum;
    for (int k = band.from; k < band.to; ++k) sum += (power[k] + power[k + 1]) / 2.0F;
    return sum;
}

// The additions of one band keep their order, which makes them wait for each other; those of its neighbours, about as many, fill
// the gaps.
constexpr int kNeighbours = 6;
void closeNeighbours(const float *power, const OpenBand *open, float *bands) {
    float sum[kNeighbours];
    int steps = open[0].to - open[0].from;
    for (int j = 0; j < kNeighbours; ++j) {
        sum[j] = open[j].sum;
        steps = open[j].to - open[j].from < steps ? open[j].to - open[j].from : steps;
    }
    const float *const p0 = power + open[0].from, *const p1 = power + open[1].from, *const p2 = power + open[2].from;
    const float *const p3 = power + open[3].from, *const p4 = power + open[4].from, *const p5 = power + open[5].from;
    for (int k = 0; k < steps; ++k) {
        sum[0] += (p0[k] + p0[k + 1]) / 2.0F;
        sum[1] += (p1[k] + p1[k + 1]) / 2.0F;
        sum[2] += (p2[k] + p2[k + 1]) / 2.0F;
        sum[3] += (p3[k] + p3[k + 1]) / 2.0F;
        sum[4] += (p4[k] + p4[k + 1]) / 2.0F;
        sum[5] += (p5[k] + p5[k + 1]) / 2.0F;
    }
    const int done = steps > 0 ? steps : 0;
    for (int j = 0; j < kNeighbours; ++j) bands[j] = closed(power, {sum[j], open[j].from + done, open[j].to});
}

void integrated(const float *power, int halfSize, const float *edges, int tableSize, float *bands, float binsPerHertz) {
    OpenBand open[kNeighbours];
    int gathered = 0;
    float low = tableSize > 0 ? binOf(edges[0], binsPerHertz, halfSize) : 0.0F;
    for (int i = 0; i + 1 < tableSize; ++i) {
        const float high = binOf(edges[i + 1], binsPerHertz, halfSize);
        const bool valid = low >= 0.0F && high >= 0.0F;
        if (valid) open[gathered++] = openIntegral(power, halfSize, low, high);
        low = high;
        if (valid && gathered == kNeighbours) {
            closeNeighbours(power, open, bands + i + 1 - kNeighbours);
            gathered = 0;
        } else if (!valid || i + 2 == tableSize) {
            // What is gathered ends at band i, or at the one before a band that is left alone.
            const int first = i + (valid ? 1 : 0) - gathered;
            for (int j = 0; j < gathered; ++j) bands[first + j] = closed(power, open[j]);
            gathered = 0;
        }
    }
}

}  // namespace

void integrateBands(const float *power, int halfSize, const float *edges, const float *centres, int tableSize, float *bands,
                    int sampleRate, bool integrate) noexcept {
    if (halfSize < 1 || sampleRate < 1) return;
    const float binsPerHertz = static_cast<float>(2.0 * halfSize) / static_cast<float>(sampleRate);
    if (integrate) {
        integrated(power, halfSize, edges, tableSize, bands, binsPerHertz);
        return;
    }
    for (int i = 0; i + 1 < tableSize; ++i) {
        const float bin = binOf(centres[i], binsPerHertz, halfSize);
        if (bin >= 0.0F) bands[i] = interpolated(power, bin);
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
