PRAGMA writable_schema=1; UPDATE sqlite_schema SET sql=replace(sql,'STRICT','');
