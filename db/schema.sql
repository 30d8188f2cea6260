/*
  Orvanta call database: Firebird 3, SQL dialect 3, default character set ISO8859_1.

  The script creates the objects of an empty database; the database itself is created by the
  caller (orvanta-createdb, the test helper or isql with a CREATE DATABASE line in front).

  Keys: every table has an integer key LID drawn from its own generator. A before-insert trigger
  assigns it when the inserting program leaves it null or 0, so the call monitor may insert LOG
  rows without a key; the procedures rely on the same triggers.

  Change states of the synchronising procedures (STAT, STATUS):
    0 unchanged  - nothing to do, unless the key is 0: an entry that never reached the database
                   (a save that was rolled back and is now retried) is inserted
    1 new        - insert; the key passed in is ignored, the generator gives the new one
    2 changed    - update the row with the key; key 0 inserts as for 0; a key that does not
                   exist or belongs to another contact fails
    3 deleted    - delete the row with the key; key 0 or an already deleted row is a no-op
  Result codes of the synchronising procedures and of P_CONT_EDIT:
    0 done, 1 unknown change state, 2 contact not found, 3 entry not found for this contact.
*/

/* ---------------------------------------------------------------- generators */

CREATE GENERATOR GEN_LOG_ID;
CREATE GENERATOR GEN_CONTACT_ID;
CREATE GENERATOR GEN_COM_ID;
CREATE GENERATOR GEN_E_MAIL_ID;
CREATE GENERATOR GEN_KAT_ID;
CREATE GENERATOR GEN_CONKAT_ID;
CREATE GENERATOR GEN_ADDR_ID;
-- Counters of the changes to LOG, kept by its triggers: the log list re-reads only the new calls
-- when no row changed or went away since it read the log, and the inserts counted match the new
-- rows it finds. Generators, as they count outside transactions and never conflict.
CREATE GENERATOR GEN_LOG_INSERTS;
CREATE GENERATOR GEN_LOG_CHANGES;

/* ---------------------------------------------------------------- tables */

-- One row per call, written by the call monitor.
CREATE TABLE LOG (
    LID            INTEGER NOT NULL,
    SERVICE        INTEGER,
    FROMPHONE      VARCHAR(25),
    FROMBEZ        VARCHAR(80),
    FROMSUBB       VARCHAR(25),
    ONMSN          VARCHAR(25),
    ONBEZ          VARCHAR(30),
    STATUS         VARCHAR(40),
    TSDATE         DATE,
    TSTIME         TIME,
    TS             TIMESTAMP,
    CID            INTEGER DEFAULT 0 NOT NULL,
    BEMERK         VARCHAR(50),
    CTYPE          SMALLINT DEFAULT 0 NOT NULL,
    CTIME          TIME DEFAULT '00:00:00' NOT NULL,
    CCHARGE        NUMERIC(15,2) DEFAULT 0 NOT NULL,
    ABID           INTEGER DEFAULT 0 NOT NULL,
    REGION         VARCHAR(35),
    FROM2          VARCHAR(25),
    FROMANSCHLUSS  VARCHAR(30),
    NTYPE          SMALLINT,
    NPLAN          SMALLINT,
    PRESENT        SMALLINT,
    B1             SMALLINT,
    B2             SMALLINT,
    B3             SMALLINT,
    CONSTRAINT PK_LOG PRIMARY KEY (LID)
);

CREATE INDEX IX_LOG_TSDATE ON LOG (TSDATE);
-- The printed log runs in date and time order: with this index its first page needs no sort of
-- the whole log.
CREATE INDEX IX_LOG_TSDATE_TSTIME ON LOG (TSDATE, TSTIME);
-- The log list reads the newest calls first: with this index they come without a sort of the
-- whole log.
CREATE DESCENDING INDEX IX_LOG_TSDATE_TSTIME_DESC ON LOG (TSDATE, TSTIME);
CREATE INDEX IX_LOG_FROMPHONE ON LOG (FROMPHONE);
CREATE INDEX IX_LOG_FROMSUBB ON LOG (FROMSUBB);
CREATE INDEX IX_LOG_CID ON LOG (CID);

