#pragma once

// Every SQL statement the program runs. Names travel as bound parameters
// (the ? of a statement), never as part of the text.
namespace Sql {

// A query and the column whose value the panes show.
struct Query {
    const char* text;
    const char* column;
};

// User list.
inline constexpr Query UserFirstNames{"select * from user_firstname order by firstname",
                                      "firstname"};
inline constexpr Query UserLastNames{"select * from user_lastname order by lastname", "lastname"};

// Built-in list.
inline constexpr Query BuiltInLastNames{"select * from system_lastname order by Last", "Last"};
inline constexpr Query BuiltInFirstNamesBoth{
    "select distinct mfirst as firstname from system_mfirstname union "
    "select distinct ffirst as firstname from system_ffirstname order by firstname",
    "firstname"};
inline constexpr Query BuiltInFirstNamesMale{
    "select distinct mfirst from system_mfirstname order by mfirst", "mfirst"};
inline constexpr Query BuiltInFirstNamesFemale{
    "select distinct ffirst from system_ffirstname order by ffirst", "ffirst"};

// Inserts. A first name added to the built-in list always joins the female
// table, whatever gender is chosen.
inline constexpr char InsertBuiltInFirstName[] =
    "insert into system_ffirstname (Ffirst) values (?)";
inline constexpr char InsertUserFirstName[] = "insert into user_firstname (firstname) values (?)";
inline constexpr char InsertBuiltInLastName[] = "insert into system_lastname ([Last]) values (?)";
inline constexpr char InsertUserLastName[] = "insert into user_lastname (lastname) values (?)";

// Deletes.
inline constexpr char DeleteBuiltInMaleFirstName[] =
    "delete from system_mfirstname where Mfirst = ?";
inline constexpr char DeleteBuiltInFemaleFirstName[] =
    "delete from system_ffirstname where Ffirst = ?";
inline constexpr char ClearUserFirstNames[] = "delete from user_firstname";
inline constexpr char DeleteBuiltInLastName[] = "delete from system_lastname where Last = ?";
inline constexpr char ClearUserLastNames[] = "delete from user_lastname";

} // namespace Sql
