#include <fcntl.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <string>
#include <string_view>

// The file traffic of a migration with nothing between: what no faster code could save. It also
// times one read and one copy in memory of the same bytes.

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr std::size_t kBlockSize = std::size_t{64} << 10;

struct Traffic {
  /// The settings file before the migration, and a finished one whose bytes the saves write.
  std::string before;
  std::string after;
  /// Reads before the first save, and saves, each of which reads the file again.
  int reads = 0;
  int saves = 0;
};

[[noreturn]] void fail(const std::string& operation) {
  std::fprintf(stderr, "file-traffic: %s: %s\n", operation.c_str(), std::strerror(errno));
  std::exit(EXIT_FAILURE);
}

int openFile(const std::string& path, int flags) {
  const int file = open(path.c_str(), flags | O_CLOEXEC, 0600);
  if (file < 0) {
    fail("open " + path);
  }
  return file;
}

void writeAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t count = write(file, bytes.data(), bytes.size());
    if (count < 0) {
      fail("write");
    }
    bytes.remove_prefix(static_cast<std::size_t>(count));
  }
}

void flush(int file) {
  if (fsync(file) != 0) {
    fail("flush");
  }
}

/// Passes a file's bytes to `take` in blocks of the size that the migration reads.
template <class Take>
void readBlocks(const std::string& path, Take take) {
  const int file = openFile(path, O_RDONLY);
  std::array<char, kBlockSize> block;
  for (ssize_t count = 0; (count = read(file, block.data(), block.size())) != 0;) {
    if (count < 0) {
      fail("read " + path);
    }
    take(std::string_view(block.data(), static_cast<std::size_t>(count)));
  }
  close(file);
}

/// The bytes go one block over the other: what becomes of them is no part of the traffic.
void readOver(const std::string& path) {
  readBlocks(path, [](std::string_view) {});
}

std::string readContents(const std::string& path) {
  std::string contents;
  readBlocks(path, [&](std::string_view block) { contents += block; });
  return contents;
}

void copyAside(const std::string& source, const std::string& destination) {
  const int copy = openFile(destination, O_WRONLY | O_CREAT | O_EXCL);
  readBlocks(source, [&](std::string_view block) { writeAll(copy, block); });
  close(copy);
}

void save(const std::string& path, const std::string& temporary, std::string_view bytes) {
  readOver(path);
  const int file = openFile(temporary, O_WRONLY | O_CREAT | O_EXCL);
  writeAll(file, bytes);
  flush(file);
  close(file);
  if (rename(temporary.c_str(), path.c_str()) != 0) {
    fail("rename");
  }
  const int directory = openFile(fs::path(path).parent_path(), O_RDONLY | O_DIRECTORY);
  flush(directory);
  close(directory);
}

template <class Action>
double secondsFor(Action action) {
  const Clock::time_point start = Clock::now();
  action();
  return std::chrono::duration<double>(Clock::now() - start).count();
}

double secondsForTraffic(const Traffic& traffic, std::string_view afterBytes) {
  const fs::path directory = fs::path(traffic.before).parent_path();
  const std::string aside = directory / "file-traffic-aside";
  const std::string temporary = directory / "file-traffic-temporary";
  const double seconds = secondsFor([&] {
    copyAside(traffic.before, aside);
    for (int count = 0; count < traffic.reads; ++count) {
      readOver(traffic.before);
    }
    for (int count = 0; count < traffic.saves; ++count) {
      save(traffic.before, temporary, afterBytes);
    }
  });
  fs::remove(aside);
  return seconds;
}

double secondsForMemoryCopy(const std::string& bytes) {
  std::string copy(bytes.size(), '\0');
  return secondsFor([&] {
    std::memcpy(copy.data(), bytes.data(), bytes.size());
    // The compiler must believe that the copy is looked at.
    asm volatile("" : : "r"(copy.data()) : "memory");
  });
}

}  // namespace

int main(int argumentCount, char** arguments) {
  Traffic traffic;
  CLI::App program(
      "Do a migration's reads, writes, flushes and renames on one file and print the seconds that\n"
      "they take as one JSON object.",
      "file-traffic");
  program.add_option("--before", traffic.before, "The settings file, which is replaced")
      ->option_text("FILE")
      ->required();
  program.add_option("--after", traffic.after, "A finished file, whose bytes each save writes")
      ->option_text("FILE")
      ->required();
  program.add_option("--reads", traffic.reads, "Reads before the first save")->required();
  program.add_option("--saves", traffic.saves, "Saves, each with a read")->required();
  CLI11_PARSE(program, argumentCount, arguments);

  const std::string afterBytes = readContents(traffic.after);
  const double memoryCopy = secondsForMemoryCopy(afterBytes);
  const double oneRead = secondsFor([&] { readOver(traffic.before); });
  std::printf("{\"trafficSeconds\": %.9f, \"readSeconds\": %.9f, \"memoryCopySeconds\": %.9f}\n",
              secondsForTraffic(traffic, afterBytes), oneRead, memoryCopy);
}
