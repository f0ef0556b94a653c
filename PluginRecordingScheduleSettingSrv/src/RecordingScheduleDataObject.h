#pragma once

#include "IRawDataObject.h"
#include "RecordingScheduleType.h"

#include <QString>
#include <QtGlobal>

// One camera's recording schedule in the host's serialisable form: the kind
// of schedule and, for a customised one, its schedule content document.
// Streamed as a 32-bit int followed by the QString, nothing else.
class Q_DECL_EXPORT RecordingScheduleDataObject final : public IRawDataObject
{
public:
    RecordingScheduleDataObject();
    RecordingScheduleDataObject(const RecordingScheduleDataObject &other);
    RecordingScheduleDataObject &operator=(const RecordingScheduleDataObject &other);
    ~RecordingScheduleDataObject() override;

    // Copies another RecordingScheduleDataObject; any other kind of data
    // object, and the object itself, leave it unchanged.
    IRawDataObject &operator=(const IRawDataObject &other) override;

    PluginRecordingScheduleSettingCommon::RecordingScheduleType getRecScheduleType() const;
    void setRecScheduleType(PluginRecordingScheduleSettingCommon::RecordingScheduleType type);
    QString getCustomizeContent() const;
    void setCustomizeContent(const QString &content);

    void WriteDataToDataStream(QDataStream &stream) const override;
    // A stream that ends before the int leaves the type 0; the stream's
    // status tells the caller that the read failed.
    void ReadDataFromDataStream(QDataStream &stream) override;

private:
    void initContent();

    PluginRecordingScheduleSettingCommon::RecordingScheduleType m_recScheduleType;
    QString m_customizeContent;
};
