#include "RequestParser.h"

#include "XmlCursor.h"

#include <QLatin1String>

#include <unordered_set>

namespace {

const QLatin1String kRevision("Revision");
const QLatin1String kTmcardId("TmcardID");
const QLatin1String kName("Name");
const QLatin1String kMapping("Mapping");
const QLatin1String kCamList("CamList");
const QLatin1String kCam("Cam");
const QLatin1String kRecGrpId("RecGrpID");
const QLatin1String kGrpId("GrpID");
const QLatin1String kTmcard("Tmcard");

bool enterRoot(XmlCursor &cursor, QLatin1String expected)
{
    if (!cursor.enterRoot())
        return false;
    if (cursor.name() != expected)
        return cursor.refuse(
            ServerCode::WrongRoot,
            QStringLiteral("root <%1> where <%2> belongs").arg(cursor.name(), expected));
    return true;
}

bool duplicate(XmlCursor &cursor, bool *seen)
{
    if (*seen)
        return !cursor.refuse(ServerCode::BadStructure,
                              QStringLiteral("<%1> given twice").arg(cursor.name()));
    *seen = true;
    return false;
}

bool unexpected(XmlCursor &cursor, const QString &parent)
{
    return cursor.refuse(ServerCode::BadStructure,
                         QStringLiteral("unexpected <%1> in <%2>").arg(cursor.name(), parent));
}

bool missing(XmlCursor &cursor, QLatin1String element, QLatin1String parent)
{
    return cursor.refuse(ServerCode::BadStructure,
                         QStringLiteral("<%1> missing in <%2>").arg(element, parent));
}

bool readCamera(XmlCursor &cursor, Camera *camera)
{
    bool seenName = false;
    bool seenGroup = false;
    while (cursor.nextChild()) {
        const QString element = cursor.name();
        if (element == kName) {
            if (duplicate(cursor, &seenName) || !cursor.readText(&camera->name))
                return false;
            if (camera->name.trimmed().isEmpty())
                return cursor.refuse(ServerCode::BadValue, QStringLiteral("empty camera name"));
        } else if (element == kRecGrpId || element == kGrpId) {
            if (duplicate(cursor, &seenGroup) || !cursor.readInteger(&camera->group))
                return false;
            if (camera->group < 0)
                return cursor.refuse(ServerCode::BadValue,
                                     QStringLiteral("negative recording group"));
        } else {
            return unexpected(cursor, kCam);
        }
    }
    if (cursor.refused())
        return false;
    if (!seenName)
        return missing(cursor, kName, kCam);
    if (!seenGroup)
        return missing(cursor, kRecGrpId, kCam);
    return true;
}

bool readCameraList(XmlCursor &cursor, std::vector<Camera> *cameras)
{
    while (cursor.nextChild()) {
        if (cursor.name() != kCam)
            return unexpected(cursor, kCamList);
        Camera camera;
        if (!readCamera(cursor, &camera))
            return false;
        cameras->push_back(std::move(camera));
    }
    return !cursor.refused();
}

enum class IdFields { Required, Optional };

// Reads the children of a <Tmcard> element, the cursor standing on it.
bool readTimecard(XmlCursor &cursor, Timecard *card, IdFields idFields)
{
    bool seenRevision = false;
    bool seenId = false;
    bool seenName = false;
    bool seenMapping = false;
    bool seenCameras = false;
    while (cursor.nextChild()) {
        const QString element = cursor.name();
        bool read = false;
        if (element == kRevision)
            read = !duplicate(cursor, &seenRevision) && cursor.readInteger(&card->revision);
        else if (element == kTmcardId)
            read = !duplicate(cursor, &seenId) && cursor.readInteger(&card->id);
        else if (element == kName)
            read = !duplicate(cursor, &seenName) && cursor.readText(&card->name);
        else if (element == kMapping)
            read = !duplicate(cursor, &seenMapping) && cursor.copyContent(&card->mapping);
        else if (element == kCamList)
            read = !duplicate(cursor, &seenCameras) && readCameraList(cursor, &card->cameras);
        else
            return unexpected(cursor, kTmcard);
        if (!read)
            return false;
    }
    if (cursor.refused())
        return false;
    if (idFields == IdFields::Required && !seenRevision)
        return missing(cursor, kRevision, kTmcard);
    if (idFields == IdFields::Required && !seenId)
        return missing(cursor, kTmcardId, kTmcard);
    if (!seenName)
        return missing(cursor, kName, kTmcard);
    if (!seenMapping)
        return missing(cursor, kMapping, kTmcard);
    return true;
}

// A body whose root holds exactly one <Tmcard>.
Refusal parseTimecardBody(const QString &body, QLatin1String root, Timecard *card,
                          IdFields idFields)
{
    XmlCursor cursor(body);
    if (enterRoot(cursor, root)) {
        bool seenCard = false;
        while (cursor.nextChild()) {
            if (cursor.name() != kTmcard) {
                unexpected(cursor, root);
                break;
            }
            if (duplicate(cursor, &seenCard) || !readTimecard(cursor, card, idFields))
                break;
        }
        if (!cursor.refused() && !seenCard)
            missing(cursor, kTmcard, root);
    }
    return cursor.finish();
}

} // namespace

