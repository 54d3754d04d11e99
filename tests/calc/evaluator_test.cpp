// The evaluator against fake entry points: the calling shape (nlhs, the
// 0x200 flag on temporaries only), results and refusals, the human display,
// and no array left behind.
#include "calc/evaluator.hpp"
#include "calc/display.hpp"
#include "host/array_factory.hpp"
#include "host/exceptions.hpp"

#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <vector>

namespace bitcalc {
namespace {

// What the fake entry points saw of each call.
struct CallRecord {
    int nlhs;
    std::vector<bool> flagged;  // per input: the 0x200 flag
};
std::vector<CallRecord> calls;

void record(int nlhs, int nrhs, const zqArray_tag** prhs) {
    CallRecord call{nlhs, {}};
    for (int i = 0; i < nrhs; ++i)
        call.flagged.push_back((prhs[i]->flags & zqSharedResultFlag) != 0);
    calls.push_back(call);
}

// Adds 1 to each element of a double first input, in its own storage when
// the input is flagged, the way a library takes a temporary over; fills
// every output slot asked for.
void increment(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    record(nlhs, nrhs, prhs);
    if (nrhs == 0) host::raiseHostError("VESPRA", "minrhs");
    const zqArray_tag* first = prhs[0];
    if (host::classOf(*first) != zqDoubleClass || host::isComplex(*first))
        host::raiseHostError("VESPRA:bitcmp", "firstArgNotInt");
    zqArraySlot result((first->flags & zqSharedResultFlag)
                           ? matrix::detail::shared_copy(first)
                           : host::makeArray(zqDoubleClass, host::dimensions(*first)).release());
    for (std::size_t i = 0, n = host::elementCount(*first); i < n; ++i) {
        static_cast<double*>(result->data)[i] = static_cast<const double*>(first->data)[i] + 1;
    }
    for (int slot = 1; slot < nlhs; ++slot) plhs[slot] = host::makeArray(zqDoubleClass, {1, 1});
    plhs[0] = std::move(result);
}

// Gives no output at all.
void silent(int nlhs, zqArraySlot*, int nrhs, const zqArray_tag** prhs) {
    record(nlhs, nrhs, prhs);
}

const LibraryFunction fakeFunctions[] = {
    {"bitcmp", &increment}, {"bitset", &silent}, {"bitget", nullptr}};

struct Session {
    std::ostringstream out;
    std::unique_ptr<Display> display = makeCanonicalDisplay(out);
    Evaluator evaluator{*display, fakeFunctions};

    std::string run(std::string_view source) {
        out.str("");
        calls.clear();
        evaluator.run(source, true);
        return out.str();
    }
};

TEST(CallingShape, OutputsAskedForFollowTheStatement) {
    Session session;
    session.run("bitcmp(1); y = bitcmp(1); [a, b, c] = bitcmp(1); bitcmp(bitcmp(1))");
    ASSERT_EQ(calls.size(), 5u);
    EXPECT_EQ(calls[0].nlhs, 0);  // a call at top level
    EXPECT_EQ(calls[1].nlhs, 1);  // on the right of NAME =
    EXPECT_EQ(calls[2].nlhs, 3);  // one per name of the output list
    EXPECT_EQ(calls[3].nlhs, 1);  // the argument of another call
    EXPECT_EQ(calls[4].nlhs, 0);
    EXPECT_NE(session.evaluator.variable("c"), nullptr);
}

TEST(CallingShape, OnlyTemporariesAreFlaggedAndVariablesKeepTheirValues) {
    Session session;
    session.run("x = [1 2]; bitcmp(x, double(x), bitcmp(x), [1 2], x + 1, 5, (x))");
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[1].flagged, (std::vector<bool>{false, true, true, true, true, true, false}));

    // A flagged temporary is taken over; a variable passed by name is not,
    // nor is a variable that holds a result that once shared a temporary.
    EXPECT_EQ(session.run("y = bitcmp([1 2]); z = bitcmp(y); x, y, z"),
              "x = double 1x2 [1 2]\ny = double 1x2 [2 3]\nz = double 1x2 [3 4]\n");
    EXPECT_EQ(session.run("bitcmp(y)"), "ans = double 1x2 [3 4]\n");
    EXPECT_EQ(calls[0].flagged, std::vector<bool>{false});
}

TEST(CallingShape, MissingOutputsAndRefusals) {
    Session session;
    EXPECT_EQ(session.run("bitset(1)"), "");  // no output asked, none given
    EXPECT_EQ(session.run("y = bitset(1)"), "error: bitcalc:noOutput\n");
    EXPECT_EQ(session.run("bitcmp()"), "error: VESPRA:minrhs\n");
    EXPECT_EQ(session.run("bitget(5, 1)"), "error: bitcalc:undefinedFunction\n");
    EXPECT_EQ(session.run("bitshift(5, 1)"), "error: bitcalc:undefinedFunction\n");
    EXPECT_EQ(session.evaluator.variable("y"), nullptr);
}

std::string humanText(std::string_view source) {
    std::ostringstream out;
    std::ostringstream errors;
    const auto display = makeHumanDisplay(out, errors);
    Evaluator evaluator(*display, fakeFunctions);
    evaluator.run(source, true);
    return out.str() + errors.str();
}

TEST(HumanDisplay, LaysValuesOutByRowsAndColumns) {
    EXPECT_EQ(humanText("[1 2.5; -3 2^64]"),
              "ans = 2x2 double\n                     1                   2.5\n"
              "                    -3  18446744073709551616\n");
    EXPECT_EQ(humanText("zeros(1, 2, 2), ['ab'; 'cd']"),
              "ans = 1x2x2 double\n  (:,:,1)\n  0  0\n  (:,:,2)\n  0  0\nans = 2x2 char\n  'ab'\n  "
              "'cd'\n");
    EXPECT_EQ(
        humanText("{1, 'a', {}, [1 2]}, [\"a\" string(missing)], complex(1, -2), sparse(true)"),
        "ans = 1x4 cell\n  [1]  'a'  {0x0 cell}  [1x2 double]\nans = 1x2 string\n  \"a\"  "
        "<missing>\nans = 1x1 double complex\n  1-2i\nans = 1x1 logical sparse\n  1\n");
    EXPECT_EQ(humanText("1e300, bitcmp("),
              "ans = 1x1 double\n  1e300\nerror: 1:15: expected a value, found end of input "
              "(bitcalc:syntax)\n");
    const std::string shown = humanText("1:30");  // long rows wrap into blocks of columns
    EXPECT_NE(shown.find("  Columns 1 to 20:\n   1   2"), std::string::npos) << shown;
    EXPECT_NE(shown.find("  Columns 21 to 30:\n  21  22"), std::string::npos) << shown;
}

TEST(Memory, NoArrayOutlivesTheEvaluator) {
    const std::size_t before = host::liveArrayCount();
    {
        Session session;
        session.run(
            "x = {1, 'a', \"s\", {2}}; y = [x x]; z = bitcmp([1 2]); w = complex(int8(1), 2)'; "
            "bad = [1 'a']; q = reshape(1:6, 4, []); bitset(1); r = bitcmp(bitcmp(x))");
    }
    EXPECT_EQ(host::liveArrayCount(), before);
}

}  // namespace
}  // namespace bitcalc
