// SPDX-License-Identifier: MIT
//
// The filter-design family's interface and its one member: an elliptic band-stop of at most order 6. The order of the virtual
// operations is fixed. A design object is built, used and dropped by one caller; nothing here is for the block path.
#pragma once

#include <complex>
#include <string>
#include <vector>

#include "measure/elliptic_cascade.h"
#include "measure/elliptic_parameters.h"
#include "measure/elliptic_prototype.h"

namespace Dsp {

inline constexpr int kMaxParameters = 8;

struct Params {
    double values[kMaxParameters] = {};
};

enum class Kind : int { ellipticBandStop = 1 };

class Filter {
  public:
    Filter() = default;
    Filter(const Filter &) = default;
    Filter &operator=(const Filter &) = default;

    virtual ~Filter() = default;
    virtual Kind kind() const = 0;
    virtual std::string name() const = 0;
    virtual int parameterCount() const = 0;
    virtual ParamInfo parameterInfo(int index) const = 0;  // raises a logic error for an index outside the table
    virtual std::vector<PoleZeroPair> poleZeros() const = 0;
    virtual std::complex<double> response(double normalizedFrequency) const = 0;  // in cycles per sample
    virtual int channelCount() const = 0;
    virtual void reset() = 0;
    virtual void process(int sampleCount, double *const *channels) = 0;
    virtual void process(int sampleCount, float *const *channels) = 0;
    virtual void setParameters(const Params &parameters) = 0;  // runs the design
};

namespace Elliptic::Design {

// The three steps of the design, with what each leaves.
template <int MaxOrder>
class BandStop {
  public:
    static_assert(MaxOrder == kMaxPrototypePoles, "the layouts have room for this order");

    static constexpr Kind kKind = Kind::ellipticBandStop;
    static constexpr const char *kName = "Elliptic Band Stop";
    static constexpr int kParameters = 6;

    static ParamInfo parameterInfo(int index);

    void design(const Params &parameters);

    Cascade cascade;
    Layout<kMaxDigitalPoles> digital;
    AnalogLowPass analog;
};

}  // namespace Elliptic::Design

template <typename Design>
class FilterDesignBase : public Filter {
  public:
    Kind kind() const override { return Design::kKind; }
    std::string name() const override { return Design::kName; }
    int parameterCount() const override { return Design::kParameters; }
    ParamInfo parameterInfo(int index) const override { return Design::parameterInfo(index); }
    std::vector<PoleZeroPair> poleZeros() const override {
        return {design_.digital.pairs.begin(), design_.digital.pairs.begin() + design_.digital.pairCount()};
    }
    std::complex<double> response(double normalizedFrequency) const override;
    int channelCount() const override = 0;
    void reset() override = 0;
    void process(int sampleCount, double *const *channels) override = 0;
    void process(int sampleCount, float *const *channels) override = 0;
    void setParameters(const Params &parameters) override {
        previous_ = current_;
        current_ = parameters;
        design_.design(current_);
    }

    const Params &parameters() const { return current_; }
    const Cascade &cascade() const { return design_.cascade; }

  protected:
    Params current_;
    Params previous_;
    Design design_;
};

template <typename Design, int Channels, typename State>
class FilterDesign final : public FilterDesignBase<Design> {
  public:
    static_assert(Channels == 1, "one channel is what the family is used with");

    int channelCount() const override { return Channels; }
    void reset() override { state_.reset(); }
    void process(int sampleCount, double *const *channels) override { run(sampleCount, channels[0]); }
    void process(int sampleCount, float *const *channels) override { run(sampleCount, channels[0]); }

  private:
    template <typename Sample>
    void run(int sampleCount, Sample *samples) {
        for (int i = 0; i < sampleCount; ++i) {
            samples[i] = static_cast<Sample>(state_.process(static_cast<double>(samples[i]), this->design_.cascade));
        }
    }

    State state_;
};

using EllipticBandStop = FilterDesign<Elliptic::Design::BandStop<6>, 1, DirectFormI>;

}  // namespace Dsp

// Designs a band-stop of order 2 and writes the ten floats of its two stages, each as b0, b1, b2, a1, a2: the order in which a
// BiquadState begins. Frequencies in Hz. The reserved words are not read. Returns the number of stages.
int32_t designEllipticBandStop(float *coefficients, uint64_t reserved1, uint64_t reserved2, double centerFrequency,
                               double bandwidth, double rippleDb, double sampleRate);
