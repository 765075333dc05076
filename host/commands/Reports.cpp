// `reports`: the reports that are known.
#include <cstdio>

#include "host/commands/Command.h"
#include "host/output/OutputFile.h"
#include "host/report/KnownReports.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

std::string padded(std::string_view text, std::size_t width) {
  std::string cell(text);
  cell.resize(std::max(width, cell.size()), ' ');
  return cell;
}

std::string sizeText(const KnownReport &report) {
  return report.length == KnownReport::Length::kText ? "text" : std::to_string(report.layoutSize);
}

void listReports() {
  std::string table = "ID    type     bytes  name                    decoder\n";
  for (const KnownReport &report : knownReports()) {
    const std::string size = sizeText(report);
    table += formatted<"0x%02X">(std::uint32_t{report.id}) + "  " + padded(typeName(report.type), 7) + "  " +
             std::string(5 - size.size(), ' ') + size + "  " + padded(report.name, 22) + "  " +
             std::string(report.decoder) + "\n";
  }
  OutputFile("-").write(table);
}

}  // namespace

void addReports(CLI::App &app, CommandContext &) {
  app.add_subcommand("reports", "List the reports that are known")->callback(listReports);
}

}  // namespace vesk::host
