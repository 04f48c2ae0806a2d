/* SPDX-License-Identifier: MIT
 *
 * LibraryContext: all state of one host instance, one for each loaded engine module. The engine receives its address at
 * VXDSPAPI_Initialize, so the order of the fields and their natural alignment are part of the contract; the offsets are pinned at
 * the end. Zero-filled at creation. Compiles as C11 and C++17 by itself.
 *
 * Threads: "render" is the thread of VXDSPAPI_Process, "capture" that of VXDSPAPI_Record, "control" any other. An atomic byte
 * names its writers; everything else is written by control calls while the matching block function is kept out, or by one side
 * only. Stop and busy bytes form a handshake: the block function stores busy and then loads stop, the control call stores stop and
 * then loads busy, all four sequentially consistent. Whoever sees busy at 0 with its stop up is alone until it lowers the stop.
 * The other lock and busy bytes of the control side work the same way against the same two busy bytes.
 */
#ifndef VXCOMN_LIBRARY_CONTEXT_H
#define VXCOMN_LIBRARY_CONTEXT_H

#include "engine.h"
#include "measurement_records.h"

enum {
    VX_FILE_NAME_SIZE = 512,
    VX_MAX_COMPONENTS = 100, /* component ids that the enable tables hold */
    VX_RECORD_CHANNELS = 4,  /* channels that the capture side works on */
    VX_SINE_CHANNELS = 4
};

/* The library's logger; engines have no use for it. */
struct CTraceFuncCallTarget;
struct BinProjectParameters;