-- Address book.
CREATE TABLE CONTACT (
    LID        INTEGER NOT NULL,
    ANREDE     VARCHAR(30),
    TITEL      VARCHAR(25),
    NAME       VARCHAR(30),
    VNAME      VARCHAR(30),
    FIRMA      VARCHAR(50),
    CONTBEZ    VARCHAR(80),
    WEBSITE    VARCHAR(50),
    ABTEILUNG  VARCHAR(35),
    NOTIZ      BLOB SUB_TYPE TEXT,
    CONSTRAINT PK_CONTACT PRIMARY KEY (LID)
);

CREATE INDEX IX_CONTACT_CONTBEZ ON CONTACT (CONTBEZ);

-- Postal address, at most one per contact.
CREATE TABLE ADDR (
    LID         INTEGER NOT NULL,
    CID         INTEGER NOT NULL,
    STR         VARCHAR(40),
    PLZ         VARCHAR(10),
    ORT         VARCHAR(35),
    ZUSATZ      VARCHAR(30),
    LAND        VARCHAR(30),
    BUNDESLAND  VARCHAR(30),
    CONSTRAINT PK_ADDR PRIMARY KEY (LID),
    CONSTRAINT UQ_ADDR_CID UNIQUE (CID),
    CONSTRAINT FK_ADDR_CONTACT FOREIGN KEY (CID) REFERENCES CONTACT (LID) ON DELETE CASCADE
);

-- Telephone numbers of contacts; NUMBEROF, VORWNUMBER and LCVORWNUMBER hold digits only,
-- without leading zeros, and are what callers' numbers are matched against.
CREATE TABLE COM (
    LID           INTEGER NOT NULL,
    CID           INTEGER NOT NULL,
    KOMMBEZ       VARCHAR(20),
    LC            VARCHAR(5),
    VORW          VARCHAR(10),
    NUMBER        VARCHAR(15) DEFAULT '' NOT NULL,
    VORWNUMBER    VARCHAR(25),
    LCVORWNUMBER  VARCHAR(30),
    BEMERKUNG     VARCHAR(40),
    AUTOREJECT    SMALLINT DEFAULT 0 NOT NULL,
    NUMBEROF      VARCHAR(15),
    CONSTRAINT PK_COM PRIMARY KEY (LID),
    CONSTRAINT FK_COM_CONTACT FOREIGN KEY (CID) REFERENCES CONTACT (LID) ON DELETE CASCADE
);

CREATE INDEX IX_COM_NUMBEROF ON COM (NUMBEROF);
CREATE INDEX IX_COM_VORWNUMBER ON COM (VORWNUMBER);
CREATE INDEX IX_COM_LCVORWNUMBER ON COM (LCVORWNUMBER);

-- E-mail addresses of contacts.
CREATE TABLE E_MAIL (
    LID       INTEGER NOT NULL,
    CID       INTEGER NOT NULL,
    MAILADDR  VARCHAR(40),
    BEMERK    VARCHAR(40),
    CONSTRAINT PK_E_MAIL PRIMARY KEY (LID),
    CONSTRAINT FK_E_MAIL_CONTACT FOREIGN KEY (CID) REFERENCES CONTACT (LID) ON DELETE CASCADE
);

-- Categories; names are unique regardless of case.
CREATE TABLE KAT (
    LID        INTEGER NOT NULL,
    KATBEZ     VARCHAR(30) NOT NULL,
    BEMERKUNG  VARCHAR(40),
    CONSTRAINT PK_KAT PRIMARY KEY (LID)
);

CREATE UNIQUE INDEX UX_KAT_KATBEZ ON KAT COMPUTED BY (UPPER(KATBEZ));

