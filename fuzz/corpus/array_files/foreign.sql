PRAGMA application_id=7;
