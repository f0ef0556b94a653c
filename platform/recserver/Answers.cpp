#include "Answers.h"

#include "XmlOut.h"

namespace {

void writeTimecard(XmlOut &out, const Timecard &card)
{
    out.start(u"Tmcard");
    out.leaf(u"Revision", QString::number(card.revision));
    out.leaf(u"TmcardID", QString::number(card.id));
    out.leaf(u"Name", card.name);
    out.start(u"Mapping");
    out.content(card.mapping);
    out.end(u"Mapping");
    if (!card.cameras.empty()) {
        out.start(u"CamList");
        for (const Camera &camera : card.cameras) {
            out.start(u"Cam");
            out.leaf(u"Name", camera.name);
            out.leaf(u"GrpID", QString::number(camera.group));
            out.end(u"Cam");
        }
        out.end(u"CamList");
    }
    out.end(u"Tmcard");
}

} // namespace

ServerAnswer refusalAnswer(const Refusal &refusal, AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    out.start(u"Error");
    out.leaf(u"Code", serverCodeText(refusal.code));
    out.leaf(u"Reason", refusal.reason);
    out.end(u"Error");
    out.finish();
    return {serverCodeText(refusal.code), content};
}

QString timecardsAnswer(const std::vector<Timecard> &cards, AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    // Always a start and an end tag: readers cut the answer at both.
    out.start(u"GetRecTmcardRes");
    for (const Timecard &card : cards)
        writeTimecard(out, card);
    out.end(u"GetRecTmcardRes");
    out.finish();
    return content;
}

QString fieldsAnswer(QStringView root, std::initializer_list<std::pair<QStringView, qint64>> fields,
                     AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    out.start(root);
    for (const auto &field : fields)
        out.leaf(field.first, QString::number(field.second));
    out.end(root);
    out.finish();
    return content;
}
