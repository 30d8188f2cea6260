#include "db/SqlScript.h"

#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbTransaction.h"

#include <QFile>
#include <QRegularExpression>

namespace orvanta {
namespace {

// The statement without comments, for deciding what kind of statement it is.
QString stripComments(QStringView s)
{
    QString out;
    out.reserve(s.size());
    const qsizetype n = s.size();
    for (qsizetype i = 0; i < n;) {
        const QChar c = s[i];
        if (c == QLatin1Char('\'') || c == QLatin1Char('"')) {
            qsizetype j = i + 1;
            while (j < n && !(s[j] == c && !(j + 1 < n && s[j + 1] == c)))
                j += (s[j] == c) ? 2 : 1;
            out.append(s.mid(i, qMin(n, j + 1) - i));
            i = j + 1;
        } else if (c == QLatin1Char('-') && i + 1 < n && s[i + 1] == QLatin1Char('-')) {
            while (i < n && s[i] != QLatin1Char('\n'))
                ++i;
            out.append(QLatin1Char(' '));
        } else if (c == QLatin1Char('/') && i + 1 < n && s[i + 1] == QLatin1Char('*')) {
            const qsizetype end = s.indexOf(QLatin1String("*/"), i + 2);
            i = end < 0 ? n : end + 2;
            out.append(QLatin1Char(' '));
        } else {
            out.append(c);
            ++i;
        }
    }
    return out.simplified();
}

bool isDdl(const QString& upper)
{
    static const char* const words[] = {"CREATE ", "ALTER ", "DROP ", "RECREATE ", "DECLARE ", "GRANT ",
                                        "REVOKE ", "COMMENT ", "CREATE\n"};
    for (const char* w : words)
        if (upper.startsWith(QLatin1String(w)))
            return true;
    return false;
}

// isql's own settings, which are not SQL.
bool isClientSetting(const QString& upper)
{
    static const QRegularExpression re(
        QStringLiteral("^SET\\s+(SQL\\s+DIALECT|NAMES|AUTODDL|ECHO|LIST|BAIL|STATS|PLAN|COUNT|WARNINGS|HEADING|BLOB|ROWCOUNT|TIME|WIDTH)\\b"));
    return re.match(upper).hasMatch() || upper.startsWith(QLatin1String("CONNECT ")) || upper == QLatin1String("QUIT")
        || upper == QLatin1String("EXIT") || upper.startsWith(QLatin1String("CREATE DATABASE "));
}

} // namespace

QList<SqlScript::Statement> SqlScript::split(QStringView script)
{
    QList<Statement> out;
    QString term = QStringLiteral(";");
    const qsizetype n = script.size();
    qsizetype start = 0;
    qsizetype i = 0;
    int line = 1;
    int startLine = 1;
    static const QRegularExpression setTerm(QStringLiteral("^SET\\s+TERM\\s+(\\S+)\\s*$"),
                                            QRegularExpression::CaseInsensitiveOption);

    auto finish = [&](qsizetype end) {
        const QString raw = script.mid(start, end - start).toString();
        // The statement starts after the blanks and comments in front of it.
        int lead = 0;
        qsizetype k = 0;
        for (;;) {
            while (k < raw.size() && raw[k].isSpace()) {
                if (raw[k] == QLatin1Char('\n'))
                    ++lead;
                ++k;
            }
            if (raw.mid(k, 2) == QLatin1String("--")) {
                while (k < raw.size() && raw[k] != QLatin1Char('\n'))
                    ++k;
            } else if (raw.mid(k, 2) == QLatin1String("/*")) {
                const qsizetype close = raw.indexOf(QLatin1String("*/"), k + 2);
                const qsizetype stop = close < 0 ? raw.size() : close + 2;
                lead += int(QStringView(raw).mid(k, stop - k).count(QLatin1Char('\n')));
                k = stop;
            } else {
                break;
            }
        }
        const QString text = raw.mid(k).trimmed();
        const QString bare = stripComments(text);
        if (!bare.isEmpty()) {
            const auto m = setTerm.match(bare);
            if (m.hasMatch())
                term = m.captured(1);
            else
                out.append({text, startLine + lead});
        }
    };

    while (i < n) {
        const QChar c = script[i];
        if (c == QLatin1Char('\n')) {
            ++line;
            ++i;
        } else if (c == QLatin1Char('\'') || c == QLatin1Char('"')) {
            qsizetype j = i + 1;
            while (j < n) {
                if (script[j] == QLatin1Char('\n'))
                    ++line;
                if (script[j] == c) {
                    if (j + 1 < n && script[j + 1] == c) {
                        j += 2;
                        continue;
                    }
                    break;
                }
                ++j;
            }
            i = j + 1;
        } else if (c == QLatin1Char('-') && i + 1 < n && script[i + 1] == QLatin1Char('-')) {
            while (i < n && script[i] != QLatin1Char('\n'))
                ++i;
        } else if (c == QLatin1Char('/') && i + 1 < n && script[i + 1] == QLatin1Char('*')) {
            qsizetype j = i + 2;
            while (j < n && !(script[j] == QLatin1Char('*') && j + 1 < n && script[j + 1] == QLatin1Char('/'))) {
                if (script[j] == QLatin1Char('\n'))
                    ++line;
                ++j;
            }
            i = qMin(n, j + 2);
        } else if (script.mid(i).startsWith(term, Qt::CaseInsensitive)) {
            finish(i);
            i += term.size();
            start = i;
            startLine = line;
        } else {
            ++i;
        }
    }
    finish(n);
    return out;
}

void SqlScript::run(FbAttachment& db, QStringView script)
{
    const QList<Statement> statements = split(script);
    FbTransaction tx(db, {}, FbTransaction::EndAction::Rollback);
    int number = 0;
    for (const Statement& s : statements) {
        ++number;
        const QString upper = stripComments(s.text).toUpper();
        try {
            if (isClientSetting(upper))
                continue;
            if (upper == QLatin1String("COMMIT") || upper == QLatin1String("COMMIT WORK")) {
                if (tx.isActive())
                    tx.commit();
                continue;
            }
            if (upper == QLatin1String("ROLLBACK") || upper == QLatin1String("ROLLBACK WORK")) {
                if (tx.isActive())
                    tx.rollback();
                continue;
            }
            if (!tx.isActive())
                tx.start();
            db.executeImmediate(s.text, tx);
            if (isDdl(upper))
                tx.commit();
        } catch (const DatabaseError& e) {
            tx.rollbackQuietly();
            const QString head = s.text.left(200).simplified();
            throw DatabaseError(QStringLiteral("Statement %1 (line %2) failed: %3\r\n%4")
                                    .arg(number)
                                    .arg(s.line)
                                    .arg(head, e.message()),
                                e.errorCodes(), e.sqlCode(), s.text);
        }
    }
    if (tx.isActive())
        tx.commit();
}

void SqlScript::runFile(FbAttachment& db, const QString& path)
{
    QFile f(path);
    if (!f.open(QIODevice::ReadOnly))
        throw DatabaseError(QStringLiteral("Cannot read script %1: %2").arg(path, f.errorString()));
    // Scripts are read as UTF-8 when they are valid UTF-8, else as ISO 8859-1 like the database.
    const QByteArray bytes = f.readAll();
    QStringDecoder utf8(QStringDecoder::Utf8, QStringDecoder::Flag::Stateless);
    QString text = utf8.decode(bytes);
    if (utf8.hasError())
        text = QString::fromLatin1(bytes);
    run(db, text);
}

} // namespace orvanta