typedef struct LibraryContext {
    void *engineModule;                     /* the loaded module */
    char engineFileName[VX_FILE_NAME_SIZE]; /* its file name as loaded */
    int32_t sampleRate;                     /* Hz, output side */
    int32_t recordSampleRate;               /* Hz, capture side */
    int32_t blockFrames;                    /* 512; not consulted */
    VXAtomicByte recordFirResetPending;     /* control: set; capture: clears the overlaps of recordFir and the byte */
    VXAtomicByte processFirResetPending;    /* control: set; render: clears the overlap of processFir and the byte */
    uint8_t initialised;                    /* 1 from creation on */
    VXAtomicByte recordBusy;                /* capture: 1 while VXDSPAPI_Record is inside its body */
    VXAtomicByte recordStop;                /* control: VXDSPAPI_Record is to do nothing */
    VXAtomicByte processBusy;               /* render: 1 while VXDSPAPI_Process is inside its body */
    VXAtomicByte processStop;               /* control: VXDSPAPI_Process is to leave the samples alone */
    uint32_t hardwareMode;                  /* bit 0: iSST module wanted; bit 1: run it inside VXDSPAPI_Process */
    struct LibraryContext *isstModule;      /* the iSST module's context, or null */
    VXEngineHandle isstHandle;              /* the iSST module's instance, or null */
    int32_t isstLoaded;                     /* nonzero while the iSST module is in use */
    uint8_t componentEnable[VX_MAX_COMPONENTS];
    uint8_t componentOnISST[VX_MAX_COMPONENTS];
    VXAtomicByte processFirEnable; /* control: filter the single-channel pink noise */
    uint32_t processFirLength;     /* coefficients; 128 initially */
    float processFirCoefficients[VX_MAX_FIR_TAPS];
    VXAtomicByte processFirBusy; /* control: the filter is being replaced; render keeps off it */
    FftFirFilter processFir;
    VXAtomicByte recordFirEnable[VX_RECORD_CHANNELS];
    uint32_t recordFirLength[VX_RECORD_CHANNELS];
    float recordFirCoefficients[VX_RECORD_CHANNELS][VX_MAX_FIR_TAPS];
    VXAtomicByte recordFirBusy[VX_RECORD_CHANNELS];
    FftFirFilter recordFir[VX_RECORD_CHANNELS];
    uint64_t totalFrames;          /* frames seen by VXDSPAPI_Process since start */
    VXAtomicByte analyserLock[3];  /* control: feeds are skipped */
    RealTimeAnalyser analyser[3];  /* 0: engine input, 1: engine output, 2: capture */
    int32_t analyserFeedMode;      /* channel choice of analysers 1 and 2; 2 initially */
    VXAtomicByte captureRequested; /* control: written together with captureArmed in one 16-bit store */
    VXAtomicByte captureArmed;
    CaptureRing capture[VX_RECORD_CHANNELS];
    VXAtomicByte recordStatsLock;        /* control: timing is skipped */
    double recordSeconds;                /* time in VXDSPAPI_Record */
    uint64_t recordStatFrames;           /* frames in that time */
    float recordLoadPercent;             /* last computed load */
    VXAtomicByte processStatsLock;       /* control: timing is skipped */
    double processSeconds;               /* time in VXDSPAPI_Process */
    uint64_t processStatFrames;          /* frames in that time */
    float processLoadPercent;            /* last computed load */
    VXAtomicByte pinkNoiseMode;          /* control: pink noise on every channel */
    VXAtomicByte singleChannelPinkNoise; /* control: pink noise on channel 0 only */
    PinkNoiseGenerator pinkNoise;        /* shared by both pink modes */
    VXAtomicByte whiteNoiseMode;         /* control: white noise on every channel */
    VXAtomicByte sineMode;               /* control: sine generators */
    SineGenerator sine[VX_SINE_CHANNELS];
    VXAtomicByte sweepActive[VX_SLOT_COUNT];       /* control: sweep running */
    VXAtomicByte sweepStarted[VX_SLOT_COUNT];      /* render: the first block has been generated */
    VXAtomicByte sweepTracking[VX_SLOT_COUNT];     /* capture: follows the sweep */
    VXAtomicByte sweepOnsetPending[VX_SLOT_COUNT]; /* control: set; capture: clears at the onset */
    OnsetDetector sweepDetector[VX_SLOT_COUNT];
    SweepGenerator sweep[VX_SLOT_COUNT];
    SweepGenerator sweepTracker[VX_SLOT_COUNT]; /* capture-side twins, restarted at the onset */
    BiquadState trackingNotch[VX_SLOT_COUNT];
    IOFormat inputFormat;                               /* render rewrites `frames` at every block */
    IOFormat outputFormat;                              /* the same */
    int32_t distortionPoints[VX_SLOT_COUNT];            /* results that a sweep can give */
    float distortion[VX_SLOT_COUNT][VX_MAX_DISTORTION]; /* ratio a band */
    int32_t distortionIndex[VX_SLOT_COUNT];             /* next band to fill */
    double notchInputSum[VX_SLOT_COUNT];                /* magnitudes ahead of the notch */
    double notchOutputSum[VX_SLOT_COUNT];               /* magnitudes behind the notch */
    VXAtomicByte polarityActive[VX_SLOT_COUNT];         /* control: set; render: clears at the tone's end */
    VXAtomicByte polarityStarted[VX_SLOT_COUNT];        /* render: the first block has been generated */
    VXAtomicByte polarityOnsetPending[VX_SLOT_COUNT];   /* control: set; capture: clears at the onset */
    OnsetDetector polarityDetector[VX_SLOT_COUNT];
    int32_t polarityResult[VX_SLOT_COUNT]; /* +1, -1, or 0 while unknown */
    PolarityToneGenerator polarityTone[VX_SLOT_COUNT];
    VXAtomicByte recordMeterLock; /* control: the meter is being read */
    int32_t recordMeterChannels;
    float recordPeak[VX_SLOT_COUNT]; /* linear; capture: raises; control: zeroes under the lock */
    VXAtomicByte inputMeterLock;     /* control: the meter is being read */
    int32_t inputMeterChannels;
    float inputPeak[VX_SLOT_COUNT]; /* ahead of the mixer and the engine */
    VXAtomicByte outputMeterLock;   /* control: the meter is being read */
    int32_t outputMeterChannels;
    float outputPeak[VX_SLOT_COUNT];     /* behind the engine */
    int32_t silentFrames;                /* frames since the last sample above the silence threshold */
    uint8_t hardwareFlag0;               /* bit 0 of Hardware */
    uint8_t hardwareFlag1;               /* bit 1 of Hardware */
    VXEngineInitialize engineInitialize; /* the module's exports, each null if it has none */
    VXEngineFree engineFree;
    VXEngineIsInputFormatSupported engineIsInputFormatSupported;
    VXEngineIsOutputFormatSupported engineIsOutputFormatSupported;
    VXEngineSetIOFormat engineSetIOFormat;
    VXEngineSetInputGain engineSetInputGain;
    VXEngineCreateComponent engineCreateComponent;
    VXEngineDisposeComponent engineDisposeComponent;
    VXEngineClear engineClear;
    VXEngineSetParameter engineSetParameter;
    VXEngineReadWriteData engineReadWriteData;
    VXEngineProcess engineProcess;
    VXEngineRecord engineRecord;
    VXEngineOnIdle engineOnIdle;
    VXEngineProcess processAdapter;                 /* what VXDSPAPI_Process calls for the engine */
    VXEngineRecord recordAdapter;                   /* what VXDSPAPI_Record calls for the engine */
    struct BinProjectParameters *projectParameters; /* the preset mirror, or null */
    uint64_t thisModuleVersion;                     /* four 16-bit parts, major highest */
    uint64_t apoModuleVersion;                      /* the same, of the installed copy */
    char *apoPresetPath;                            /* owned, or null */
    VXWCHAR *inputEndpointId;                       /* owned, or null; likewise the next three */
    VXWCHAR *inputEndpointName;
    VXWCHAR *outputEndpointId;
    VXWCHAR *outputEndpointName;
    char *engineShortName;          /* VXORLO or KZNOVA; owned, or null */
    EngineConfig engineDescription; /* the engine's record of the built-in table */
    int32_t hostType;
    int32_t presetBinWriteOff;             /* "/wrpresetbinoff" on the command line */
    int32_t boardParamsWriteOff;           /* "/wrboardparamsoff" on the command line */
    char *commandLine;                     /* owned, or null */
    struct CTraceFuncCallTarget *ownTrace; /* the logger created with the context */
    struct CTraceFuncCallTarget *trace;    /* the logger in use */
    int32_t maxComponentId;                /* highest id given to VXDSPAPI_CreateComponent */
    int32_t recordFixedBuffers[VX_SLOT_COUNT][VX_MAX_FRAMES];
    int32_t *recordFixedPointers[VX_SLOT_COUNT];
    int32_t processFixedBuffers[VX_SLOT_COUNT][VX_MAX_FRAMES];
    int32_t *processFixedPointers[VX_SLOT_COUNT];
} LibraryContext;

#include "library_context_layout.h"

#endif
