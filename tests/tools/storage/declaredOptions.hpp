#pragma once

#include <map>
#include <set>
#include <string>

/// The options of each command of the tool, with their dashes.
std::map<std::string, std::set<std::string>> declaredOptions();
