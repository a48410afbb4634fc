#include <cstdio>
#include <exception>
#include <new>
#include <variant>

#include "Commands.h"
#include "Options.h"
#include "Refusal.h"

int main(int argc, char** argv) {
  constexpr int kNotDone = 1;
  try {
    const std::variant<QeltDesktop::Options, QeltDesktop::UsageEnd> parsed =
        QeltDesktop::parseOptions(argc, argv);
    if (const auto* const end = std::get_if<QeltDesktop::UsageEnd>(&parsed)) {
      std::fputs(end->text.c_str(), end->status == 0 ? stdout : stderr);
      return end->status;
    }
    QeltDesktop::runCommand(std::get<QeltDesktop::Options>(parsed));
    return 0;
  } catch (const std::bad_alloc&) {
    std::fputs("qelt-sketch: out of memory\n", stderr);
  } catch (const QeltDesktop::Refusal& refusal) {
    std::fprintf(stderr, "%s\n", refusal.what());
  } catch (const std::exception& error) {
    std::fprintf(stderr, "qelt-sketch: %s\n", error.what());
  }
  return kNotDone;
}
