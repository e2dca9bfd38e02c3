// Builds the shipped names database from the schema and the three built-in
// lists. Writes to a temporary file first and renames it into place, so a
// failed build never leaves a half-filled database behind.
//
// usage: makedb OUTPUT SCHEMA MALE_FIRST FEMALE_FIRST LAST
#include <sqlite3.h>

#include <cstdio>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>

namespace {

bool check(sqlite3* db, int rc, const char* what)
{
    if (rc == SQLITE_OK || rc == SQLITE_DONE || rc == SQLITE_ROW)
        return true;
    std::cerr << "makedb: " << what << ": " << sqlite3_errmsg(db) << '\n';
    return false;
}

bool fill(sqlite3* db, const char* insert, const char* listPath)
{
    std::ifstream in(listPath);
    if (!in) {
        std::cerr << "makedb: cannot read " << listPath << '\n';
        return false;
    }
    sqlite3_stmt* stmt = nullptr;
    if (!check(db, sqlite3_prepare_v2(db, insert, -1, &stmt, nullptr), insert))
        return false;
    bool ok = true;
    std::string line;
    while (ok && std::getline(in, line)) {
        if (!line.empty() && line.back() == '\r')
            line.pop_back();
        if (line.empty())
            continue;
        sqlite3_bind_text(stmt, 1, line.data(), static_cast<int>(line.size()), SQLITE_TRANSIENT);
        ok = check(db, sqlite3_step(stmt), insert);
        sqlite3_reset(stmt);
    }
    sqlite3_finalize(stmt);
    return ok;
}

} // namespace

int main(int argc, char** argv)
{
    if (argc != 6) {
        std::cerr << "usage: makedb OUTPUT SCHEMA MALE_FIRST FEMALE_FIRST LAST\n";
        return 2;
    }
    const std::string output = argv[1];
    const std::string temporary = output + ".part";
    std::remove(temporary.c_str());

    std::ifstream schemaFile(argv[2]);
    std::stringstream schema;
    schema << schemaFile.rdbuf();

    sqlite3* db = nullptr;
    if (sqlite3_open(temporary.c_str(), &db) != SQLITE_OK) {
        std::cerr << "makedb: cannot create " << temporary << '\n';
        return 1;
    }
    bool ok =
        check(db, sqlite3_exec(db, "begin", nullptr, nullptr, nullptr), "begin")
        && check(db, sqlite3_exec(db, schema.str().c_str(), nullptr, nullptr, nullptr), "schema")
        && fill(db, "insert into system_mfirstname (Mfirst) values (?)", argv[3])
        && fill(db, "insert into system_ffirstname (Ffirst) values (?)", argv[4])
        && fill(db, "insert into system_lastname ([Last]) values (?)", argv[5])
        && check(db, sqlite3_exec(db, "commit", nullptr, nullptr, nullptr), "commit");
    sqlite3_close(db);
    if (!ok || std::rename(temporary.c_str(), output.c_str()) != 0) {
        std::remove(temporary.c_str());
        return 1;
    }
    return 0;
}
