#include "TraceOutput.h"

#include <QByteArray>

void sendTraceToStandardError(int level)
{
    qputenv("QIRNLOG_FILE", QByteArrayLiteral("-"));
    qputenv("QIRNLOG_LEVEL", QByteArray::number(level));
}
