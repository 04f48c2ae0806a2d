// SPDX-License-Identifier: MIT
//
// vx doctor in three steps: gathering what is so (doctor_facts.cpp), judging it (doctor_judge.cpp), printing it (doctor_print.cpp).
// "Is my effect active on this endpoint, and if not, why?"
#pragma once

#include <cstdint>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <vector>

#include "tools/vx/console.h"
#include "tools/vx_client/device_list.h"
#include "tools/vx_client/slot_facts.h"

namespace vx::client {

struct ModuleFacts {
    std::string path;  // empty: not found
    bool loads = false;
    bool isEngine = false;
    std::string reason;  // why it does not load
    std::vector<std::string> looked;
};

// What is installed, the same for all endpoints.
struct InstallationFacts {
    std::string libraryPath;
    std::optional<uint64_t> libraryVersion;
    std::string moduleLooked;               // the installed copy whose version names the keys
    std::optional<uint64_t> moduleVersion;  // nothing: it is not there
    ModuleFacts apoModule;                  // VXAPO64U.dll

    // As the library takes it: the installed module's, or its own.
    uint64_t keyVersion() const { return moduleVersion.value_or(libraryVersion.value_or(0)); }
};

struct DoctorFacts {
    Device device;
    InstallationFacts installation;
    SlotFacts slot;
    std::string engineFile;  // the module's name that the engine asks for
    ModuleFacts engineModule;
    std::string openProblem;  // what the control API says to opening the endpoint; empty: it opens
};

InstallationFacts readInstallation();
DoctorFacts gatherFacts(const Device &device, const std::string &apo, const InstallationFacts &installation);

// `note` is worth knowing and nothing is wrong; `wrong` keeps the effect from being heard, or may.
enum class Verdict : uint8_t { good, note, wrong };

struct Finding {
    std::string what;
    Verdict verdict;
    std::string found;
    std::string meaning;
    std::string advice;
};

std::vector<Finding> judge(const DoctorFacts &facts);
bool anythingWrong(const std::vector<Finding> &findings);

std::string doctorText(const DoctorFacts &facts, const std::vector<Finding> &findings, const Style &style);
nlohmann::ordered_json doctorJson(const DoctorFacts &facts, const std::vector<Finding> &findings);

// "2.1.0.0"
std::string versionText(uint64_t version);

}  // namespace vx::client
