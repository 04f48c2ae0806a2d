// SPDX-License-Identifier: MIT
#include "measure/elliptic_filter.h"

#include <stdexcept>

#include "measure/band_stop_transform.h"
#include "measure/elliptic_math.h"

namespace Dsp {
namespace Elliptic::Design {

template <int MaxOrder>
ParamInfo BandStop<MaxOrder>::parameterInfo(int index) {
    switch (index) {
        case 0:
            return familyParamInfo(ParamId::sampleRate);
        case 1:
            return familyParamInfo(ParamId::order);
        case 2:
            return centerFrequencyInfo();
        case 3:
            return familyParamInfo(ParamId::bandwidthHz);
        case 4:
            return familyParamInfo(ParamId::rippleDb);
        case 5:
            return familyParamInfo(ParamId::rolloff);
        default:
            throw std::logic_error("invalid usage of ParamInfo");
    }
}

template <int MaxOrder>
void BandStop<MaxOrder>::design(const Params &parameters) {
    const double rate = parameters.values[0];
    const double order = parameters.values[1];
    // Not a number counts as 1, so that the conversion has a value.
    const int wholeOrder = order >= MaxOrder ? MaxOrder : order >= 1.0 ? static_cast<int>(order) : 1;
    analog.design(wholeOrder, parameters.values[4], parameters.values[5]);
    transformToBandStop(parameters.values[2] / rate, parameters.values[3] / rate, analog, digital);
    cascade.setLayout(digital);
}

template class BandStop<6>;

}  // namespace Elliptic::Design

template <typename Design>
std::complex<double> FilterDesignBase<Design>::response(double normalizedFrequency) const {
    return design_.cascade.responseAt(2.0 * vxcomn::kPi * normalizedFrequency);
}

template class FilterDesignBase<Elliptic::Design::BandStop<6>>;

}  // namespace Dsp

int32_t designEllipticBandStop(float *coefficients, uint64_t, uint64_t, double centerFrequency, double bandwidth, double rippleDb,
                               double sampleRate) {
    Dsp::EllipticBandStop filter;
    filter.setParameters({{sampleRate, 2.0, centerFrequency, bandwidth, rippleDb, 0.0}});
    const Dsp::Cascade &cascade = filter.cascade();
    for (int i = 0; i < cascade.stageCount; ++i) {
        const Dsp::Stage &stage = cascade.stages[static_cast<size_t>(i)];
        for (const double value : {stage.b0, stage.b1, stage.b2, stage.a1, stage.a2}) *coefficients++ = static_cast<float>(value);
    }
    return cascade.stageCount;
}
