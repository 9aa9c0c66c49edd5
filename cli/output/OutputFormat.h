#pragma once

#include <optional>
#include <string_view>

namespace zorva::cli {

enum class OutputFormat { Table, Json, Mof, Xml, Dot, Svg };

/// Each of them, in the order in which the help lists them.
inline constexpr OutputFormat kAllFormats[] = {OutputFormat::Table, OutputFormat::Json, OutputFormat::Mof,
                                               OutputFormat::Xml,   OutputFormat::Dot,  OutputFormat::Svg};

/// The option's value for a format: "json".
const char* formatName(OutputFormat format) noexcept;

/// The format of that word; nothing if there is none.
std::optional<OutputFormat> formatNamed(std::string_view word) noexcept;

}  // namespace zorva::cli
