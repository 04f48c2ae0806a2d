// An audio processing object's side of the host, cut down to its calls: open an engine, agree on formats, process blocks, close.
#include <VXDSPAPI.h>

#include <array>
#include <cmath>
#include <cstdio>
#include <numbers>

int main(int argc, char **argv) {
    VXHandle host = VXDSPAPI_InitializeLibrary(argc > 1 ? argv[1] : "SampleEngine", nullptr, 0, nullptr, nullptr, 48000, 1);
    if (host == nullptr) return std::fputs("no such engine, or it declines\n", stderr), 1;

    IOFormat input{2, VX_SPEAKER_FRONT_LEFT | VX_SPEAKER_FRONT_RIGHT, 480, 48000, {0, 1}, {1, 2}};
    IOFormat output = input;
    if (VXDSPAPI_IsInputFormatSupported(host, &input, &output) != 0) std::puts("the engine wants another format: see input");
    input.frames = output.frames = 480;  // the query leaves its longest block there
    VXDSPAPI_SetIOFormat(host, &input, &output);

    // Eight buffers, whatever the format; the slots in use are processed in place. No block function may run before this point.
    static std::array<std::array<float, VX_MAX_FRAMES>, VX_SLOT_COUNT> planes;
    std::array<float *, VX_SLOT_COUNT> channels;
    for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) channels[slot] = planes[slot].data();
    ProcessBuffers buffers{channels.data(), 0, 0, 0};

    float peak = 0;
    for (int block = 0; block < 100; ++block) {  // [render]: this loop is the audio thread's
        for (int frame = 0; frame < output.frames; ++frame) {
            const double time = (block * output.frames + frame) / 48000.0;
            planes[0][frame] = planes[1][frame] = 0.25F * static_cast<float>(std::sin(2 * std::numbers::pi * 1000 * time));
        }
        VXDSPAPI_Process(host, &buffers, &input, &output);
        for (int frame = 0; frame < output.frames; ++frame) peak = std::max(peak, std::abs(planes[0][frame]));
    }
    std::printf("1 s of a sine at 0.25: peak behind the engine %.3f\n", static_cast<double>(peak));

    const bool well = VXDSPAPI_FreeLibrary(host) != 0 && peak > 0;  // no block may begin after this
    return well ? 0 : 1;
}
