/* SPDX-License-Identifier: MIT
 *
 * The two records that accompany every block of audio, and the speaker positions. Host, engine and caller read and write them in
 * place. Compiles as C11 and C++17 by itself.
 */
#ifndef VXCOMN_BLOCK_H
#define VXCOMN_BLOCK_H

#include "types.h"

enum {
    VX_SLOT_COUNT = 8,  /* buffers of a block, one a speaker position */
    VX_MAX_FRAMES = 512 /* the longest block that is processed */
};

/* Slots: the fixed positions of the eight channel buffers. */
enum VXSlot {
    VX_SLOT_FRONT_LEFT = 0,
    VX_SLOT_FRONT_RIGHT = 1,
    VX_SLOT_FRONT_CENTER = 2,
    VX_SLOT_LOW_FREQUENCY = 3,
    VX_SLOT_BACK_LEFT = 4,
    VX_SLOT_BACK_RIGHT = 5,
    VX_SLOT_SIDE_LEFT = 6,
    VX_SLOT_SIDE_RIGHT = 7
};

/* Speaker mask bits of the eight slots, numbered as in WAVEFORMATEXTENSIBLE. */
enum VXSpeaker {
    VX_SPEAKER_FRONT_LEFT = 0x1,
    VX_SPEAKER_FRONT_RIGHT = 0x2,
    VX_SPEAKER_FRONT_CENTER = 0x4,
    VX_SPEAKER_LOW_FREQUENCY = 0x8,
    VX_SPEAKER_BACK_LEFT = 0x10,
    VX_SPEAKER_BACK_RIGHT = 0x20,
    VX_SPEAKER_SIDE_LEFT = 0x200,
    VX_SPEAKER_SIDE_RIGHT = 0x400
};

/* The format of one side of a block. 32 bytes. */
typedef struct IOFormat {
    int32_t channels;                   /* number of channels */
    uint32_t channelMask;               /* speaker mask */
    int32_t frames;                     /* frames in this block */
    int32_t sampleRate;                 /* samples per second */
    uint8_t channelSlot[VX_SLOT_COUNT]; /* for stream channel i, the slot of its buffer */
    uint8_t slotSpeaker[VX_SLOT_COUNT]; /* for each slot, the 1-based number of the mask bit that landed there; 0 if none */
} IOFormat;

/* The buffers of a block. 24 bytes. */
typedef struct ProcessBuffers {
    float **channels;   /* eight pointers, all valid whatever the format, to buffers of at least 512 samples; processed in place */
    uint64_t reserved;  /* the caller's; travels to the engine */
    int32_t silent;     /* written by VXDSPAPI_Process: 1 after more than one second of silence, else 0 */
    uint32_t reserved2; /* the caller's; travels to the engine */
} ProcessBuffers;

#ifdef __cplusplus
static_assert(sizeof(IOFormat) == 32 && offsetof(IOFormat, channelMask) == 4 && offsetof(IOFormat, frames) == 8 &&
                  offsetof(IOFormat, sampleRate) == 12 && offsetof(IOFormat, channelSlot) == 16 &&
                  offsetof(IOFormat, slotSpeaker) == 24,
              "IOFormat crosses the interface");
static_assert(sizeof(ProcessBuffers) == 24 && offsetof(ProcessBuffers, reserved) == 8 && offsetof(ProcessBuffers, silent) == 16 &&
                  offsetof(ProcessBuffers, reserved2) == 20,
              "ProcessBuffers crosses the interface");
#endif

#endif