Refusal parseReadRequest(const QString &body, ReadRequest *request)
{
    static const QLatin1String root("GetRecTmcard");
    static const QLatin1String all("TmcardAll");
    XmlCursor cursor(body);
    if (enterRoot(cursor, root)) {
        bool seenAll = false;
        bool seenId = false;
        while (cursor.nextChild()) {
            if (cursor.name() == all) {
                QString text;
                if (duplicate(cursor, &seenAll) || !cursor.readText(&text))
                    break;
                const QString word = text.trimmed();
                if (word.compare(QLatin1String("true"), Qt::CaseInsensitive) != 0 &&
                    word != QLatin1String("1")) {
                    cursor.refuse(ServerCode::BadValue,
                                  QStringLiteral("<TmcardAll> other than true"));
                    break;
                }
                request->all = true;
            } else if (cursor.name() == kTmcardId) {
                if (duplicate(cursor, &seenId) || !cursor.readInteger(&request->id))
                    break;
            } else {
                unexpected(cursor, root);
                break;
            }
        }
        if (!cursor.refused() && seenAll == seenId)
            cursor.refuse(ServerCode::BadStructure,
                          QStringLiteral("either <TmcardAll> or <TmcardID> is needed"));
    }
    return cursor.finish();
}

Refusal parseInsertRequest(const QString &body, Timecard *card)
{
    return parseTimecardBody(body, QLatin1String("InsRecTmcard"), card, IdFields::Optional);
}

Refusal parseUpdateRequest(const QString &body, Timecard *card)
{
    return parseTimecardBody(body, QLatin1String("UpdRecTmcard"), card, IdFields::Required);
}

Refusal parseDeleteRequest(const QString &body, DeleteRequest *request)
{
    static const QLatin1String root("DelTmcard");
    XmlCursor cursor(body);
    if (enterRoot(cursor, root)) {
        bool seenRevision = false;
        bool seenId = false;
        while (cursor.nextChild()) {
            bool read = false;
            if (cursor.name() == kRevision)
                read = !duplicate(cursor, &seenRevision) && cursor.readInteger(&request->revision);
            else if (cursor.name() == kTmcardId)
                read = !duplicate(cursor, &seenId) && cursor.readInteger(&request->id);
            else
                unexpected(cursor, root);
            if (!read)
                break;
        }
        if (!cursor.refused() && !seenRevision)
            missing(cursor, kRevision, root);
        else if (!cursor.refused() && !seenId)
            missing(cursor, kTmcardId, root);
    }
    return cursor.finish();
}

Refusal parseTimecardList(const QString &document, std::vector<Timecard> *cards)
{
    static const QLatin1String root("GetRecTmcardRes");
    XmlCursor cursor(document);
    std::unordered_set<qint64> ids;
    if (enterRoot(cursor, root)) {
        while (cursor.nextChild()) {
            if (cursor.name() != kTmcard) {
                unexpected(cursor, root);
                break;
            }
            Timecard card;
            if (!readTimecard(cursor, &card, IdFields::Required))
                break;
            if (card.id <= 0) {
                cursor.refuse(
                    ServerCode::BadValue,
                    QStringLiteral("time card identifier %1 is not positive").arg(card.id));
                break;
            }
            if (!ids.insert(card.id).second) {
                cursor.refuse(ServerCode::BadValue,
                              QStringLiteral("time card %1 given twice").arg(card.id));
                break;
            }
            cards->push_back(std::move(card));
        }
    }
    return cursor.finish();
}
