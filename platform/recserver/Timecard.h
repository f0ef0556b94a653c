#pragma once

#include <QString>

#include <vector>

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
