// SPDX-License-Identifier: MIT
#include "tools/vx/engine_seat.h"

#include "tools/vx/failure.h"

namespace vx {

EngineSeat::EngineSeat(EngineChoice choice, const IOFormat &input, const IOFormat &output, std::vector<ParameterWrite> writes,
                       RunFollower *follower)
    : choice_(std::move(choice)), input_(input), output_(output), writes_(std::move(writes)), follower_(follower) {
    asked_ = follower_ != nullptr ? follower_->engine() : choice_.engine;
    open(asked_);
    if (follower_ != nullptr) follower_->attach(host_.get());
}

EngineSeat::~EngineSeat() {
    if (follower_ != nullptr) follower_->attach(nullptr);
}

void EngineSeat::open(const std::string &engine) {
    EngineChoice choice = choice_;
    choice.engine = engine;
    auto host = std::make_unique<HostSession>(choice);
    host->start(input_, output_);
    std::vector<ParameterAnswer> answers;
    for (const ParameterWrite &write : writes_) answers.push_back(host->send(write));
    if (follower_ != nullptr) follower_->attach(nullptr);
    host_ = std::move(host);
    answers_ = std::move(answers);
}

void EngineSeat::renew() {
    if (follower_ == nullptr) return;
    const std::string wanted = follower_->engine();
    if (wanted == asked_) return;
    asked_ = wanted;
    try {
        open(wanted);
        follower_->attach(host_.get());
    } catch (const Failure &failure) {
        follower_->engineRefused(failure.what());
    }
}

}  // namespace vx
