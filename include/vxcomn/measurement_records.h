/* SPDX-License-Identifier: MIT
 *
 * The records of the measuring tools, as they lie in a LibraryContext: test signal generators, meters, analysers, FIR filters and
 * the detectors of the capture side. Their layout is part of the contract with engine modules. The member functions belong to the
 * library: they are not exported, and an engine only looks at the fields. Compiles as C11 and C++17 by itself.
 *
 * Threads: `generate`, `feed`, `process` and `clearOverlap` are called from the block functions; all others are control calls.
 */
#ifndef VXCOMN_MEASUREMENT_RECORDS_H
#define VXCOMN_MEASUREMENT_RECORDS_H

#include "types.h"

enum {
    VX_MAX_BANDS = 556,      /* results of the largest band table, and one */
    VX_ONSET_HISTORY = 1920, /* 10 ms at 192 kHz */
    VX_CAPTURE_BUFFERS = 8,  /* buffers that a capture ring can hold */
    VX_MAX_FIR_TAPS = 4096,  /* the longest FIR filter */
    VX_MAX_DISTORTION = 1024 /* the most results of a sweep */
};

/* Seven states of the pink filter bank. All zero at creation. */
typedef struct PinkNoiseGenerator {
    float b[7];
#ifdef __cplusplus
    /* Clears the states. */
    void create();
    /* Writes `count` samples to the front of `buffer`; the offset is not looked at. */
    void generate(float *buffer, int offset, int count);
#endif
} PinkNoiseGenerator;

typedef struct SineGenerator {
    int32_t SampleRate; /* Hz; rate that the steps were computed for */
    int32_t Frequency;  /* Hz, 1000 at creation */
    float PhaseStep;    /* radians per sample */
    double Phase;       /* radians */
    float CurrentStep;  /* step in use */
    float MinStep;      /* step of 20 Hz */
    float MaxStep;      /* step of 20000 Hz */
    float NyquistStep;  /* pi / SampleRate; computed and not read */
#ifdef __cplusplus
    void create(int rate);
    void setSampleRate(int rate);
    void setFrequency(int hz, int rate);
    void generate(float *buffer, int offset, int count);
#endif
} SineGenerator;

typedef struct SweepGenerator {
    int32_t SampleRate;     /* Hz */
    int32_t StartFrequency; /* Hz */
    int32_t StopFrequency;  /* Hz */
    int32_t SweepTime;      /* ms */
    int32_t BandsPerOctave; /* selects the frequency table */
    double RadiansPerHz;    /* 2 pi / SampleRate */
    float PreDelay;         /* ms of lead-in */
    float PostDelay;        /* ms after the sweep */
    int64_t PreDelaySamples;
    int64_t PostDelaySamples;
    int64_t FadePosition; /* zero, not read */
    double FadeStep;      /* 1 / PreDelaySamples, not read */
    int64_t SweepSamples;
    int64_t TotalSamples;    /* not read by the run loop */
    int64_t Position;        /* samples since arming */
    double CurrentFrequency; /* Hz */
    double Phase;            /* radians */
    int32_t TableSize;       /* entries of the frequency table */
    const float *Table;      /* shared band edges, not owned */
    int32_t FirstIndex;      /* table index where the sweep starts */
    int32_t IndexSpan;       /* table indexes that the sweep covers */
    double TablePosition;    /* fractional table index */
    double TableStep;        /* table indexes per sample */
#ifdef __cplusplus
    void arm(int rate, int start, int stop, int sweepTimeMs, float preDelayMs, float postDelayMs, int bandsPerOctave);
    void generate(float *buffer, int offset, int count);
#endif
} SweepGenerator;

typedef struct PolarityToneGenerator {
    float Value;        /* last output, -1e-5 at arming */
    int32_t Position;   /* samples since arming */
    int32_t HalfLength; /* samples to the sign flip; the tone lasts twice this */
    int32_t PeakIndex;  /* block index of the flip, -1 at arming */
    float GrowthFactor; /* 2 - DecayFactor */
    float DecayFactor;  /* factor a sample that brings 1.0 down to 1e-5 over HalfLength */
#ifdef __cplusplus
    void create(int rate);
    void arm(int rate, float milliseconds);
    /* 1 while the tone lasts, 0 once it has ended. */
    int generate(float *buffer, int offset, int count);
#endif
} PolarityToneGenerator;

typedef struct RealTimeAnalyser {
    float *ring;               /* one second of samples, owned */
    int32_t capacity;          /* ring length in samples, equal to the sample rate */
    int32_t *writeIndex;       /* next slot to write; render: atomic exchange */
    int32_t *readIndex;        /* where the last readout stopped; control: atomic exchange */
    uint32_t enabled;          /* nonzero while the feed runs */
    float *window;             /* Hamming window of fftSize / 2 values, owned */
    int32_t *fftSize;          /* transform size; null until the first readout */
    int32_t sampleRate;        /* Hz */
    float bands[VX_MAX_BANDS]; /* linear power; result of the last readout */
    float *work;               /* transform buffer, owned */
#ifdef __cplusplus
    void create(int rate);
    void dispose();
    void feed(int channelChoice, float *const *channels, int channelCount, int frameCount);
    void clear();
    void readBands(int integrate, int size, int bandsPerOctave);
#endif
} RealTimeAnalyser;

/* A hook of the filter; called with the work buffer and the argument stored beside it. */
typedef void (*FftFirFilterHook)(double *work, void *argument);

