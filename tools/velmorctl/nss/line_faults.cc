#include "nss/line_faults.h"

#include "nss/databases.h"

namespace velmorctl {

namespace {

using Kind = LineFault::Kind;

struct FaultText {
  const char* reason;
  const char* remedy;
};

FaultText BadCriterionText(const SwitchLine& line) {
  return {
      IsLibraryDatabase(line.database)
          ? "the brackets have no meaning, and because of them the C library uses no line of the file"
          : "the brackets have no meaning",
      "write [STATUS=ACTION], with success, notfound, unavail or tryagain, and return, continue or merge"};
}

FaultText TextOf(const LineFault& fault, const SwitchLine& line) {
  switch (fault.kind) {
    case Kind::NoDatabase:
      return {"the line names no database, so it is passed over",
              "write the database's name before the colon"};
    case Kind::NoColon:
      return {"there is no colon behind the database's name; not every program reads such a line",
              "put a colon behind the name"};
    case Kind::ManyColons:
      return {"there is more than one colon; not every program reads such a line", "leave one colon"};
    case Kind::LoneBracket:
      return {"the brackets have no service of their own before them; the C library reads no further",
              "put all words of one service into one pair of brackets behind it"};
    case Kind::BadCriterion:
      return BadCriterionText(line);
    case Kind::Remark:
      return {"a comment behind services: the C library takes its words for services",
              "put the comment on a line of its own"};
    case Kind::NoNewline:
      break;
  }
  return {"the last line is not ended by a newline, so the C library does not read it",
          "end the line with a newline"};
}

}  // namespace

FileProblem LineProblem(const std::string& shown, const SwitchLine& line, const std::string& value,
                        const std::string& reason, const std::string& remedy) {
  FileProblem problem = {};
  problem.kind = FileProblem::Kind::Malformed;
  problem.file = shown;
  problem.line = line.number;
  problem.value = value;
  problem.reason = reason;
  problem.remedy = remedy;
  return problem;
}

FileProblem FaultProblem(const LineFault& fault, const SwitchLine& line, const std::string& shown) {
  const FaultText text = TextOf(fault, line);
  return LineProblem(shown, line, fault.value, text.reason, text.remedy);
}

}  // namespace velmorctl
