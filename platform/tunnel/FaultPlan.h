#pragma once

#include <QHash>
#include <QString>

#include <chrono>
#include <optional>
#include <random>
#include <vector>

// What the fault plan does to one request.
struct FaultDecision
{
    bool refuse = false;         // SendRequest returns false
    bool fail = false;           // ok false; the server is not asked
    std::optional<QString> code; // ok true with this code; the server is not asked
    bool drop = false;           // the server carries it out; ok false delivered
    std::chrono::milliseconds latency{0};
    bool reorder = false; // held back until a later answer has gone out

    QString describe() const;
};

// Injected faults, reproducible from a seed: the same fault text, seed and
// sequence of requests give the same decisions. Grammar (README.md):
//   item[,item...]   item = kind[@selector][=value]
//   kind: latency refuse fail drop code reorder
//   selector: N | N-M | N+ | Command | Command#N
// Not thread-safe: the tunnel calls it under its own lock.
class FaultPlan
{
public:
    // Replaces the rules with those of a fault text. Why the text does not
    // parse (the plan is then empty), or nothing.
    std::optional<QString> parse(const QString &text);
    void setSeed(quint64 seed) { m_random.seed(seed); }

    // Counts the request (from 1, per tunnel and per command) and decides.
    FaultDecision decide(const QString &command);

private:
    enum class Kind { Latency, Refuse, Fail, Drop, Code, Reorder };

    struct Rule
    {
        Kind kind = Kind::Fail;
        QString command;   // empty: any command
        quint64 first = 0; // 0: every request; else the request numbers first..last
        quint64 last = 0;
        double probability = 1.0;
        QString code;
        std::chrono::milliseconds minLatency{0};
        std::chrono::milliseconds maxLatency{0};
    };

    static Rule readRule(const QString &item);
    bool hits(const Rule &rule, const QString &command, quint64 request, quint64 ofCommand);
    std::chrono::milliseconds drawLatency(const Rule &rule);
    double draw();

    std::vector<Rule> m_rules;
    std::mt19937_64 m_random{1};
    quint64 m_requests = 0;
    QHash<QString, quint64> m_requestsPerCommand;
};
