// `kvt doctor`: what surprises people about zones and encodings, as the library finds it here.

#include "base/messages.h"
#include "base/output.h"
#include "base/table.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"
#include "zone/machine_zone.h"
#include "zone/zone_files.h"
#include "zone/zone_folder.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/zone_folder.h>
#include <kvt/encoding/encoding.h>

#include <nlohmann/json.hpp>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <locale.h>
#include <sys/statvfs.h>
#include <system_error>
#include <unistd.h>

namespace host {

namespace {

namespace fs = std::filesystem;
namespace datetime = kvt::ex::datetime;

// Below this a folder is not a place for a backing file of any size.
constexpr std::uint64_t littleSpace = std::uint64_t{1} << 30;

constexpr const char* examples = R"(kvt doctor
kvt doctor --zone-database tzdata)";

constexpr const char* notes =
    R"(Looks at the system's encoding, the zone of this machine, the zone database that
the library reads, and the free space for backing files. What deserves a look is
marked with '!' and explained below the table.

Exit status:
  0  done, and nothing deserves a look
  1  done, and something does
  2  not done)";

struct Finding {
    std::string subject;
    std::string value;
    std::string source;
    std::string warning; ///< empty where all is well
};

std::string variable(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? std::string() : std::string(value);
}

// ---- Encoding

// The variable that decides the locale's characters: the first of these that is set and not empty.
Finding systemEncoding() {
    Finding finding{"system encoding", std::string(kvt::ex::Encoding(kvt::ex::Encoding::System).getName()),
                    "", ""};
    std::string locale;
    for (const char* name : {"LC_ALL", "LC_CTYPE", "LANG"}) {
        locale = variable(name);
        if (!locale.empty()) {
            finding.source = std::string(name) + "=" + printable(locale);
            break;
        }
    }
    if (locale.empty()) {
        finding.source = "none of LC_ALL, LC_CTYPE and LANG is set, which counts as UTF-8";
    } else if (locale == "C" || locale == "POSIX") {
        finding.source += ", which counts as UTF-8";
    } else {
        const locale_t known = ::newlocale(LC_CTYPE_MASK, locale.c_str(), nullptr);
        if (known == nullptr) {
            finding.warning =
                "There is no locale \"" + printable(locale) +
                "\" on this machine, so that it counts as \"C\"; 'locale -a' lists those that there are.";
        } else {
            ::freelocale(known);
        }
    }
    if (finding.warning.empty() &&
        kvt::ex::Encoding(kvt::ex::Encoding::System).evaluate() != kvt::ex::Encoding::Utf8) {
        finding.warning =
            "The system's encoding is not UTF-8: patterns of dates are read in it, and characters "
            "outside it do not survive.";
    }
    return finding;
}

// ---- Zones

Finding zoneOfMachine() {
    const MachineZone zone = machineZone();
    Finding finding{"zone of the machine", zone.name.empty() ? "not found" : printable(zone.name),
                    zone.source, ""};
    if (zone.name.empty()) {
        finding.warning = "\"local\" means nothing without the zone of the machine.";
    }
    return finding;
}

Finding zoneVariable() {
    const char* set = std::getenv("TZ");
    if (set == nullptr) {
        return {"variable TZ", "not set", "", ""};
    }
    return {"variable TZ", "\"" + printable(set) + "\"", "",
            "Most programs obey TZ; the library does not, and always takes the zone of the machine."};
}

Finding databaseFolder(const ZoneFolder& folder) {
    Finding finding{"zone database", printable(folder.path), "", ""};
    switch (folder.origin) {
    case ZoneFolder::Origin::Named:
        finding.source = "--zone-database";
        break;
    case ZoneFolder::Origin::Usual:
        finding.source = "where the library looks by itself";
        break;
    case ZoneFolder::Origin::Cached:
        finding.source = std::string("kept by the command, made from ") + systemZoneRules;
        break;
    }
    std::error_code error;
    if (!fs::is_directory(folder.path, error)) {
        finding.warning =
            "There is no such folder, and without it nothing knows what \"local\" means; 'kvt tzdata' "
            "writes one.";
    }
    return finding;
}

// "# version 2025b" at the head of the distribution's file.
std::string distributionVersion() {
    const std::string head = firstLine(systemZoneRules);
    const std::string lead = "# version ";
    return head.starts_with(lead) ? head.substr(lead.size()) : std::string();
}

// As the library finds it: the first word of "version" or, where that file is not, the newest release in "NEWS".
std::string versionOf(const std::string& folder) {
    std::string word;
    if (std::ifstream file(folder + "/version"); file.is_open()) {
        file >> word;
        return word;
    }
    std::ifstream news(folder + "/NEWS");
    while (news >> word) {
        if (word == "Release") {
            news >> word;
            return word;
        }
    }
    return {};
}

