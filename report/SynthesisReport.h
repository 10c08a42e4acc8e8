#pragma once

#include "ReportData.h"

// Readers of the synthesis report (<design>.snx: the macro statistics of the
// "Advanced HDL Synthesis Report") and the map report (<design>_map.ktp: the
// target device, package and speed), and the macro statistics cell of the
// Device Usage Statistics table.
class CrvC_SynthesisReport
{
public:
    // Fills targetDevice, targetPackage, targetSpeed; always true.
    static bool readTargetInfo(const QString &path, CrvC_ReportData &data);
    // Adds the macro statistics entries; always true.
    static bool readMacroStatistics(const QString &path, CrvC_ReportData &data);
    // The "Macro Statistics" cell: report lines joined with "\n".
    static QString macroStatisticsCell(const CrvC_ReportData &data);
};
