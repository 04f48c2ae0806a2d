// SPDX-License-Identifier: MIT
//
// The loops behind Bare, over the including file's vector type. An empty assembler statement takes each loaded register, so that
// nothing is left out and nothing is added.
#pragma once

#include "bench/host/bare.h"

#define VXCOMN_DEFINE_BARE(name, Vector, kLanes, loadVector, storeVector)      \
    namespace vxcomn::bench {                                                  \
    namespace {                                                                \
    void load(float *const *planes, int count, int frames) {                   \
        for (int c = 0; c < count; ++c) {                                      \
            const float *plane = planes[c];                                    \
            _Pragma("GCC unroll 8") for (int t = 0; t < frames; t += kLanes) { \
                Vector v = loadVector(plane + t);                              \
                asm volatile("" : "+v"(v));                                    \
            }                                                                  \
        }                                                                      \
    }                                                                          \
    void foldTraffic(float *const *planes, int frames) {                       \
        _Pragma("GCC unroll 8") for (int t = 0; t < frames; t += kLanes) {     \
            Vector left = loadVector(planes[0] + t);                           \
            Vector right = loadVector(planes[1] + t);                          \
            _Pragma("GCC unroll 6") for (int c = 2; c < 8; ++c) {              \
                Vector v = loadVector(planes[c] + t);                          \
                asm volatile("" : "+v"(v));                                    \
            }                                                                  \
            asm volatile("" : "+v"(left), "+v"(right));                        \
            storeVector(planes[0] + t, left);                                  \
            storeVector(planes[1] + t, right);                                 \
        }                                                                      \
    }                                                                          \
    void thereAndBack(float *samples, int32_t *words, int frames) {            \
        float *asFloats = reinterpret_cast<float *>(words);                    \
        _Pragma("GCC unroll 8") for (int t = 0; t < frames; t += kLanes) {     \
            Vector v = loadVector(samples + t);                                \
            asm volatile("" : "+v"(v));                                        \
            storeVector(asFloats + t, v);                                      \
        }                                                                      \
        _Pragma("GCC unroll 8") for (int t = 0; t < frames; t += kLanes) {     \
            Vector v = loadVector(asFloats + t);                               \
            asm volatile("" : "+v"(v));                                        \
            storeVector(samples + t, v);                                       \
        }                                                                      \
    }                                                                          \
    }                                                                          \
    constinit const Bare name = {load, foldTraffic, thereAndBack};             \
    }
