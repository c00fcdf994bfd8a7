-- Accounting of received logs: samples of the log rate, and the logs of each device since the database was created.
-- All or nothing, so that an interrupted creation leaves no half of a database.
BEGIN;

-- One row for each closed sample and device. Samples are read by ranges of their stamps.
CREATE TABLE IF NOT EXISTS eps (
    id INTEGER PRIMARY KEY,
    stamp INTEGER,
    device TEXT,
    eps INTEGER
);
CREATE INDEX IF NOT EXISTS eps_stamp ON eps (stamp);

-- Writing a device again replaces its row.
CREATE TABLE IF NOT EXISTS histogram (
    id INTEGER PRIMARY KEY,
    device TEXT UNIQUE,
    count INTEGER
);

-- How far the rows of each log database are counted, and how far they are judged by the notification rules.
CREATE TABLE IF NOT EXISTS followed (
    source TEXT PRIMARY KEY,
    last INTEGER NOT NULL,
    judged INTEGER NOT NULL
);

COMMIT;
