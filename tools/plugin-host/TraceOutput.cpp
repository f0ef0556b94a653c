#include "TraceOutput.h"

#include <QByteArray>

void sendTraceToStandardError(int level)
{
    qputenv("QIRNLOG_FILE", QByteArrayLiteral("stderr"));
    qputenv("QIRNLOG_LEVEL", QByteArray::number(level));
}
