#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

namespace accounts {

/// A migration in which an account was changed, moved, added, removed or converted: each of them.
nlohmann::json sampleReport();

/// The page of a report.
std::string pageOf(const nlohmann::json& report);

/// An entry of a ledger: what became of the account of an element.
nlohmann::json fateOf(const std::string& element, const std::string& fate,
                      const std::vector<std::string>& now, const std::string& reason = "");

/// An account as the one of an element of its file.
nlohmann::json standingAt(const std::string& element, nlohmann::json account);

/// A settings file's account without dataclasses and children.
nlohmann::json plainAccount(const std::string& identifier, const std::string& title,
                            const nlohmann::json& properties = nlohmann::json::object());

}  // namespace accounts
