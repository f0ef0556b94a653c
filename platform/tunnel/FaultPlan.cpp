#include "FaultPlan.h"

#include <QRegularExpression>
#include <QStringList>

#include <limits>
#include <tuple>

namespace {

// Why a fault item does not parse; thrown inside the parser only.
struct BadFault
{
    QString why;
};

std::chrono::milliseconds readDuration(const QString &text, const QString &value)
{
    static const QRegularExpression pattern(QStringLiteral("^(\\d{1,9})(ms|s)?$"));
    const QRegularExpressionMatch match = pattern.match(text.trimmed());
    if (!match.hasMatch())
        throw BadFault{QStringLiteral("bad duration \"%1\"").arg(value)};
    const qint64 amount = match.captured(1).toLongLong();
    return std::chrono::milliseconds(match.captured(2) == QLatin1String("s") ? amount * 1000
                                                                             : amount);
}

std::optional<double> readProbability(const QString &text)
{
    bool ok = false;
    const double value = text.trimmed().toDouble(&ok);
    if (!ok || !(value >= 0.0 && value <= 1.0))
        return std::nullopt;
    return value;
}

// The request numbers a selector names: a command (empty: any), and the
// numbers first..last (first 0: every request).
struct Selection
{
    QString command;
    quint64 first = 0;
    quint64 last = 0;
};

Selection readSelector(const QString &selector)
{
    static const QRegularExpression numbers(QStringLiteral("^(\\d+)(?:(\\+)|-(\\d+))?$"));
    static const QRegularExpression command(QStringLiteral("^([A-Za-z]\\w*)(?:#(\\d+))?$"));
    const QRegularExpressionMatch byNumber = numbers.match(selector);
    const QRegularExpressionMatch byCommand = command.match(selector);
    Selection selection;
    if (byNumber.hasMatch()) {
        selection.first = byNumber.captured(1).toULongLong();
        selection.last = byNumber.hasCaptured(2)   ? std::numeric_limits<quint64>::max()
                         : byNumber.hasCaptured(3) ? byNumber.captured(3).toULongLong()
                                                   : selection.first;
    } else if (byCommand.hasMatch()) {
        selection.command = byCommand.captured(1);
        if (byCommand.hasCaptured(2))
            selection.first = selection.last = byCommand.captured(2).toULongLong();
    } else {
        throw BadFault{QStringLiteral("bad selector \"%1\"").arg(selector)};
    }
    if (selection.first == 0 && (byNumber.hasMatch() || byCommand.hasCaptured(2)))
        throw BadFault{QStringLiteral("requests are counted from 1")};
    if (selection.last < selection.first)
        throw BadFault{QStringLiteral("empty range")};
    return selection;
}

// "50ms", "2s", "50" or a range "10-80ms", whose upper bound's unit applies
// to both.
std::pair<std::chrono::milliseconds, std::chrono::milliseconds> readLatency(const QString &value)
{
    const QStringList bounds = value.split(QLatin1Char('-'));
    if (value.isEmpty() || bounds.size() > 2)
        throw BadFault{QStringLiteral("latency needs a duration such as 50ms or 10-80ms")};
    QString low = bounds.front();
    const QString &high = bounds.back();
    if (bounds.size() == 2 && !low.endsWith(QLatin1Char('s')))
        low += high.endsWith(QLatin1String("ms")) ? QStringLiteral("ms")
               : high.endsWith(QLatin1Char('s'))  ? QStringLiteral("s")
                                                  : QString();
    const auto least = readDuration(low, value);
    const auto most = readDuration(high, value);
    if (most < least)
        throw BadFault{QStringLiteral("bad duration \"%1\"").arg(value)};
    return {least, most};
}

} // namespace

QString FaultDecision::describe() const
{
    QStringList parts;
    if (refuse)
        parts << QStringLiteral("refuse");
    if (fail)
        parts << QStringLiteral("fail");
    if (code)
        parts << QStringLiteral("code:%1").arg(*code);
    if (drop)
        parts << QStringLiteral("drop");
    if (latency.count() > 0)
        parts << QStringLiteral("latency:%1ms").arg(latency.count());
    if (reorder)
        parts << QStringLiteral("reorder");
    return parts.join(QLatin1Char(' '));
}

