INSERT INTO answer VALUES(1,'create','createVirtualVolume 36:0a1b2c3d-4e5f-6071-8293-a4b5c6d7e8f9 1:0 3:new 1:0 0: 0: 0:','x',-1,0);
