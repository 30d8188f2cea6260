#include "tools/demo/LogWriter.h"

#include "tools/demo/CallFactory.h"

namespace orvanta::demo {
namespace {

QVariant textOrNull(const QString& s) { return s.isEmpty() ? QVariant() : QVariant(s); }

} // namespace

LogWriter::LogWriter(FbAttachment& attachment, FbTransaction& transaction)
    : m_insert(attachment, &transaction,
               QStringLiteral("INSERT INTO LOG (SERVICE, FROMPHONE, FROMBEZ, FROMSUBB, ONMSN, ONBEZ, STATUS, "
                              "TSDATE, TSTIME, TS, CID, BEMERK, CTYPE, CTIME, CCHARGE, ABID, REGION, FROM2, "
                              "FROMANSCHLUSS, NTYPE, NPLAN, PRESENT, B1, B2, B3) VALUES (:SERVICE, :FROMPHONE, "
                              ":FROMBEZ, :FROMSUBB, :ONMSN, :ONBEZ, :STATUS, :TSDATE, :TSTIME, :TS, :CID, :BEMERK, "
                              ":CTYPE, :CTIME, :CCHARGE, :ABID, :REGION, :FROM2, :FROMANSCHLUSS, :NTYPE, :NPLAN, "
                              ":PRESENT, :B1, :B2, :B3)"))
{
    m_insert.prepare();
}

void LogWriter::insert(const CallRow& row)
{
    FbStatement& st = m_insert;
    st.setParam(u"SERVICE", row.service);
    st.setParam(u"FROMPHONE", row.fromPhone);
    st.setParam(u"FROMBEZ", row.fromBez);
    st.setParam(u"FROMSUBB", textOrNull(row.fromSubb));
    st.setParam(u"ONMSN", row.onMsn);
    st.setParam(u"ONBEZ", row.onBez);
    st.setParam(u"STATUS", row.status);
    st.setParam(u"TSDATE", row.date);
    st.setParam(u"TSTIME", row.time);
    st.setParam(u"TS", QDateTime(row.date, row.time));
    st.setParam(u"CID", row.cid);
    st.setParam(u"BEMERK", textOrNull(row.bemerk));
    st.setParam(u"CTYPE", row.ctype);
    st.setParam(u"CTIME", row.ctime);
    st.setParamScaled(u"CCHARGE", row.chargeCents, 2);
    st.setParam(u"ABID", row.abid);
    st.setParam(u"REGION", textOrNull(row.region));
    st.setParam(u"FROM2", textOrNull(row.from2));
    st.setParam(u"FROMANSCHLUSS", textOrNull(row.fromAnschluss));
    st.setParam(u"NTYPE", row.ntype);
    st.setParam(u"NPLAN", row.nplan);
    st.setParam(u"PRESENT", row.present);
    st.setParam(u"B1", row.b1);
    st.setParam(u"B2", row.b2);
    st.setParam(u"B3", row.b3);
    st.execute();
}

} // namespace orvanta::demo
