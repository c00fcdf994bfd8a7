-- A log database. The order of the columns is the order in which searches need them: a keyword search reads no further
-- than msg, other filters little further. Pages of 16 KiB make such a search read a quarter of the pages.
PRAGMA page_size = 16384;
-- All or nothing, so that an interrupted creation leaves no half of a database.
BEGIN;

CREATE TABLE logs (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    msg TEXT,
    prio TEXT,
    llevel TEXT GENERATED ALWAYS AS (prio) VIRTUAL, -- searches by level ask for it by this name
    ldate TEXT, -- YYYY-MM-DD
    host TEXT,
    prog TEXT,
    fac TEXT,
    ltime TEXT,
    ip TEXT,
    tag TEXT,
    utcsec INTEGER, -- what the sender says of the time
    tzoffset TEXT,
    pid TEXT,
    msgid TEXT,
    sdata TEXT,
    rsec INTEGER -- Unix second of the reception, to which ldate and ltime belong
);

-- Who follows the rows notices by it that another database has taken the place of this one.
CREATE TABLE store_identity (id INTEGER PRIMARY KEY CHECK (id = 1), value TEXT NOT NULL);
INSERT INTO store_identity VALUES (1, lower(hex(randomblob(16))));

-- Named as syslog-ng names those that it creates. None on ldate: the newest rows of a range of days would be sorted out
-- of all its rows.
CREATE INDEX logs_host_idx ON logs (host);
CREATE INDEX logs_prog_idx ON logs (prog);

-- What the query planner is to believe, in place of what ANALYZE would measure: that a host or program has a tenth of
-- the rows. So one host is found by the index, a list of hosts by reading the newest rows first, and the distinct
-- names by skipping from one to the next.
ANALYZE sqlite_schema;
INSERT INTO sqlite_stat1 (tbl, idx, stat) VALUES
    ('logs', 'logs_host_idx', '1000000 100000'),
    ('logs', 'logs_prog_idx', '1000000 120000');

CREATE TABLE general_log (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    host TEXT,
    llevel TEXT,
    prog TEXT,
    ldate TEXT,
    ltime TEXT,
    luser TEXT,
    msg TEXT
);

CREATE TABLE connection_log (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    host TEXT,
    llevel TEXT,
    prog TEXT,
    ldate TEXT,
    ltime TEXT,
    luser TEXT,
    msg TEXT
);

CREATE TABLE transfer_log (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    host TEXT,
    prog TEXT,
    ldate TEXT,
    ltime TEXT,
    luser TEXT,
    event TEXT,
    fname TEXT,
    isdir INTEGER,
    fsize TEXT,
    ip TEXT
);

CREATE TABLE db_info (
    id INTEGER PRIMARY KEY CHECK (id = 1),
    start_time INTEGER NOT NULL DEFAULT 0,
    end_time INTEGER NOT NULL DEFAULT 0,
    log_count INTEGER NOT NULL DEFAULT 0,
    device TEXT NOT NULL DEFAULT ''
);
INSERT INTO db_info (id) VALUES (1);

-- A database with db_info is asked for its names by key.
CREATE VIEW hosts AS
    SELECT row_number() OVER () AS host_id, host AS host_name FROM (SELECT DISTINCT host FROM logs);
CREATE VIEW progs AS
    SELECT row_number() OVER () AS prog_id, prog AS prog_name FROM (SELECT DISTINCT prog FROM logs);
CREATE VIEW tags AS
    SELECT row_number() OVER () AS tag_id, tag AS tag_name FROM (SELECT DISTINCT tag FROM logs);
CREATE VIEW facs AS
    SELECT row_number() OVER () AS fac_id, fac AS fac_name FROM (SELECT DISTINCT fac FROM logs);

COMMIT;
