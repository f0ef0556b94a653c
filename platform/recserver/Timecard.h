#pragma once

#include <QString>

#include <vector>

// Clients read time card identifiers as 32-bit signed integers: the server
// hands out and takes only identifiers from 1 to this.
constexpr qint64 kMaxTimecardId = 2147483647;

// A camera as the server stores it: its place on the time card is its index.
struct Camera
{
    QString name;
    qint64 group = 0;
};

// A time card as the server stores it. The mapping is the canonical compact
// XML of the Mapping element's content (see XmlCursor::copyContent).
struct Timecard
{
    qint64 revision = 0;
    qint64 id = 0;
    QString name;
    QString mapping;
    std::vector<Camera> cameras;
};
