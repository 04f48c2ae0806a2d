// SPDX-License-Identifier: MIT
#include "tests/support/host_instance.h"

#include <cstring>
#include <random>
#include <stdexcept>

#include "host/channel_mixer.h"
#include "host/module_name.h"

namespace vxcomn::testing {

Block::Block(int frames, float fill) : length(frames), storage(static_cast<size_t>(frames) * VX_SLOT_COUNT, fill), pointers{} {
    point();
}

Block::Block(const Block &other) : length(other.length), storage(other.storage), pointers{}, buffers(other.buffers) {
    point();
}

Block &Block::operator=(const Block &other) {
    length = other.length;
    storage = other.storage;
    buffers = other.buffers;
    point();
    return *this;
}

void Block::point() {
    for (int i = 0; i < VX_SLOT_COUNT; ++i) pointers[static_cast<size_t>(i)] = slot(i);
    buffers.channels = pointers.data();
}

void Block::fillNoise(uint32_t seed) {
    std::mt19937 random(seed);
    for (float &sample : storage) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
}

bool Block::operator==(const Block &other) const {
    return storage.size() == other.storage.size() &&
           std::memcmp(storage.data(), other.storage.data(), storage.size() * sizeof(float)) == 0;
}

IOFormat formatOf(uint32_t mask, int frames, int sampleRate) {
    IOFormat format{};
    format.channels = __builtin_popcount(mask);
    format.frames = frames;
    format.sampleRate = sampleRate;
    setChannelMask(&format, mask);
    return format;
}

MockEngine &mockEngine(const char *fileName, Module &keep) {
    keep = loadModule(fileName);
    const auto state = reinterpret_cast<MockEngineState>(findExport(keep.get(), "MockEngine_State"));
    if (state == nullptr) throw std::runtime_error(std::string("no mock engine in ") + fileName);
    return *state();
}

HostInstance::HostInstance() : HostInstance(Options()) {}

HostInstance::HostInstance(const Options &options) {
    engine_ = &mockEngine(composeModuleName(options.engine, options.platform, options.hostType).c_str(), module_);
    *engine_ = MockEngine();
    handle = VXDSPAPI_InitializeLibrary(options.engine, options.platform, options.hardware, options.commandLine, options.presetPath,
                                        options.recordRate, options.hostType);
    if (handle == nullptr) throw std::runtime_error("the host did not open the mock engine");
}

HostInstance::~HostInstance() {
    *engine_ = MockEngine();  // the test's hooks may look at objects of the test that are gone by now
    if (handle != nullptr) VXDSPAPI_FreeLibrary(handle);
    *engine_ = MockEngine();
}

int32_t HostInstance::free() {
    const int32_t result = VXDSPAPI_FreeLibrary(handle);
    handle = nullptr;
    return result;
}

void HostInstance::setFormat(const IOFormat &format) {
    IOFormat input = format;
    IOFormat output = format;
    VXDSPAPI_SetIOFormat(handle, &input, &output);
}

void HostInstance::process(Block &block, IOFormat input, IOFormat output) const {
    VXDSPAPI_Process(handle, &block.buffers, &input, &output);
}

}  // namespace vxcomn::testing
