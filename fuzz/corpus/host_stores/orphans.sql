PRAGMA foreign_keys=0; DELETE FROM file_system; INSERT INTO provider_array VALUES(99,1,'a',1,1);