-- Category of a contact, at most one per contact.
CREATE TABLE CONKAT (
    LID  INTEGER NOT NULL,
    CID  INTEGER NOT NULL,
    KID  INTEGER NOT NULL,
    CONSTRAINT PK_CONKAT PRIMARY KEY (LID),
    CONSTRAINT UQ_CONKAT_CID UNIQUE (CID),
    CONSTRAINT FK_CONKAT_CONTACT FOREIGN KEY (CID) REFERENCES CONTACT (LID) ON DELETE CASCADE,
    CONSTRAINT FK_CONKAT_KAT FOREIGN KEY (KID) REFERENCES KAT (LID) ON DELETE CASCADE
);

CREATE INDEX IX_CONKAT_KID ON CONKAT (KID);

/* ---------------------------------------------------------------- triggers */

SET TERM ^ ;

-- The monitor may leave out the key and the not-null columns, or send them as null.
CREATE TRIGGER LOG_BI FOR LOG ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_LOG_ID;
    IF (NEW.CID IS NULL) THEN NEW.CID = 0;
    IF (NEW.CTYPE IS NULL) THEN NEW.CTYPE = 0;
    IF (NEW.CTIME IS NULL) THEN NEW.CTIME = '00:00:00';
    IF (NEW.CCHARGE IS NULL) THEN NEW.CCHARGE = 0;
    IF (NEW.ABID IS NULL) THEN NEW.ABID = 0;
END^

CREATE TRIGGER LOG_AI FOR LOG ACTIVE AFTER INSERT POSITION 0
AS
DECLARE VARIABLE N BIGINT;
BEGIN
    N = GEN_ID(GEN_LOG_INSERTS, 1);
END^

CREATE TRIGGER LOG_AUD FOR LOG ACTIVE AFTER UPDATE OR DELETE POSITION 0
AS
DECLARE VARIABLE N BIGINT;
BEGIN
    N = GEN_ID(GEN_LOG_CHANGES, 1);
END^

CREATE TRIGGER CONTACT_BI FOR CONTACT ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_CONTACT_ID;
END^

CREATE TRIGGER ADDR_BI FOR ADDR ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_ADDR_ID;
END^

CREATE TRIGGER COM_BI FOR COM ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_COM_ID;
    IF (NEW.NUMBER IS NULL) THEN NEW.NUMBER = '';
    IF (NEW.AUTOREJECT IS NULL) THEN NEW.AUTOREJECT = 0;
END^

CREATE TRIGGER E_MAIL_BI FOR E_MAIL ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_E_MAIL_ID;
END^

CREATE TRIGGER KAT_BI FOR KAT ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_KAT_ID;
END^

CREATE TRIGGER CONKAT_BI FOR CONKAT ACTIVE BEFORE INSERT POSITION 0
AS
BEGIN
    IF (NEW.LID IS NULL OR NEW.LID <= 0) THEN
        NEW.LID = NEXT VALUE FOR GEN_CONKAT_ID;
END^

SET TERM ; ^

/* ---------------------------------------------------------------- views */

CREATE VIEW V_SELECT_LIST (LID, CONTBEZ, KATBEZ, STR, PLZ, ORT, ANREDE, TITEL, NAME, VNAME,
                           FIRMA, ZUSATZ, LAND, BUNDESLAND)
AS
SELECT C.LID, C.CONTBEZ, K.KATBEZ, A.STR, A.PLZ, A.ORT, C.ANREDE, C.TITEL, C.NAME, C.VNAME,
       C.FIRMA, A.ZUSATZ, A.LAND, A.BUNDESLAND
FROM CONTACT C
LEFT OUTER JOIN ADDR A ON A.CID = C.LID
LEFT OUTER JOIN CONKAT V ON V.CID = C.LID
LEFT OUTER JOIN KAT K ON K.LID = V.KID;

CREATE VIEW V_SELECT_CARD (LID, CONTBEZ, KATBEZ, STR, PLZ, ORT, ANREDE, TITEL, NAME, VNAME,
                           FIRMA, ZUSATZ, LAND, BUNDESLAND)
