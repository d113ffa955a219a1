#include "accountsctl/ExportedSymbols.h"

#include <dlfcn.h>
#include <elf.h>
#include <link.h>

#include <algorithm>
#include <bit>
#include <cstdint>

namespace accounts {
namespace {

/// The tables by which the dynamic loader finds the symbols of a library; null for one it has not.
struct SymbolTables {
  const ElfW(Sym) * symbols = nullptr;
  const char* names = nullptr;
  const std::uint32_t* gnuHash = nullptr;
  const std::uint32_t* hash = nullptr;
};

SymbolTables tablesOf(const ElfW(Dyn) * entry) {
  SymbolTables tables;
  for (; entry->d_tag != DT_NULL; ++entry) {
    const auto* const address = std::bit_cast<const void*>(entry->d_un.d_ptr);
    switch (entry->d_tag) {
      case DT_SYMTAB:
        tables.symbols = static_cast<const ElfW(Sym)*>(address);
        break;
      case DT_STRTAB:
        tables.names = static_cast<const char*>(address);
        break;
      case DT_GNU_HASH:
        tables.gnuHash = static_cast<const std::uint32_t*>(address);
        break;
      case DT_HASH:
        tables.hash = static_cast<const std::uint32_t*>(address);
        break;
      default:
        break;
    }
  }
  return tables;
}

/// How many symbols a table of the newer kind has, which says so nowhere: one more than the last of
/// the longest chain.
std::uint32_t countIn(const std::uint32_t* table) {
  const std::uint32_t bucketCount = table[0];
  const std::uint32_t firstHashed = table[1];
  const std::uint32_t filterWords = table[2] * (sizeof(ElfW(Addr)) / sizeof(std::uint32_t));
  const std::uint32_t* const buckets = table + 4 + filterWords;
  const std::uint32_t* const chains = buckets + bucketCount;
  std::uint32_t last = *std::max_element(buckets, buckets + bucketCount);
  if (last < firstHashed) {
    return firstHashed;
  }
  while ((chains[last - firstHashed] & 1U) == 0) {
    ++last;
  }
  return last + 1;
}

}  // namespace

std::vector<std::string> exportedSymbols(void* handle) {
  link_map* library = nullptr;
  if (dlinfo(handle, RTLD_DI_LINKMAP, static_cast<void*>(&library)) != 0) {
    return {};
  }
  const SymbolTables tables = tablesOf(library->l_ld);
  const std::uint32_t count = tables.gnuHash != nullptr ? countIn(tables.gnuHash)
                              : tables.hash != nullptr  ? tables.hash[1]
                                                        : 0;
  std::vector<std::string> names;
  for (std::uint32_t index = 0; index < count; ++index) {
    const auto& symbol = tables.symbols[index];
    if (symbol.st_shndx != SHN_UNDEF && ELF64_ST_BIND(symbol.st_info) != STB_LOCAL) {
      names.emplace_back(tables.names + symbol.st_name);
    }
  }
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace accounts
