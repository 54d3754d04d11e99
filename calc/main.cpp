// bitcalc: the command line of the evaluator. Runs statements from -e, a
// file or standard input (interactively at a terminal), or checks golden
// case files.
#include "bitfcns/version.hpp"
#include "calc/display.hpp"
#include "calc/evaluator.hpp"
#include "calc/golden_check.hpp"
#include "calc/line_reader.hpp"
#include "calc/parser.hpp"
#include "calc/text_join.hpp"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace {

constexpr int exitClean = 0;
constexpr int exitError = 1;
constexpr int exitUsage = 2;

constexpr std::string_view helpText = R"(Usage: bitcalc [-k] [--canonical] -e STATEMENTS
       bitcalc [-k] [--canonical] FILE
       bitcalc [-k] [--canonical]          (statements from standard input)
       bitcalc --check FILE...
       bitcalc --version

bitcalc evaluates statements in the host's array syntax over the stand-in
host, calling the seven functions of libbitfcns.so (bitand, bitor, bitxor,
bitcmp, bitget, bitset, bitshift) the way the host's interpreter does, and
shows their results or the errors they raise.

Options:
  -e STATEMENTS  evaluate STATEMENTS
  -k             keep going: show each error and go on with the next statement
                 (after a syntax error, with the next line); without -k the
                 first error ends the evaluation
  --canonical    show each value as one exact line, NAME = CLASS DIMS [e1 e2 ...],
                 and each error as "error: IDENTIFIER" (or "error: TEXT" for an
                 error without identifier), all on standard output
  --check FILE...  run golden case files: ">> STATEMENTS" lines, ".. MORE" lines
                 continuing them, then the exact canonical lines expected; blank
                 lines and lines starting with % are passed over. Reports each
                 mismatch with the file's line number. In a Markdown file
                 (.md) only the fenced blocks that begin with >> are read
  --version      show the versions of bitcalc and of the loaded libbitfcns.so
  -h, --help     show this text

At a terminal, standard input is read with a prompt, line editing and
history; an error there ends the rest of that input, not the session.
Exit status: 0 when no error occurred; 1 when one did, when the input can't
be read or the output can't be written, or when a golden case failed or a
case file holds none; 2 for a usage error.

Statements are separated by line breaks, ';' or ','; a ';' after a statement
keeps its value from being shown; '%' starts a comment; '...' continues a
statement on the next line.
  EXPR               a call at top level asks for no output; the value is ans
  NAME = EXPR        a call on the right asks for one output
  [A, B] = CALL      the call asks for as many outputs as there are names
A call used as an argument of another call asks for one output. An argument
that is no variable (a call's result, a conversion, a literal) is passed as a
temporary, flagged 0x200: the library may take over its storage.

Expressions:
  5  -1  1.5  .5  1e300  Inf  NaN      double scalars; true, false logical
  + - * / ^  (also .* ./ .^)           element-wise, a scalar broadcasting;
                                       an integer operand gives an integer
                                       result (rounded, saturated), else single
                                       gives single, else double
  -x  +x  (x)  x'  x.'                 signs, parentheses, transposes
  a:b  a:s:b                           ranges
  [a b c; d e f]  []                   concatenation of arrays of one class
  'text'  ''                           char row (UTF-16 units), 0-by-0 char
  "text"  ""  string(missing)          string scalars; missing alone is the
                                       missing string too
  {a, b; c, d}  {}                     cell arrays
  int8(x) ... uint64(x), single(x), double(x), logical(x)
                                       conversion: round half away from zero,
                                       saturate, NaN to 0; char becomes its codes
  intmax('cls')  intmin('cls')         limits of an integer class (int32 if none)
  zeros(d1, d2, ..., 'cls')  ones(...)  true(...)  false(...)  Inf(...)  NaN(...)
  reshape(x, d1, d2, ...)              one size may be [] to be worked out
  sparse(x)  complex(re, im)  string(x)
  bitand(...) and the other six        any number of arguments, nested freely
A function that libbitfcns.so doesn't define yet answers "undefined function".
bitcalc makes no array over 1 GiB of its own.

Display: the human form shows NAME = DIMS CLASS, then the values by rows and
columns, a page per index beyond the second dimension. The canonical form
writes elements in storage order (column-major): integers and logicals as
exact decimals; double and single as NaN, Inf, -Inf, a whole number as its
exact integer (-0 for negative zero), others as the shortest text that reads
back to the same value; complex elements as re+imi, with "complex" after the
sizes ("sparse" likewise); a char array as one quoted text ['int8']; string
elements as "text" or <missing>; cell elements as {CLASS DIMS [...]}. In
quoted text a quote is doubled, a backslash is \\, and any code unit outside
printable ASCII is \uXXXX.
)";

struct Options {
    bool keepGoing = false;
    bool canonical = false;
    bool check = false;
    std::optional<std::string> statements;
    std::vector<std::string> files;
};

int usageError(const std::string& problem) {
    std::cerr << "bitcalc: " << problem << " (see bitcalc --help)\n";
    return exitUsage;
}

