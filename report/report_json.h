#pragma once

#include <functional>
#include <string>

#include "report/report_cards.h"

namespace vexel_yaml {

/// The version of the format; a field that comes in addition doesn't change it.
inline constexpr int kReportJsonVersion = 1;

/// What settles a row's conflict, as record files name the place; of bytes that are not UTF-8, escapes. Empty
/// where it can't be settled.
std::string ChoicePath(const ReportRow& row);

/// One card as JSON text, which is valid whatever the values hold.
std::string CardJson(const ReportCard& card, VersionNames& names);

/// The whole report as JSON text.
std::string ReportJson(const MergedFiles& files, VersionNames& names, const std::string& title);

}  // namespace vexel_yaml
