#pragma once

#include "ServerCode.h"

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

// Why a request was not carried out; code Ok means it was.
struct Refusal
{
    ServerCode code = ServerCode::Ok;
    QString reason;

    bool refused() const { return code != ServerCode::Ok; }
};
