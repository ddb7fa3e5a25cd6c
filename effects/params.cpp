#include "effects/params.h"

#include <charconv>
#include <cstdio>

namespace quillane {
namespace {

std::string Range(const ParamSpec& p) {
  return std::to_string(p.minimum) + ".." + std::to_string(p.maximum);
}

std::string OptionWords(const ParamSpec& p) {
  std::string words;
  for (const ParamOption& o : p.options) words += (words.empty() ? "" : "|") + o.word;
  return words;
}

std::vector<std::string> SplitCommas(const std::string& text) {
  std::vector<std::string> parts;
  std::size_t start = 0;
  for (;;) {
    const std::size_t comma = text.find(',', start);
    parts.push_back(text.substr(start, comma - start));
    if (comma == std::string::npos) return parts;
    start = comma + 1;
  }
}

std::string Hex6(std::int64_t colorRef) {
  // 0x00BBGGRR shown the way people write colours: RRGGBB.
  const auto c = static_cast<std::uint32_t>(colorRef);
  char text[8];
  std::snprintf(text, sizeof text, "%02x%02x%02x", c & 0xFF, (c >> 8) & 0xFF, (c >> 16) & 0xFF);
  return text;
}

std::optional<std::int64_t> ParseHexColour(std::string text) {
  if (!text.empty() && text.front() == '#') text.erase(0, 1);
  if (text.size() != 6) return std::nullopt;
  std::uint32_t rgb = 0;
  const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), rgb, 16);
  if (ec != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return ((rgb >> 16) & 0xFF) | (rgb & 0xFF00) | ((rgb & 0xFF) << 16);
}

}  // namespace

void EffectParams::Merge(const EffectParams& other) {
  for (const auto& [name, values] : other.values_) values_[name] = values;
}

EffectParams::Values DefaultValue(const ParamSpec& param) {
  if (param.kind == ParamKind::Cells || param.kind == ParamKind::Clicks) return param.defaultList;
  return {param.defaultValue};
}

std::int64_t ParseWholeNumber(const std::string& text) {
  std::string_view digits = text;
  if (!digits.empty() && digits.front() == '+') digits.remove_prefix(1);
  std::int32_t value = 0;
  const char* end = digits.data() + digits.size();
  const auto [ptr, ec] = std::from_chars(digits.data(), end, value);
  if (digits.empty() || digits.front() == '+' || (digits != text && digits.front() == '-') ||
      ec != std::errc() || ptr != end)
    throw ParamError("'" + text + "' is not a valid integer value");
  return value;
}

std::optional<int> FindOption(const ParamSpec& param, const std::string& word) {
  for (std::size_t i = 0; i < param.options.size(); ++i)
    if (param.options[i].word == word) return static_cast<int>(i + 1);
  try {
    const std::int64_t n = ParseWholeNumber(word);
    if (n >= 1 && n <= static_cast<std::int64_t>(param.options.size())) return static_cast<int>(n);
  } catch (const ParamError&) {
  }
  return std::nullopt;
}

EffectParams::Values ParseParamText(const ParamSpec& param, const std::string& text) {
  const std::string option = "--" + param.name;
  auto fail = [&](const std::string& takes) -> EffectParams::Values {
    throw ParamError(option + " must be " + takes + ", not '" + text + "'");
  };
  auto number = [&](const std::string& piece) -> std::optional<std::int64_t> {
    try {
      const std::int64_t n = ParseWholeNumber(piece);
      if (n >= param.minimum && n <= param.maximum) return n;
    } catch (const ParamError&) {
    }
    return std::nullopt;
  };
  switch (param.kind) {
    case ParamKind::Slider:
    case ParamKind::Switch:
    case ParamKind::Hidden:
      if (const auto n = number(text)) return {*n};
      return fail("an integer from " + std::to_string(param.minimum) + " to " +
                  std::to_string(param.maximum));
    case ParamKind::Cells: {
      const std::vector<std::string> pieces = SplitCommas(text);
      if (pieces.size() != param.cells.size())
        return fail(std::to_string(param.cells.size()) + " integers separated by commas");
      EffectParams::Values values;
      for (const std::string& piece : pieces) values.push_back(ParseWholeNumber(piece));
      return values;
    }
    case ParamKind::Choice:
      if (const auto n = FindOption(param, text)) return {*n};
      return fail("one of " + OptionWords(param));
    case ParamKind::Clicks: {
      EffectParams::Values values;
      if (text.empty()) return values;
      for (const std::string& piece : SplitCommas(text)) {
        const auto n = FindOption(param, piece);
        if (!n) return fail("a list of " + OptionWords(param) + " separated by commas");
        values.push_back(*n);
      }
      return values;
    }
    case ParamKind::Colour:
      if (const auto c = ParseHexColour(text)) return {*c};
      return fail("a colour written RRGGBB in hexadecimal");
  }
  return fail("a value");
}

std::string DescribeParam(const ParamSpec& param) {
  switch (param.kind) {
    case ParamKind::Slider:
      return "N  " + Range(param) + ", default " + std::to_string(param.defaultValue);
    case ParamKind::Switch:
      return "0|1  default " + std::to_string(param.defaultValue) + " (0 off, 1 on)";
    case ParamKind::Hidden:
      return "default " + std::to_string(param.defaultValue);
    case ParamKind::Cells: {
      std::string defaults;
      for (std::int64_t v : param.defaultList) {
        if (!defaults.empty()) defaults += ',';
        defaults += std::to_string(v);
      }
      return "N,N,...  " + std::to_string(param.cells.size()) + " integers, default " + defaults;
    }
    case ParamKind::Choice: {
      const auto index = static_cast<std::size_t>(param.defaultValue - 1);
      const std::string fallback =
          index < param.options.size() ? param.options[index].word : std::string("?");
      return OptionWords(param) + "  (or 1.." + std::to_string(param.options.size()) +
             "), default " + fallback;
    }
    case ParamKind::Clicks:
      return "WORD,...  any of " + OptionWords(param) + " in order, default none";
    case ParamKind::Colour:
      return "RRGGBB  hexadecimal colour, default " + Hex6(param.defaultValue);
  }
  return {};
}

}  // namespace quillane
