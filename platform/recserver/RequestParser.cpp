#include "RequestParser.h"

#include "XmlCursor.h"

#include <QLatin1String>

#include <algorithm>
#include <functional>
#include <initializer_list>
#include <optional>
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

std::nullopt_t unexpected(XmlCursor &cursor, const QString &parent)
{
    cursor.refuse(ServerCode::BadStructure,
                  QStringLiteral("unexpected <%1> in <%2>").arg(cursor.name(), parent));
    return std::nullopt;
}

std::nullopt_t missing(XmlCursor &cursor, QLatin1String element, QLatin1String parent)
{
    cursor.refuse(ServerCode::BadStructure,
                  QStringLiteral("<%1> missing in <%2>").arg(element, parent));
    return std::nullopt;
}

std::nullopt_t badValue(XmlCursor &cursor, const QString &reason)
{
    cursor.refuse(ServerCode::BadValue, reason);
    return std::nullopt;
}

// The kinds of child element met so far in one element: each may come once.
class Seen
{
public:
    // False, with the refusal recorded, when an element of this kind came before.
    bool first(XmlCursor &cursor, QLatin1String kind)
    {
        if (has(kind))
            return cursor.refuse(ServerCode::BadStructure,
                                 QStringLiteral("<%1> given twice").arg(cursor.name()));
        m_kinds.push_back(kind);
        return true;
    }
    bool has(QLatin1String kind) const
    {
        return std::find(m_kinds.begin(), m_kinds.end(), kind) != m_kinds.end();
    }

private:
    std::vector<QLatin1String> m_kinds;
};

// Moves a value that was read into its field; false when the read was refused.
template <typename T> bool take(std::optional<T> value, T &field)
{
    if (!value)
        return false;
    field = std::move(*value);
    return true;
}

using FieldReader = std::function<bool(XmlCursor &)>;

// Reads the children of the element the cursor stands on, each of one of the
// given kinds and at most once, through its reader. The kinds that came, or
// none at the first refusal.
std::optional<Seen> readFields(XmlCursor &cursor, QLatin1String parent,
                               std::initializer_list<std::pair<QLatin1String, FieldReader>> fields)
{
    Seen seen;
    while (cursor.nextChild()) {
        const auto field = std::find_if(fields.begin(), fields.end(),
                                        [&](const auto &f) { return cursor.name() == f.first; });
        if (field == fields.end())
            return unexpected(cursor, parent);
        if (!seen.first(cursor, field->first) || !field->second(cursor))
            return std::nullopt;
    }
    if (cursor.refused())
        return std::nullopt;
    return seen;
}

// readFields for the body's root, which must be the expected one.
std::optional<Seen> readRoot(XmlCursor &cursor, QLatin1String root,
                             std::initializer_list<std::pair<QLatin1String, FieldReader>> fields)
{
    if (!enterRoot(cursor, root))
        return std::nullopt;
    return readFields(cursor, root, fields);
}

// The request the body makes, or the first reason to refuse the body.
template <typename T> Result<T> resultOf(XmlCursor &cursor, std::optional<T> value)
{
    Refusal refusal = cursor.finish();
    if (refusal.refused())
        return refusal;
    return std::move(*value);
}

std::optional<Camera> readCamera(XmlCursor &cursor)
{
    Camera camera;
    Seen seen;
    while (cursor.nextChild()) {
        const QString element = cursor.name();
        if (element == kName) {
            if (!seen.first(cursor, kName) || !take(cursor.readText(), camera.name))
                return std::nullopt;
            if (camera.name.trimmed().isEmpty())
                return badValue(cursor, QStringLiteral("empty camera name"));
        } else if (element == kRecGrpId || element == kGrpId) {
            if (!seen.first(cursor, kRecGrpId) || !take(cursor.readInteger(), camera.group))
                return std::nullopt;
            if (camera.group < 0)
                return badValue(cursor, QStringLiteral("negative recording group"));
        } else {
            return unexpected(cursor, kCam);
        }
    }
    if (cursor.refused())
        return std::nullopt;
    if (!seen.has(kName))
        return missing(cursor, kName, kCam);
    if (!seen.has(kRecGrpId))
        return missing(cursor, kRecGrpId, kCam);
    return camera;
}

std::optional<std::vector<Camera>> readCameraList(XmlCursor &cursor)
{
    std::vector<Camera> cameras;
    while (cursor.nextChild()) {
        if (cursor.name() != kCam)
            return unexpected(cursor, kCamList);
        std::optional<Camera> camera = readCamera(cursor);
        if (!camera)
            return std::nullopt;
        cameras.push_back(std::move(*camera));
    }
    if (cursor.refused())
        return std::nullopt;
    return cameras;
}

enum class IdFields { Required, Optional };

