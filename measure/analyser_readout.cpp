// SPDX-License-Identifier: MIT
//
// The reader's side of the real-time analyser: the newest samples of the ring, windowed, transformed to linear power and summed
// into bands. The thread that polls pays for all of it. One reader at a time for each analyser.
#include <cstdlib>

#include "measure/analyser_transform.h"
#include "measure/band_integration.h"
#include "measure/band_tables.h"
#include "measure/exact_sine.h"
#include "measure/float_buffer.h"
#include "measure/kernels.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

bool allocate(RealTimeAnalyser &analyser, int size) {
    const auto half = static_cast<size_t>(size) / 2;
    analyser.fftSize = static_cast<int32_t *>(std::malloc(sizeof(int32_t)));
    analyser.work = allocateFloats(5 * half);
    analyser.window = allocateFloats(half);
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
    freeFloats(analyser.work);
    freeFloats(analyser.window);
    analyser.fftSize = nullptr;
    analyser.work = analyser.window = nullptr;
}

// The tables of all stages of a size, by the power of two of their butterflies' distance. False if memory is out.
constexpr int kStages = 31;
bool stagesOf(int size, StageTwiddles *stages) {
    for (int bit = 0; (1 << bit) < size; ++bit) {
        stages[bit] = stageTwiddles(1 << bit);
        if (stages[bit].real == nullptr) return false;
    }
    return true;
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
    StageTwiddles stages[kStages];
    if (!stagesOf(size, stages)) return;

    const int half = size / 2;
    const int write = __atomic_load_n(writeIndex, __ATOMIC_ACQUIRE);
    int start = write - half;
    if (start < 0) start += capacity;
    // While the frame is copied its first slot stands for the read position, so that a feed can't run into it.
    __atomic_exchange_n(readIndex, start, __ATOMIC_ACQ_REL);
    const int toEnd = capacity - start < half ? capacity - start : half;
    if (size >= kSmallestFastTransform && half < capacity) {
        measureKernels->spectrum({size, ring + start, ring, toEnd, window, stages, work});
        __atomic_exchange_n(readIndex, write, __ATOMIC_ACQ_REL);
    } else {
        // Kept: with a frame as long as the ring the start is the end, nothing is copied, and what the last transform left in the
        // real slots is analysed.
        for (int i = 0; i < half && start != write; ++i) work[2 * i] = i < toEnd ? ring[start + i] : ring[i - toEnd];
        __atomic_exchange_n(readIndex, write, __ATOMIC_ACQ_REL);
        plainSpectrum(work, window, size, stages);
    }

    const float *edges = nullptr, *centres = nullptr;
    int tableSize = 0;
    BandTables::select(bandsPerOctave, &edges, &centres, &tableSize);
    integrateBands(work, half, edges, centres, tableSize, bands, sampleRate, integrate != 0);
}