AS
SELECT C.LID, C.CONTBEZ, K.KATBEZ, A.STR, A.PLZ, A.ORT, C.ANREDE, C.TITEL, C.NAME, C.VNAME,
       C.FIRMA, A.ZUSATZ, A.LAND, A.BUNDESLAND
FROM CONTACT C
LEFT OUTER JOIN ADDR A ON A.CID = C.LID
LEFT OUTER JOIN CONKAT V ON V.CID = C.LID
LEFT OUTER JOIN KAT K ON K.LID = V.KID;

-- LID is the key of the category link, so the category manager can move or cut it.
CREATE VIEW V_SELECT_CONKAT (LID, CID, KID, CONTBEZ, STR, PLZ, ORT)
AS
SELECT V.LID, V.CID, V.KID, C.CONTBEZ, A.STR, A.PLZ, A.ORT
FROM CONKAT V
JOIN CONTACT C ON C.LID = V.CID
LEFT OUTER JOIN ADDR A ON A.CID = C.LID;

CREATE VIEW V_SELECT_DETAIL (LID, NOTIZ, ANREDE, VNAME, NAME, FIRMA, TITEL, CONTBEZ, WEBSITE,
                             ABTEILUNG, STR, PLZ, ORT, ZUSATZ, LAND, BUNDESLAND, KATBEZ)
AS
SELECT C.LID, C.NOTIZ, C.ANREDE, C.VNAME, C.NAME, C.FIRMA, C.TITEL, C.CONTBEZ, C.WEBSITE,
       C.ABTEILUNG, A.STR, A.PLZ, A.ORT, A.ZUSATZ, A.LAND, A.BUNDESLAND, K.KATBEZ
FROM CONTACT C
LEFT OUTER JOIN ADDR A ON A.CID = C.LID
LEFT OUTER JOIN CONKAT V ON V.CID = C.LID
LEFT OUTER JOIN KAT K ON K.LID = V.KID;

CREATE VIEW V_SELECT_NOTIZ (LID, NOTIZ, CONTBEZ)
AS
SELECT C.LID, C.NOTIZ, C.CONTBEZ
FROM CONTACT C;

/* ---------------------------------------------------------------- routines */

SET TERM ^ ;

-- Digits of a number without its leading zeros: "0049 (0)30 1234" gives "490301234".
-- Empty for null, empty or all-zero input.
CREATE FUNCTION F_NORMALIZE_NUMBER (NR VARCHAR(80))
RETURNS VARCHAR(80)
AS
DECLARE I INTEGER = 1;
DECLARE N INTEGER;
DECLARE CH CHAR(1);
DECLARE RES VARCHAR(80) = '';
BEGIN
    IF (NR IS NULL) THEN
        RETURN '';
    N = CHAR_LENGTH(NR);
    WHILE (I <= N) DO
    BEGIN
        CH = SUBSTRING(NR FROM I FOR 1);
        IF (CH BETWEEN '0' AND '9' AND (CH <> '0' OR RES <> '')) THEN
            RES = RES || CH;
        I = I + 1;
    END
    RETURN RES;
END^

-- Key of the category with that name (any case), null for an empty or unknown name.
CREATE FUNCTION F_KAT_BY_NAME (KATB VARCHAR(30))
RETURNS INTEGER
AS
DECLARE KID INTEGER;
BEGIN
    IF (KATB IS NULL OR TRIM(KATB) = '') THEN
        RETURN NULL;
    SELECT FIRST 1 LID FROM KAT WHERE UPPER(KATBEZ) = UPPER(TRIM(:KATB)) ORDER BY LID
        INTO :KID;
    RETURN KID;
END^

-- Puts the contact into the named category, or into none.
CREATE PROCEDURE P_SET_CONTACT_KAT (CID INTEGER, KATB VARCHAR(30))
AS
DECLARE KID INTEGER;
BEGIN
    KID = F_KAT_BY_NAME(KATB);
    IF (KID IS NULL) THEN
        DELETE FROM CONKAT WHERE CID = :CID;
    ELSE
        UPDATE OR INSERT INTO CONKAT (CID, KID) VALUES (:CID, :KID) MATCHING (CID);
