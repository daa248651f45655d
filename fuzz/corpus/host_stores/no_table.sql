DROP TABLE provider;
