// SPDX-License-Identifier: MIT
#include "measure/elliptic_cascade.h"

#include "measure/elliptic_math.h"

namespace Dsp {
namespace {

using Value = std::complex<double>;

// The polynomial 1 + c1 z^-1 + c2 z^-2 with these two roots.
struct Second {
    double c1;
    double c2;
};

Second polynomialOf(const Value *roots) {
    const Value root = roots[0];
    if (root.imag() != 0.0) return {-2.0 * root.real(), root.real() * root.real() + root.imag() * root.imag()};
    return {-(root.real() + roots[1].real()), root.real() * roots[1].real()};
}

}  // namespace

void Cascade::setLayout(const Layout<kMaxDigitalPoles> &layout) {
    stageCount = layout.pairCount();
    for (size_t i = 0; i < static_cast<size_t>(stageCount); ++i) {
        const Second poles = polynomialOf(layout.pairs[i].poles);
        const Second zeros = polynomialOf(layout.pairs[i].zeros);
        stages[i] = {1.0, poles.c1, poles.c2, zeros.c1, zeros.c2, 1.0};
    }
    const Value response = responseAt(layout.normalFrequency);
    const double magnitude = vxcomn::squareRoot(response.real() * response.real() + response.imag() * response.imag());
    const double scale = layout.normalGain / magnitude;
    stages[0].b0 *= scale;
    stages[0].b1 *= scale;
    stages[0].b2 *= scale;
}

Value Cascade::responseAt(double frequency) const {
    // z^-1 and its square
    const double c1 = vxcomn::cosine(frequency);
    const double s1 = -vxcomn::sine(frequency);
    const double c2 = vxcomn::cosine(2.0 * frequency);
    const double s2 = -vxcomn::sine(2.0 * frequency);
    double real = 1.0;
    double imaginary = 0.0;
    for (size_t i = 0; i < static_cast<size_t>(stageCount); ++i) {
        const Stage &stage = stages[i];
        const double topReal = stage.b0 + stage.b1 * c1 + stage.b2 * c2;
        const double topImaginary = stage.b1 * s1 + stage.b2 * s2;
        const double bottomReal = stage.a0 + stage.a1 * c1 + stage.a2 * c2;
        const double bottomImaginary = stage.a1 * s1 + stage.a2 * s2;
        const double square = bottomReal * bottomReal + bottomImaginary * bottomImaginary;
        const double ratioReal = (topReal * bottomReal + topImaginary * bottomImaginary) / square;
        const double ratioImaginary = (topImaginary * bottomReal - topReal * bottomImaginary) / square;
        const double nextReal = real * ratioReal - imaginary * ratioImaginary;
        imaginary = real * ratioImaginary + imaginary * ratioReal;
        real = nextReal;
    }
    return {real, imaginary};
}

double DirectFormI::process(double sample, const Cascade &cascade) {
    antiDenormal = -antiDenormal;
    double added = antiDenormal;  // into the first stage's sum alone
    for (size_t i = 0; i < static_cast<size_t>(cascade.stageCount); ++i) {
        const Stage &stage = cascade.stages[i];
        History &history = histories[i];
        const double out = stage.b0 * sample + stage.b1 * history.x1 + stage.b2 * history.x2 - stage.a1 * history.y1 -
                           stage.a2 * history.y2 + added;
        history.x2 = history.x1;
        history.x1 = sample;
        history.y2 = history.y1;
        history.y1 = out;
        sample = out;
        added = 0.0;
    }
    return sample;
}

}  // namespace Dsp
