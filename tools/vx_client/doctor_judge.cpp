// SPDX-License-Identifier: MIT
#include <algorithm>

#include "tools/vx/text.h"
#include "tools/vx_client/doctor.h"

namespace vx::client {

namespace {

constexpr uint32_t kActive = 1, kDisabled = 2, kUnplugged = 8;
constexpr const char *kNothingToDo = "nothing to do";

// One method a line of the report, in its order.
class Judge {
  public:
    explicit Judge(const DoctorFacts &facts)
        : facts_(facts), slot_(facts.slot), name_("\"" + facts.device.name + "\""), options_(" --apo " + facts.slot.apo) {}

    std::vector<Finding> all() {
        endpoint();
        systemSwitch();
        device();
        package();
        ioConfig();
        preset();
        digest();
        engine();
        engineModule();
        parameters();
        userSwitch("power", slot_.power, true);
        userSwitch("bypass", slot_.bypass, false);
        selections();
        clients();
        receiver();
        library();
        apoModule();
        return findings_;
    }

  private:
    void say(const char *what, Verdict verdict, std::string found, std::string meaning, std::string advice = kNothingToDo) {
        findings_.push_back({what, verdict, std::move(found), std::move(meaning), std::move(advice)});
    }
    void good(const char *what, std::string found, std::string meaning) {
        say(what, Verdict::good, std::move(found), std::move(meaning));
    }

    void endpoint() {
        const uint32_t state = facts_.device.state;
        const std::string found = name_ + ", " + stateText(state);
        if (!facts_.openProblem.empty())
            say("endpoint", Verdict::wrong, found, "the library cannot open it: " + facts_.openProblem,
                "see whether it is still there with vx list, and check the rights of the machine folder or registry");
        else if (state == kActive)
            good("endpoint", found, "the system plays through it");
        else
            say("endpoint", Verdict::wrong, found, "the system plays nothing through it",
                state == kDisabled    ? "enable the endpoint in the system's sound settings"
                : state == kUnplugged ? "plug the device in"
                                      : "connect the device, or choose another endpoint with vx list");
    }

    void systemSwitch() {
        if (facts_.device.effectsOff)
            say("system's switch", Verdict::wrong, "the system has the effects of this endpoint switched off",
                "no effect slot runs on it",
                "switch audio enhancements on in the endpoint's properties in the system's sound settings");
        else
            good("system's switch", "effects are allowed", "the system loads effects on this endpoint");
    }

    void device() {
        const std::string id = vxcomn::toUtf8(facts_.device.deviceId), ssid = vxcomn::toUtf8(facts_.device.subsystemId);
        const std::string index =
            facts_.device.index < 0 ? "no endpoint index" : "endpoint index " + std::to_string(facts_.device.index);
        const std::string found =
            (id.empty() ? "no device id" : id) + ", " + (ssid.empty() ? "no subsystem id" : ssid) + ", " + index;
        if (!facts_.device.hasProperties)
            say("device", Verdict::wrong, "the endpoint's properties cannot be read",
                "nothing tells which presets are meant for it",
                "reinstall the driver of the device, or check the rights of its registry key");
        else if (id.empty())
            say("device", Verdict::note, found, "without a device id no package is looked for; loose presets may serve",
                "if the device ought to have presets, reinstall its driver");
        else
            good("device", found, "this names its package, its presets and its store");
    }

    void package() {
        const PresetFacts &preset = slot_.preset;
        if (preset.packageName.empty())
            say("package", Verdict::note, "none looked for, since there is no device id", "loose presets serve",
                "nothing, unless the device ought to have a package");
        else if (!preset.packagePath.empty())
            good("package", preset.packagePath, "the presets come from it");
        else
            say("package", preset.found ? Verdict::note : Verdict::wrong, preset.packageName + " is not in " + preset.packageFolder,
                "loose presets serve, if there are any", "install the device's driver package, or put the file there");
    }

    void ioConfig() {
        const Selection &config = slot_.ioConfig;
        if (config.value.empty())
            say("configuration", Verdict::wrong, "none",
                "the endpoint's form factor cannot be read and nobody forces a configuration",
                "reinstall the driver of the device, or force one with vx ioconfig " + name_ + " NAME" + options_);
        else
            selected("configuration", config, "ioconfig");
    }

