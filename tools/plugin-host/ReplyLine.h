#pragma once

#include "ReplyCollector.h"

#include <QByteArray>
#include <QString>

// The line plugin-host prints for one reply, keys in this order:
// {"command": NAME, "flag": B, "code": C, "text": T, "data": D}
QByteArray replyLine(const QString &command, const ReplyCollector::Reply &reply);
