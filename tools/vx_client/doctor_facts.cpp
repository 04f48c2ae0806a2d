// SPDX-License-Identifier: MIT
#include <VXDSPAPI.h>

#include <filesystem>

#include "platform/file_version.h"
#include "preset/package_discovery.h"
#include "tools/vx/engine_search.h"
#include "tools/vx/failure.h"
#include "tools/vx/system.h"
#include "tools/vx/text.h"
#include "tools/vx_client/doctor.h"
#include "tools/vx_client/session.h"

namespace vx::client {
namespace fs = std::filesystem;

namespace {

ModuleFacts findModule(const std::string &file) {
    ModuleFacts facts;
    for (const fs::path &place : modulePlaces(file)) {
        std::error_code ignored;
        facts.looked.push_back(utf8Of(place));
        if (!fs::exists(place, ignored)) continue;
        const ModuleProbe probe = probeModule(place);
        facts.path = utf8Of(place);
        facts.loads = probe.loads;
        facts.isEngine = probe.hasInitialize;
        facts.reason = probe.reason;
        return facts;
    }
    return facts;
}

// Without choosing a slot, which would fill its store.
std::string problemOfOpening(const Device &device) {
    try {
        const Session session(device, "", SessionKind::observer);
        return {};
    } catch (const Failure &failure) {
        return failure.what();
    }
}

}  // namespace

InstallationFacts readInstallation() {
    InstallationFacts facts;
    const fs::path library = fileOfCode(reinterpret_cast<const void *>(VXDSPAPI_GetProcessFuncAddress()));
    facts.libraryPath = utf8Of(library);
    facts.libraryVersion = vxcomn::fileVersion(vxcomn::toWide(facts.libraryPath));
    const vxcomn::WideString installed = vxcomn::packageFolder(vxcomn::systemFacts()) + VX_TEXT("\\VXCOMN64U.dll");
    facts.moduleLooked = vxcomn::toUtf8(installed);
    facts.moduleVersion = vxcomn::fileVersion(installed);
    facts.apoModule = findModule("VXAPO64U.dll");
    return facts;
}

DoctorFacts gatherFacts(const Device &device, const std::string &apo, const InstallationFacts &installation) {
    DoctorFacts facts;
    facts.device = device;
    facts.installation = installation;
    facts.slot = readSlot(device, apo, installation.keyVersion());
    const std::string &engine = facts.slot.engine.value;
    // A name from the store is data, never a path.
    if (!engine.empty() && engine.find_first_of("/\\:") == std::string::npos) {
        facts.engineFile = engineModuleName(engine, std::nullopt, 0);
        facts.engineModule = findModule(facts.engineFile);
    }
    facts.openProblem = problemOfOpening(device);
    return facts;
}

}  // namespace vx::client
