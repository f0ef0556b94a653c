#include "RecordingScheduleDataObject.h"

#include <QDataStream>

using namespace PluginRecordingScheduleSettingCommon;

RecordingScheduleDataObject::RecordingScheduleDataObject()
{
    initContent();
}

RecordingScheduleDataObject::RecordingScheduleDataObject(const RecordingScheduleDataObject &other) =
    default;

RecordingScheduleDataObject &
RecordingScheduleDataObject::operator=(const RecordingScheduleDataObject &other)
{
    m_recScheduleType = other.m_recScheduleType;
    m_customizeContent = other.m_customizeContent;
    return *this;
}

RecordingScheduleDataObject::~RecordingScheduleDataObject() = default;

IRawDataObject &RecordingScheduleDataObject::operator=(const IRawDataObject &other)
{
    if (&other == this)
        return *this;
    if (const auto *same = dynamic_cast<const RecordingScheduleDataObject *>(&other))
        *this = *same;
    return *this;
}

RecordingScheduleType RecordingScheduleDataObject::getRecScheduleType() const
{
    return m_recScheduleType;
}

void RecordingScheduleDataObject::setRecScheduleType(RecordingScheduleType type)
{
    m_recScheduleType = type;
}

QString RecordingScheduleDataObject::getCustomizeContent() const
{
    return m_customizeContent;
}

void RecordingScheduleDataObject::setCustomizeContent(const QString &content)
{
    m_customizeContent = content;
}

void RecordingScheduleDataObject::WriteDataToDataStream(QDataStream &stream) const
{
    stream << static_cast<qint32>(m_recScheduleType) << m_customizeContent;
}

void RecordingScheduleDataObject::ReadDataFromDataStream(QDataStream &stream)
{
    qint32 type = 0;
    stream >> type >> m_customizeContent;
    // Any int is kept as it came, also one that no enumerator names.
    m_recScheduleType = static_cast<RecordingScheduleType>(type);
}

void RecordingScheduleDataObject::initContent()
{
    m_recScheduleType = DefaultContinuous;
    m_customizeContent.clear();
}
