// SPDX-License-Identifier: MIT
//
// The chains of operations that the signals of this room hang on: what has to be done one sample after the other, because each
// result is rounded and feeds the next. Everything else can go in lanes beside them, so they are what the best program would take.
// No loads, no stores: an empty assembler statement holds each result in a register for every sample.
#pragma once

namespace vxcomn::bench {

inline void holdInRegister(double &value) {
    asm volatile("" : "+x"(value));
}
inline void holdInRegister(float &value) {
    asm volatile("" : "+x"(value));
}

// Sweep: its law is hz = slope * (position - index) + table[index], phase += hz * radiansPerHz, position += step. Two additions
// a sample are serial, those of phase and position, and the two chains run side by side. The steps themselves go in lanes and stand
// here as registers.
inline void barePhaseAdditions(int count) {
    double phase = 0.25, position = 100.0, turn = 0.125, step = 0.001;
    holdInRegister(turn);
    holdInRegister(step);
    for (int i = 0; i < count; ++i) {
        phase += turn;
        position += step;
        holdInRegister(phase);
        holdInRegister(position);
    }
}

// Notch: y = forward - a1 * y1 - a2 * y2 in double precision, with what comes forward and the coefficients in registers.
inline void bareFilterRecurrence(int count) {
    double forward = 0.5, a1 = -1.5, a2 = 0.75, y1 = 1.0, y2 = 0.5;
    holdInRegister(forward);
    holdInRegister(a1);
    holdInRegister(a2);
    for (int i = 0; i < count; ++i) {
        double y = forward - a1 * y1 - a2 * y2;
        holdInRegister(y);
        y2 = y1;
        y1 = y;
    }
}

// Pink noise: the slowest of its six filters as its formula reads, b = f32(decay * f64(b) + share), without the noise. The other
// five would run beside it.
inline void barePinkRecurrence(int count) {
    double decay = 0.99886, share = 0.0555179;
    float b = 1.0F;
    holdInRegister(decay);
    holdInRegister(share);
    for (int i = 0; i < count; ++i) {
        b = static_cast<float>(decay * static_cast<double>(b) + share);
        holdInRegister(b);
    }
}

}  // namespace vxcomn::bench
