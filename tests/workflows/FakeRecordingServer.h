#pragma once

#include "TestTunnel.h"

#include <QList>
#include <QString>

#include <map>
#include <mutex>
#include <optional>

// A recording server for the workflow tests: keeps time cards in a map and
// answers the four time card commands from the request bodies, as the real
// server would. An update must carry the revision it read; every accepted
// change raises the revision. Thread-safe, so several tunnels may share one.
class FakeRecordingServer
{
public:
    struct Camera
    {
        QString name;
        QString group;
    };

    struct Timecard
    {
        int id = 0;
        int revision = 0;
        QString name;
        QString mapping;
        QList<Camera> cameras;
    };

    void put(const Timecard &timecard);
    std::optional<Timecard> find(int id) const;
    QList<Timecard> timecards() const;
    // The flag that every answer carries.
    void setAnswerFlag(bool flag);

    TestTunnel::Answer answer(const TestTunnel::Sent &sent);

    // A time card as the server writes it in a read answer ("GrpID"), or as a
    // camera-list update sends it back ("RecGrpID").
    static QString timecardXml(const Timecard &timecard,
                               const QString &groupTag = QStringLiteral("GrpID"));

private:
    TestTunnel::Answer read(const QString &body) const;
    TestTunnel::Answer insert(const QString &body);
    TestTunnel::Answer update(const QString &body);
    TestTunnel::Answer remove(const QString &body);
    TestTunnel::Answer success(const QString &content = QString()) const;
    TestTunnel::Answer failure() const;

    mutable std::mutex m_mutex;
    std::map<int, Timecard> m_timecards;
    int m_nextId = 100;
    bool m_flag = false;
};
