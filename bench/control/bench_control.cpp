// Composition and camera-list edits against the bare parse of the same input
// in the same run: each subject should stay a small constant factor of its
// baseline as the input grows (linear, no rescans or repeated copies).
#include "RecordingSettingControl.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QXmlStreamReader>

#include <benchmark/benchmark.h>

// Takes every request and answers it at once with success; keeps only the
// size of the last body so that the work cannot be optimised away.
class SinkTunnel final : public IKoltTunnelClient
{
public:
    bool IsConnected() const override { return true; }
    void *GetClientID() override { return this; }
    QString GetServerAddress() const override { return {}; }
    bool SendRequest(const QString &, void *, int, const QString &, TunnelRequest &request) override
    {
        lastSize = request.body.size();
        request.onResponse(true, {}, {}, QStringLiteral("0"), {}, false);
        return true;
    }
    qsizetype lastSize = 0;
};

// The camera removal handler, reached as its read answer would reach it.
class RecordingSettingControlTest
{
public:
    static void removeFrom(RecordingSettingControl &control, const QList<QVariant> &removal,
                           const QString &answer, ControlResultCallback done)
    {
        control.HdlrRmvDefTimecardCameraList(true, false, {}, removal, answer, std::move(done));
    }
};

namespace {

QString scheduleDocument(int rectangles)
{
    QJsonArray list;
    for (int i = 0; i < rectangles; ++i) {
        list.append(QJsonObject{
            {"Left", i % 7},
            {"Right", i % 7 + 1},
            {"Top", (i % 24) / 1.5},
            {"Bottom", 23.9997},
            {"RecordingMode", i % 2 ? "Event" : "Continuous"},
            {"triggerEvents", QJsonObject{{"motion", true}, {"di", true}, {"traditional", true}}},
        });
    }
    return QString::fromUtf8(
        QJsonDocument(QJsonObject{{"Rectangles", list}}).toJson(QJsonDocument::Compact));
}

QString timecardAnswer(int cameras)
{
    QString list;
    for (int i = 0; i < cameras; ++i)
        list +=
            QStringLiteral("\n  <Cam><Name>C_%1</Name><GrpID>%2</GrpID></Cam>").arg(i).arg(i % 9);
    return "<GetRecTmcardRes><Tmcard><Revision>7</Revision><TmcardID>3</TmcardID>"
           "<Name>Lobby</Name><Mapping></Mapping><CamList>" +
           list + "\n</CamList></Tmcard></GetRecTmcardRes>";
}

QList<QVariant> cameraEntries(int count, int step)
{
    QList<QVariant> list;
    for (int i = 0; i < count; i += step)
        list << QMap<QString, QVariant>{{"Name", QStringLiteral("C_%1").arg(i)}, {"GrpID", "1"}};
    return list;
}

void BaselineJsonParse(benchmark::State &state)
{
    const QString document = scheduleDocument(int(state.range(0)));
    for (auto _ : state) {
        const QJsonDocument parsed = QJsonDocument::fromJson(document.toUtf8());
        qsizetype fields = 0;
        for (const QJsonValue &v : parsed.object().value("Rectangles").toArray())
            fields += v.toObject().size();
        benchmark::DoNotOptimize(fields);
    }
    state.SetComplexityN(state.range(0));
}

// The bytes a composed body of that many rectangles holds, written once into
// fresh memory: a floor that no composer can go under.
void BaselineWriteBody(benchmark::State &state)
{
    SinkTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    control.AddSchedule(QStringLiteral("Lobby & Hall"), scheduleDocument(int(state.range(0))), {});
    const QString chunk(1024, QLatin1Char('x'));
    for (auto _ : state) {
        QString body;
        while (body.size() < tunnel.lastSize)
            body.append(chunk);
        benchmark::DoNotOptimize(body.data());
    }
    state.SetComplexityN(state.range(0));
}

void ComposeSchedule(benchmark::State &state)
{
    const QString document = scheduleDocument(int(state.range(0)));
    SinkTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    for (auto _ : state) {
        control.AddSchedule(QStringLiteral("Lobby & Hall"), document, {});
        benchmark::DoNotOptimize(tunnel.lastSize);
    }
    state.counters["bodyChars"] = double(tunnel.lastSize);
    state.SetComplexityN(state.range(0));
}

void BaselineXmlPass(benchmark::State &state)
{
    const QString answer = timecardAnswer(int(state.range(0)));
    for (auto _ : state) {
        QXmlStreamReader reader(answer);
        int elements = 0;
        while (!reader.atEnd())
            elements += reader.readNext() == QXmlStreamReader::StartElement;
        benchmark::DoNotOptimize(elements);
    }
    state.SetComplexityN(state.range(0));
}

// A tenth of the cameras removed: 1,000 of 10,000 at the largest size.
void RemoveCameras(benchmark::State &state)
{
    const int cameras = int(state.range(0));
    const QString answer = timecardAnswer(cameras);
    const QList<QVariant> removal = cameraEntries(cameras, 10);
    SinkTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    for (auto _ : state) {
        RecordingSettingControlTest::removeFrom(control, removal, answer, [](bool, bool) {});
        benchmark::DoNotOptimize(tunnel.lastSize);
    }
    state.SetComplexityN(state.range(0));
}

void ReplaceCameraList(benchmark::State &state)
{
    const int cameras = int(state.range(0));
    const QString answer = timecardAnswer(cameras);
    const QList<QVariant> given = cameraEntries(cameras, 1);
    SinkTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    for (auto _ : state) {
        control.UpdateTimecardCameraList(
            answer, given, [](bool, bool) {}, 0);
        benchmark::DoNotOptimize(tunnel.lastSize);
    }
    state.SetComplexityN(state.range(0));
}

} // namespace

BENCHMARK(BaselineJsonParse)->RangeMultiplier(4)->Range(625, 10000)->Complexity();
BENCHMARK(BaselineWriteBody)->RangeMultiplier(4)->Range(625, 10000)->Complexity();
BENCHMARK(ComposeSchedule)->RangeMultiplier(4)->Range(625, 10000)->Complexity();
BENCHMARK(BaselineXmlPass)->RangeMultiplier(4)->Range(625, 10000)->Complexity();
BENCHMARK(RemoveCameras)->RangeMultiplier(4)->Range(625, 10000)->Complexity();
BENCHMARK(ReplaceCameraList)->RangeMultiplier(4)->Range(625, 10000)->Complexity();

BENCHMARK_MAIN();
