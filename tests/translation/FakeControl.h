#pragma once

#include "IRecordingSettingControl.h"

#include <QList>
#include <QString>
#include <QStringList>
#include <QVariant>

#include <deque>
#include <functional>
#include <mutex>

// A time card control for tests of the plug-in side: records which operation
// was called with what, answers the read of all time cards as scripted, and
// refuses every other send. Thread-safe; completions are called outside its
// lock.
class FakeControl final : public IRecordingSettingControl
{
public:
    struct Call
    {
        QString operation;
        QList<QVariant> arguments;
    };

    enum class Fetch {
        Answer, // calls the completion inside GetAllScheduleTimecardInfo
        Hold,   // keeps the completion until deliverHeld()
        Refuse, // returns false; the completion is never called
    };

    struct Answer
    {
        bool ok = true;
        bool flag = false;
        QList<QVariant> timecards;
        QString text;
    };

    explicit FakeControl(std::function<void()> onDestroyed = {})
        : m_onDestroyed(std::move(onDestroyed))
    {}
    ~FakeControl() override
    {
        if (m_onDestroyed)
            m_onDestroyed();
    }

    void setFetch(Fetch fetch)
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_fetch = fetch;
    }
    void setAnswer(Answer answer)
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_answer = std::move(answer);
    }

    QList<Call> calls() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_calls;
    }
    // Operation names in call order, SetClientID left out.
    QStringList operations() const
    {
        QStringList names;
        for (const Call &call : calls()) {
            if (call.operation != QLatin1String("SetClientID"))
                names << call.operation;
        }
        return names;
    }
    QList<void *> clientIds() const
    {
        QList<void *> ids;
        for (const Call &call : calls()) {
            if (call.operation == QLatin1String("SetClientID"))
                ids << reinterpret_cast<void *>(call.arguments.value(0).toULongLong());
        }
        return ids;
    }
    int held() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return static_cast<int>(m_held.size());
    }
    // Answers every held read with the scripted answer, in order.
    void deliverHeld()
    {
        for (;;) {
            TimecardListCallback done;
            Answer answer;
            {
                const std::lock_guard<std::mutex> lock(m_mutex);
                if (m_held.empty())
                    return;
                done = std::move(m_held.front());
                m_held.pop_front();
                answer = m_answer;
            }
            done(answer.ok, answer.flag, answer.timecards, answer.text);
        }
    }

    bool GetAllScheduleTimecardInfo(TimecardListCallback done) override
    {
        Answer answer;
        {
            const std::lock_guard<std::mutex> lock(m_mutex);
            m_calls.append({QStringLiteral("GetAllScheduleTimecardInfo"), {}});
            if (m_fetch == Fetch::Refuse)
                return false;
            if (m_fetch == Fetch::Hold) {
                m_held.push_back(std::move(done));
                return true;
            }
            answer = m_answer;
        }
        done(answer.ok, answer.flag, answer.timecards, answer.text);
        return true;
    }
    bool GetScheduleTimecardInfoById(int id, TimecardListCallback) override
    {
        return refuse("GetScheduleTimecardInfoById", {id});
    }
    bool RemoveTimecardCameraList(int id, const QList<QVariant> &cameras,
                                  ControlResultCallback) override
    {
        return refuse("RemoveTimecardCameraList", {id, cameras});
    }
    bool CreateDefaultContinuousTimecard(const QList<QVariant> &cameras,
                                         ControlResultCallback) override
    {
        return refuse("CreateDefaultContinuousTimecard", {cameras});
    }
    bool UpdateDefaultContinuousTimecard(const QMap<QString, QVariant> &summary,
                                         const QList<QVariant> &cameras,
                                         ControlResultCallback) override
    {
        return refuse("UpdateDefaultContinuousTimecard", {summary, cameras});
    }
    bool CreateDefaultEventTimecard(const QList<QVariant> &cameras, ControlResultCallback) override
    {
        return refuse("CreateDefaultEventTimecard", {cameras});
    }
    bool UpdateDefaultEventTimecard(const QMap<QString, QVariant> &summary,
                                    const QList<QVariant> &cameras, ControlResultCallback) override
    {
        return refuse("UpdateDefaultEventTimecard", {summary, cameras});
    }
    bool CreateCustomizeTimecard(const QString &content, const QList<QVariant> &cameras,
                                 ControlResultCallback) override
    {
        return refuse("CreateCustomizeTimecard", {content, cameras});
    }
    bool UpdateCustomizeTimecard(const QMap<QString, QVariant> &summary, const QString &content,
                                 const QList<QVariant> &cameras, ControlResultCallback) override
    {
        return refuse("UpdateCustomizeTimecard", {summary, content, cameras});
    }
    bool AddSchedule(const QString &name, const QString &content, TimecardIdCallback) override
    {
        return refuse("AddSchedule", {name, content});
    }
    bool UpdateSchedule(const QString &revision, const QString &id, const QString &name,
                        const QString &content, const QList<QVariant> &cameras,
                        ControlResultCallback) override
    {
        return refuse("UpdateSchedule", {revision, id, name, content, cameras});
    }
    bool DeleteSchedule(const QMap<QString, QVariant> &timecard, ControlResultCallback) override
    {
        return refuse("DeleteSchedule", {timecard});
    }
    bool UpdateTimecardCameraList(const QString &answer, const QList<QVariant> &cameras,
                                  ControlResultCallback, int timeoutMs) override
    {
        return refuse("UpdateTimecardCameraList", {answer, cameras, timeoutMs});
    }
    QMap<QString, QVariant> GetDefaultContinousTimecardInfo(const QList<QVariant> &list) override
    {
        record("GetDefaultContinousTimecardInfo", {list});
        return {};
    }
    QMap<QString, QVariant> GetDefaultEventTimecardInfo(const QList<QVariant> &list) override
    {
        record("GetDefaultEventTimecardInfo", {list});
        return {};
    }
    QMap<QString, QVariant> GetCustomizeTimecardInfo(const QList<QVariant> &list) override
    {
        record("GetCustomizeTimecardInfo", {list});
        return {};
    }
    void SetClientID(void *const clientId) override
    {
        record("SetClientID", {QVariant::fromValue(reinterpret_cast<qulonglong>(clientId))});
    }

private:
    void record(const char *operation, QList<QVariant> arguments)
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_calls.append({QString::fromLatin1(operation), std::move(arguments)});
    }
    bool refuse(const char *operation, QList<QVariant> arguments)
    {
        record(operation, std::move(arguments));
        return false;
    }

    mutable std::mutex m_mutex;
    std::function<void()> m_onDestroyed;
    Fetch m_fetch = Fetch::Answer;
    Answer m_answer;
    QList<Call> m_calls;
    std::deque<TimecardListCallback> m_held;
};