END^

CREATE PROCEDURE P_CONT_INSERT (
    ANR    VARCHAR(30),
    VNA    VARCHAR(30),
    NA     VARCHAR(30),
    FA     VARCHAR(50),
    TIT    VARCHAR(25),
    CONTB  VARCHAR(80),
    WEB    VARCHAR(50),
    ABT    VARCHAR(35),
    KATB   VARCHAR(30),
    ST     VARCHAR(40),
    PL     VARCHAR(10),
    OT     VARCHAR(35),
    ZUSA   VARCHAR(30),
    L      VARCHAR(30),
    BUND   VARCHAR(30),
    TEXT   BLOB SUB_TYPE TEXT)
RETURNS (NEW_LID INTEGER)
AS
BEGIN
    NEW_LID = 0;
    INSERT INTO CONTACT (ANREDE, VNAME, NAME, FIRMA, TITEL, CONTBEZ, WEBSITE, ABTEILUNG, NOTIZ)
        VALUES (:ANR, :VNA, :NA, :FA, :TIT, :CONTB, :WEB, :ABT, :TEXT)
        RETURNING LID INTO :NEW_LID;
    INSERT INTO ADDR (CID, STR, PLZ, ORT, ZUSATZ, LAND, BUNDESLAND)
        VALUES (:NEW_LID, :ST, :PL, :OT, :ZUSA, :L, :BUND);
    EXECUTE PROCEDURE P_SET_CONTACT_KAT (:NEW_LID, :KATB);
END^

CREATE PROCEDURE P_CONT_EDIT (
    E_LID  INTEGER,
    ANR    VARCHAR(30),
    VNA    VARCHAR(30),
    NA     VARCHAR(30),
    FA     VARCHAR(50),
    TIT    VARCHAR(25),
    CONTB  VARCHAR(80),
    WEB    VARCHAR(50),
    ABT    VARCHAR(35),
    KATB   VARCHAR(30),
    ST     VARCHAR(40),
    PL     VARCHAR(10),
    OT     VARCHAR(35),
    ZUSA   VARCHAR(30),
    L      VARCHAR(30),
    BUND   VARCHAR(30),
    TEXT   BLOB SUB_TYPE TEXT)
RETURNS (RESULT INTEGER)
AS
BEGIN
    UPDATE CONTACT SET
        ANREDE = :ANR, VNAME = :VNA, NAME = :NA, FIRMA = :FA, TITEL = :TIT, CONTBEZ = :CONTB,
        WEBSITE = :WEB, ABTEILUNG = :ABT, NOTIZ = :TEXT
    WHERE LID = :E_LID;
    IF (ROW_COUNT = 0) THEN
    BEGIN
        RESULT = 2;
        EXIT;
    END
    UPDATE OR INSERT INTO ADDR (CID, STR, PLZ, ORT, ZUSATZ, LAND, BUNDESLAND)
        VALUES (:E_LID, :ST, :PL, :OT, :ZUSA, :L, :BUND)
        MATCHING (CID);
    EXECUTE PROCEDURE P_SET_CONTACT_KAT (:E_LID, :KATB);
    RESULT = 0;
END^

-- Removes the contact with everything that hangs on it; its calls stay in the log, unlinked,
-- with their caller text.
CREATE PROCEDURE P_CONT_DELETE (D_LID INTEGER)
AS
BEGIN
    UPDATE LOG SET CID = 0 WHERE CID = :D_LID;
    DELETE FROM COM WHERE CID = :D_LID;
    DELETE FROM E_MAIL WHERE CID = :D_LID;
    DELETE FROM CONKAT WHERE CID = :D_LID;
    DELETE FROM ADDR WHERE CID = :D_LID;
    DELETE FROM CONTACT WHERE LID = :D_LID;