std::optional<QString> FaultPlan::parse(const QString &text)
{
    m_rules.clear();
    for (const QString &item : text.split(QLatin1Char(','), Qt::SkipEmptyParts)) {
        try {
            m_rules.push_back(readRule(item.trimmed()));
        } catch (const BadFault &fault) {
            m_rules.clear();
            return QStringLiteral("fault \"%1\": %2").arg(item.trimmed(), fault.why);
        }
    }
    return std::nullopt;
}

FaultPlan::Rule FaultPlan::readRule(const QString &item)
{
    const qsizetype equals = item.indexOf(QLatin1Char('='));
    const QString head = equals < 0 ? item : item.left(equals);
    const QString value = equals < 0 ? QString() : item.mid(equals + 1).trimmed();
    const qsizetype at = head.indexOf(QLatin1Char('@'));
    const QString kind = (at < 0 ? head : head.left(at)).trimmed();

    static const QHash<QString, Kind> kinds = {
        {QStringLiteral("latency"), Kind::Latency}, {QStringLiteral("refuse"), Kind::Refuse},
        {QStringLiteral("fail"), Kind::Fail},       {QStringLiteral("drop"), Kind::Drop},
        {QStringLiteral("code"), Kind::Code},       {QStringLiteral("reorder"), Kind::Reorder}};
    if (!kinds.contains(kind))
        throw BadFault{QStringLiteral("unknown kind \"%1\"").arg(kind)};
    Rule rule;
    rule.kind = kinds.value(kind);
    if (at >= 0) {
        const Selection selection = readSelector(head.mid(at + 1).trimmed());
        rule.command = selection.command;
        rule.first = selection.first;
        rule.last = selection.last;
    }
    if (rule.kind == Kind::Latency) {
        std::tie(rule.minLatency, rule.maxLatency) = readLatency(value);
    } else if (rule.kind == Kind::Code) {
        const qsizetype colon = value.indexOf(QLatin1Char(':'));
        rule.code = (colon < 0 ? value : value.mid(colon + 1)).trimmed();
        if (colon >= 0) {
            const std::optional<double> probability = readProbability(value.left(colon));
            if (!probability)
                throw BadFault{QStringLiteral("bad probability")};
            rule.probability = *probability;
        }
        static const QRegularExpression codePattern(QStringLiteral("^-?\\d+$"));
        if (!codePattern.match(rule.code).hasMatch() || rule.code == QLatin1String("0"))
            throw BadFault{QStringLiteral("code needs a non-zero number: code=7 or code=0.1:7")};
    } else if (!value.isEmpty()) {
        const std::optional<double> probability = readProbability(value);
        if (!probability)
            throw BadFault{QStringLiteral("bad probability \"%1\"").arg(value)};
        rule.probability = *probability;
    }
    return rule;
}

double FaultPlan::draw()
{
    return static_cast<double>(m_random() >> 11) * 0x1.0p-53;
}

bool FaultPlan::hits(const Rule &rule, const QString &command, quint64 request, quint64 ofCommand)
{
    if (!rule.command.isEmpty() && rule.command != command)
        return false;
    const quint64 number = rule.command.isEmpty() ? request : ofCommand;
    if (rule.first != 0 && (number < rule.first || number > rule.last))
        return false;
    return rule.probability >= 1.0 || draw() < rule.probability;
}

std::chrono::milliseconds FaultPlan::drawLatency(const Rule &rule)
{
    const auto span = (rule.maxLatency - rule.minLatency).count();
    if (span <= 0)
        return rule.minLatency;
    return rule.minLatency +
           std::chrono::milliseconds(static_cast<qint64>(draw() * static_cast<double>(span + 1)));
}

FaultDecision FaultPlan::decide(const QString &command)
{
    FaultDecision decision;
    const quint64 request = ++m_requests;
    const quint64 ofCommand = ++m_requestsPerCommand[command];
    for (const Rule &rule : m_rules) {
        if (!hits(rule, command, request, ofCommand))
            continue;
        switch (rule.kind) {
        case Kind::Latency:
            decision.latency += drawLatency(rule);
            break;
        case Kind::Refuse:
            decision.refuse = true;
            break;
        case Kind::Fail:
            decision.fail = true;
            break;
        case Kind::Drop:
            decision.drop = true;
            break;
        case Kind::Code:
            if (!decision.code)
                decision.code = rule.code;
            break;
        case Kind::Reorder:
            decision.reorder = true;
            break;
        }
    }
    return decision;
}
