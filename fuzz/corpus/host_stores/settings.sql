DELETE FROM setting; DELETE FROM endpoint_outage; INSERT INTO setting VALUES('x',char(27));
