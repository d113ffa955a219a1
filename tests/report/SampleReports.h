#pragma once

#include <nlohmann/json.hpp>
#include <string>

namespace accounts {

/// A migration in which an account was changed, moved, added, removed or converted: each of them.
nlohmann::json sampleReport();

/// The page of a report.
std::string pageOf(const nlohmann::json& report);

/// A settings file's account without dataclasses and children.
nlohmann::json plainAccount(const std::string& identifier, const std::string& title,
                            const nlohmann::json& properties = nlohmann::json::object());

}  // namespace accounts