// Input that can't be read: a missing or unreadable file, a directory.
struct InputError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// All of an open file; `name` is for the error.
std::string readAll(int fd, const std::string& name) {
    auto failure = [&](int error) {
        return InputError(bitcalc::joinText("can't read ", name, ": ", std::strerror(error)));
    };
    struct stat status {};
    if (fstat(fd, &status) != 0) throw failure(errno);
    if (S_ISDIR(status.st_mode)) throw failure(EISDIR);
    std::string content;
    char buffer[1 << 16];
    for (;;) {
        const ssize_t got = read(fd, buffer, sizeof buffer);
        if (got == 0) return content;
        if (got < 0) {
            if (errno == EINTR) continue;
            throw failure(errno);
        }
        content.append(buffer, static_cast<std::size_t>(got));
    }
}

std::string readFile(const std::string& path) {
    const int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0)
        throw InputError(bitcalc::joinText("can't read ", path, ": ", std::strerror(errno)));
    try {
        std::string content = readAll(fd, path);
        close(fd);
        return content;
    } catch (...) {
        close(fd);
        throw;
    }
}

// Flushes standard output; a failed write (a full disk, a closed pipe) is
// an error of the run, since output was lost.
int finishOutput(int status) {
    errno = 0;
    std::cout.flush();
    if (!std::cout || std::fflush(stdout) != 0 || std::ferror(stdout)) {
        std::cerr << "bitcalc: can't write the output"
                  << (errno != 0 ? bitcalc::joinText(": ", std::strerror(errno)) : "") << "\n";
        return exitError;
    }
    return status;
}

int checkFiles(const std::vector<std::string>& files) {
    bool passed = true;
    for (const std::string& file : files) {
        try {
            const bitcalc::GoldenResult result =
                bitcalc::checkGoldenCases(readFile(file), file, std::cout);
            if (result.cases == 0) {
                std::cerr << "bitcalc: " << file << " holds no cases\n";
                passed = false;
                continue;
            }
            std::cout << file << ": " << result.cases - result.failures << " of " << result.cases
                      << " cases passed\n";
            passed = passed && result.failures == 0;
        } catch (const InputError& error) {
            std::cerr << "bitcalc: " << error.what() << "\n";
            passed = false;
        }
    }
    return passed ? exitClean : exitError;
}

// Statements typed at a terminal: a line is run once its brackets close.
bool runInteractively(bitcalc::Evaluator& evaluator, bool keepGoing) {
    bool clean = true;
    std::string pending;
    while (const std::optional<std::string> line =
               bitcalc::readTerminalLine(pending.empty() ? ">> " : ".. ")) {
        pending += *line;
        pending += '\n';
        if (bitcalc::needsMoreInput(pending)) continue;
        clean = evaluator.run(pending, keepGoing) && clean;
        pending.clear();
    }
    if (!pending.empty()) clean = evaluator.run(pending, keepGoing) && clean;
    std::cout << "\n";
    return clean;
}

int run(const Options& options) {
    const auto display = options.canonical ? bitcalc::makeCanonicalDisplay(std::cout)
                                           : bitcalc::makeHumanDisplay(std::cout, std::cerr);
    bitcalc::Evaluator evaluator(*display);
    bool clean = true;
    if (options.statements) {
        clean = evaluator.run(*options.statements, options.keepGoing);
    } else if (!options.files.empty()) {
        clean = evaluator.run(readFile(options.files.front()), options.keepGoing);
    } else if (isatty(STDIN_FILENO)) {
        clean = runInteractively(evaluator, options.keepGoing);
    } else {
        clean = evaluator.run(readAll(STDIN_FILENO, "standard input"), options.keepGoing);
    }
    return clean ? exitClean : exitError;
}

}  // namespace

int main(int argc, char** argv) {
    Options options;
    for (int i = 1; i < argc; ++i) {
        const std::string_view argument = argv[i];
        if (argument == "-h" || argument == "--help") {
            std::cout << helpText;
            return finishOutput(exitClean);
        } else if (argument == "--version") {
            std::cout << "bitcalc " << BITFCNS_VERSION_STRING << " (libbitfcns " << bitfcnsVersion()
                      << ")\n";
            return finishOutput(exitClean);
        } else if (argument == "-k" || argument == "--keep-going") {
            options.keepGoing = true;
        } else if (argument == "--canonical") {
            options.canonical = true;
        } else if (argument == "--check") {
            options.check = true;
        } else if (argument == "-e") {
            if (i + 1 == argc) return usageError("-e needs the statements to evaluate");
            if (options.statements) return usageError("-e may be given once");
            options.statements = argv[++i];
        } else if (argument.size() > 1 && argument.front() == '-') {
            return usageError(bitcalc::joinText("unknown option ", argument));
        } else {
            options.files.emplace_back(argument);
        }
    }
    if (options.check) {
        if (options.files.empty()) return usageError("--check needs at least one file");
        if (options.statements) return usageError("--check takes files, not -e");
        return finishOutput(checkFiles(options.files));
    }
    if (options.statements && !options.files.empty())
        return usageError("give either -e or a file, not both");
    if (options.files.size() > 1) return usageError("give one file to evaluate");
    try {
        return finishOutput(run(options));
    } catch (const std::exception& error) {
        std::cerr << "bitcalc: " << error.what() << "\n";
        return exitError;
    }
}
