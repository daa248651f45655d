PRAGMA user_version=2;
