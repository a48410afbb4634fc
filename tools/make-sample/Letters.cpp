#include "Letters.h"

#include <map>
#include <stdexcept>
#include <string>

namespace {

// A letter's design: y up from the base line, an x is 1 high. A letter is entered at (0, 0.28) and most are
// left at (advance, 0.28), on the hairline up to the next one; o and w are left at the height of an x.
struct Letter {
  double advance;
  PenPass joined;
  std::vector<PenPass> after;  // dots and bars, made when the word is done
};

constexpr bool kCorner = true;

const std::map<char, Letter>& letters() {
  static const std::map<char, Letter> kLetters = {
      {'a',
       {0.98,
        {{{0.00, 0.28}},
         {{0.28, 0.78}},
         {{0.62, 0.90}, kCorner},
         {{0.40, 1.00}},
         {{0.16, 0.68}},
         {{0.15, 0.22}},
         {{0.33, 0.00}},
         {{0.53, 0.36}},
         {{0.65, 0.96}, kCorner},
         {{0.60, 0.45}},
         {{0.62, 0.10}},
         {{0.75, 0.00}},
         {{0.98, 0.28}}},
        {}}},
      {'c',
       {0.74,
        {{{0.00, 0.28}},
         {{0.26, 0.75}},
         {{0.57, 0.84}, kCorner},
         {{0.40, 1.00}},
         {{0.18, 0.70}},
         {{0.16, 0.26}},
         {{0.38, 0.00}},
         {{0.74, 0.28}}},
        {}}},
      {'d',
       {1.00,
        {{{0.00, 0.28}},
         {{0.28, 0.78}},
         {{0.60, 0.88}, kCorner},
         {{0.40, 1.00}},
         {{0.16, 0.66}},
         {{0.15, 0.22}},
         {{0.33, 0.00}},
         {{0.53, 0.34}},
         {{0.65, 1.10}},
         {{0.72, 2.00}, kCorner},
         {{0.64, 1.05}},
         {{0.62, 0.20}},
         {{0.76, 0.00}},
         {{1.00, 0.28}}},
        {}}},
      {'e',
       {0.72,
        {{{0.00, 0.28}},
         {{0.30, 0.46}},
         {{0.52, 0.78}},
         {{0.38, 1.00}},
         {{0.17, 0.66}},
         {{0.20, 0.16}},
         {{0.40, 0.00}},
         {{0.72, 0.28}}},
        {}}},
      {'h',
       {0.96,
        {{{0.00, 0.28}},
         {{0.30, 1.00}},
         {{0.47, 1.75}},
         {{0.38, 2.10}},
         {{0.24, 1.65}},
         {{0.19, 0.80}},
         {{0.17, 0.00}, kCorner},
         {{0.24, 0.55}},
         {{0.44, 0.95}},
         {{0.61, 0.86}},
         {{0.62, 0.45}},
         {{0.63, 0.12}},
         {{0.76, 0.00}},
         {{0.96, 0.28}}},
        {}}},
      {'i',
       {0.58,
        {{{0.00, 0.28}},
         {{0.20, 0.72}},
         {{0.28, 1.00}, kCorner},
         {{0.25, 0.50}},
         {{0.26, 0.12}},
         {{0.38, 0.00}},
         {{0.58, 0.28}}},
        {{{{0.30, 1.50}}, {{0.36, 1.46}}, {{0.34, 1.40}}, {{0.29, 1.45}}, {{0.36, 1.47}}}}}},
      {'l',
       {0.64,
        {{{0.00, 0.28}},
         {{0.30, 1.00}},
         {{0.48, 1.75}},
         {{0.39, 2.12}},
         {{0.24, 1.65}},
         {{0.19, 0.75}},
         {{0.24, 0.12}},
         {{0.40, 0.00}},
         {{0.64, 0.28}}},
        {}}},
      {'n',
       {0.98,
        {{{0.00, 0.28}},
         {{0.17, 0.72}},
         {{0.25, 0.98}, kCorner},
         {{0.22, 0.50}},
         {{0.20, 0.00}, kCorner},
         {{0.27, 0.55}},
         {{0.47, 0.95}},
         {{0.64, 0.86}},
         {{0.65, 0.45}},
         {{0.66, 0.12}},
         {{0.79, 0.00}},
         {{0.98, 0.28}}},
        {}}},
      {'o',
       {0.92,
        {{{0.00, 0.28}},
         {{0.26, 0.78}},
         {{0.46, 0.96}, kCorner},
         {{0.20, 0.76}},
         {{0.15, 0.28}},
         {{0.36, 0.00}},
         {{0.60, 0.30}},
         {{0.60, 0.78}},
         {{0.44, 0.97}},
         {{0.55, 0.80}},
         {{0.92, 0.84}}},
        {}}},
      {'p',
       {0.90,
        {{{0.00, 0.28}},
         {{0.18, 0.72}},
         {{0.26, 1.04}, kCorner},
         {{0.20, 0.10}},
         {{0.15, -0.95}, kCorner},
         {{0.20, -0.20}},
         {{0.28, 0.60}},
         {{0.46, 0.97}},
         {{0.67, 0.82}},
         {{0.67, 0.34}},
         {{0.46, 0.01}},
         {{0.24, 0.14}, kCorner},
         {{0.50, 0.00}},
         {{0.90, 0.28}}},
        {}}},
      {'r',
       {0.82,
        {{{0.00, 0.28}},
         {{0.19, 0.80}},
         {{0.27, 1.12}, kCorner},
         {{0.36, 0.93}},
         {{0.56, 0.94}, kCorner},
         {{0.50, 0.50}},
         {{0.50, 0.12}},
         {{0.62, 0.00}},
         {{0.82, 0.28}}},
        {}}},
      {'s',
       {0.76,
        {{{0.00, 0.28}},
         {{0.24, 0.65}},
         {{0.40, 1.08}, kCorner},
         {{0.45, 0.74}},
         {{0.55, 0.36}},
         {{0.42, 0.02}},
         {{0.18, 0.08}, kCorner},
         {{0.44, 0.00}},
         {{0.76, 0.28}}},
        {}}},
      {'t',
       {0.66,
        {{{0.00, 0.28}},
         {{0.25, 0.90}},
         {{0.36, 1.62}, kCorner},
         {{0.29, 0.80}},
         {{0.29, 0.14}},
         {{0.43, 0.00}},
         {{0.66, 0.28}}},
        {{{{0.02, 1.13}}, {{0.34, 1.16}}, {{0.66, 1.22}}}}}},
      {'w',
       {1.22,
        {{{0.00, 0.28}},
         {{0.17, 0.72}},
         {{0.24, 1.00}, kCorner},
         {{0.20, 0.45}},
         {{0.25, 0.08}},
         {{0.40, 0.00}},
         {{0.57, 0.36}},
         {{0.66, 0.98}, kCorner},
         {{0.61, 0.45}},
         {{0.66, 0.08}},
         {{0.80, 0.00}},
         {{0.97, 0.36}},
         {{0.96, 0.95}},
         {{1.02, 0.80}},
         {{1.22, 0.84}}},
        {}}},
  };
  return kLetters;
}

// The one capital stands alone: an oval begun at its top right, then the tail across it.
const std::vector<PenPass>& capitalQ() {
  static const std::vector<PenPass> kPasses = {
      {{{1.18, 1.82}},
       {{0.86, 2.10}},
       {{0.38, 1.85}},
       {{0.12, 1.10}},
       {{0.24, 0.34}},
       {{0.70, 0.00}},
       {{1.20, 0.32}},
       {{1.40, 1.05}},
       {{1.24, 1.75}},
       {{0.86, 2.10}},
       {{0.58, 2.00}}},
      {{{0.62, 0.42}}, {{0.86, 0.46}}, {{1.12, 0.10}}, {{1.42, -0.22}}, {{1.78, 0.02}}}};
  return kPasses;
}

constexpr double kCapitalAdvance = 1.62;
constexpr double kSpace = 0.62;

}  // namespace

