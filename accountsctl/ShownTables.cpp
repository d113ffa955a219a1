#include <fmt/format.h>

#include "accountsctl/ShowCommand.h"
#include "accountsctl/TextTable.h"
#include "accountsettings/AccountsManager.h"
#include "inspection/ListedAccount.h"
#include "inspection/StoreLayout.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

constexpr std::string_view kDataclassPrefix = "com.quarx.Dataclass.";

std::string counted(std::size_t count, std::string_view singular, std::string_view plural) {
  return fmt::format("{} {}", count, count == 1 ? singular : plural);
}

/// The enabled dataclasses as people read them; empty when the account has no list.
std::string enabledDataclasses(const PropertyDictionary& properties) {
  const std::optional<PropertyArray> list = properties.arrayForKey(kAccountEnabledDataclasses);
  std::string words = list && list->empty() ? "none" : "";
  for (const PropertyValue& member : list.value_or(PropertyArray())) {
    const std::string word = describe(member);
    words += words.empty() ? "" : " ";
    words += word.starts_with(kDataclassPrefix) ? word.substr(kDataclassPrefix.size()) : word;
  }
  return words;
}

/// Appends a dictionary's entries, those of dictionaries within it each on their own.
void addEntries(TextTable& table, const PropertyDictionary& dictionary, const std::string& prefix) {
  for (const PropertyEntry& entry : dictionary) {
    const std::string name = prefix + entry.key.string();
    const PropertyDictionary* inner = entry.value.asDictionary();
    if (inner != nullptr && !inner->empty()) {
      addEntries(table, *inner, name + "/");
    } else {
      table.addRow({name, describe(entry.value)});
    }
  }
}

/// Writes one file's tables.
class Tables {
 public:
  Tables(const ShowOptions& options, const Terminal& terminal)
      : options_(options), terminal_(terminal) {}

  void addFile(const PropertyValue& content) {
    const FileKind kind = kindOf(content);
    addHeading(std::string(nameOf(kind)), content, kind);
    const PropertyDictionary* root = content.asDictionary();
    if (root == nullptr) {
      TextTable table({""});
      table.addRow({describe(content)});
      text_ += table.text(terminal_);
    } else if (kind == FileKind::MigrationInformation) {
      addInformation(*root);
    } else {
      addContent(*root, kind);
    }
  }

  std::string take() { return std::move(text_); }

 private:
  void addHeading(const std::string& name, const PropertyValue& content, FileKind kind) {
    std::string line = name;
    line.front() = static_cast<char>(std::toupper(static_cast<unsigned char>(line.front())));
    line = emphasized(terminal_, Emphasis::Heading, line);
    if (kind == FileKind::AccountSettings && content.asDictionary() != nullptr) {
      const std::string version = wordFor(*content.asDictionary(), kPlistVersionKey);
      line += version.empty() ? ", without a version" : ", version " + escapedText(version);
      line += fmt::format(" (current is {})", AccountsManager::currentVersion());
    }
    text_ += line + "\n";
  }

  void addContent(const PropertyDictionary& root, FileKind kind) {
    const std::optional<StoreLayout> layout = layoutOf(kind);
    PropertyDictionary rest = root;
    if (layout) {
      for (const AccountArray& array : layout->arrays) {
        addAccounts(root.arrayForKey(array.key).value_or(PropertyArray()), array, *layout);
        if (root.arrayForKey(array.key)) {
          rest.remove(array.key);
        }
      }
    }
    if (kind == FileKind::AccountSettings) {
      rest.remove(kPlistVersionKey);
    }
    if (layout && !rest.empty()) {
      addLine("Beside the accounts:");
    }
    addTableOf(rest);
  }

  void addAccounts(const PropertyArray& array, const AccountArray& kind,
                   const StoreLayout& layout) {
    const std::vector<ListedAccount> accounts = listedAccounts(array, layout);
    const std::size_t childCount = accounts.size() - array.size();
    std::string line = counted(array.size(), kind.singular, kind.plural);
    if (!layout.childrenKey.empty()) {
      line += " and " + counted(childCount, "child", "children");
    }
    addLine(line);
    if (accounts.empty()) {
      return;
    }
    TextTable table(
        layout.typeKey.empty()
            ? std::vector<std::string>{"", "Class", "Name", "User", "Identifier"}
            : std::vector<std::string>{"", "Type", "Name", "User", "Enabled", "Identifier"},
        options_.longCells);
    // People copy identifiers.
    table.keepWhole(layout.typeKey.empty() ? 4 : 5);
    for (const ListedAccount& account : accounts) {
      table.addRow(rowOf(account, layout));
    }
    text_ += table.text(terminal_);
    if (options_.withProperties) {
      addProperties(accounts, layout);
    }
  }

  [[nodiscard]] std::vector<std::string> rowOf(const ListedAccount& account,
                                               const StoreLayout& layout) const {
    const PropertyDictionary properties = account.properties.value_or(PropertyDictionary());
    const bool hasTypes = !layout.typeKey.empty();
    std::vector<std::string> row = {
        (account.isChild && terminal_.isInteractive ? "  " : "") + account.place,
        wordFor(properties, hasTypes ? layout.typeKey : layout.classKey),
        account.properties ? wordFor(properties, layout.nameKey) : describe(account.element),
        wordFor(properties, layout.userKey)};
    if (hasTypes) {
      row.push_back(enabledDataclasses(properties));
    }
    row.push_back(wordFor(properties, layout.identifierKey));
    return row;
  }

  void addProperties(const std::vector<ListedAccount>& accounts, const StoreLayout& layout) {
    for (const ListedAccount& account : accounts) {
      if (account.properties) {
        addLine("");
        addLine(emphasized(terminal_, Emphasis::Heading,
                           escapedText(account.place + " " + titleOf(account, layout))));
        PropertyDictionary own = *account.properties;
        // Children have a place of their own, if they are children at all.
        if (!account.isChild && own.arrayForKey(layout.childrenKey)) {
          own.remove(layout.childrenKey);
        }
        addTableOf(own);
      }
    }
  }

  void addInformation(const PropertyDictionary& root) {
    PropertyDictionary rest = root;
    for (const InformationPart& part : informationParts()) {
      if (const std::optional<PropertyDictionary> store = root.dictionaryForKey(part.key)) {
        addLine("");
        addHeading(std::string(part.key), *store, part.kind);
        addContent(*store, part.kind);
        rest.remove(part.key);
      }
    }
    if (!rest.empty()) {
      addLine("");
    }
    addTableOf(rest);
  }

  void addTableOf(const PropertyDictionary& dictionary) {
    TextTable table({"", ""}, options_.longCells);
    addEntries(table, dictionary, "");
    text_ += table.text(terminal_);
  }

  void addLine(const std::string& line) { text_ += line + "\n"; }

  const ShowOptions& options_;
  const Terminal& terminal_;
  std::string text_;
};

}  // namespace

std::string shownTables(const PropertyValue& content, const ShowOptions& options,
                        const Terminal& terminal) {
  Tables tables(options, terminal);
  tables.addFile(content);
  return tables.take();
}

}  // namespace accounts
