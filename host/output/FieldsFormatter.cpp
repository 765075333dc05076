// The layout's rows with a report's bytes in them.
#include "host/output/FieldsFormatter.h"

#include <map>

#include "host/output/JsonText.h"
#include "host/output/JsonValue.h"
#include "host/output/ReportHeading.h"
#include "host/report/Layouts.h"
#include "values/PrintfFormat.h"

namespace vesk::host {

namespace {

constexpr std::uint32_t kBytesARow = 16;

/// The node that a JSON Pointer names, or null.
const ReportValue *nodeAt(const ReportValue &root, std::string_view pointer) {
  const ReportValue *node = &root;
  while (node != nullptr && !pointer.empty()) {
    pointer.remove_prefix(1);
    const std::size_t end = std::min(pointer.find('/'), pointer.size());
    node = node->find(pointer.substr(0, end));
    pointer.remove_prefix(end);
  }
  return node;
}

std::string asJson(const ReportValue &value) {
  OutputBuffer out;
  appendJsonValue(out, value);
  return std::string(out.text());
}

/// Bytes as digits; those that the report lacks as "--".
std::string hexText(std::string_view bytes, std::uint32_t offset, std::uint32_t count) {
  std::string text;
  for (std::uint32_t at = offset; at < offset + count; ++at) {
    if (!text.empty()) text += ' ';
    text += at < bytes.size() ? formatted<"%02x">(unsigned{static_cast<unsigned char>(bytes[at])}) : "--";
  }
  return text;
}

/// The number of a field that the value leaves out.
std::uint64_t numberAt(std::string_view bytes, const Field &field) {
  std::uint64_t number = 0;
  for (std::uint32_t i = field.width(); i-- > 0;)
    number = number << 8 | (field.offset + i < bytes.size() ? static_cast<unsigned char>(bytes[field.offset + i]) : 0u);
  return number;
}

bool isArray(const Field &field) {
  return field.count > 1 && elementWidth(field.type) > 1;
}

class FieldsFormatter : public Formatter {
 public:
  bool wantsValue() const override { return true; }
  bool isStateless() const override { return false; }

  void report(OutputBuffer &out, const SourceReport &report, const Decoded &decoded, bool first,
              std::vector<Finding> &) override {
    if (!first) out.append('\n');
    appendHeading(out, report);
    std::uint32_t end = 0;
    if (const KnownReport *known = findReport(report.id)) {
      for (const Field &field : fieldsOf(*known)) {
        const std::uint32_t width = widthIn(report, field);
        appendField(out, report.bytes, decoded, field, width);
        end = std::max(end, field.offset + width);
      }
    }
    appendRest(out, report.bytes, end);
  }

 private:
  /// Asking the decoder takes a while, so it is asked once a report ID.
  const std::vector<Field> &fieldsOf(const KnownReport &report) {
    auto [entry, isNew] = fields_.try_emplace(report.id);
    if (isNew) entry->second = layoutOf(report);
    return entry->second;
  }

  /// A text has all that is behind the ID.
  static std::uint32_t widthIn(const SourceReport &report, const Field &field) {
    const auto size = static_cast<std::uint32_t>(report.bytes.size());
    return field.type == FieldType::kString && size > field.offset ? size - field.offset : field.width();
  }

  static void appendField(OutputBuffer &out, std::string_view bytes, const Decoded &decoded, const Field &field,
                          std::uint32_t width) {
    const bool isCount = field.key == kNotShown && field.type == FieldType::kU16;
    const std::optional<ReportValue> own = isCount ? std::optional(ReportValue(numberAt(bytes, field))) : std::nullopt;
    const ReportValue *value = own ? &*own : !decoded.value ? nullptr : nodeAt(*decoded.value, field.key);
    for (std::uint32_t at = 0; at < width; at += kBytesARow) {
      const std::uint32_t count = std::min(kBytesARow, width - at);
      appendRow(out, field.offset + at, hexText(bytes, field.offset + at, count), nameOf(field, at),
                valueText(value, field, at, count));
    }
  }

  static std::string nameOf(const Field &field, std::uint32_t at) {
    std::string name = field.key.starts_with('/') ? field.key.substr(1) : field.label;  // keys are unique, labels not
    if (name.empty()) name = fieldTypeName(field.type);
    if (name == kNotShown) name = fieldTypeName(FieldType::kUnused);
    if (isArray(field)) name += " " + std::to_string(at / elementWidth(field.type));
    if (field.bit) name = "bit " + std::to_string(*field.bit) + " " + name;
    return name;
  }

  static std::string valueText(const ReportValue *value, const Field &field, std::uint32_t at, std::uint32_t count) {
    std::string text;
    if (value == nullptr) return text;
    if (isArray(field)) {
      const std::uint32_t width = elementWidth(field.type);
      for (std::uint32_t i = at / width; i < (at + count) / width; ++i)
        text += (text.empty() ? "" : " ") + asJson(value->at(std::size_t{i}));
    } else if (at == 0) {
      text = asJson(*value);
      if (!field.unit.empty()) text += " " + field.unit;
    }
    return text;
  }

  static void appendRest(OutputBuffer &out, std::string_view bytes, std::uint32_t end) {
    for (std::uint32_t at = std::max(end, 1u); at < bytes.size(); at += kBytesARow) {
      const auto count = std::min(kBytesARow, static_cast<std::uint32_t>(bytes.size()) - at);
      appendRow(out, at, hexText(bytes, at, count), "not decoded", "");
    }
  }

  static void appendRow(OutputBuffer &out, std::uint32_t offset, std::string_view hex, std::string_view name,
                        std::string_view value) {
    constexpr std::size_t kHexColumn = 24, kNameColumn = 24;
    std::string row = formatted<"%6u  ">(offset);
    row += hex;
    row.append(hex.size() < kHexColumn ? kHexColumn - hex.size() : 0, ' ');
    row += "  ";
    row += name;
    if (!value.empty()) {
      row.append(name.size() < kNameColumn ? kNameColumn - name.size() : 0, ' ');
      row += "  ";
      row += value;
    }
    out.append(row);
    out.append('\n');
  }

  std::map<std::uint8_t, std::vector<Field>> fields_;
};

}  // namespace

std::unique_ptr<Formatter> makeFieldsFormatter() {
  return std::make_unique<FieldsFormatter>();
}

}  // namespace vesk::host
