#include "LocalTunnel.h"

#include "ExchangeLog.h"
#include "FaultPlan.h"

#include <QThread>

#include <chrono>
#include <condition_variable>
#include <deque>
#include <map>
#include <mutex>
#include <optional>
#include <thread>

namespace {

using Clock = std::chrono::steady_clock;

// One request taken and not yet delivered.
struct Entry
{
    ExchangeRecord record;
    TunnelResponseHandler handler;
    Clock::time_point accepted;
    Clock::time_point deadline;
    FaultDecision faults;
    bool answered = false;
    Clock::time_point readyAt;
    bool held = false; // a reordered answer waiting for a later one to go out
};

// A closure from runOnBackend, queued among the requests.
struct Task
{
    const std::function<void()> *work = nullptr;
    bool done = false;
    bool ran = false;
};

struct Job
{
    quint64 seq = 0;      // a request, or
    Task *task = nullptr; // a closure
};

qint64 millisecondsSince(Clock::time_point start)
{
    return std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - start).count();
}

} // namespace

struct LocalTunnel::State
{
    LocalTunnelOptions options;
    FaultPlan faults;
    // Shared, so that a caller can ask about it after the tunnel is gone.
    const std::shared_ptr<ExchangeLog> log = std::make_shared<ExchangeLog>();
    void *ownIdentity = nullptr;

    std::mutex mutex;
    std::condition_variable backendWake;
    std::condition_variable deliveryWake;
    std::condition_variable changed; // factory ran, task done, idle
    bool factoryRan = false;
    bool connected = false;
    bool stopping = false;
    bool delivering = false;
    QString error;
    quint64 nextSeq = 1;
    std::deque<Job> jobs;
    std::map<quint64, Entry> pending;

    std::thread backendThread;
    std::thread deliveryThread;

    // Backend thread.
    void backendLoop(const TunnelBackendFactory &factory);
    TunnelBackend startBackend(const TunnelBackendFactory &factory);
    void runTask(Task &task, std::unique_lock<std::mutex> &lock);
    void carryOut(quint64 seq, const TunnelBackend &backend, std::unique_lock<std::mutex> &lock);
    void releaseQueuedTasks();

    // Delivery thread.
    void deliveryLoop();
    void deliverAllPending(std::unique_lock<std::mutex> &lock);
    void deliverOutcome(Entry &entry);
    void deliver(Entry &entry, bool ok, const QString &code, const QString &content,
                 const QString &outcome);
    struct Due
    {
        std::map<quint64, Entry>::iterator entry;
        Clock::time_point at;
    };
    // The pending entry to deliver next and when, under the lock.
    std::optional<Due> nextDue();
    bool idle() const { return (pending.empty() && !delivering) || !deliveryThread.joinable(); }
};

TunnelBackendFactory recordingServerBackend(const QString &databasePath, AnswerLayout layout,
                                            RecordingServer **server)
{
    return [databasePath, layout, server]() -> StartedBackend {
        auto owned = std::make_shared<RecordingServer>(databasePath, layout);
        if (const Refusal refusal = owned->open(); refusal.refused())
            return {{}, refusal.reason};
        if (server)
            *server = owned.get();
        return {[owned](const QString &command, const QString &body) {
                    return owned->handle(command, body);
                },
                {}};
    };
}

LocalTunnel::LocalTunnel(TunnelBackendFactory factory, LocalTunnelOptions options)
    : m_state(std::make_unique<State>())
{
    // Qt takes the first thread that asks for its thread data for the
    // application's main thread. Were that the backend thread (its database
    // connection is a QObject), Qt would keep the backend's thread data as
    // the main thread's, and the real main thread's, made later, would never
    // be freed. So the thread that makes the tunnel asks first.
    QThread::currentThread();
    State &state = *m_state;
    state.options = std::move(options);
    state.ownIdentity = static_cast<IKoltTunnelClient *>(this);
    if (std::optional<QString> error = state.faults.parse(state.options.faults)) {
        state.error = *error;
        return;
    }
    state.faults.setSeed(state.options.faultSeed);
    if (!state.options.exchangeLogPath.isEmpty()) {
        if (std::optional<QString> error = state.log->open(state.options.exchangeLogPath)) {
            state.error = *error;
            return;
        }
    }
    state.backendThread =
        std::thread([&state, factory = std::move(factory)] { state.backendLoop(factory); });
    std::unique_lock<std::mutex> lock(state.mutex);
    state.changed.wait(lock, [&] { return state.factoryRan; });
    if (state.connected)
        state.deliveryThread = std::thread([&state] { state.deliveryLoop(); });
}

LocalTunnel::~LocalTunnel()
{
    State &state = *m_state;
    {
        const std::lock_guard<std::mutex> lock(state.mutex);
        state.stopping = true;
    }
    state.backendWake.notify_all();
    state.deliveryWake.notify_all();
    state.changed.notify_all();
    if (state.deliveryThread.joinable())
        state.deliveryThread.join();
    if (state.backendThread.joinable())
        state.backendThread.join();
}

