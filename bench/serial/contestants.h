#pragma once

#include <iosfwd>

#include "bench/serial/tables.h"

/// \file
/// Saving tables to XML and loading them back, each in a form of its own. Loading expects an empty
/// table.

namespace bench {

void saveByPells(Table& table, std::ostream& out);
void loadByPells(Table& table, std::istream& in);

void saveByCereal(PlainTable& table, std::ostream& out);
void loadByCereal(PlainTable& table, std::istream& in);

void saveByBoost(PlainTable& table, std::ostream& out);
void loadByBoost(PlainTable& table, std::istream& in);

/// Loads what saveByPells() wrote with code that is written out for these classes.
void loadByPugixml(PlainTable& table, std::istream& in);

}  // namespace bench
