// How many times our time the fastest peer of a row is to take. The first pattern that fits a row's name
// counts.
#include <fnmatch.h>

#include "table.h"

namespace bench {
namespace {

struct Goal {
  const char* rows;
  double times;
};
constexpr Goal kGoals[] = {
    {"first-use/*", 3},
    {"process/convert/*", 1.5},
    {"process/sort/binary", 1},
    {"process/lines", 0.7},
    {"process/start", 0.8},
    {"convert/UTF-8/UTF-16/*/24B", 1.3},
    {"convert/UTF-16/UTF-8/*/24B", 1.3},
    {"convert/UTF-8/UTF-16/*", 1.6},
    {"convert/UTF-16/UTF-8/*", 1.6},
    {"convert/Latin1/UTF-16/*/24B", 2.5},
    {"convert/UTF-16/Latin1/*/24B", 2.5},
    {"convert/IBM9[0-9][0-9]/*", 2.5},
    {"convert/*/IBM9[0-9][0-9]/*", 2.5},
    {"convert/UTF-8/MS1251/*", 1.5},
    {"convert/UTF-8/MS9[0-9][0-9]/*/1MB", 1.6},
    {"convert/UTF-16/MS9[0-9][0-9]/*/24B", 2},
    {"convert/UTF-16/JapanEUC/*/24B", 2},
    {"convert/*/UTF-16/*/24B", 0},
    {"convert/MS9[0-9][0-9]/UTF-16/*/1MB", 2},
    {"convert/JapanEUC/UTF-16/*/1MB", 2},
    {"convert/MS9[0-9][0-9]/*", 2},
    {"convert/JapanEUC/*", 2},
    {"convert/Latin1/IBM1141/*/1MB", 6},
    {"convert/IBM1141/Latin1/*/1MB", 6},
    {"convert/MS1251/KOI8-R/*/1MB", 6},
    {"convert/Latin1/IBM1141/*/24B", 4},
    {"convert/IBM1141/Latin1/*/24B", 4},
    {"convert/MS1251/KOI8-R/*/24B", 4},
    {"convert/KOI8-R/MS1251/*/1MB", 6},
    {"convert/KOI8-R/MS1251/*/24B", 4},
    {"convert/EUC-KR/*", 2},
    {"count/UTF-8/*/long", 20},
    {"count/*/long", 8},
    {"walk/UTF-8/*", 0.8},
    {"map/Russian/UTF-8/*", 3},
    {"map/Greek/UTF-8/*", 3},
    {"map/Japanese/MS932/*", 2},
    {"map/Russian/UTF-16/*", 1.3},
    {"collate/*/neighbours_*", 1.2},
    {"collate/*/sort_*", 1.2},
    {"keys/*", 2.3},
    {"message/loaded/Latin1", 2.5},
    {"message/loaded/UTF-8", 1.5},
    {"write/*/integer", 2.5},
    {"write/*/double", 5},
    {"write/*/currency", 3.5},
    {"write/*/time_names", 1.8},
    {"write/*/time_*", 2.2},
    {"read/*/integer", 2},
    {"read/*/time_names", 3},
    {"read/*/time_*", 1.5},
};

}  // namespace

double goal_of(const std::string& row) {
  for (const Goal& goal : kGoals)
    if (fnmatch(goal.rows, row.c_str(), 0) == 0) return goal.times;
  return 0;
}

}  // namespace bench