    // Who chose a selection, and what of it does not count.
    void selected(const char *what, const Selection &selection, const std::string &verb) {
        if (selection.origin == Origin::forced) {
            say(what, Verdict::note, selection.value + ", forced by client " + selection.setter, "it lasts as long as that client",
                "end that client to get back what the preset says");
            return;
        }
        const std::string origin = selection.origin == Origin::preset   ? "of the preset"
                                   : selection.origin == Origin::stored ? "chosen by an application"
                                                                        : "derived from the endpoint";
        const std::string found = selection.value + ", " + origin;
        if (selection.ignored.empty())
            good(what, found, "nobody forces another");
        else
            say(what, Verdict::note,
                found + "; " + selection.ignored + " was forced by client " + selection.setter + ", who is gone",
                "what a client forces lapses with it", "if it is still wanted: vx " + verb + " " + name_ + " NAME" + options_);
    }

    void preset() {
        const PresetFacts &preset = slot_.preset;
        if (preset.found) {
            good("preset", preset.entry.empty() ? preset.path : preset.entry, "the slot's settings come from it");
            return;
        }
        std::string found =
            preset.path.empty() ? "none looked for, since there is no configuration" : "there is none for " + preset.path;
        if (!preset.log.empty()) found += " (the loader says: " + preset.log.back() + ")";
        say("preset", Verdict::wrong, found, "the slot has no engine and no settings",
            preset.packagePath.empty() ? "put a preset there; vx preset compile makes one"
                                       : "look into the package: vx preset check --log \"" + preset.packagePath + "\" --path " +
                                             (preset.path.empty() ? "PATH" : preset.path));
    }

    void digest() {
        const PresetFacts &preset = slot_.preset;
        if (!preset.found) return;
        if (!preset.sound)
            say("digest", Verdict::wrong, "the preset's header cannot be read", "a loader refuses it",
                "replace the preset; vx preset check tells where it is damaged");
        else if (!preset.digestHolds)
            say("digest", Verdict::note, preset.digest + ", which is not the digest of its bytes",
                "a loader takes it for an identity and does not check it", "make the preset anew with vx preset compile");
        else
            good("digest", preset.digest, textf("format version 0x%X; the digest is that of the bytes", preset.version));
    }

    void engine() {
        if (slot_.engine.value.empty())
            say("engine", Verdict::wrong, "none", "neither the preset nor an application names one",
                "mend the preset first, or force one with vx engine " + name_ + " NAME" + options_);
        else
            selected("engine", slot_.engine, "engine");
    }

    void engineModule() {
        const ModuleFacts &module = facts_.engineModule;
        if (slot_.engine.value.empty()) return;
        if (facts_.engineFile.empty()) {
            say("engine module", Verdict::wrong, "\"" + slot_.engine.value + "\" is no module name", "no host loads it",
                "see who wrote it; vx reset does not touch it, another vx engine does");
            return;
        }
        if (module.path.empty()) {
            std::string looked;
            for (const std::string &place : module.looked) looked += (looked.empty() ? "" : ", ") + place;
            say("engine module", Verdict::wrong, facts_.engineFile + " is not there; looked for " + looked,
                "no host can run the engine", "install the engine's module in one of these places");
        } else if (!module.loads) {
            say("engine module", Verdict::wrong, module.path + " cannot be loaded: " + module.reason, "no host can run the engine",
                "install the engine built for this system");
        } else if (!module.isEngine) {
            say("engine module", Verdict::wrong, module.path + " does not export VXDSPAPI_Initialize", "it is no engine",
                "install the engine's module in its place");
        } else {
            good("engine module", module.path, "it loads and is an engine");
        }
    }

