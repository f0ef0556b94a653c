#include "FaultPlan.h"

#include <QRegularExpression>
#include <QStringList>

#include <limits>

namespace {

bool parseDuration(const QString &text, std::chrono::milliseconds *duration)
{
    static const QRegularExpression pattern(QStringLiteral("^(\\d{1,9})(ms|s)?$"));
    const QRegularExpressionMatch match = pattern.match(text.trimmed());
    if (!match.hasMatch())
        return false;
    const qint64 amount = match.captured(1).toLongLong();
    *duration =
        std::chrono::milliseconds(match.captured(2) == QLatin1String("s") ? amount * 1000 : amount);
    return true;
}

bool parseProbability(const QString &text, double *probability)
{
    bool ok = false;
    const double value = text.trimmed().toDouble(&ok);
    if (!ok || !(value >= 0.0 && value <= 1.0))
        return false;
    *probability = value;
    return true;
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

bool FaultPlan::parse(const QString &text, QString *error)
{
    m_rules.clear();
    for (const QString &item : text.split(QLatin1Char(','), Qt::SkipEmptyParts)) {
        if (!parseItem(item.trimmed(), error)) {
            m_rules.clear();
            return false;
        }
    }
    return true;
}

bool FaultPlan::parseItem(const QString &item, QString *error)
{
    const auto fail = [&](const QString &why) {
        if (error)
            *error = QStringLiteral("fault \"%1\": %2").arg(item, why);
        return false;
    };
    const qsizetype equals = item.indexOf(QLatin1Char('='));
    const QString head = equals < 0 ? item : item.left(equals);
    const QString value = equals < 0 ? QString() : item.mid(equals + 1).trimmed();
    const qsizetype at = head.indexOf(QLatin1Char('@'));
    const QString kind = (at < 0 ? head : head.left(at)).trimmed();
    const QString selector = at < 0 ? QString() : head.mid(at + 1).trimmed();

    Rule rule;
    static const QHash<QString, Kind> kinds = {
        {QStringLiteral("latency"), Kind::Latency}, {QStringLiteral("refuse"), Kind::Refuse},
        {QStringLiteral("fail"), Kind::Fail},       {QStringLiteral("drop"), Kind::Drop},
        {QStringLiteral("code"), Kind::Code},       {QStringLiteral("reorder"), Kind::Reorder}};
    if (!kinds.contains(kind))
        return fail(QStringLiteral("unknown kind \"%1\"").arg(kind));
    rule.kind = kinds.value(kind);

    if (at >= 0) {
        static const QRegularExpression numbers(QStringLiteral("^(\\d+)(?:(\\+)|-(\\d+))?$"));
        static const QRegularExpression command(QStringLiteral("^([A-Za-z]\\w*)(?:#(\\d+))?$"));
        const QRegularExpressionMatch byNumber = numbers.match(selector);
        const QRegularExpressionMatch byCommand = command.match(selector);
        if (byNumber.hasMatch()) {
            rule.first = byNumber.captured(1).toULongLong();
            rule.last = byNumber.hasCaptured(2)   ? std::numeric_limits<quint64>::max()
                        : byNumber.hasCaptured(3) ? byNumber.captured(3).toULongLong()
                                                  : rule.first;
        } else if (byCommand.hasMatch()) {
            rule.command = byCommand.captured(1);
            if (byCommand.hasCaptured(2))
                rule.first = rule.last = byCommand.captured(2).toULongLong();
        } else {
            return fail(QStringLiteral("bad selector \"%1\"").arg(selector));
        }
        if (rule.first == 0 && (byNumber.hasMatch() || byCommand.hasCaptured(2)))
            return fail(QStringLiteral("requests are counted from 1"));
        if (rule.last < rule.first)
            return fail(QStringLiteral("empty range"));
    }

    switch (rule.kind) {
    case Kind::Latency: {
        const QStringList bounds = value.split(QLatin1Char('-'));
        if (value.isEmpty() || bounds.size() > 2)
            return fail(QStringLiteral("latency needs a duration such as 50ms or 10-80ms"));
        QString low = bounds.front();
        const QString high = bounds.back();
        // "10-80ms": the unit of the upper bound applies to both.
        if (bounds.size() == 2 && !low.endsWith(QLatin1Char('s')))
            low += high.endsWith(QLatin1String("ms")) ? QStringLiteral("ms")
                   : high.endsWith(QLatin1Char('s'))  ? QStringLiteral("s")
                                                      : QString();
        if (!parseDuration(low, &rule.minLatency) || !parseDuration(high, &rule.maxLatency) ||
            rule.maxLatency < rule.minLatency)
            return fail(QStringLiteral("bad duration \"%1\"").arg(value));
        break;
    }
    case Kind::Code: {
        const qsizetype colon = value.indexOf(QLatin1Char(':'));
        rule.code = (colon < 0 ? value : value.mid(colon + 1)).trimmed();
        if (colon >= 0 && !parseProbability(value.left(colon), &rule.probability))
            return fail(QStringLiteral("bad probability"));
        static const QRegularExpression codePattern(QStringLiteral("^-?\\d+$"));
        if (!codePattern.match(rule.code).hasMatch() || rule.code == QLatin1String("0"))
            return fail(QStringLiteral("code needs a non-zero number: code=7 or code=0.1:7"));
        break;
    }
    default:
        if (!value.isEmpty() && !parseProbability(value, &rule.probability))
            return fail(QStringLiteral("bad probability \"%1\"").arg(value));
        break;
    }
    m_rules.push_back(rule);
    return true;
}

double FaultPlan::draw()
{
    return static_cast<double>(m_random() >> 11) * 0x1.0p-53;
}

FaultDecision FaultPlan::decide(const QString &command)
{
    FaultDecision decision;
    const quint64 request = ++m_requests;
    const quint64 ofCommand = ++m_requestsPerCommand[command];
    for (const Rule &rule : m_rules) {
        if (!rule.command.isEmpty() && rule.command != command)
            continue;
        const quint64 number = rule.command.isEmpty() ? request : ofCommand;
        if (rule.first != 0 && (number < rule.first || number > rule.last))
            continue;
        if (rule.probability < 1.0 && !(draw() < rule.probability))
            continue;
        switch (rule.kind) {
        case Kind::Latency: {
            const auto span = (rule.maxLatency - rule.minLatency).count();
            decision.latency += rule.minLatency;
            if (span > 0)
                decision.latency += std::chrono::milliseconds(
                    static_cast<qint64>(draw() * static_cast<double>(span + 1)));
            break;
        }
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