END^

CREATE PROCEDURE P_COM_SYNCHRONIZE (
    L     INTEGER,
    C     INTEGER,
    KB    VARCHAR(20),
    LC    VARCHAR(5),
    V     VARCHAR(10),
    N     VARCHAR(15),
    VN    VARCHAR(25),
    LCVN  VARCHAR(30),
    BEM   VARCHAR(40),
    AURE  SMALLINT,
    NOF   VARCHAR(15),
    STAT  INTEGER)
RETURNS (RESULT INTEGER)
AS
BEGIN
    RESULT = 0;
    IF (STAT IS NULL OR STAT NOT IN (0, 1, 2, 3)) THEN
    BEGIN
        RESULT = 1;
        EXIT;
    END
    IF (STAT = 3) THEN
    BEGIN
        IF (COALESCE(L, 0) <> 0) THEN
        BEGIN
            IF (EXISTS (SELECT 1 FROM COM WHERE LID = :L AND CID IS DISTINCT FROM :C)) THEN
                RESULT = 3;
            ELSE
                DELETE FROM COM WHERE LID = :L;
        END
        EXIT;
    END
    IF (STAT = 0 AND COALESCE(L, 0) <> 0) THEN
        EXIT;
    IF (NOT EXISTS (SELECT 1 FROM CONTACT WHERE LID = :C)) THEN
    BEGIN
        RESULT = 2;
        EXIT;
    END
    IF (STAT = 2 AND COALESCE(L, 0) <> 0) THEN
    BEGIN
        UPDATE COM SET
            KOMMBEZ = :KB, LC = :LC, VORW = :V, NUMBER = COALESCE(:N, ''), VORWNUMBER = :VN,
            LCVORWNUMBER = :LCVN, BEMERKUNG = :BEM, AUTOREJECT = COALESCE(:AURE, 0),
            NUMBEROF = :NOF
        WHERE LID = :L AND CID = :C;
        IF (ROW_COUNT = 0) THEN
            RESULT = 3;
        EXIT;
    END
    INSERT INTO COM (CID, KOMMBEZ, LC, VORW, NUMBER, VORWNUMBER, LCVORWNUMBER, BEMERKUNG,
                     AUTOREJECT, NUMBEROF)
        VALUES (:C, :KB, :LC, :V, COALESCE(:N, ''), :VN, :LCVN, :BEM, COALESCE(:AURE, 0), :NOF);
END^

CREATE PROCEDURE P_MAIL_SYNCHRONIZE (
    LID       INTEGER,
    CID       INTEGER,
    MAILADDR  VARCHAR(40),
    BEMERK    VARCHAR(40),
    STATUS    INTEGER)
RETURNS (RESULT INTEGER)
AS
BEGIN
    RESULT = 0;
    IF (STATUS IS NULL OR STATUS NOT IN (0, 1, 2, 3)) THEN
    BEGIN
        RESULT = 1;
        EXIT;
    END
    IF (STATUS = 3) THEN
    BEGIN
        IF (COALESCE(:LID, 0) <> 0) THEN
        BEGIN
            IF (EXISTS (SELECT 1 FROM E_MAIL M WHERE M.LID = :LID
                                                 AND M.CID IS DISTINCT FROM :CID)) THEN
                RESULT = 3;
            ELSE
                DELETE FROM E_MAIL M WHERE M.LID = :LID;
        END
        EXIT;
    END
    IF (STATUS = 0 AND COALESCE(:LID, 0) <> 0) THEN
        EXIT;
    IF (NOT EXISTS (SELECT 1 FROM CONTACT C WHERE C.LID = :CID)) THEN
    BEGIN
        RESULT = 2;
        EXIT;
    END
    IF (STATUS = 2 AND COALESCE(:LID, 0) <> 0) THEN
    BEGIN
        UPDATE E_MAIL M SET M.MAILADDR = :MAILADDR, M.BEMERK = :BEMERK
        WHERE M.LID = :LID AND M.CID = :CID;
        IF (ROW_COUNT = 0) THEN
            RESULT = 3;
        EXIT;
    END
    INSERT INTO E_MAIL (CID, MAILADDR, BEMERK) VALUES (:CID, :MAILADDR, :BEMERK);
