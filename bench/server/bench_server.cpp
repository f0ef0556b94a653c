// Requests per second through the local tunnel and the recording server,
// against the server called directly and against the bare SQLite statements
// that a read and a write come down to, all on the same kind of database
// (one file, WAL, synchronous NORMAL) in the same run. Wall-clock time: the
// tunnel's work happens on its own threads.

#include "LocalTunnel.h"
#include "RecordingServer.h"

#include <QSqlDatabase>
#include <QSqlError>
#include <QSqlQuery>
#include <QTemporaryDir>
#include <QVariant>

#include <benchmark/benchmark.h>

#include <condition_variable>
#include <mutex>

namespace {

constexpr int kCameras = 10;

const QString kMapping = QStringLiteral(
    "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod>"
    "<RepeatMod>Weekly</RepeatMod><DayList><Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/>"
    "<Ele B=\"4.0\"/><Ele B=\"5.0\"/></DayList><Intervals><Ele B=\"28800\" E=\"64800\"/>"
    "</Intervals><Holiday>false</Holiday><Range><Period><TmS>2016-03-29 00:00:00.000</TmS>"
    "<TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range>"
    "<RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode></Ele>");

QString cameraList()
{
    QString list;
    for (int i = 0; i < kCameras; ++i)
        list +=
            QStringLiteral("<Cam><Name>C_%1</Name><RecGrpID>%2</RecGrpID></Cam>").arg(i).arg(i % 3);
    return QStringLiteral("<CamList>%1</CamList>").arg(list);
}

// The server's state for every benchmark: the default card and card 2.
QString seedDocument()
{
    QString cams;
    for (int i = 0; i < kCameras; ++i)
        cams += QStringLiteral("<Cam><Name>C_%1</Name><GrpID>%2</GrpID></Cam>").arg(i).arg(i % 3);
    return QStringLiteral("<GetRecTmcardRes><Tmcard><Revision>1</Revision><TmcardID>2</TmcardID>"
                          "<Name>Lobby</Name><Mapping>%1</Mapping><CamList>%2</CamList></Tmcard>"
                          "</GetRecTmcardRes>")
        .arg(kMapping, cams);
}

const QString kReadBody = QStringLiteral("<GetRecTmcard><TmcardID>2</TmcardID></GetRecTmcard>");

QString updateBody(qint64 revision)
{
    return QStringLiteral("<UpdRecTmcard><Tmcard><Revision>%1</Revision><TmcardID>2</TmcardID>"
                          "<Name>Lobby</Name><Mapping>%2</Mapping>%3</Tmcard></UpdRecTmcard>")
        .arg(revision)
        .arg(kMapping, cameraList());
}

// Sends one request and waits for its answer on the caller's thread.
class Waiter
{
public:
    TunnelResponseHandler handler()
    {
        return [this](bool ok, const QString &, const QString &, const QString &code,
                      const QString &, bool) {
            const std::lock_guard<std::mutex> lock(m_mutex);
            m_ok = ok && code == QLatin1String("0");
            m_done = true;
            m_changed.notify_one();
        };
    }
    bool wait()
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        m_changed.wait(lock, [&] { return m_done; });
        m_done = false;
        return m_ok;
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    bool m_done = false;
    bool m_ok = false;
};

bool roundTrip(LocalTunnel &tunnel, Waiter &waiter, const QString &command, const QString &body)
{
    TunnelRequest request;
    request.body = body;
    request.onResponse = waiter.handler();
    if (!tunnel.SendRequest(QStringLiteral("bench"), tunnel.GetClientID(), 1, command, request))
        return false;
    return waiter.wait();
}

struct TunnelSetup
{
    QTemporaryDir dir;
    RecordingServer *server = nullptr;
    LocalTunnel tunnel{recordingServerBackend(dir.filePath(QStringLiteral("bench.db")),
                                              AnswerLayout::Compact, &server)};
    TunnelSetup()
    {
        tunnel.runOnBackend([this] { server->seed(seedDocument()); });
    }
};

void BM_TunnelRead(benchmark::State &state)
{
    TunnelSetup setup;
    Waiter waiter;
    for (auto _ : state) {
        if (!roundTrip(setup.tunnel, waiter, QStringLiteral("GetRecTmcard"), kReadBody))
            state.SkipWithError("read failed");
    }
    state.SetItemsProcessed(state.iterations());
}

// 64 requests in flight at once: the tunnel's queue keeps the server busy.
void BM_TunnelReadPipelined(benchmark::State &state)
{
    TunnelSetup setup;
    const auto ignore = [](bool, const QString &, const QString &, const QString &, const QString &,
                           bool) {};
    for (auto _ : state) {
        for (int i = 0; i < 64; ++i) {
            TunnelRequest request;
            request.body = kReadBody;
            request.onResponse = ignore;
            setup.tunnel.SendRequest(QStringLiteral("bench"), nullptr, 1,
                                     QStringLiteral("GetRecTmcard"), request);
        }
        setup.tunnel.waitIdle();
    }
    state.SetItemsProcessed(state.iterations() * 64);
}

void BM_TunnelWrite(benchmark::State &state)
{
    TunnelSetup setup;
    Waiter waiter;
    qint64 revision = 1;
    for (auto _ : state) {
        if (!roundTrip(setup.tunnel, waiter, QStringLiteral("UpdRecTmcard"),
                       updateBody(revision++)))
            state.SkipWithError("update failed");
    }
    state.SetItemsProcessed(state.iterations());
}

struct ServerSetup
{
    QTemporaryDir dir;
    RecordingServer server{dir.filePath(QStringLiteral("bench.db"))};
    ServerSetup()
    {
        server.open();
        server.seed(seedDocument());
    }
};

void BM_ServerRead(benchmark::State &state)
{
    ServerSetup setup;
    for (auto _ : state) {
        const ServerAnswer answer = setup.server.handle(QStringLiteral("GetRecTmcard"), kReadBody);
        benchmark::DoNotOptimize(answer.content.size());
    }
    state.SetItemsProcessed(state.iterations());
}

void BM_ServerWrite(benchmark::State &state)
{
    ServerSetup setup;
    qint64 revision = 1;
    for (auto _ : state) {
        if (setup.server.handle(QStringLiteral("UpdRecTmcard"), updateBody(revision++)).code !=
            QLatin1String("0"))
            state.SkipWithError("update failed");
    }
    state.SetItemsProcessed(state.iterations());
}

// The bare statements on a database the server created: no XML either way.
struct SqlSetup
{
    ServerSetup server;
    QSqlDatabase db;
    SqlSetup()
    {
        db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), QStringLiteral("bench-sql"));
        db.setDatabaseName(server.server.databasePath());
        db.open();
        QSqlQuery pragma(db);
        pragma.exec(QStringLiteral("PRAGMA journal_mode=WAL"));
        pragma.exec(QStringLiteral("PRAGMA synchronous=NORMAL"));
    }
    ~SqlSetup()
    {
        db.close();
        db = QSqlDatabase();
        QSqlDatabase::removeDatabase(QStringLiteral("bench-sql"));
    }
};

