#pragma once

#include "RecordingSettingControl.h"
#include "TestTunnel.h"
#include "XML2Json.h"

#include <QXmlStreamReader>

#include <gtest/gtest.h>

// Reaches the control's private composers and its camera removal handler,
// for the cases that cannot be driven through a public operation.
class RecordingSettingControlTest : public ::testing::Test
{
protected:
    static QString composeMapping(const RecordingSettingControl &control, const QString &content)
    {
        return control.ComposeScheRecTimeframeMsg(content);
    }
    static QString composeInterval(const RecordingSettingControl &control, double begin, double end)
    {
        return control.ComposeIntervalMsg(begin, end);
    }
    static QString composeCameras(const RecordingSettingControl &control,
                                  const QList<QVariant> &cameras)
    {
        return control.ComposeCamRecGrpListMsg(cameras);
    }
    // The read answer of a camera removal arriving on the tunnel's thread.
    static void answerRemovalRead(RecordingSettingControl &control, bool ok, bool flag,
                                  const QList<QVariant> &removal, const QString &answer,
                                  ControlResultCallback done)
    {
        control.HdlrRmvDefTimecardCameraList(ok, flag, {}, removal, answer, std::move(done));
    }
};

// What one completion was called with, and how often.
struct Completion
{
    int calls = 0;
    bool ok = false;
    bool flag = false;
    QString text;
    QList<QVariant> timecards;

    ControlResultCallback result()
    {
        return [this](bool ok_, bool flag_) { record(ok_, flag_); };
    }
    TimecardListCallback timecardList()
    {
        return [this](bool ok_, bool flag_, const QList<QVariant> &list, const QString &answer) {
            record(ok_, flag_);
            timecards = list;
            text = answer;
        };
    }
    TimecardIdCallback timecardId()
    {
        return [this](bool ok_, bool flag_, const QString &id) {
            record(ok_, flag_);
            text = id;
        };
    }

private:
    void record(bool ok_, bool flag_)
    {
        ++calls;
        ok = ok_;
        flag = flag_;
    }
};

inline QVariant camera(const QString &name, const QString &group)
{
    return QMap<QString, QVariant>{{QStringLiteral("Name"), name},
                                   {QStringLiteral("GrpID"), group}};
}

inline bool isWellFormedXml(const QString &text)
{
    QXmlStreamReader reader(text);
    while (!reader.atEnd())
        reader.readNext();
    return !reader.hasError();
}

// The text of the first element of that name in a body, as an XML reader
// sees it: what the server will read back.
inline QString elementText(const QString &body, const QString &element)
{
    QXmlStreamReader reader(body);
    while (!reader.atEnd()) {
        if (reader.readNext() == QXmlStreamReader::StartElement && reader.name() == element)
            return reader.readElementText(QXmlStreamReader::IncludeChildElements);
    }
    return QStringLiteral("<missing>");
}

// Answers are read through the XML converter; until the real one is built
// in, cases that need a parsed answer are skipped rather than failed.
#define REQUIRE_CONVERTER()                                                                        \
    do {                                                                                           \
        if (!XML2Json().parse(QStringLiteral("<a><b>1</b></a>")).isValid())                        \
            GTEST_SKIP() << "the XML converter is not built in yet";                               \
    } while (false)
