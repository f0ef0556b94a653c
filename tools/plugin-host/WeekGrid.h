#pragma once

#include <QString>
#include <QStringList>

// A schedule content document drawn for people: the days 1 to 7 as
// columns, the hours of the day as rows, and in each cell the recording
// mode's first letter (upper case when the mode covers the whole hour,
// lower case when only part of it, "*" where modes overlap, "." for no
// recording). Frames that do not repeat weekly are listed below the grid.
QStringList weekGrid(const QString &content);
