// SPDX-License-Identifier: MIT
//
// The measuring set-up: host, engine, and the chain from what the host plays to what its capture side hears. Each step runs one
// block through VXDSPAPI_Process, the chain and VXDSPAPI_Record, faster than it would sound. Channels are those of the host's test
// signals: buffers by number.
#pragma once

#include <memory>
#include <optional>
#include <vector>

#include "tools/vx/audio_file.h"
#include "tools/vx/host_session.h"
#include "tools/vx/interrupt.h"
#include "tools/vx/slot_buffers.h"
#include "tools/vx_measure/measure_options.h"
#include "tools/vx_measure/plant.h"

namespace vx {

class Rig {
  public:
    // `channel` is the measured one; a mono recording is heard there. `input` is a sound file that plays ahead of the engine; empty
    // for silence, which the test signals replace.
    Rig(const MeasureOptions &options, int channel, const std::string &input = {});

    // Runs one block. False, and nothing run, once the recording or the input has ended.
    bool step();
    // Steps until so many seconds have run since the beginning.
    bool stepUntil(double seconds);

    std::vector<uint8_t> command(int32_t id, const std::vector<uint8_t> &input = {}) { return host_.command(id, input); }

    int rate() const { return rate_; }
    int channels() const { return format_.channels; }
    uint32_t mask() const { return format_.channelMask; }
    uint64_t frames() const { return frames_; }
    double seconds() const { return static_cast<double>(frames_) / rate_; }
    // Whether the chain is known to hear what plays at the same moment.
    bool isSimulated() const { return !plants_.empty(); }
    std::string engineFile() const { return host_.engineFile(); }
    const SlotBuffers &played() const { return render_; }

    // Completes the file of --play.
    void commit();

  private:
    bool fillInput();
    bool fillCapture();
    void writePlayed();

    MeasureOptions options_;
    std::unique_ptr<AudioReader> recorded_;
    std::unique_ptr<AudioReader> input_;
    int rate_;
    int channel_;
    HostSession host_;
    IOFormat format_;
    std::vector<Plant> plants_;
    std::unique_ptr<OutputFile> playFile_;
    std::unique_ptr<AudioWriter> playWriter_;
    SlotBuffers render_;
    SlotBuffers capture_;
    std::vector<float> interleaved_;
    uint64_t frames_ = 0;
    bool ended_ = false;
    InterruptGuard interrupt_;
};

}  // namespace vx
