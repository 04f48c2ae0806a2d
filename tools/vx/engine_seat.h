// SPDX-License-Identifier: MIT
//
// The place of the engine in a run: opened with the run's formats and settings, and opened anew when a follower wants another one.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tools/vx/host_session.h"
#include "tools/vx/run_follower.h"

namespace vx {

class EngineSeat {
  public:
    // `follower` may be null.
    EngineSeat(EngineChoice choice, const IOFormat &input, const IOFormat &output, std::vector<ParameterWrite> writes,
               RunFollower *follower);
    EngineSeat(const EngineSeat &) = delete;
    EngineSeat &operator=(const EngineSeat &) = delete;
    ~EngineSeat();

    HostSession &host() { return *host_; }
    const std::vector<ParameterAnswer> &answers() const { return answers_; }

    // Between blocks: takes the follower's engine if it is another one.
    void renew();

  private:
    void open(const std::string &engine);

    EngineChoice choice_;
    IOFormat input_, output_;
    std::vector<ParameterWrite> writes_;
    RunFollower *follower_;
    std::string asked_;
    std::unique_ptr<HostSession> host_;
    std::vector<ParameterAnswer> answers_;
};

}  // namespace vx
