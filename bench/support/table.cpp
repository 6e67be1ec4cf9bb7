#include "bench/support/table.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <utility>

namespace zal::bench {
namespace {

std::string times(double ratio) { return ratio < 0.1 ? decimal(ratio, 3) + " x" : decimal(ratio, 2) + " x"; }

double ratioOf(double ours, double peer) { return peer > 0 ? ours / peer : 0; }

}  // namespace

std::string decimal(double value, int digits) {
  char text[64];
  snprintf(text, sizeof text, "%.*f", digits, value);
  return text;
}

std::string rate(double perSecond) { return decimal(perSecond / 1000, 0) + " k/s"; }

std::string duration(double seconds) {
  if (seconds >= 1) return decimal(seconds, 2) + " s";
  if (seconds >= 1e-3) return decimal(seconds * 1e3, 2) + " ms";
  return decimal(seconds * 1e6, 1) + " us";
}

Row atLeast(std::string figure, double ours, double peer, double target, std::string (*text)(double)) {
  const double ratio = ratioOf(ours, peer);
  return {std::move(figure),
          text(ours),
          text(peer),
          times(ratio),
          "at least " + times(target),
          ratio >= target ? "met" : "MISSED"};
}

Row atMost(std::string figure, double ours, double peer, double target, std::string (*text)(double)) {
  const double ratio = ratioOf(ours, peer);
  return {std::move(figure),
          text(ours),
          text(peer),
          times(ratio),
          "at most " + times(target),
          ratio <= target && peer > 0 ? "met" : "MISSED"};
}

Row plain(std::string figure, double ours, double peer, std::string (*text)(double)) {
  return {std::move(figure), text(ours), text(peer), times(ratioOf(ours, peer)), "", ""};
}

Row skipped(std::string figure, std::string why) {
  return {std::move(figure), "skipped: " + why, "", "", "", ""};
}

void printTable(const std::vector<Row>& rows) {
  const Row heads{"figure", "ours", "peer", "ratio", "target", ""};
  const auto fields = [](const Row& row) {
    return std::array{&row.figure, &row.ours, &row.peer, &row.ratio, &row.target, &row.verdict};
  };
  std::array<std::size_t, 6> widths{};
  const auto measure = [&](const Row& row) {
    for (std::size_t column = 0; column < widths.size(); ++column) {
      if (row.ours.rfind("skipped", 0) == 0 && column > 0) break;
      widths[column] = std::max(widths[column], fields(row)[column]->size());
    }
  };
  measure(heads);
  for (const Row& row : rows) measure(row);
  const auto print = [&](const Row& row) {
    std::string line;
    for (std::size_t column = 0; column < widths.size(); ++column) {
      std::string cell = *fields(row)[column];
      cell.resize(std::max(cell.size(), widths[column]), ' ');
      line += (column == 0 ? "" : "  ") + cell;
    }
    printf("%s\n", line.substr(0, line.find_last_not_of(' ') + 1).c_str());
  };
  print(heads);
  std::size_t whole = 2 * (widths.size() - 1);
  for (const std::size_t width : widths) whole += width;
  printf("%s\n", std::string(whole, '-').c_str());
  for (const Row& row : rows) print(row);
}

}  // namespace zal::bench
