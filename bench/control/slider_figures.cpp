// SPDX-License-Identifier: MIT
//
// From a slider in one process to a receiver that waits in another, beside a word in shared memory and a futex between the same two
// pinned processes, in turns; from there to the sound: the receiver hands each change to the sample engine, while blocks of 480
// frames are played in real time; and the reading of a user parameter beside the bare read of its value.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <thread>

#include <linux/futex.h>
#include <sched.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include "VXAPOCOMAPI.h"
#include "VXDSPAPI.h"
#include "bench/control/figures.h"
#include "bench/support/shared_page.h"
#include "bench/support/timing.h"
#include "control/endpoint_context.h"
#include "tests/control/changes.h"
#include "tests/support/host_instance.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::bench {

namespace {

using testing::ChangeRecord;

constexpr int kRounds = 2000, kSoundRounds = 200;
constexpr uint32_t kPatience = 20000;  // ms
constexpr int kBlockFrames = 480, kRate = 48000;
constexpr double kBlockNanoseconds = 1e9 * kBlockFrames / kRate;

struct Page : SharedPage {
    std::atomic<int64_t> heard;  // when the first block that sounds different was there
    std::atomic<uint32_t> sounded;
};

void unpin() {
    cpu_set_t all;
    std::memset(&all, 0xFF, sizeof all);
    sched_setaffinity(0, sizeof all, &all);
}

// The client's end of an endpoint with a slot.
struct Slot {
    explicit Slot(const testing::SampleMachine &machine)
        : api(VXAPOCOMAPI_InitializeAPI()), endpoint(VXAPOCOMAPI_GetEndpoint(api, machine.endpointId().c_str(), 0)) {
        require(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1, "no slot");
    }
    ~Slot() { VXAPOCOMAPI_FreeAPI(api); }
    Slot(const Slot &) = delete;
    Slot &operator=(const Slot &) = delete;

    VXAPOHandle const api, endpoint;
};

// The sample engine, playing a tone of a whole number of periods a block, so that block follows block without a difference until a
// parameter moves.
class Player {
  public:
    Player(VXHandle engine, Page &page) : engine_(engine), page_(page), thread_([this] { play(); }) {}
    ~Player() {
        ended_ = true;
        thread_.join();
    }
    Player(const Player &) = delete;
    Player &operator=(const Player &) = delete;

    // The next change that is heard is that of this round.
    void listenFor(uint32_t round) { awaited_ = round; }

  private:
    void play() {
        constexpr float kAudible = 1e-4F;
        IOFormat input = testing::formatOf(0x3, kBlockFrames, kRate), output = input;
        testing::Block block(kBlockFrames);
        std::vector<float> last(kBlockFrames);
        auto next = std::chrono::steady_clock::now();
        while (!ended_) {
            for (int slot = 0; slot < 2; ++slot) {
                for (int i = 0; i < kBlockFrames; ++i)
                    block.slot(slot)[i] = 0.1F * std::sin(2.0F * 3.14159265F * static_cast<float>(i) / 24.0F);
            }
            VXDSPAPI_Process(engine_, &block.buffers, &input, &output);
            bool different = false;
            for (int i = 0; i < kBlockFrames; ++i)
                different |= std::abs(block.slot(0)[i] - last[static_cast<size_t>(i)]) > kAudible;
            std::copy_n(block.slot(0), kBlockFrames, last.begin());
            if (const uint32_t round = awaited_; round != 0 && different) {
                page_.heard = nowNanoseconds();
                awaited_ = 0;
                page_.sounded = round;
            }
            next += std::chrono::nanoseconds(static_cast<int64_t>(kBlockNanoseconds));
            std::this_thread::sleep_until(next);
        }
    }

    VXHandle engine_;
    Page &page_;
    std::atomic<uint32_t> awaited_{0};
    std::atomic<bool> ended_{false};
    std::thread thread_;
};

void waitOnFutex(Page &page, uint32_t round) {
    const uint32_t seen = page.word.load();
    page.blocked.store(round);
    while (page.word.load() == seen) syscall(SYS_futex, &page.word, FUTEX_WAIT, seen, nullptr, nullptr, 0);
    keep(page.value.load());
    page.when.store(nowNanoseconds());
}

std::vector<ChangeRecord> waitForChange(Page &page, VXAPOHandle endpoint, uint32_t round) {
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    page.blocked.store(round);
    while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, kPatience, 0) != 1) {
    }
    page.when.store(nowNanoseconds());
    return testing::recordsOf(blob, size, count);
}

VXHandle openEngine() {
    VXHandle const engine = VXDSPAPI_InitializeLibrary("SampleEngine", nullptr, 0, nullptr, nullptr, kRate, 0);
    require(engine != nullptr, "no sample engine");
    IOFormat input = testing::formatOf(0x3, kBlockFrames, kRate), output = input;
    VXDSPAPI_SetIOFormat(engine, &input, &output);
    return engine;
}

