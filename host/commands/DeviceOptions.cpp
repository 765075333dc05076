// Device options.
#include "host/commands/DeviceOptions.h"

#include <cmath>

#include "host/report/KnownReports.h"

namespace vesk::host {

void DeviceOptions::addDevice(CLI::App &command) {
  command
      .add_option("--device", device,
                  "a node's path, vendor:product or a serial number; not needed where one device speaks our reports")
      ->type_name("DEVICE")
      ->group("Device");
}

CLI::Validator secondsBetween(double least, double most) {
  const auto range = CLI::Range(least, most);
  return {[range](std::string &text) {
            double seconds = 0;
            if (CLI::detail::lexical_cast(text, seconds) && std::isnan(seconds))
              return text + " is no number of seconds";
            return range(text);
          },
          range.get_description()};
}

void DeviceOptions::addTimeout(CLI::App &command) {
  command
      .add_option("--timeout", timeoutSeconds, "how long a report may take to come; the kernel gives up after 5 itself")
      ->check(secondsBetween(0.05, 60.0))
      ->type_name("SECONDS")
      ->capture_default_str()
      ->group("Device");
}

std::vector<std::uint32_t> featureIds(const std::vector<std::string> &names) {
  std::vector<std::uint32_t> ids;
  for (const std::string &name : names) {
    const KnownReport *known = findReport(name);
    if (name == "all") {
      for (const KnownReport &report : knownReports())
        if (report.type == ReportType::kFeature) ids.push_back(report.id);
    } else if (known == nullptr) {
      throw CLI::ValidationError(name, "no report is called so; 'vesk-report reports' lists them");
    } else if (known->type != ReportType::kFeature) {
      throw CLI::ValidationError(name, "an input report, which cannot be asked for; 'vesk-report watch' shows it");
    } else {
      ids.push_back(known->id);
    }
  }
  return ids;
}

}  // namespace vesk::host
