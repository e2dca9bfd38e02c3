-- The names database. Every name column compares without regard to case, so
-- that sorting, "distinct", "union" and "=" treat Smith and SMITH alike.
-- The indexes keep the sorted reads of the panes fast at a million rows.
create table system_mfirstname (Mfirst text collate nocase);
create table system_ffirstname (Ffirst text collate nocase);
create table system_lastname (Last text collate nocase);
create table user_firstname (firstname text collate nocase);
create table user_lastname (lastname text collate nocase);

create index system_mfirstname_Mfirst on system_mfirstname (Mfirst);
create index system_ffirstname_Ffirst on system_ffirstname (Ffirst);
create index system_lastname_Last on system_lastname (Last);
create index user_firstname_firstname on user_firstname (firstname);
create index user_lastname_lastname on user_lastname (lastname);
