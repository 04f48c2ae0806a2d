// SPDX-License-Identifier: MIT
//
// A machine for tests of the control functions: the library is installed, one endpoint for rendering plays through a product
// device, and presets of it lie loose in their folders. Two things that Windows gives and Linux does not: an endpoint is made where
// the machine has none. What a test stored below the root is taken away at both ends.
#pragma once

#include <atomic>
#include <cstdint>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "platform/registry.h"
#include "preset/preset_writer.h"

namespace vxcomn::testing {

// What the sample presets hold beside the engine's identity.
struct SampleValues {
    std::vector<PresetBlock> blocks;

    // All seventeen user parameters: power on, levels at 0 dB, the equaliser on and flat, no bypass.
    static SampleValues usual();
    SampleValues &add(int32_t component, int32_t param, std::vector<uint8_t> value);
};

// A preset of the engine VXORLO, and one of KZNOVA.
PresetDocument orloPreset(SampleValues values = SampleValues::usual());
PresetDocument novaraPreset(SampleValues values = SampleValues::usual());

class SampleMachine {
  public:
    // With a preset of VXORLO for EFX, "AnyOutput", "AnyContent".
    SampleMachine();
    ~SampleMachine();
    SampleMachine(const SampleMachine &) = delete;
    SampleMachine &operator=(const SampleMachine &) = delete;

    const WideString &endpointId() const noexcept { return id_; }
    // False on a Windows machine without an endpoint for rendering.
    bool hasEndpoint() const noexcept { return !id_.empty(); }

    static void putPreset(const PresetDocument &document, const char *apoType = "EFX", const char *ioConfig = "AnyOutput",
                          const char *content = "AnyContent");
    static void removePreset(const char *apoType = "EFX", const char *ioConfig = "AnyOutput", const char *content = "AnyContent");

    // Keys below the root.
    static WideString configurationPath(const char *apoType = "EFX");
    static WideString parametersPath(const char *engine = "VXORLO", const char *ioConfig = "AnyOutput", const char *apoType = "EFX",
                                     const char *profile = "GlobalProfile", const char *content = "AnyContent");
    static RegistryKey configurationKey(const char *apoType = "EFX");
    static std::string textAt(const RegistryKey &key, const VXWCHAR *name);

    // The store as it was before anybody used it.
    static void clean();

  private:
    WideString id_;
};

// Where a file of the machine lies for the test itself.
std::filesystem::path hostPath(const WideString &path);

// The id of an endpoint for rendering: of the machine's own, or of one made for the purpose; empty if there is none. Taken back by
// the second call (sample_endpoint.cpp).
WideString takeSampleEndpoint();
void giveSampleEndpointBack();

// While this lives an endpoint comes and goes, as one on a bad cable does: a list that names it may be out of date when it is asked
// for its properties. Nothing happens where endpoints are the machine's.
class FlickeringEndpoint {
  public:
    FlickeringEndpoint();
    ~FlickeringEndpoint();
    FlickeringEndpoint(const FlickeringEndpoint &) = delete;
    FlickeringEndpoint &operator=(const FlickeringEndpoint &) = delete;

    static bool possible() noexcept;

  private:
    std::atomic<bool> ended_{false};
    std::thread thread_;
};

}  // namespace vxcomn::testing