TunnelBackend LocalTunnel::State::startBackend(const TunnelBackendFactory &factory)
{
    StartedBackend started;
    try {
        if (factory)
            started = factory();
    } catch (...) {
        started = {{}, QStringLiteral("the backend could not be created")};
    }
    {
        const std::lock_guard<std::mutex> lock(mutex);
        connected = static_cast<bool>(started.backend);
        if (!connected)
            error = started.error.isEmpty() ? QStringLiteral("no backend") : started.error;
        factoryRan = true;
    }
    changed.notify_all();
    return std::move(started.backend);
}

void LocalTunnel::State::backendLoop(const TunnelBackendFactory &factory)
{
    TunnelBackend backend = startBackend(factory);
    if (!backend)
        return;
    std::unique_lock<std::mutex> lock(mutex);
    for (;;) {
        backendWake.wait(lock, [&] { return stopping || !jobs.empty(); });
        if (stopping)
            break;
        const Job job = jobs.front();
        jobs.pop_front();
        if (job.task)
            runTask(*job.task, lock);
        else
            carryOut(job.seq, backend, lock);
    }
    lock.unlock();
    releaseQueuedTasks();
    // The backend (and a database connection in it) ends on this thread.
    backend = nullptr;
}

void LocalTunnel::State::runTask(Task &task, std::unique_lock<std::mutex> &lock)
{
    lock.unlock();
    (*task.work)();
    lock.lock();
    task.ran = task.done = true;
    changed.notify_all();
}

void LocalTunnel::State::carryOut(quint64 seq, const TunnelBackend &backend,
                                  std::unique_lock<std::mutex> &lock)
{
    auto it = pending.find(seq);
    // Already delivered as timed out: a request the caller gave up on is
    // never carried out.
    if (it == pending.end() || Clock::now() >= it->second.deadline)
        return;
    Entry &entry = it->second;
    if (entry.faults.fail || entry.faults.code) {
        entry.answered = true;
        entry.readyAt = Clock::now() + entry.faults.latency;
        deliveryWake.notify_one();
        return;
    }
    const QString command = entry.record.command;
    const QString body = entry.record.body;
    lock.unlock();
    ServerAnswer answer;
    bool exchanged = true;
    try {
        answer = backend(command, body);
    } catch (...) {
        exchanged = false;
    }
    lock.lock();
    it = pending.find(seq);
    if (it == pending.end()) {
        // Its time-out was delivered already; the answer is dropped.
        ExchangeRecord late;
        late.seq = seq;
        late.outcome = QStringLiteral("late");
        late.command = command;
        late.code = answer.code;
        late.content = answer.content;
        lock.unlock();
        log->write(late);
        lock.lock();
        return;
    }
    Entry &answered = it->second;
    answered.answered = true;
    answered.readyAt = Clock::now() + answered.faults.latency;
    answered.record.ok = exchanged && !answered.faults.drop;
    answered.record.code = answer.code;
    answered.record.content = answer.content;
    deliveryWake.notify_one();
}

void LocalTunnel::State::releaseQueuedTasks()
{
    {
        const std::lock_guard<std::mutex> lock(mutex);
        // Closures still queued are not run; their callers are released.
        for (const Job &job : jobs) {
            if (job.task)
                job.task->done = true;
        }
        jobs.clear();
    }
    changed.notify_all();
}

std::optional<LocalTunnel::State::Due> LocalTunnel::State::nextDue()
{
    std::optional<Due> next;
    for (auto it = pending.begin(); it != pending.end(); ++it) {
        const Entry &entry = it->second;
        Clock::time_point at = entry.deadline;
        if (entry.answered && !(entry.held && pending.size() > 1))
            at = std::min(entry.readyAt, entry.deadline);
        if (!next || at < next->at)
            next = Due{it, at};
    }
    return next;
}

void LocalTunnel::State::deliver(Entry &entry, bool ok, const QString &code, const QString &content,
                                 const QString &outcome)
{
    entry.record.ok = ok;
    entry.record.code = code;
    entry.record.content = content;
    entry.record.outcome = outcome;
    entry.record.elapsedMs = millisecondsSince(entry.accepted);
    log->write(entry.record);
    try {
        entry.handler(ok, QString(), QString(), code, content, entry.record.flag);
    } catch (...) {
        // A throwing handler must not take the delivery thread down.
    }
}

