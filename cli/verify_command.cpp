// verify: what an archive holds, what it does not, and whether it is as it was made.

#include <memory>
#include <system_error>

#include "cli/archive_verdict.h"
#include "cli/printable_text.h"
#include "cli/tool_context.h"
#include "platform/json_text.h"
#include "platform/size_text.h"

namespace zal {
namespace {

/// Of each list on the screen, so that all of it is one screen.
constexpr std::size_t kMostFindings = 12;

using Findings = std::vector<ArchiveVerdict::Finding>;

ExitCode codeOf(const ArchiveVerdict& verdict) {
  if (!verdict.damaged.empty()) return ExitCode::damaged;
  return verdict.missing.empty() ? ExitCode::done : ExitCode::incomplete;
}

const char* wordOf(ExitCode code) {
  if (code == ExitCode::damaged) return "damaged";
  return code == ExitCode::incomplete ? "incomplete" : "whole";
}

std::string findingsJson(const Findings& findings) {
  std::vector<std::string> rows;
  for (const auto& [what, why] : findings)
    rows.push_back(JsonObject().add("what", what).add("why", why).text());
  return jsonArray(rows);
}

std::string verdictJson(const std::string& path, const ArchiveVerdict& verdict) {
  std::vector<std::string> skipped;
  for (const std::string& step : verdict.skipped) skipped.push_back(jsonString(step));
  JsonObject object;
  object.add("result", wordOf(codeOf(verdict)))
      .add("archive", path)
      .add("files", std::uint64_t{verdict.files})
      .add("bytes", verdict.bytes)
      .add("manifest", verdict.hasManifest);
  if (verdict.hasManifest) {
    object.add("service", verdict.service)
        .add("flags", verdict.flags)
        .add("began", verdict.began)
        .add("archived", verdict.archived);
  }
  return object.addJson("missing", findingsJson(verdict.missing))
      .addJson("skipped", jsonArray(skipped))
      .addJson("damaged", findingsJson(verdict.damaged))
      .text();
}

void printFindings(std::ostream& out, const char* heading, const Findings& findings) {
  if (findings.empty()) return;
  out << "  " << heading << ":\n";
  for (std::size_t i = 0; i < std::min(findings.size(), kMostFindings); ++i) {
    const auto& [what, why] = findings[i];
    out << "    " << printableLine(what) << (what.empty() ? "" : ": ") << printableLine(why) << "\n";
  }
  if (findings.size() > kMostFindings) {
    out << "    and " << findings.size() - kMostFindings << " more; --json has all\n";
  }
}

void printVerdict(std::ostream& out, const std::string& path, const ArchiveVerdict& verdict) {
  out << printableLine(path) << ": " << wordOf(codeOf(verdict)) << "\n";
  if (verdict.hasManifest && !verdict.began.empty()) {
    out << "  " << printableLine(verdict.service) << ", flags " << printableLine(verdict.flags) << ", from "
        << printableLine(verdict.began) << " to " << printableLine(verdict.archived) << "\n";
  }
  out << "  there: " << verdict.files << (verdict.files == 1 ? " file, " : " files, ")
      << sizeText(verdict.bytes) << "\n";
  if (!verdict.hasManifest) out << "  It has no manifest: only its checksums could be looked at.\n";
  printFindings(out, "damaged", verdict.damaged);
  printFindings(out, "missing", verdict.missing);
  if (verdict.skipped.empty()) return;
  out << "  not asked for:";
  const char* separator = " ";
  for (const std::string& step : verdict.skipped) {
    out << separator << printableLine(step);
    separator = ", ";
  }
  out << "\n";
}

ExitCode verify(ToolContext& tool, const std::string& archive) {
  const std::string path = tool.host.absolutePath(archive);
  ArchiveInspection inspection;
  if (const std::error_code error = tool.host.archives().inspect(path, inspection)) {
    const bool isAbsent = error == std::errc::no_such_file_or_directory;
    return tool.fail(isAbsent ? ExitCode::notFound : ExitCode::fileTrouble, path + ": " + error.message(),
                     "");
  }
  if (!inspection.isArchive) return tool.fail(ExitCode::fileTrouble, path + " is no archive", "");
  const ArchiveVerdict verdict = judgeArchive(inspection);
  if (tool.options.json) {
    tool.out << verdictJson(path, verdict) << "\n";
  } else {
    printVerdict(tool.out, path, verdict);
  }
  return codeOf(verdict);
}

}  // namespace

void addVerifyCommand(CLI::App& app, ToolContext& tool) {
  const auto archive = std::make_shared<std::string>();
  CLI::App* const command = app.add_subcommand(
      "verify", "Check an archive: what is there, what is missing and why, what is damaged");
  command->group("Archives");
  command->footer(
      "Reads every file in the archive, holds it against its checksum and against the manifest, and writes\n"
      "nothing. Exit codes: 0 whole, 6 something is missing, 7 damaged.");
  command->add_option("ARCHIVE", *archive, "The archive's path")->required();
  tool.onCommand(*command, [&tool, archive] { return verify(tool, *archive); });
}

}  // namespace zal
