// The table's rows, and in place of those that stand for modules what the decoder says of them.
#include "host/report/Layouts.h"

#include <stdexcept>

#include "plugin/HIDReportVeskPlugin.h"

namespace vesk::host {

namespace {

/// What a change in a report does to its two forms; kNotShown where it does nothing.
struct Effect {
  std::string key, label;
  friend bool operator==(const Effect &, const Effect &) = default;
};

/// The strange ones among the fields that the table does not list one by one.
struct KeyNote {
  std::string_view key, label, note;
};
constexpr KeyNote kKeyNotes[] = {
    {kNotShown, "PMGR # Events", "on screen only: consumers know PMGR's as one event, uncounted"},
    {"/OPEN_SHORT_EVENT_SINGLE_OPEN", kNotShown,
     "in the value only: its line on screen has always shown the byte of OPEN_SHORT_EVENT_DOUBLE_OPEN"},
    {"/OPEN_SHORT_EVENT_DOUBLE_OPEN", "OPEN_SHORT_EVENT_DOUBLE_OPEN",
     "on screen the line of OPEN_SHORT_EVENT_SINGLE_OPEN shows it too"},
    {kNotShown, kNotShown, "nobody's"},
};

/// Decodes reports that differ from an all-zero one, and says what that changes.
class Prober {
 public:
  explicit Prober(const KnownReport &report)
      : report_(report), plugin_(HIDReportVeskPlugin::init()), bytes_(report.layoutSize, '\0') {
    if (plugin_ == nullptr) throw std::runtime_error("the plug-in could not be started");
    bytes_[0] = static_cast<char>(report.id);
    zeroValue_ = std::get<ReportValue>(decode(false));
    zeroLines_ = std::get<DisplayLines>(decode(true));
  }

  Effect effectOf(std::uint32_t offset, unsigned mask) {
    bytes_[offset] = static_cast<char>(mask);
    const ReportResult value = decode(false), lines = decode(true);
    bytes_[offset] = '\0';
    return {changedKey(*zeroValue_, std::get<ReportValue>(value), ""),
            changedLabel(zeroLines_, std::get<DisplayLines>(lines))};
  }

 private:
  ReportResult decode(bool strings) {
    padded_.assign(bytes_);
    plugin_->setUseStrings(strings);
    return plugin_->reportToObject(padded_.data(), report_.id, static_cast<std::int32_t>(report_.type),
                                   padded_.length());
  }

  /// The pointer to the innermost node that holds everything that changed.
  static std::string changedKey(const ReportValue &before, const ReportValue &after, const std::string &pointer) {
    if (before == after) return std::string(kNotShown);
    if (!before.is<Dictionary>()) return pointer;
    std::string changed(kNotShown);
    for (const auto &[key, value] : before.as<Dictionary>()) {
      const std::string inner = changedKey(value, after.at(key.text()), pointer + "/" + std::string(key.text()));
      if (inner == kNotShown) continue;
      if (changed != kNotShown) return pointer;
      changed = inner;
    }
    return changed;
  }

  /// What stands before the colon of the first line that changed.
  static std::string changedLabel(const DisplayLines &before, const DisplayLines &after) {
    for (std::size_t i = 0; i < before.size(); ++i) {
      if (before[i] == after[i]) continue;
      const std::string_view label = before[i].substr(0, before[i].find(':'));
      return std::string(label.substr(std::min(label.find_first_not_of(' '), label.size())));
    }
    return std::string(kNotShown);
  }

  const KnownReport &report_;
  std::unique_ptr<HIDReportVeskPlugin> plugin_;
  PaddedReport padded_;
  std::string bytes_;
  std::optional<ReportValue> zeroValue_;
  DisplayLines zeroLines_;
};

std::string noteOf(const Effect &effect) {
  for (const KeyNote &note : kKeyNotes)
    if (note.key == effect.key && note.label == effect.label) return std::string(note.note);
  return {};
}

FieldType typeOf(const Effect &effect, std::uint32_t width) {
  if (effect == Effect{std::string(kNotShown), std::string(kNotShown)}) return FieldType::kUnused;
  return width == 1 ? FieldType::kOption : width == 2 ? FieldType::kU16 : FieldType::kU32;
}

/// The bits of one byte, from which several keys come.
void addBits(std::vector<Field> &fields, Prober &prober, std::uint32_t offset) {
  for (unsigned bit = 0; bit < 8; ++bit) {
    const Effect effect = prober.effectOf(offset, 1u << bit);
    fields.push_back({offset, FieldType::kBit, 1, bit, effect.label, effect.key, {}, noteOf(effect)});
  }
}

/// The fields in place of one row: neighbouring bytes that do the same are one number.
void addModules(std::vector<Field> &fields, const KnownReport &report, const FieldRow &row) {
  constexpr std::string_view kSeveral;  // the pointer to the whole value
  Prober prober(report);
  for (std::uint32_t at = row.offset; at < row.end();) {
    const Effect effect = prober.effectOf(at, 0xFF);
    if (effect.key == kSeveral) {
      addBits(fields, prober, at++);
      continue;
    }
    std::uint32_t end = at + 1;
    while (end < row.end() && prober.effectOf(end, 0xFF) == effect) ++end;
    const FieldType type = typeOf(effect, end - at);
    const std::uint32_t count = (end - at) / elementWidth(type);
    fields.push_back({at, type, count, {}, effect.label, effect.key, {}, noteOf(effect)});
    at = end;
  }
}

}  // namespace

std::vector<Field> layoutOf(const KnownReport &report) {
  std::vector<Field> fields;
  for (const FieldRow &row : report.fields) {
    if (row.type == FieldType::kModules)
      addModules(fields, report, row);
    else
      fields.push_back({row.offset,
                        row.type,
                        row.count,
                        {},
                        std::string(row.label),
                        std::string(row.key),
                        std::string(row.unit),
                        std::string(row.note)});
  }
  return fields;
}

}  // namespace vesk::host
