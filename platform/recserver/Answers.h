#pragma once

#include "AnswerLayout.h"
#include "Refusal.h"
#include "Timecard.h"

#include <QString>
#include <QStringView>

#include <initializer_list>
#include <utility>
#include <vector>

// The texts of the server's answers, in a layout.

// An <Error> element with the refusal's code and reason.
ServerAnswer refusalAnswer(const Refusal &refusal, AnswerLayout layout);
// A "GetRecTmcardRes" element holding the time cards.
QString timecardsAnswer(const std::vector<Timecard> &cards, AnswerLayout layout);
// A root element holding one numeric leaf per field, in the order given.
QString fieldsAnswer(QStringView root, std::initializer_list<std::pair<QStringView, qint64>> fields,
                     AnswerLayout layout);
