#include "CameraList.h"

#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"

using namespace PluginRecordingScheduleSettingCommon;

namespace {

QString textOf(const QVariant &camera, const QString &key)
{
    return camera.toMap().value(key).toString();
}

} // namespace

CameraList CameraList::of(const QVariant &cameras)
{
    return CameraList(TimecardReadings::asList(cameras));
}

CameraList CameraList::onTimecard(const QMap<QString, QVariant> &timecard)
{
    const QVariant cameras = timecard.value(TimecardKey::CamList).toMap().value(TimecardKey::Cam);
    CameraList list = of(cameras);
    if (list.m_cameras.size() == 1 && !TimecardReadings::isList(cameras) &&
        list.m_cameras.constFirst().toMap().isEmpty())
        list.m_cameras.clear();
    return list;
}

CameraList &CameraList::merge(const QList<QVariant> &cameras)
{
    QSet<QString> held = names();
    for (const QVariant &camera : cameras) {
        const QString name = textOf(camera, TimecardKey::Name);
        if (held.contains(name))
            continue;
        held.insert(name);
        m_cameras.append(camera);
    }
    return *this;
}

CameraList &CameraList::remove(const QList<QVariant> &gone)
{
    for (const QVariant &camera : gone) {
        const QString name = textOf(camera, TimecardKey::Name);
        const QString group = textOf(camera, TimecardKey::GrpID);
        m_cameras.removeIf([&](const QVariant &held) {
            return textOf(held, TimecardKey::Name) == name &&
                   textOf(held, TimecardKey::GrpID) == group;
        });
    }
    return *this;
}

QSet<QString> CameraList::names() const
{
    QSet<QString> names;
    names.reserve(m_cameras.size());
    for (const QVariant &camera : m_cameras)
        names.insert(textOf(camera, TimecardKey::Name));
    return names;
}
