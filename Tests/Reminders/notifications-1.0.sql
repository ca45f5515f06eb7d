-- A store of format 1.0 with a delivery in each state. It stays as it is, whatever comes after.
PRAGMA application_id = 1447980916;
PRAGMA user_version = 1000;
PRAGMA foreign_keys=OFF;
BEGIN TRANSACTION;
CREATE TABLE durable_file(damages INTEGER NOT NULL);
INSERT INTO durable_file VALUES(0);
CREATE TABLE deliveries (number INTEGER PRIMARY KEY, state TEXT NOT NULL, key TEXT NOT NULL, zone TEXT NOT NULL, count INTEGER NOT NULL, banner TEXT, delivered INTEGER, identifier TEXT, title TEXT, text TEXT, action TEXT, other TEXT, date INTEGER, years INTEGER, months INTEGER, days INTEGER, hours INTEGER, minutes INTEGER, seconds INTEGER);
INSERT INTO deliveries VALUES(1,'planned','identifier SchedulerNotification','UTC',0,NULL,NULL,'SchedulerNotification','A','Let Orvane 2 look for duplicate files on your disks.','Scan','Later',1772352000000000,NULL,NULL,7,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(2,'due','identifier b','',0,NULL,1000000,'b','B','Text','Do','Later',900000,NULL,NULL,NULL,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(3,'hidden','identifier c','',0,NULL,1000001,'c','C',NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(4,'toShow','unique d','',0,NULL,1000002,NULL,'D',NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(5,'shown','identifier e','',0,'bus :1.5 7',1000003,'e','E',NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(6,'expired','identifier f','',0,NULL,1000004,'f','F',NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL);
INSERT INTO deliveries VALUES(7,'removed','identifier g','',0,'bus :1.5 8',1000005,'g','G',NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL,NULL);
CREATE UNIQUE INDEX planned ON deliveries (key) WHERE state = 'planned';
CREATE UNIQUE INDEX delivered ON deliveries (key) WHERE state IN ('due', 'hidden', 'toShow', 'shown', 'expired');
COMMIT;