std::vector<PenPass> write(std::string_view text, const Lettering& lettering) {
  std::vector<PenPass> passes;
  double pen = 0.0;
  const auto onPage = [&](const Waypoint& design, double left) {
    const double x = (left + design.at.x) * lettering.width + design.at.y * lettering.slant;
    const double y = -design.at.y + x * -lettering.climb;
    return Waypoint{lettering.origin + Point{x, y} * lettering.height, design.corner};
  };
  const auto placed = [&](const PenPass& design, double left) {
    PenPass pass;
    for (const Waypoint& waypoint : design) pass.push_back(onPage(waypoint, left));
    return pass;
  };

  PenPass word;
  std::vector<PenPass> after;
  const auto finishWord = [&] {
    if (!word.empty()) passes.push_back(word);
    passes.insert(passes.end(), after.begin(), after.end());
    word.clear();
    after.clear();
  };

  for (const char character : text) {
    if (character == ' ') {
      finishWord();
      pen += kSpace;
    } else if (character == ',') {
      after.push_back(placed({{{0.02, 0.10}}, {{0.06, 0.00}}, {{-0.06, -0.34}}}, pen));
      pen += 0.2;
    } else if (character == 'Q') {
      for (const PenPass& pass : capitalQ()) passes.push_back(placed(pass, pen));
      pen += kCapitalAdvance;
    } else {
      const auto found = letters().find(character);
      if (found == letters().end()) throw std::invalid_argument(std::string("no letter for ") + character);
      const Letter& letter = found->second;
      // The last point of the letter before is where this one is entered.
      for (std::size_t i = word.empty() ? 0 : 1; i < letter.joined.size(); ++i)
        word.push_back(onPage(letter.joined[i], pen));
      for (const PenPass& pass : letter.after) after.push_back(placed(pass, pen));
      pen += letter.advance;
    }
  }
  finishWord();
  return passes;
}