void LocalTunnel::State::deliverOutcome(Entry &entry)
{
    const bool inTime = entry.answered && entry.readyAt <= entry.deadline;
    if (!inTime)
        deliver(entry, false, QString(), QString(), QStringLiteral("timeout"));
    else if (entry.faults.fail)
        deliver(entry, false, QString(), QString(), QStringLiteral("failed"));
    else if (entry.faults.code)
        deliver(entry, true, *entry.faults.code, QString(), QStringLiteral("code"));
    else if (!entry.record.ok)
        deliver(entry, false, QString(), QString(),
                entry.faults.drop ? QStringLiteral("dropped") : QStringLiteral("failed"));
    else
        deliver(entry, true, entry.record.code, entry.record.content, QStringLiteral("answered"));
}

void LocalTunnel::State::deliverAllPending(std::unique_lock<std::mutex> &lock)
{
    std::map<quint64, Entry> left;
    left.swap(pending);
    delivering = true;
    lock.unlock();
    for (auto &item : left)
        deliver(item.second, false, QString(), QString(), QStringLiteral("shutdown"));
    lock.lock();
    delivering = false;
    changed.notify_all();
}

void LocalTunnel::State::deliveryLoop()
{
    std::unique_lock<std::mutex> lock(mutex);
    while (!stopping) {
        const std::optional<Due> next = nextDue();
        if (!next) {
            deliveryWake.wait(lock);
            continue;
        }
        if (Clock::now() < next->at) {
            deliveryWake.wait_until(lock, next->at);
            continue;
        }
        Entry entry = std::move(next->entry->second);
        pending.erase(next->entry);
        // A held answer is released once a later request's answer went out.
        for (auto &item : pending) {
            if (item.first < entry.record.seq)
                item.second.held = false;
        }
        delivering = true;
        lock.unlock();
        deliverOutcome(entry);
        entry = Entry();
        lock.lock();
        delivering = false;
        if (pending.empty())
            changed.notify_all();
    }
    deliverAllPending(lock);
}

QString LocalTunnel::errorString() const
{
    const std::lock_guard<std::mutex> lock(m_state->mutex);
    return m_state->error;
}

bool LocalTunnel::IsConnected() const
{
    const std::lock_guard<std::mutex> lock(m_state->mutex);
    return m_state->connected && !m_state->stopping;
}

void *LocalTunnel::GetClientID()
{
    return m_state->ownIdentity;
}

QString LocalTunnel::GetServerAddress() const
{
    return m_state->options.serverAddress;
}

bool LocalTunnel::SendRequest(const QString &pluginId, void *clientId, int kind,
                              const QString &command, TunnelRequest &request)
{
    State &state = *m_state;
    if (!request.onResponse)
        return false;
    Entry entry;
    entry.record.pluginId = pluginId;
    entry.record.identity = clientId;
    entry.record.ownIdentity = clientId == state.ownIdentity;
    entry.record.kind = kind;
    entry.record.command = command;
    entry.record.body = request.body;
    entry.record.timeoutMs = request.timeoutMs;
    entry.record.flag = request.flag;
    entry.accepted = Clock::now();
    entry.deadline =
        entry.accepted + std::chrono::milliseconds(std::max<qint32>(0, request.timeoutMs));

    std::unique_lock<std::mutex> lock(state.mutex);
    if (!state.connected || state.stopping || state.pending.size() >= state.options.queueBound)
        return false;
    entry.faults = state.faults.decide(command);
    entry.record.seq = state.nextSeq++;
    entry.record.faults = entry.faults.describe();
    if (entry.faults.refuse) {
        lock.unlock();
        entry.record.outcome = QStringLiteral("refused");
        state.log->write(entry.record);
        return false;
    }
    entry.held = entry.faults.reorder;
    entry.handler = request.onResponse;
    const quint64 seq = entry.record.seq;
    state.pending.emplace(seq, std::move(entry));
    state.jobs.push_back({seq, nullptr});
    lock.unlock();
    state.backendWake.notify_one();
    state.deliveryWake.notify_one();
    return true;
}

bool LocalTunnel::runOnBackend(const std::function<void()> &task)
{
    State &state = *m_state;
    Task job;
    job.work = &task;
    std::unique_lock<std::mutex> lock(state.mutex);
    if (!state.connected || state.stopping || !task)
        return false;
    state.jobs.push_back({0, &job});
    state.backendWake.notify_one();
    state.changed.wait(lock, [&] { return job.done; });
    return job.ran;
}

void LocalTunnel::waitIdle()
{
    State &state = *m_state;
    std::unique_lock<std::mutex> lock(state.mutex);
    state.changed.wait(lock, [&] { return state.idle(); });
}

bool LocalTunnel::waitIdle(std::chrono::milliseconds timeout)
{
    State &state = *m_state;
    std::unique_lock<std::mutex> lock(state.mutex);
    return state.changed.wait_for(lock, timeout, [&] { return state.idle(); });
}

std::shared_ptr<const ExchangeLog> LocalTunnel::exchangeLog() const
{
    return m_state->log;
}

std::optional<QString> LocalTunnel::faultTextError(const QString &text)
{
    return FaultPlan().parse(text);
}