void BM_SqlRead(benchmark::State &state)
{
    SqlSetup setup;
    QSqlQuery card(setup.db);
    QSqlQuery cams(setup.db);
    card.prepare(QStringLiteral("SELECT id, revision, name, mapping FROM tmcard WHERE id = ?"));
    cams.prepare(QStringLiteral("SELECT tmcard_id, name, grp_id FROM cam WHERE tmcard_id = ? ORDER "
                                "BY tmcard_id, position"));
    for (auto _ : state) {
        QSqlQuery(setup.db).exec(QStringLiteral("BEGIN"));
        card.addBindValue(2);
        card.exec();
        while (card.next())
            benchmark::DoNotOptimize(card.value(3).toString().size());
        cams.addBindValue(2);
        cams.exec();
        while (cams.next())
            benchmark::DoNotOptimize(cams.value(1).toString().size());
        card.finish();
        cams.finish();
        QSqlQuery(setup.db).exec(QStringLiteral("COMMIT"));
    }
    state.SetItemsProcessed(state.iterations());
}

void BM_SqlWrite(benchmark::State &state)
{
    SqlSetup setup;
    QSqlQuery check(setup.db);
    QSqlQuery update(setup.db);
    QSqlQuery clear(setup.db);
    QSqlQuery insert(setup.db);
    check.prepare(QStringLiteral("SELECT revision FROM tmcard WHERE id = ?"));
    update.prepare(
        QStringLiteral("UPDATE tmcard SET revision = ?, name = ?, mapping = ? WHERE id = ?"));
    clear.prepare(QStringLiteral("DELETE FROM cam WHERE tmcard_id = ?"));
    insert.prepare(
        QStringLiteral("INSERT INTO cam (tmcard_id, position, name, grp_id) VALUES (?, ?, ?, ?)"));
    qint64 revision = 1;
    for (auto _ : state) {
        QSqlQuery(setup.db).exec(QStringLiteral("BEGIN IMMEDIATE"));
        check.addBindValue(2);
        check.exec();
        check.next();
        check.finish();
        update.addBindValue(++revision);
        update.addBindValue(QStringLiteral("Lobby"));
        update.addBindValue(kMapping);
        update.addBindValue(2);
        update.exec();
        clear.addBindValue(2);
        clear.exec();
        for (int i = 0; i < kCameras; ++i) {
            insert.bindValue(0, 2);
            insert.bindValue(1, i);
            insert.bindValue(2, QStringLiteral("C_%1").arg(i));
            insert.bindValue(3, i % 3);
            insert.exec();
        }
        if (!QSqlQuery(setup.db).exec(QStringLiteral("COMMIT")))
            state.SkipWithError("commit failed");
    }
    state.SetItemsProcessed(state.iterations());
}

} // namespace

BENCHMARK(BM_SqlRead)->UseRealTime();
BENCHMARK(BM_ServerRead)->UseRealTime();
BENCHMARK(BM_TunnelRead)->UseRealTime();
BENCHMARK(BM_TunnelReadPipelined)->UseRealTime();
BENCHMARK(BM_SqlWrite)->UseRealTime();
BENCHMARK(BM_ServerWrite)->UseRealTime();
BENCHMARK(BM_TunnelWrite)->UseRealTime();

BENCHMARK_MAIN();