    void parameters() {
        if (slot_.parameterKey.empty()) return;
        const std::string key = "HKLM\\" + slot_.parameterKey;
        if (!slot_.parametersThere || !slot_.storedDigest)
            say("parameters", Verdict::note, key + " is not filled yet",
                "the first program that chooses the slot fills it from the preset",
                "nothing, or vx get " + name_ + options_ + " to have it filled now");
        else if (!slot_.preset.found)
            say("parameters", Verdict::note, "filled from preset " + *slot_.storedDigest, "that preset is not there any more",
                "mend the preset first");
        else if (*slot_.storedDigest != slot_.preset.digest)
            say("parameters", Verdict::wrong, "filled from preset " + *slot_.storedDigest,
                "the preset that is installed is another one",
                "run vx get " + name_ + options_ + ", which brings them into line and keeps the user's settings");
        else
            good("parameters", key, "consistent with the preset");
    }

    void userSwitch(const char *what, const std::optional<bool> &on, bool wanted) {
        if (!on) return;
        const std::string found = *on ? "on" : "off";
        if (*on == wanted)
            good(what, found, wanted ? "the effects are switched on" : "the effects are not bypassed");
        else
            say(what, Verdict::wrong, found, "the sound goes through untouched",
                std::string("vx set ") + name_ + " " + what + (wanted ? " on" : " off") + options_);
    }

    void selections() {
        good("profile", slot_.profile.value, slot_.profile.origin == Origin::stored ? "chosen by an application" : "the usual one");
        good("content", slot_.content.value, slot_.content.origin == Origin::stored ? "chosen by an application" : "the usual one");
    }

    void clients() {
        const auto alive =
            std::count_if(slot_.clients.begin(), slot_.clients.end(), [](const Client &client) { return client.alive; });
        std::string found = std::to_string(alive) + " alive";
        for (const Client &client : slot_.clients)
            if (client.alive) found += " " + client.id;
        const auto gone = static_cast<long>(slot_.clients.size()) - alive;
        if (gone > 0) found += ", " + std::to_string(gone) + " gone";
        good("clients", found,
             gone > 0 ? "the next walk of a receiver removes the marks of those that are gone" : "programs that use the slot");
    }

    void receiver() {
        if (slot_.receiverRuns)
            good("receiver", "one runs", "a program runs the slot's effects and takes changes");
        else
            say("receiver", Verdict::wrong, "none runs", "nobody takes the slot's settings to an engine",
                "play something through the endpoint, or run vx run FILE --follow " + name_ + options_);
    }

    void library() {
        const InstallationFacts &installed = facts_.installation;
        const std::string version = installed.libraryVersion ? versionText(*installed.libraryVersion) : "of no version";
        if (!installed.libraryVersion)
            say("library", Verdict::wrong, installed.libraryPath + ", without a version", "keys cannot be named by it",
                "install the library anew");
        else
            good("library", installed.libraryPath + ", " + version, "this program's library");
        if (!installed.moduleVersion)
            say("installed module", Verdict::note, installed.moduleLooked + " is not there or bears no version",
                "the library's own version names the keys", "install the library there if drivers are to use it");
        else if (installed.moduleVersion != installed.libraryVersion)
            say("installed module", Verdict::note, versionText(*installed.moduleVersion) + " against the library's " + version,
                "the installed one names the keys for both", "update the older one");
        else
            good("installed module", installed.moduleLooked + ", " + versionText(*installed.moduleVersion), "the same version");
    }

    void apoModule() {
        const ModuleFacts &module = facts_.installation.apoModule;
        if (module.path.empty())
            say("effect module", Verdict::note, "VXAPO64U.dll is not there", "applications reach the effects by the store alone",
                "nothing, unless the driver package ought to bring it");
        else if (!module.loads)
            say("effect module", Verdict::note, module.path + " cannot be loaded: " + module.reason,
                "applications reach the effects by the store alone", "reinstall the driver package");
        else
            good("effect module", module.path, "applications bind to it directly, too");
    }

    const DoctorFacts &facts_;
    const SlotFacts &slot_;
    std::string name_;
    std::string options_;
    std::vector<Finding> findings_;
};

}  // namespace

std::vector<Finding> judge(const DoctorFacts &facts) {
    return Judge(facts).all();
}

bool anythingWrong(const std::vector<Finding> &findings) {
    return std::any_of(findings.begin(), findings.end(), [](const Finding &finding) { return finding.verdict == Verdict::wrong; });
}

}  // namespace vx::client
