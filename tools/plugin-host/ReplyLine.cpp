#include "ReplyLine.h"

#include "JsonValues.h"

QByteArray replyLine(const QString &command, const ReplyCollector::Reply &reply)
{
    using JsonValues::compact;
    QByteArray line;
    line += "{\"command\": " + compact(command);
    line += ", \"flag\": " + compact(reply.flag);
    line += ", \"code\": " + compact(reply.code);
    line += ", \"text\": " + compact(reply.text);
    line += ", \"data\": " + compact(JsonValues::fromReplyData(reply.data));
    line += '}';
    return line;
}
