#pragma once

#include "Statistics.h"

#include <QByteArray>
#include <QString>

// Writes an answer of CrvB_Statistics in one of corvid-stats' formats.
class CrvB_StatisticsFormat
{
public:
    // table, csv, json, html
    static QStringList formats();
    // The answer in `format` (one of formats()), UTF-8; a final newline.
    static QByteArray write(const CrvB_Statistics::Table &table, const QString &format);

private:
    static QByteArray text(const CrvB_Statistics::Table &table);
    static QByteArray csv(const CrvB_Statistics::Table &table);
    static QByteArray json(const CrvB_Statistics::Table &table);
    static QByteArray html(const CrvB_Statistics::Table &table);
    static QString svgChart(const CrvB_Statistics::Table &table);
};
