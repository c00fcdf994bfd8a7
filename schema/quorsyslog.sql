-- The event log of the package.
BEGIN;
CREATE TABLE IF NOT EXISTS log (
    id INTEGER PRIMARY KEY,
    level INTEGER,
    time INTEGER,
    user TEXT,
    event TEXT
);
CREATE INDEX IF NOT EXISTS log_time ON log (time);
COMMIT;