typedef struct FftFirFilter {
    float *taps;                      /* time-domain coefficients, owned */
    int32_t tapCount;                 /* 0 means no filter */
    int32_t sampleRate;               /* Hz; rate that the taps were made for */
    FftFirFilterHook beforeTransform; /* on the padded block; null */
    void *beforeTransformArgument;
    FftFirFilterHook afterTransform; /* on the spectrum; null */
    void *afterTransformArgument;
    double *response; /* transform of the padded taps, fftSize complex values, owned */
    double *work;     /* the block being filtered, fftSize complex values, owned */
    float *overlap;   /* fftSize / 2 values carried to the next call, owned */
    int32_t *plan;    /* heap word that holds fftSize, owned; null means no filter */
    int32_t log2Size;
    int32_t fftSize;
#ifdef __cplusplus
    void create();
    void dispose();
    void load(const float *newTaps, int count, int rate);
    void process(const float *in, float *out, int count);
    void clearOverlap();
    void resample(int newRate);
#endif
} FftFirFilter;

/* Finds where a test signal arrives: the newest 10 ms against the history behind them. */
typedef struct OnsetDetector {
    int32_t windowLength;            /* delay of the history, samples; 10 ms, at most 1920 */
    float history[VX_ONSET_HISTORY]; /* delay ring */
    int32_t historyPosition;         /* next ring index */
    int32_t sampleIndex;             /* samples seen */
    float delayedMinimum;            /* lowest delayed sample */
    float minimum;                   /* lowest sample */
    int32_t minimumIndex;            /* sampleIndex of minimum */
    float delayedMaximum;            /* highest delayed sample */
    float maximum;                   /* highest sample */
    int32_t maximumIndex;            /* sampleIndex of maximum */
    float decay;                     /* stored, not read */
    int32_t reserved;
} OnsetDetector;

/* A second-order section: feed-forward in f32, feedback in f64. */
typedef struct BiquadState {
    float b0, b1, b2, a1, a2;
    float x1, x2;  /* input history */
    double y1, y2; /* output history */
} BiquadState;

/* Hands samples of the capture side to the application, buffer by buffer. */
typedef struct CaptureRing {
    int32_t active;                        /* ring in use */
    int32_t bufferCount;                   /* buffers in the ring, below 8 */
    int32_t currentBuffer;                 /* buffer being filled */
    int32_t bufferLength;                  /* samples a buffer */
    int32_t writePosition;                 /* next sample in the buffer */
    uint32_t *buffers[VX_CAPTURE_BUFFERS]; /* caller-owned */
    int32_t oneShot;                       /* stop behind the last buffer instead of wrapping */
    VXAtomicByte *bufferReady;             /* caller-owned flags, one a buffer */
} CaptureRing;

#ifdef __cplusplus
static_assert(sizeof(PinkNoiseGenerator) == 28, "layout");
static_assert(offsetof(SineGenerator, Phase) == 16 && offsetof(SineGenerator, CurrentStep) == 24 && sizeof(SineGenerator) == 40,
              "layout");
static_assert(offsetof(SweepGenerator, RadiansPerHz) == 24 && offsetof(SweepGenerator, PreDelay) == 32 &&
                  offsetof(SweepGenerator, PreDelaySamples) == 40 && offsetof(SweepGenerator, FadeStep) == 64 &&
                  offsetof(SweepGenerator, Position) == 88 && offsetof(SweepGenerator, Phase) == 104 &&
                  offsetof(SweepGenerator, TableSize) == 112 && offsetof(SweepGenerator, Table) == 120 &&
                  offsetof(SweepGenerator, FirstIndex) == 128 && offsetof(SweepGenerator, TablePosition) == 136 &&
                  sizeof(SweepGenerator) == 152,
              "layout");
static_assert(sizeof(PolarityToneGenerator) == 24, "layout");
static_assert(offsetof(RealTimeAnalyser, capacity) == 8 && offsetof(RealTimeAnalyser, writeIndex) == 16 &&
                  offsetof(RealTimeAnalyser, readIndex) == 24 && offsetof(RealTimeAnalyser, enabled) == 32 &&
                  offsetof(RealTimeAnalyser, window) == 40 && offsetof(RealTimeAnalyser, fftSize) == 48 &&
                  offsetof(RealTimeAnalyser, sampleRate) == 56 && offsetof(RealTimeAnalyser, bands) == 60 &&
                  offsetof(RealTimeAnalyser, work) == 2288 && sizeof(RealTimeAnalyser) == 2296,
              "layout");
static_assert(offsetof(FftFirFilter, tapCount) == 8 && offsetof(FftFirFilter, beforeTransform) == 16 &&
                  offsetof(FftFirFilter, response) == 48 && offsetof(FftFirFilter, work) == 56 &&
                  offsetof(FftFirFilter, overlap) == 64 && offsetof(FftFirFilter, plan) == 72 &&
                  offsetof(FftFirFilter, log2Size) == 80 && sizeof(FftFirFilter) == 88,
              "layout");
static_assert(offsetof(OnsetDetector, history) == 4 && offsetof(OnsetDetector, historyPosition) == 7684 &&
                  sizeof(OnsetDetector) == 7724,
              "layout");
static_assert(offsetof(BiquadState, x1) == 20 && offsetof(BiquadState, y1) == 32 && sizeof(BiquadState) == 48, "layout");
static_assert(offsetof(CaptureRing, writePosition) == 16 && offsetof(CaptureRing, buffers) == 24 &&
                  offsetof(CaptureRing, oneShot) == 88 && offsetof(CaptureRing, bufferReady) == 96 && sizeof(CaptureRing) == 104,
              "layout");
#endif

#endif