Finding databaseVersion(const std::string& folder) {
    const std::string version = versionOf(folder);
    const std::string distribution = distributionVersion();
    Finding finding{"its version", version.empty() ? "not known" : printable(version),
                    distribution.empty() ? std::string("no ") + systemZoneRules + " to compare it with"
                                         : "the distribution has " + printable(distribution),
                    ""};
    if (!version.empty() && !distribution.empty() && version != distribution) {
        finding.warning =
            "The zone database and the distribution's differ, so that this library and other programs "
            "may not agree about an offset; 'kvt tzdata' writes the distribution's.";
    }
    return finding;
}

// What the library finds where it looks the folder over, before it loads it.
Finding databaseFiles(const std::string& folder) {
    Finding finding{"its files", "good", "as the library reads them", ""};
    if (const auto fault = datetime::zoneFolderFault(folder)) {
        const std::string line = fault->line == 0 ? "" : ", line " + std::to_string(fault->line);
        finding.value = fault->file.empty() ? "none" : printable(fault->file) + line;
        finding.warning = fault->file.empty() ? "" : printable(folder + "/" + fault->file) + line + ": ";
        finding.warning += printable(fault->reason) + ". The library takes nothing from such a folder.";
    }
    return finding;
}

Finding localTime() {
    const datetime::TextResult now = datetime::now(datetime::ZoneMode::LocalWithOffset);
    const auto& message = std::get<2>(now);
    if (!message) {
        return {"local time", std::get<1>(now).toStdString(), "as the library reads the clock", ""};
    }
    std::vector<std::string> parameters;
    for (const kvt::ex::UString<0>& parameter : message->parameters) {
        parameters.push_back(printable(parameter.toStdString()));
    }
    return {"local time", "not known", "",
            describe(message->messageNumber, parameters) + " (" + std::to_string(message->messageNumber) +
                ")"};
}

// ---- Space

std::string inGibibytes(std::uint64_t bytes) {
    const std::uint64_t tenths = bytes / (littleSpace / 10);
    return std::to_string(tenths / 10) + "." + std::to_string(tenths % 10) + " GiB free";
}

Finding freeSpace(const std::string& folder, const std::string& source) {
    Finding finding{"space in " + printable(folder), "not known", source, ""};
    struct statvfs space {};
    if (::statvfs(folder.c_str(), &space) != 0) {
        finding.warning =
            std::string("The system cannot tell: ") + std::generic_category().message(errno) + ".";
        return finding;
    }
    const std::uint64_t free = static_cast<std::uint64_t>(space.f_bavail) * space.f_frsize;
    finding.value = inGibibytes(free);
    if (free < littleSpace) {
        finding.warning = "There is little room for backing files.";
    }
    return finding;
}

Finding temporarySpace() {
    const std::string folder = variable("TMPDIR");
    return folder.empty() ? freeSpace("/tmp", "for temporary files, as TMPDIR is not set")
                          : freeSpace(folder, "for temporary files, by TMPDIR");
}

// ---- The report

std::string asTable(const std::vector<Finding>& findings) {
    std::vector<std::vector<std::string>> rows;
    std::string warnings;
    for (const Finding& finding : findings) {
        const bool isFine = finding.warning.empty();
        rows.push_back({isFine ? " " : "!", finding.subject, finding.value, finding.source});
        warnings += isFine ? std::string() : "! " + finding.subject + ": " + finding.warning + "\n";
    }
    return formatTable({Align::Left, Align::Left, Align::Left, Align::Left}, rows) + warnings;
}

std::string asJson(const std::vector<Finding>& findings) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const Finding& finding : findings) {
        nlohmann::ordered_json object;
        object["subject"] = finding.subject;
        object["value"] = finding.value;
        object["source"] = finding.source;
        object["warning"] = finding.warning.empty() ? nullptr : nlohmann::ordered_json(finding.warning);
        list.push_back(std::move(object));
    }
    return list.dump(2) + "\n";
}

class DoctorCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option("--zone-database", folder_, "DIR",
                      "Folder with the zone database; without this option ~/Downloads/tzdata, or else one "
                      "that the command keeps in the cache");
        syntax.flag("--json", json_, "Print a JSON array of objects");
        declareOutput(syntax, output_);
    }

    int run(Diagnostics&) override {
        const ZoneFolder zones = zoneFolder(folder_);
        const std::string& folder = zones.path;
        datetime::setInstallPathWrapper(folder);
        const std::vector<Finding> findings = {
            systemEncoding(),      zoneOfMachine(),         zoneVariable(),
            databaseFolder(zones), databaseVersion(folder), databaseFiles(folder),
            localTime(),           temporarySpace(),        freeSpace(".", "for files in this folder"),
        };
        print(json_ ? asJson(findings) : asTable(findings), output_);
        for (const Finding& finding : findings) {
            if (!finding.warning.empty()) {
                return DoneWithLosses;
            }
        }
        return Done;
    }

private:
    std::string folder_;
    std::string output_;
    bool json_ = false;
};

} // namespace

CommandInfo doctorCommand() {
    return {"doctor", "Report what surprises people about zones and encodings", examples, notes,
            std::make_unique<DoctorCommand>()};
}

} // namespace host