// Reads the children of a <Tmcard> element, the cursor standing on it.
std::optional<Timecard> readTimecard(XmlCursor &cursor, IdFields idFields)
{
    Timecard card;
    const std::optional<Seen> seen = readFields(
        cursor, kTmcard,
        {{kRevision, [&](XmlCursor &c) { return take(c.readInteger(), card.revision); }},
         {kTmcardId, [&](XmlCursor &c) { return take(c.readInteger(), card.id); }},
         {kName, [&](XmlCursor &c) { return take(c.readText(), card.name); }},
         {kMapping, [&](XmlCursor &c) { return take(c.copyContent(), card.mapping); }},
         {kCamList, [&](XmlCursor &c) { return take(readCameraList(c), card.cameras); }}});
    if (!seen)
        return std::nullopt;
    if (idFields == IdFields::Required && !seen->has(kRevision))
        return missing(cursor, kRevision, kTmcard);
    if (idFields == IdFields::Required && !seen->has(kTmcardId))
        return missing(cursor, kTmcardId, kTmcard);
    if (!seen->has(kName))
        return missing(cursor, kName, kTmcard);
    if (!seen->has(kMapping))
        return missing(cursor, kMapping, kTmcard);
    return card;
}

// A body whose root holds exactly one <Tmcard>.
Result<Timecard> parseTimecardBody(const QString &body, QLatin1String root, IdFields idFields)
{
    XmlCursor cursor(body);
    std::optional<Timecard> card;
    if (enterRoot(cursor, root)) {
        Seen seen;
        while (cursor.nextChild()) {
            if (cursor.name() != kTmcard) {
                unexpected(cursor, root);
                break;
            }
            if (!seen.first(cursor, kTmcard) || !(card = readTimecard(cursor, idFields)))
                break;
        }
        if (!cursor.refused() && !card)
            missing(cursor, kTmcard, root);
    }
    return resultOf(cursor, std::move(card));
}

// "true" (any letter case) or "1"; anything else is refused.
bool readAllFlag(XmlCursor &cursor)
{
    const std::optional<QString> text = cursor.readText();
    if (!text)
        return false;
    const QString word = text->trimmed();
    if (word.compare(QLatin1String("true"), Qt::CaseInsensitive) != 0 && word != QLatin1String("1"))
        return cursor.refuse(ServerCode::BadValue, QStringLiteral("<TmcardAll> other than true"));
    return true;
}

} // namespace

Result<ReadRequest> parseReadRequest(const QString &body)
{
    static const QLatin1String all("TmcardAll");
    XmlCursor cursor(body);
    ReadRequest request;
    const std::optional<Seen> seen =
        readRoot(cursor, QLatin1String("GetRecTmcard"),
                 {{all, [&](XmlCursor &c) { return request.all = readAllFlag(c); }},
                  {kTmcardId, [&](XmlCursor &c) { return take(c.readInteger(), request.id); }}});
    if (seen && seen->has(all) == seen->has(kTmcardId))
        cursor.refuse(ServerCode::BadStructure,
                      QStringLiteral("either <TmcardAll> or <TmcardID> is needed"));
    return resultOf(cursor, std::optional<ReadRequest>(request));
}

Result<Timecard> parseInsertRequest(const QString &body)
{
    return parseTimecardBody(body, QLatin1String("InsRecTmcard"), IdFields::Optional);
}

Result<Timecard> parseUpdateRequest(const QString &body)
{
    return parseTimecardBody(body, QLatin1String("UpdRecTmcard"), IdFields::Required);
}

Result<DeleteRequest> parseDeleteRequest(const QString &body)
{
    static const QLatin1String root("DelTmcard");
    XmlCursor cursor(body);
    DeleteRequest request;
    const auto integer = [](qint64 &field) {
        return [&field](XmlCursor &c) { return take(c.readInteger(), field); };
    };
    const std::optional<Seen> seen = readRoot(
        cursor, root, {{kRevision, integer(request.revision)}, {kTmcardId, integer(request.id)}});
    for (const QLatin1String required : {kRevision, kTmcardId}) {
        if (seen && !seen->has(required) && !cursor.refused())
            missing(cursor, required, root);
    }
    return resultOf(cursor, std::optional<DeleteRequest>(request));
}

Result<std::vector<Timecard>> parseTimecardList(const QString &document)
{
    static const QLatin1String root("GetRecTmcardRes");
    XmlCursor cursor(document);
    std::vector<Timecard> cards;
    std::unordered_set<qint64> ids;
    if (enterRoot(cursor, root)) {
        while (cursor.nextChild()) {
            if (cursor.name() != kTmcard) {
                unexpected(cursor, root);
                break;
            }
            std::optional<Timecard> card = readTimecard(cursor, IdFields::Required);
            if (!card)
                break;
            if (card->id <= 0) {
                badValue(cursor,
                         QStringLiteral("time card identifier %1 is not positive").arg(card->id));
                break;
            }
            if (card->id > kMaxTimecardId) {
                badValue(cursor, QStringLiteral("time card identifier %1 is beyond %2")
                                     .arg(card->id)
                                     .arg(kMaxTimecardId));
                break;
            }
            if (!ids.insert(card->id).second) {
                badValue(cursor, QStringLiteral("time card %1 given twice").arg(card->id));
                break;
            }
            cards.push_back(std::move(*card));
        }
    }
    return resultOf(cursor, std::optional<std::vector<Timecard>>(std::move(cards)));
}
