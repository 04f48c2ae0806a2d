// SPDX-License-Identifier: MIT
#include "tools/vx/text.h"
#include "tools/vx_client/doctor.h"
#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

namespace {

const char *verdictName(Verdict verdict) {
    return verdict == Verdict::good ? "ok" : verdict == Verdict::note ? "note" : "wrong";
}

std::string marked(Verdict verdict, const Style &style) {
    const std::string text = textf("%-5s", verdictName(verdict));
    return verdict == Verdict::good ? style.good(text) : style.warning(text);
}

nlohmann::ordered_json moduleJson(const ModuleFacts &module) {
    nlohmann::ordered_json json = {{"path", textOrNull(module.path)}, {"loads", module.loads}, {"isEngine", module.isEngine}};
    if (module.path.empty()) json["looked"] = module.looked;
    if (!module.reason.empty()) json["reason"] = module.reason;
    return json;
}

nlohmann::ordered_json versionJson(const std::optional<uint64_t> &version) {
    return version ? nlohmann::ordered_json(versionText(*version)) : nlohmann::ordered_json();
}

}  // namespace

std::string versionText(uint64_t version) {
    return textf("%u.%u.%u.%u", static_cast<unsigned>(version >> 48), static_cast<unsigned>(version >> 32 & 0xFFFF),
                 static_cast<unsigned>(version >> 16 & 0xFFFF), static_cast<unsigned>(version & 0xFFFF));
}

std::string doctorText(const DoctorFacts &facts, const std::vector<Finding> &findings, const Style &style) {
    size_t wrong = 0;
    for (const Finding &finding : findings) wrong += finding.verdict == Verdict::wrong ? 1 : 0;
    const std::string answer = wrong == 0 ? "the effect is active"
                                          : "the effect is not active, or may not be: " + std::to_string(wrong) +
                                                (wrong == 1 ? " thing is wrong" : " things are wrong");
    std::string text = style.bold(facts.device.name + ", " + facts.slot.apo + ": " + answer) + "\n";
    for (const Finding &finding : findings) {
        text += "  " + marked(finding.verdict, style) + textf(" %-17s", finding.what.c_str()) + printable(finding.found) + "\n";
        text += std::string(25, ' ') + printable(finding.meaning) + "; " + (finding.verdict == Verdict::good ? "" : "do: ") +
                printable(finding.advice) + "\n";
    }
    return text;
}

nlohmann::ordered_json doctorJson(const DoctorFacts &facts, const std::vector<Finding> &findings) {
    const InstallationFacts &installed = facts.installation;
    nlohmann::ordered_json json = {{"endpoint", deviceJson(facts.device)},
                                   {"apo", facts.slot.apo},
                                   {"active", !anythingWrong(findings)},
                                   {"findings", nlohmann::ordered_json::array()}};
    for (const Finding &finding : findings)
        json["findings"].push_back({{"what", finding.what},
                                    {"verdict", verdictName(finding.verdict)},
                                    {"found", finding.found},
                                    {"meaning", finding.meaning},
                                    {"do", finding.advice}});
    json["slot"] = slotJson(facts.slot);
    json["engineModule"] = moduleJson(facts.engineModule);
    json["apoModule"] = moduleJson(installed.apoModule);
    json["library"] = {{"path", installed.libraryPath}, {"version", versionJson(installed.libraryVersion)}};
    json["installedModule"] = {{"path", installed.moduleLooked}, {"version", versionJson(installed.moduleVersion)}};
    return json;
}

}  // namespace vx::client