END^

-- Which contact owns a number: the caller's number is reduced to its digits without leading
-- zeros and compared with the three stored digit forms; the oldest matching entry wins.
-- Outputs: key of the number entry, its label, the contact's display name and key (0 and empty
-- when nothing matches).
CREATE PROCEDURE P_SELECT_LOG_CONTACT (PHONENR VARCHAR(80))
RETURNS (COM_LID INTEGER, KOMMBEZ VARCHAR(20), CONTBEZ VARCHAR(80), CID INTEGER)
AS
DECLARE DIGITS VARCHAR(80);
BEGIN
    COM_LID = 0;
    KOMMBEZ = '';
    CONTBEZ = '';
    CID = 0;
    DIGITS = F_NORMALIZE_NUMBER(PHONENR);
    IF (DIGITS = '') THEN
        EXIT;
    SELECT FIRST 1 M.LID, COALESCE(M.KOMMBEZ, ''), COALESCE(C.CONTBEZ, ''), C.LID
    FROM COM M
    JOIN CONTACT C ON C.LID = M.CID
    WHERE M.NUMBEROF = :DIGITS OR M.VORWNUMBER = :DIGITS OR M.LCVORWNUMBER = :DIGITS
    ORDER BY M.LID
    INTO :COM_LID, :KOMMBEZ, :CONTBEZ, :CID;
END^

CREATE PROCEDURE P_GET_COUNT_OF_NUMBER (PN VARCHAR(80))
RETURNS (CNT INTEGER)
AS
BEGIN
    SELECT COUNT(*) FROM LOG WHERE FROMPHONE = :PN OR FROMSUBB = :PN INTO :CNT;
END^

-- Creates (KID 0) or updates a category. Returns its key; -2 when another category already has
-- that name in any case; 0 when nothing was stored (empty name, unknown key, database error).
CREATE PROCEDURE P_KAT_INSERT (KID INTEGER, KA VARCHAR(30), BEM VARCHAR(40))
RETURNS (RESULT INTEGER)
AS
DECLARE NAME VARCHAR(30);
BEGIN
    RESULT = 0;
    NAME = TRIM(COALESCE(KA, ''));
    IF (NAME = '' OR KID < 0) THEN
        EXIT;
    IF (EXISTS (SELECT 1 FROM KAT WHERE UPPER(KATBEZ) = UPPER(:NAME)
                                    AND LID IS DISTINCT FROM :KID)) THEN
    BEGIN
        RESULT = -2;
        EXIT;
    END
    BEGIN
        IF (COALESCE(KID, 0) = 0) THEN
            INSERT INTO KAT (KATBEZ, BEMERKUNG) VALUES (:NAME, :BEM) RETURNING LID INTO :RESULT;
        ELSE
        BEGIN
            UPDATE KAT SET KATBEZ = :NAME, BEMERKUNG = :BEM WHERE LID = :KID;
            IF (ROW_COUNT > 0) THEN
                RESULT = KID;
        END
        WHEN GDSCODE unique_key_violation DO
            RESULT = -2;
        WHEN ANY DO
            RESULT = 0;
    END
END^

-- Contacts of a deleted category belong to no category afterwards.
CREATE PROCEDURE P_KAT_DELETE (KID INTEGER)
AS
BEGIN
    DELETE FROM CONKAT WHERE KID = :KID;
    DELETE FROM KAT WHERE LID = :KID;
END^

CREATE PROCEDURE P_CHANGE_CONKAT (CK_ID INTEGER, KID INTEGER)
AS
BEGIN
    UPDATE CONKAT SET KID = :KID WHERE LID = :CK_ID;
END^

SET TERM ; ^
