// SPDX-License-Identifier: MIT
//
// The reader's side of the real-time analyser: the newest samples of the ring, windowed, transformed to linear power and summed
// into bands. The thread that polls pays for all of it. One reader at a time for each analyser.
#include <cstdlib>

#include "measure/analyser_transform.h"
#include "measure/band_integration.h"
#include "measure/band_tables.h"
#include "measure/exact_sine.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

constexpr float kClamp = 1e6F;

bool allocate(RealTimeAnalyser &analyser, int size) {
    const auto half = static_cast<size_t>(size) / 2;
    analyser.fftSize = static_cast<int32_t *>(std::malloc(sizeof(int32_t)));
    analyser.work = static_cast<float *>(std::calloc(4 * half, sizeof(float)));
    analyser.window = static_cast<float *>(std::malloc(half * sizeof(float)));
    if (analyser.fftSize == nullptr || analyser.work == nullptr || analyser.window == nullptr) return false;
    *analyser.fftSize = size;
    for (size_t i = 0; i < half; ++i) {
        const double turn = 6.283185307179586 * static_cast<double>(i) / static_cast<double>(half);
        analyser.window[i] = static_cast<float>(0.54 - 0.46 * exactCosine(turn));
    }
    return true;
}

void release(RealTimeAnalyser &analyser) {
    std::free(analyser.fftSize);
    std::free(analyser.work);
    std::free(analyser.window);
    analyser.fftSize = nullptr;
    analyser.work = analyser.window = nullptr;
}

// A size that can be transformed and whose samples the ring can hold.
bool fits(const RealTimeAnalyser &analyser, int size) {
    return size >= 2 && (size & (size - 1)) == 0 && analyser.ring != nullptr && size / 2 <= analyser.capacity;
}

}  // namespace

void RealTimeAnalyser::readBands(int integrate, int size, int bandsPerOctave) {
    if (!fits(*this, size)) return;
    if (fftSize != nullptr && *fftSize != size) release(*this);
    if (fftSize == nullptr && !allocate(*this, size)) {
        release(*this);
        return;
    }
    const int half = size / 2;
    const int write = __atomic_load_n(writeIndex, __ATOMIC_ACQUIRE);
    int start = write - half;
    if (start < 0) start += capacity;
    // Kept: with a frame as long as the ring the start is the end, nothing is copied, and the last transform's leavings are
    // analysed.
    if (start != write) {
        for (int i = 0, from = start; i < half; ++i) {
            work[2 * i] = ring[from];
            if (++from == capacity) from = 0;
        }
    }
    __atomic_exchange_n(readIndex, write, __ATOMIC_ACQ_REL);
    for (int k = 0; k < half; ++k) {
        float value = work[2 * k];
        if (value > kClamp) value = kClamp;
        if (value < -kClamp) value = -kClamp;
        work[2 * k] = value * window[k];
        work[2 * k + 1] = 0.0F;
    }
    for (int i = size; i < 2 * size; ++i) work[i] = 0.0F;
    transformInPlace(work, size);
    powerInPlace(work, size);

    const float *edges = nullptr, *centres = nullptr;
    int tableSize = 0;
    BandTables::select(bandsPerOctave, &edges, &centres, &tableSize);
    integrateBands(work, half, edges, centres, tableSize, bands, sampleRate, integrate != 0);
}