// The receiving process. In the rounds of Way::store it only receives, in those of Way::sound it plays what it receives.
void receive(const testing::SampleMachine &machine, Page &page) {
    pinTo(1);
    const Slot slot(machine);
    while (!testing::receiveParams(slot.endpoint, 0).empty()) {
    }
    VXHandle engine = nullptr;
    std::unique_ptr<Player> player;
    for (uint32_t round = 1;; ++round) {
        while (page.round.load() != round) sleepMicroseconds(20);
        const Way way = page.way.load();
        if (way == Way::end) return;
        if (way == Way::futex) {
            waitOnFutex(page, round);
        } else if (way == Way::store) {
            waitForChange(page, slot.endpoint, round);
        } else {
            if (player == nullptr) {
                unpin();
                engine = openEngine();
                player = std::make_unique<Player>(engine, page);
                sleepMicroseconds(500000);
            }
            for (ChangeRecord &change : waitForChange(page, slot.endpoint, round)) {
                player->listenFor(round);
                VXDSPAPI_SetParameterEx(engine, change.component, change.param, static_cast<uint32_t>(change.channel),
                                        change.data.data(), static_cast<uint32_t>(change.data.size()), change.isTransient);
            }
        }
        page.arrived.store(round);
    }
}

void waitUntil(const std::atomic<uint32_t> &word, uint32_t value, const char *what) {
    for (int i = 0; word.load() != value; ++i) {
        require(i < 1000000, what);
        sleepMicroseconds(20);
    }
}

double handOver(Page &page, VXAPOHandle endpoint, uint32_t round, Way way) {
    page.way.store(way);
    page.round.store(round);
    waitUntil(page.blocked, round, "the receiver does not wait");
    sleepMicroseconds(way == Way::futex ? 100 : 500);  // until it really sleeps
    const int64_t begin = nowNanoseconds();
    if (way == Way::futex) {
        page.value.store(round);
        page.word.fetch_add(1);
        syscall(SYS_futex, &page.word, FUTEX_WAKE, 1, nullptr, nullptr, 0);
    } else {
        const float value = round % 2 == 0 ? 0.2F : 1.0F;
        require(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_VOICE_LEVEL, value) == 1, "the slider does not move");
    }
    waitUntil(page.arrived, round, "the change did not arrive");
    return static_cast<double>(page.when.load() - begin);
}

double percentile99(std::vector<double> times) {
    std::sort(times.begin(), times.end());
    return times[times.size() * 99 / 100];
}

void printReading(const Slot &slot) {
    const auto &context = *static_cast<VXAPOCOMAPI_EndpointContext *>(slot.endpoint);
    const WideString key = context.ParamRegKeyName.get();
    const std::vector<Work> works = {
        {"bare",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 uint8_t value[4];
                 uint32_t size = sizeof value;
                 keep(ReadParameterValue(key, 0, -12, value, size, nullptr, nullptr));
             }
         }},
        {"user parameter",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) keep(VXAPOCOMAPI_GetUserParameter(slot.endpoint, USER_PARAM_ID_VOICE_LEVEL));
         }},
    };
    const std::vector<Figure> figures = timeInTurns(works);
    const double bare = nanosecondsOf(figures, "bare"), ours = nanosecondsOf(figures, "user parameter");
    printRatio("VXAPOCOMAPI_GetUserParameter", ours, ours / bare, "the bare read of the value", 4, true);
}

}  // namespace

void printSliderFigures() {
    const testing::SampleMachine machine;
    Page &page = *makeShared<Page>();
    const pid_t receiver = fork();
    if (receiver == 0) {
        try {
            receive(machine, page);
        } catch (const std::exception &error) {
            std::fprintf(stderr, "the receiving process: %s\n", error.what());
            _exit(1);
        }
        _exit(0);
    }
    pinTo(0);
    const Slot slot(machine);
    std::vector<double> futex, slider, sound;
    uint32_t round = 0;
    for (int i = 0; i < kRounds; ++i) {
        futex.push_back(handOver(page, slot.endpoint, ++round, Way::futex));
        slider.push_back(handOver(page, slot.endpoint, ++round, Way::store));
    }
    unpin();
    for (int i = 0; i < kSoundRounds; ++i) {
        handOver(page, slot.endpoint, ++round, Way::sound);
        waitUntil(page.sounded, round, "nothing was heard");
        sound.push_back(static_cast<double>(page.heard.load() - page.when.load()));
        // Until the glide to the new level is over.
        sleepMicroseconds(100000);
    }
    page.way.store(Way::end);
    page.round.store(++round);
    waitpid(receiver, nullptr, 0);

    const double bare = medianOf(futex), ours = medianOf(slider);
    printRatio("slider to a receiver in another process, median", ours, ours / bare, "a shared futex", 5, true);
    printRatio("slider to a receiver in another process, p99", percentile99(slider), percentile99(slider) / percentile99(futex),
               "a shared futex's p99");
    const double heard = medianOf(sound);
    printRatio("from there to the first changed sample, median", heard, (heard - 5e5) / kBlockNanoseconds, "a block, less 0.5 ms",
               1, true);
    printReading(slot);
    std::printf("\n");
}

}  // namespace vxcomn::bench
