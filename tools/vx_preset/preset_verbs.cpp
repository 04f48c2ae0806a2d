// SPDX-License-Identifier: MIT
#include "tools/vx_preset/preset_verbs.h"

#include <CLI/CLI.hpp>
#include <functional>
#include <iostream>
#include <memory>

#include "platform/text.h"
#include "preset/preset_names.h"
#include "preset/preset_writer.h"
#include "tools/vx_preset/check.h"
#include "tools/vx_preset/compare.h"
#include "tools/vx_preset/failure.h"
#include "tools/vx_preset/package_json.h"
#include "tools/vx_preset/preset_json.h"

namespace vx {
namespace {

using namespace preset;

// What the command line said. One for all verbs: only one of them runs.
struct Options {
    std::string input, other, output;
    std::string ssid, path;
    bool force = false, json = false, log = false;
};

std::string jsonText(const Json &json) {
    return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

Bytes imageFrom(const std::string &file) {
    return imageOf(file, readInput(file));
}

Exit compile(const Options &options) {
    const Bytes content = readInput(options.input);
    const Json json = parseJson(options.input, content);
    const JsonAt document(options.input, json);
    if (document.member("format").text() == "package") {
        document.member("format").fail("\"package\"", "\"preset\"; packages are made by vx preset pack");
    }
    writeOutput(options.output, vxcomn::writePreset(presetFromJson(document)), options.force);
    return Exit::well;
}

Exit dump(const Options &options) {
    const Bytes content = readInput(options.input);
    Json json;
    if (looksLikePackage(content)) {
        json = packageToJson(options.input, readArchive(content));
    } else {
        vxcomn::PresetDocument document;
        if (vxcomn::parsePreset(content, document) != vxcomn::PresetParse::parsed) {
            throw Failure(Exit::input, options.input + ": offset " + std::to_string(content.size() < 4 ? content.size() : 0) +
                                           ": found no whole header, expected a preset or a package; see vx preset check");
        }
        json = presetToJson(document);
    }
    writeOutput(options.output, jsonText(json), options.force);
    return Exit::well;
}

Exit check(const Options &options) {
    const Bytes image = imageFrom(options.input);
    std::optional<OpenRequest> request;
    if (!options.path.empty()) request = OpenRequest{options.ssid, options.path};
    const bool package = looksLikePackage(image);
    if (request && !package) throw Failure(Exit::usage, options.input + ": found a preset, expected a package for --path");
    const CheckReport report = package ? checkPackage(image, request) : checkPreset(image);
    if (options.json) {
        Json json = {{"file", options.input}, {"sound", report.findings.empty()}, {"findings", Json::array()}, {"log", report.log}};
        for (const Finding &finding : report.findings) {
            json["findings"].push_back({{"offset", finding.offset},
                                        {"entry", finding.entry},
                                        {"found", finding.found},
                                        {"expected", finding.expected},
                                        {"loader", finding.loader}});
        }
        std::cout << jsonText(json);
    } else {
        for (const Finding &finding : report.findings) {
            std::cout << options.input << (finding.entry.empty() ? "" : ": " + finding.entry) << ": offset " << finding.offset
                      << ": found " << finding.found << ", expected " << finding.expected << ". A loader: " << finding.loader
                      << ".\n";
        }
        if (options.log) {
            for (const std::string &line : report.log) std::cout << "log: " << line << '\n';
        }
        if (report.findings.empty()) std::cout << options.input << ": sound\n";
    }
    return report.findings.empty() ? Exit::well : Exit::found;
}

Exit diff(const Options &options) {
    const auto differences = differencesOf(options.input, imageFrom(options.input), options.other, imageFrom(options.other));
    if (options.json) {
        Json json = Json::array();
        for (const Difference &difference : differences) {
            Json item = {{"where", difference.where}};
            if (!difference.left.empty()) item["left"] = difference.left;
            if (!difference.right.empty()) item["right"] = difference.right;
            json.push_back(std::move(item));
        }
        std::cout << jsonText(json);
    } else {
        for (const Difference &difference : differences) {
            std::cout << difference.where << ": " << (difference.left.empty() ? "nothing" : difference.left) << " -> "
                      << (difference.right.empty() ? "nothing" : difference.right) << '\n';
        }
    }
    return differences.empty() ? Exit::well : Exit::found;
}

Exit pack(const Options &options) {
    namespace fs = std::filesystem;
    std::error_code error;
    PackageInput package;
    if (fs::is_directory(options.input, error)) {
        package = packageFromFolder(options.input);
    } else {
        const Json json = parseJson(options.input, readInput(options.input));
        package =
            packageFromJson(JsonAt(options.input, json), options.input == "-" ? fs::path() : fs::path(options.input).parent_path());
    }
    const auto archive = vxcomn::writePackage(package.entries);
    if (!archive)
        throw Failure(Exit::input,
                      options.input + ": found more than an archive can hold, expected at most 65,535 entries and 2 GiB");
    fs::path output = options.output;
    if (output.empty() || fs::is_directory(output, error)) {
        if (package.device.empty()) {
            throw Failure(Exit::usage, options.input + ": found no \"device\" that names the package, expected one or -o FILE");
        }
        if (package.device.find_first_of("/:") != std::string::npos || package.device.find('\\') != package.device.rfind('\\')) {
            throw Failure(Exit::input, options.input + ": device: found \"" + package.device + "\", expected BUS\\DEVICE");
        }
        output /= vxcomn::toUtf8(vxcomn::presetPackageName(vxcomn::toWide(package.device)));
    }
    writeOutput(output.string(), *archive, options.force);
    if (output != "-") std::cerr << "vx: wrote " << output.string() << ", " << package.entries.size() << " entries\n";
    return Exit::well;
}

Exit list(const Options &options) {
    const Json json = listing(options.input, imageFrom(options.input));
    std::cout << (options.json ? jsonText(json) : listingText(json));
    return Exit::well;
}

using Verb = std::function<Exit(const Options &)>;

CLI::App *addVerb(CLI::App &group, const std::shared_ptr<Options> &options, int &exitStatus, const char *name, const char *help,
                  Verb verb) {
    CLI::App *const command = group.add_subcommand(name, help);
    command->callback([options, &exitStatus, verb = std::move(verb)] {
        try {
            exitStatus = static_cast<int>(verb(*options));
        } catch (const Failure &failure) {
            std::cerr << "vx: " << failure.what() << '\n';
            exitStatus = static_cast<int>(failure.exit());
        } catch (const std::filesystem::filesystem_error &error) {
            std::cerr << "vx: " << error.path1().string() << ": cannot be read (" << error.code().message()
                      << "); check its rights\n";
            exitStatus = static_cast<int>(Exit::system);
        }
    });
    return command;
}

}  // namespace

void addPresetVerbs(CLI::App &app, int &exitStatus) {
    app.allow_windows_style_options(false);  // a path may begin with a slash
    CLI::App *const group = app.add_subcommand("preset", "Presets and packages from readable JSON and back");
    group->require_subcommand(1);
    const auto options = std::make_shared<Options>();
    const auto add = [&](const char *name, const char *help, Verb verb) {
        return addVerb(*group, options, exitStatus, name, help, std::move(verb));
    };
    const auto output = [&](CLI::App *command, const char *what) {
        command->add_flag("--force", options->force, "Write over an existing file");
        return command->add_option("-o,--output", options->output, what);
    };
    const auto json = [&](CLI::App *command) { command->add_flag("--json", options->json, "One JSON document instead of text"); };

    CLI::App *command = add("compile", "Make a Preset.bin of a JSON document", compile);
    command->add_option("INPUT", options->input, "The document, or - for standard input")->required();
    output(command, "The preset, or - for standard output")->required();

    command = add("dump", "Show a preset or a package as the JSON that makes it", dump);
    command->add_option("INPUT", options->input, "Preset.bin or a package, or - for standard input")->required();
    output(command, "The document; standard output without it");
    command->parse_complete_callback([options] {
        if (options->output.empty()) options->output = "-";
    });

    command = add("check", "Say what a loader would say of a preset or a package, with the byte offset", check);
    command->add_option("INPUT", options->input, "Preset, package or a document of either")->required();
    CLI::Option *const path = command->add_option(
        "--path", options->path, "In a package: look only for this preset, such as 0/EFX/AnyOutput/AnyContent/Preset.bin");
    command->add_option("--ssid", options->ssid, "In a package: the unit's subsystem id, such as SUBSYS_12345678")->needs(path);
    command->add_flag("--log", options->log, "Print the loader's log lines, too");
    json(command);

    command = add("diff", "Compare two presets or two packages; status 1 if they differ", diff);
    command->add_option("LEFT", options->input, "Preset, package or a document of either")->required();
    command->add_option("RIGHT", options->other, "The same kind")->required();
    json(command);

    command = add("pack", "Make a package of a JSON document or a folder", pack);
    command->add_option("INPUT", options->input, "The document, or a folder with package.json and a tree of presets")->required();
    output(command, "The archive, or a folder for it; without it the device's name for it, here");

    command = add("list", "Show what a preset or a package holds", list);
    command->add_option("INPUT", options->input, "Preset, package or a document of either")->required();
    json(command);
}

}  // namespace vx
