#include "TextPrinter.h"

#include <algorithm>

namespace lodestack {
namespace scan {
namespace {

std::string plain(const Json& value) {
  return value.is_string() ? value.get<std::string>() : value.dump();
}

bool isPlain(const Json& value) { return !value.is_object() && !value.is_array(); }

// An object of plain values: "a 1, b 2".
bool isFlat(const Json& value) {
  return value.is_object() && std::all_of(value.begin(), value.end(), isPlain);
}

// Whether an object fits on one line: its members are plain values or flat
// objects, shown as "a 1, b (c 2, d 3)".
bool isShort(const Json& value) {
  return value.is_object() && std::all_of(value.begin(), value.end(), [](const Json& member) {
           return isPlain(member) || isFlat(member);
         });
}

std::string shortText(const Json& object) {
  std::string text;
  for (const auto& [key, member] : object.items()) {
    if (!text.empty()) text += ", ";
    text += key + (isPlain(member) ? " " + plain(member) : " (" + shortText(member) + ")");
  }
  return text;
}

void addLine(std::string& text, int depth, const std::string& line) {
  text.append(2 * depth, ' ').append(line).append("\n");
}

void addMember(std::string& text, int depth, const std::string& name, const Json& value) {
  if (value.is_array()) {
    if (value.empty()) addLine(text, depth, name + ": none");
    for (std::size_t i = 0; i < value.size(); ++i) {
      addMember(text, depth, name + "[" + std::to_string(i) + "]", value[i]);
    }
  } else if (isPlain(value)) {
    addLine(text, depth, name + ": " + plain(value));
  } else if (isShort(value)) {
    addLine(text, depth, name + ": " + shortText(value));
  } else {
    addLine(text, depth, name + ":");
    for (const auto& [key, member] : value.items()) addMember(text, depth + 1, key, member);
  }
}

}  // namespace

std::string resultText(const Json& tree) {
  std::string text;
  addLine(text, 0, plain(tree["kind"]) + " request " + plain(tree["requestId"]) + ": " +
                       plain(tree["status"]));
  const Json& measurements = tree["measurements"];
  if (measurements.is_object()) {
    for (const auto& [key, value] : measurements.items()) addMember(text, 1, key, value);
  }
  return text;
}

void TextPrinter::print(const Result& result) {
  out_ << resultText(resultTree(result)) << std::flush;
}

}  // namespace scan
}  // namespace lodestack
