#include "ReaderTestSupport.h"

#include <gtest/gtest.h>

// What the reader says of a mistake, and where. Statements stand in main from line 2 on.

namespace {

struct Mistake {
    const char* pText;
    const char* pMessages;
};

template <std::size_t Count>
void expectInMain(const Mistake (&Mistakes)[Count]) {
    for (const Mistake& Each : Mistakes)
        EXPECT_EQ(ReadText(inMain(Each.pText)).messages(), Each.pMessages) << Each.pText;
}

/// On line 1 of a text with a main behind it.
template <std::size_t Count>
void expectInProgram(const Mistake (&Mistakes)[Count]) {
    for (const Mistake& Each : Mistakes)
        EXPECT_EQ(ReadText(Each.pText + std::string("\nproc main() { }")).messages(),
                  Each.pMessages)
            << Each.pText;
}

TEST(ReaderMessages, NumbersCharactersAndSeparators) {
    const Mistake Mistakes[] = {
        {"s = 1 $ 2;", "2:7: error: unexpected character '$'\n"},
        {"s = 'a';", "2:5: error: texts in quotes are not part of the language\n"},
        {"s = 12ab;", "2:5: error: malformed number '12ab'\n"},
        {"s = 0x;", "2:5: error: malformed number '0x'\n"},
        {"s = 1e400;", "2:5: error: number '1e400' is out of the range of float64\n"},
        {"s = 007;", "2:5: error: a decimal number does not begin with 0: '007'\n"},
        {"s = 18446744073709551615;", "2:5: error: integer '18446744073709551615' is too large for "
                                      "a float64 to hold it exactly\n"},
        {"s = 9007199254740993;",
         "2:5: error: integer '9007199254740993' is too large for a float64 to hold it exactly\n"},
        {"/* open", "2:1: error: the comment is not closed\n4:1: error: expected '}' before the "
                    "end of the file\n"},
        {"s = \"a b c", "2:5: error: texts in quotes are not part of the language\n"},
        {"s = ümlaut;", "2:5: error: unexpected character 'ü'\n"},
        {"s = 1.2.3;", "2:5: error: malformed number '1.2.3'\n"},
        {"s = 1\nout = 2;", "2:6: error: expected ';'\n"},
        {"s = 1 out = 2;", "2:6: error: expected ';'\n"},
        {"s = ;", "2:5: error: expected an expression before ';'\n"},
        {"s = (1 + ;", "2:10: error: expected an expression before ';'\n"},
        {"s = (1 + 2;", "2:11: error: expected ')' before ';'\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, NamesAndWhatTheyStandFor) {
    const Mistake Mistakes[] = {
        {"s = a;", "2:5: error: array 'a' needs an index\n"},
        {"s = a[];", "2:7: error: expected an expression before ']'\n"},
        {"s = s[1];", "2:5: error: 's' is not an array\n"},
        {"a = 1;", "2:1: error: array 'a' needs an index\n"},
        {"a[1 = 1;", "2:5: error: '=' cannot stand in an expression; equality is tested by '=='\n"},
        {"s[0] = 1;", "2:1: error: 's' is not an array\n"},
        {"in = 1;", "2:1: error: input 'in' cannot be assigned\n"},
        {"P = 1;", "2:1: error: param 'P' cannot be assigned\n"},
        {"P++;", "2:1: error: param 'P' cannot be assigned\n"},
        {"T = 1;", "2:1: error: 'T' is not a variable\n"},
        {"f = 1;", "2:1: error: 'f' is not a variable\n"},
        {"s = T;", "2:5: error: 'T' is not a variable\n"},
        {"s = f;", "2:5: error: 'f' is not a variable\n"},
        {"s = f(1);", "2:5: error: 'f' has no result\n"},
        {"s = 1 + g();", "2:9: error: a call cannot stand in an expression: assign the result of "
                         "'g' to a variable first\n"},
        {"s = e();", "2:5: error: extern 'e' has no result\n"},
        {"e(1);", "2:1: error: extern 'e' takes no arguments\n"},
        {"f();", "2:1: error: 'f' takes 1 argument, not 0\n"},
        {"f(1, 2);", "2:1: error: 'f' takes 1 argument, not 2\n"},
        {"g(1);", "2:1: error: 'g' takes 0 arguments, not 1\n"},
        {"a[1] = g();", "2:8: error: the result of a call goes to a variable, not to an element\n"},
        {"main();", "2:1: error: 'main' cannot be called\n"},
        {"s();", "2:1: error: 's' is not a procedure\n"},
        {"nothing();", "2:1: error: 'nothing' is not declared\n"},
        {"x = y + x;", "2:1: error: 'x' is not declared\n2:5: error: 'y' is not declared\n"},
        {"s += g();", "2:6: error: a call cannot stand in an expression: assign the result of 'g' "
                      "to a variable first\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, StatementsThatHoldOthers) {
    const Mistake Mistakes[] = {
        {"if (s = 1) { }",
         "2:7: error: '=' cannot stand in an expression; equality is tested by '=='\n"},
        {"if s { }", "2:4: error: expected '(' before 's'\n"},
        {"if (s { s = 1; }", "2:7: error: expected ')' before '{'\n"},
        {"if (s) }", "2:8: error: expected a statement before '}'\n3:1: error: expected a "
                     "declaration before '}'\n"},
        {"else s = 1;", "2:1: error: this 'else' belongs to no 'if'\n"},
        {"if (s) local uint8 x;", "2:8: error: a declaration needs braces around it here\n"},
        {"while (s)", "3:1: error: expected a statement before '}'\n"},
        {"do s = 1; s = 2;", "2:11: error: expected 'while' before 's'\n"},
        {"do { s = 1; } while (s)\nout = 1;", "2:24: error: expected ';'\n"},
        {"for (s = 0, s < 3; s++) { }", "2:11: error: expected ';'\n"},
        {"for (f(1); s < 3; s++) { }", "2:6: error: a call cannot stand in the head of 'for'\n"},
        {"for (s = 0; s < 3) { out = 1; }", "2:18: error: expected ';'\n"},
        {"for (s = g(); s < 3; s++) { }", "2:10: error: a call cannot stand in an expression: "
                                          "assign the result of 'g' to a variable first\n"},
        {"for (local uint8 i = 0; i < 3; ++i) { } s = i;", "2:45: error: 'i' is not declared\n"},
        {"switch (s) s = 1;", "2:12: error: expected '{' before 's'\n"},
        {"switch (s) case 1: s = 2; break; }\nproc after() {",
         "2:12: error: expected '{' before 'case'\n3:1: error: expected '}' before 'proc'\n"},
        {"state uint8 inner;", "2:1: error: expected '}' before 'state'\n"},
        {"proc inner() { s = 1; }",
         "2:1: error: expected '}' before 'proc'\n3:1: error: expected a declaration before '}'\n"},
        {"s = 1; } }", "2:10: error: expected a declaration before '}'\n"},
        {"{ s = 1;", "4:1: error: expected '}' before the end of the file\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, CasesLabelsAndJumps) {
    const Mistake Mistakes[] = {
        {"switch (s) { case s: break; }",
         "2:19: error: 's' is no constant: it is not a param declared before\n"},
        {"switch (s) { case 1: case 0.5 + 0.5: break; }", "2:27: error: this case stands twice\n"},
        {"switch (s) { case 0: case -0.0: break; }", "2:27: error: this case stands twice\n"},
        {"switch (s) { default: default: break; }", "2:23: error: 'default' stands twice\n"},
        {"switch (s) { case 1: if (in) { case 2: s = 1; } }",
         "2:32: error: 'case' does not stand among the statements of a switch\n"},
        {"switch (s) { if (in) case 1: s = 1; }",
         "2:22: error: 'case' does not stand among the statements of a switch\n"},
        {"switch (s) { case (1/0) % 0 : break; case 1e308 * 10 - 1e308 * 10: break; }",
         "2:43: error: a case must be a number\n"},
        {"case 1: s = 1;", "2:1: error: 'case' does not stand among the statements of a switch\n"},
        {"default: s = 1;",
         "2:1: error: 'default' does not stand among the statements of a switch\n"},
        {"break;", "2:1: error: 'break' stands in no loop or switch\n"},
        {"continue;", "2:1: error: 'continue' stands in no loop\n"},
        {"switch (s) { case 1: continue; }", "2:22: error: 'continue' stands in no loop\n"},
        {"goto x;", "2:1: error: label 'x' is not in this procedure\n"},
        {"goto 1;", "2:6: error: expected a label before '1'\n"},
        {"x: x: s = 1;", "2:4: error: label 'x' already stands at t:2\n"},
        {"x: s = 1;", "2:1: warning: no 'goto' reaches label 'x'\n"},
        {"goto x; x:", ""},
        {"return 1;", "2:8: error: 'main' has no result to return\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, Locals) {
    const Mistake Mistakes[] = {
        {"local uint8 x; local uint8 x;", "2:28: error: 'x' is already declared at t:2\n"},
        {"{ local uint8 x; } x = 1;", "2:20: error: 'x' is not declared\n"},
        {"local uint8 x = x;", "2:17: error: 'x' is not declared\n"},
        {"local uint8 x = f(x);",
         "2:17: error: 'f' has no result\n2:19: error: 'x' is not declared\n"},
        {"local uint8 s;", "2:13: error: 's' is already declared at t:1\n"},
        {"local uint8 f;", "2:13: error: 'f' is already declared at t:1\n"},
        {"local uint8 x[3];", "2:14: error: a local cannot be an array\n"},
        {"local thing x;", "2:7: error: 'thing' is not the name of a type\n"},
        {"local x = 1;", "2:7: error: 'x' is not the name of a type\n"},
        {"local uint8 = 1;", "2:13: error: expected the variable's name before '='\n"},
        {"local uint8 x g();", "2:14: error: expected ';'\n"},
        {"local uint8 q = g() + 1;", "2:17: error: a call cannot stand in an expression: assign "
                                     "the result of 'g' to a variable first\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, OperatorsAndFunctions) {
    const Mistake Mistakes[] = {
        {"s++ ;; s--; ++s; --s; ++a[1]; a[2]--;", ""},
        {"s = s++;", "2:6: error: expected ';'\n"},
        {"s = - - s; s = s--1;", "2:17: error: expected ';'\n"},
        {"1 + 2;", "2:1: error: expected a statement before '1'\n"},
        {"(s) = 1;", "2:1: error: expected a statement before '('\n"},
        {"s == 1;", "2:3: error: expected '=' before '=='\n"},
        {"s = min(1);", "2:10: error: expected ',' before ')'\n"},
        {"s = max(1, 2, 3);", "2:13: error: expected ')' before ','\n"},
        {"s = abs();", "2:9: error: expected an expression before ')'\n"},
        {"s = (T);", "2:8: error: expected an expression before ';'\n"},
        {"s = (uint8 s);", "2:12: error: expected ')' before 's'\n"},
        {"s = in || 2;", "2:8: warning: the left operand of '||' can be other than 0 and 1, and "
                         "only 1 counts as true there\n"},
        {"s = (in == 1) || (bool) in || true && in;", ""},
        {"s = in | 1 || (in > 1 | false);", "2:12: warning: the left operand of '||' can be other "
                                            "than 0 and 1, and only 1 counts as true there\n"},
    };
    expectInMain(Mistakes);
}

TEST(ReaderMessages, Types) {
    const Mistake Mistakes[] = {
        {"type T = uint8 lsb 0;", "1:16: error: lsb is 0; it must lie between 1e-100 and 1e100\n"},
        {"type T = uint8 lsb -1;",
         "1:16: error: lsb is -1; it must lie between 1e-100 and 1e100\n"},
        {"type T = uint8 lsb 1e-300;",
         "1:16: error: lsb is 1e-300; it must lie between 1e-100 and 1e100\n"},
        {"type T = float32 lsb 0.5;", "1:18: error: only integer types can be scaled\n"},
        {"type T = bool offset 1;", "1:15: error: only integer types can be scaled\n"},
        {"type T = uint8 lsb 0.001 offset 1e15;",
         "1:26: error: the offset is too large for the lsb: float64 cannot hold the numbers\n"},
        {"type T = uint8 lsb 0.5 lsb 0.5;", "1:24: error: 'lsb' stands twice\n"},
        {"type T = uint8 saturate;", "1:16: error: 'saturate' needs a range\n"},
        {"type T = uint8 range [0, 256];",
         "1:16: error: limit 256 lies outside the storage, which holds 0 to 255\n"},
        {"type T = uint8 lsb 0.5 offset 1 range [0, 10];",
         "1:33: error: limit 0 lies outside the storage, which holds 1 to 128.5\n"},
        {"type T = uint8 lsb 0.5 range [0.25, 10];",
         "1:24: error: limit 0.25 is not on the grid of the type, whose step is 0.5\n"},
        {"type T = uint8 range [0.5, 10];",
         "1:16: error: limit 0.5 is not on the grid of the type, whose step is 1\n"},
        {"type T = uint8 range [10, 0];",
         "1:16: error: the lower limit 10 is greater than the upper limit 0\n"},
        {"type T = float32 range [0, 1e39];",
         "1:18: error: limit 1e+39 lies outside the storage\n"},
        {"type T = float64 range [0, 1/0];", "1:18: error: a limit must be a finite number\n"},
        {"param float64 X = 1; type T = float64 range [0, X];",
         "1:49: error: 'X' cannot stand in the declaration of a type\n"},
        {"type T = uint8; type U = uint8 range [(T) 0, 1];",
         "1:40: error: 'T' cannot stand in the declaration of a type\n"},
        {"type T = U; type U = uint8;",
         "1:10: error: expected the name of a built-in type before 'U'\n"},
        {"type T = uint8 ragne [0, 1];",
         "1:16: error: expected 'lsb', 'offset', 'range', 'saturate' or ';' before 'ragne'\n"},
        {"type T uint8;", "1:8: error: expected '=' before 'uint8'\n"},
        {"type = uint8;", "1:6: error: expected the new type's name before '='\n"},
        {"type T = uint8 range (0, 1);", "1:22: error: expected '[' before '('\n"},
        {"type T = uint8 range [0 1];", "1:25: error: expected ',' before '1'\n"},
        {"type T = uint8 range [0, 1] saturate both;",
         "1:38: error: expected 'lsb', 'offset', 'range', 'saturate' or ';' before 'both'\n"},
        {"type T = uint8; type T = int8;", "1:22: error: 'T' is already declared at t:1\n"},
    };
    expectInProgram(Mistakes);
}

TEST(ReaderMessages, Variables) {
    const Mistake Mistakes[] = {
        {"state T x;", "1:7: error: 'T' is not the name of a type\n"},
        {"state uint8;", "1:12: error: expected the variable's name before ';'\n"},
        {"state uint8 3x;", "1:13: error: malformed number '3x'\n"},
        {"state uint8 x y;", "1:14: error: expected ';'\n"},
        {"state uint8 x state uint8 y;", "1:14: error: expected ';'\n"},
        {"state uint8 if;", "1:13: error: expected the variable's name before 'if'\n"},
        {"state uint8 x; output int8 x;", "1:28: error: 'x' is already declared at t:1\n"},
        {"state uint8 x = y; state uint8 y = 1;",
         "1:17: error: 'y' is no constant: it is not a param declared before\n"},
        {"param uint8 A = B; param uint8 B = 1;",
         "1:17: error: 'B' is no constant: it is not a param declared before\n"},
        {"param uint8 A;", "1:13: error: param 'A' needs a value\n"},
        {"param uint8 A = A;",
         "1:17: error: 'A' is no constant: it is not a param declared before\n"},
        {"input uint8 i = 1;", "1:17: error: input 'i' gets its value from outside\n"},
        {"state uint8 x = {1};", "1:17: error: 'x' is not an array\n"},
        {"state uint8 x[2] = 1;", "1:20: error: array 'x' takes its values in braces\n"},
        {"state uint8 x[2] = {1, 2, 3};",
         "1:27: error: more values than the 2 elements of the array\n"},
        {"state uint8 x[2] = {1, };", ""},
        {"state uint8 x[2] = {};", "1:21: error: expected an expression before '}'\n"},
        {"state uint8 x[0];", "1:15: error: an array has 1 to 65536 elements, not 0\n"},
        {"state uint8 x[1.5];", "1:15: error: an array has 1 to 65536 elements, not 1.5\n"},
        {"state uint8 x[-1];", "1:15: error: an array has 1 to 65536 elements, not -1\n"},
        {"state uint8 x[];", "1:15: error: expected an expression before ']'\n"},
        {"state uint8 x[70000];", "1:15: error: an array has 1 to 65536 elements, not 70000\n"},
        {"param uint8 A[2] = {1, 2}; state uint8 x = A[0]; state uint8 y = A;",
         "1:44: error: an array element is not a constant\n1:66: error: array 'A' needs an "
         "index\n"},
        {"state float64 x = 1 / 0;", "1:21: error: an initial value must be a finite number\n"},
        {"state float32 x = 1e39;", "1:19: error: an initial value must be a finite number\n"},
        {"state uint8 x = 256; state uint8 y = 1.5; state bool b = 2; state float32 f = 0.1;",
         "1:17: warning: initial value 256 becomes 0 in type 'uint8'\n1:38: warning: initial value "
         "1.5 becomes 1 in type 'uint8'\n1:58: warning: initial value 2 becomes 1 in type "
         "'bool'\n"},
        {"extern e reads(x);", "1:16: error: 'x' is not a variable of the program\n"},
        {"input uint8 i; param uint8 P = 1; extern e reads(i, P) writes(i, P);",
         "1:63: error: an extern cannot write input 'i'\n1:66: error: an extern cannot write param "
         "'P'\n"},
        {"state uint8 x; extern e reads(x, x);", "1:34: error: 'x' is listed twice\n"},
        {"state uint8 x; extern e reads(x) reads(x);",
         "1:34: error: 'reads' stands twice\n1:40: error: 'x' is listed twice\n"},
        {"extern e touches(x);",
         "1:10: error: expected 'reads', 'writes' or ';' before 'touches'\n"},
        {"extern e reads(main);", "1:16: error: 'main' is not a variable of the program\n"},
        {"extern ;", "1:8: error: expected the extern's name before ';'\n"},
        {"export state uint8 x;", "1:8: error: expected 'proc' before 'state'\n"},
        {"uint8 x;", "1:1: error: expected a declaration before 'uint8'\n"},
        {"}", "1:1: error: expected a declaration before '}'\n"},
        {"int x = 3; state uint8 y;", "1:1: error: expected a declaration before 'int'\n"},
        {"state int x;", "1:7: error: 'int' is not the name of a type\n"},
    };
    expectInProgram(Mistakes);
}

TEST(ReaderMessages, Procedures) {
    const Mistake Mistakes[] = {
        {"type T = uint8 lsb 0.5 range [0, 10] saturate; proc main() { } state T x = 11; state T y "
         "= 0.3;",
         "1:76: warning: initial value 11 becomes 10 in type 'T'\n"},
        {"proc main { }", "1:11: error: expected '(' before '{'\n"},
        {"proc uint8 main() { return 1; }", "1:12: error: 'main' has no result\n"},
        {"export proc main() { }", "1:13: error: 'main' cannot be exported\n"},
        {"proc main(uint8 x) { }", "1:17: error: 'main' has no formals\n"},
        {"state uint8 main;", "1:1: error: the program has no procedure 'main'\n"},
        {"", "1:1: error: the program has no procedure 'main'\n"},
        {"proc main() { } proc main() { }", "1:22: error: 'main' is already declared at t:1\n"},
        {"proc main() { } proc f(x) { }", "1:24: error: 'x' is not the name of a type\n"},
        {"proc main() { } proc f(uint8) { }",
         "1:29: error: expected the formal's name before ')'\n"},
        {"proc main() { } proc f(uint8 x[2]) { x = 1; }",
         "1:31: error: a formal cannot be an array\n"},
        {"proc main() { } proc f(uint8 x, uint8 x) { }",
         "1:39: error: 'x' is already declared at t:1\n"},
        {"state uint8 x; proc main() { } proc f(uint8 x) { }",
         "1:45: error: 'x' is already declared at t:1\n"},
        {"proc main() { } proc f(uint8 f) { }", "1:30: error: 'f' is already declared at t:1\n"},
        {"proc main() { } proc f(uint8 x { }", "1:32: error: expected ')' before '{'\n"},
        {"proc main() { } proc f(uint8 x);",
         "1:32: error: expected the procedure's '{' before ';'\n"},
        {"proc main() { } proc T f() { }", "1:22: error: 'T' is not the name of a type\n"},
        {"proc main() { } proc uint8 () { }",
         "1:28: error: expected the procedure's name before '('\n"},
        {"proc main() { } proc uint8 f() { return; }", "1:34: error: 'f' must return a value\n"},
        {"proc main() { } proc uint8 f() { return 1",
         "1:42: error: expected ';'\n1:42: error: expected '}' before the end of the file\n"},
        {"proc main() { ; ", "1:17: error: expected '}' before the end of the file\n"},
    };
    for (const Mistake& Each : Mistakes)
        EXPECT_EQ(ReadText(Each.pText).messages(), Each.pMessages) << Each.pText;
}

TEST(ReaderMessages, ReadingTakesUpAgainBehindAMistake) {
    const std::string Messages = ReadText(R"(type Speed = uint16 lsb;
state Speed fine;
state Sped wrong = 1;
output uint8 y
proc helper(uint8 a, uint b) {
  y = a + b;
}
proc main() {
  wrong = 1;
  if (y = 2) { unknown = 1; }
  else if (y ==) { y = 3 }
  for (y = 0 y < 3; y++) { y = unknown; }
  switch (y) { case y: break; case 2: y = ; break; default y = 1; }
  helper(1, 2;
  do { y++; } while y < 3);
  goto nowhere;
  y = nothing + nothing;
}
proc last() { y = 1; } }
state uint8 z = 300;
)")
                                     .messages();
    EXPECT_EQ(Messages, R"(1:24: error: expected an expression before ';'
3:7: error: 'Sped' is not the name of a type
4:15: error: expected ';'
5:22: error: 'uint' is not the name of a type
10:9: error: '=' cannot stand in an expression; equality is tested by '=='
10:16: error: 'unknown' is not declared
11:16: error: expected an expression before ')'
11:25: error: expected ';'
12:13: error: expected ';'
13:21: error: 'y' is no constant: it is not a param declared before
13:43: error: expected an expression before ';'
13:60: error: expected ':' before 'y'
14:14: error: expected ')' before ';'
15:21: error: expected '(' before 'y'
16:3: error: label 'nowhere' is not in this procedure
17:7: error: 'nothing' is not declared
19:24: error: expected a declaration before '}'
20:17: warning: initial value 300 becomes 44 in type 'uint8'
)");
}

TEST(ReaderMessages, SourceLineAndCaretFollow) {
    const std::pair<std::string, std::string> Cases[] = {
        {"proc main() {\n\tx = 1;\n}", "t:2:2: error: 'x' is not declared\n\tx = 1;\n\t^\n"},
        {"proc main() {\r\n  x = 1;\r\n}\r\n",
         "t:2:3: error: 'x' is not declared\n  x = 1;\n  ^\n"},
        {"\xEF\xBB\xBFproc main( { }",
         "t:1:12: error: expected the name of a type before '{'\nproc main( { }\n           ^\n"},
        {"proc main() { /* \xC3\xA4\xE2\x82\xAC */ x = 1; }",
         "t:1:24: error: 'x' is not declared\n"
         "proc main() { /* \xC3\xA4\xE2\x82\xAC */ x = 1; }\n                       ^\n"},
        {"proc main() { /* \x01\xFF */ x = 1; }",
         "t:1:24: error: 'x' is not declared\nproc main() { /* ?? */ x = 1; }\n"
         "                       ^\n"},
        {"proc main() {", "t:1:14: error: expected '}' before the end of the file\n"
                          "proc main() {\n             ^\n"},
        {"proc main() { } // \xFF\n\xFF\xFE\n", "t:2:1: error: byte 0xff is not UTF-8\n??\n^\n"},
        {std::string("proc main() { }\0\x01", 17),
         "t:1:16: error: unexpected control character 0x00\nproc main() { }??\n"
         "               ^\n"},
    };
    for (const auto& [Text, Expected] : Cases)
        EXPECT_EQ(ReadText(Text).diagnostics().print(), Expected) << Text;
}

TEST(ReaderMessages, ReadingStopsAfterTwentyErrors) {
    std::string Text;
    for (int i = 0; i < 30; ++i)
        Text += "x" + std::to_string(i) + " = 1;\n";
    const std::string Printed = ReadText(inMain(Text)).diagnostics().print();
    EXPECT_NE(Printed.find("t:21:1: error: 'x19' is not declared\n"), std::string::npos);
    EXPECT_EQ(Printed.find("x20"), std::string::npos);
    EXPECT_EQ(Printed.substr(Printed.size() - 24), "stopped after 20 errors\n");
}

TEST(ReaderMessages, WarningsAreCountedButNotAllShown) {
    std::string Text;
    for (int i = 0; i < 30; ++i)
        Text += "s = in || 2;\n";
    const ReadText Read(inMain(Text));
    EXPECT_TRUE(Read.isRead());
    EXPECT_EQ(Read.diagnostics().getWarningCount(), 30U);
    const std::string Printed = Read.diagnostics().print();
    EXPECT_EQ(Printed.substr(Printed.size() - 34), "10 further warnings are not shown\n");
}

TEST(ReaderMessages, FilesAreOneProgram) {
    const ReadText Good(
        {{"dir/9 main-file.hpn", "proc main() { helper(P); x[0] = 1; }"},
         {"data.hpn", "param T P = 2; state T x[(int8) P]; type T = uint8 lsb 0.5;"},
         {"help.hpn", "proc helper(T a) { x[1] = a; }"}});
    EXPECT_EQ(Good.messages(), "");
    EXPECT_EQ(Good.program().Name, "program_9_main_file");
    EXPECT_EQ(Good.variable("x")->Count, 2U);

    // Declarations count in the order of the files, names of types and procedures in any.
    const ReadText Bad({{"b.hpn", "state uint8 y[N]; proc main() { late(1); x = }\n"},
                        {"a.hpn", "param uint8 N = 2;\nstate uint8 x;\nproc main() { }\n"},
                        {"c.hpn", "state uint8 x; proc late() { goto on; on: }\nproc open() {"}});
    EXPECT_EQ(Bad.messages(),
              "b.hpn:1:15: error: 'N' is no constant: it is not a param declared before\n"
              "b.hpn:1:33: error: 'late' takes 0 arguments, not 1\n"
              "b.hpn:1:46: error: expected an expression before '}'\n"
              "a.hpn:3:6: error: 'main' is already declared at b.hpn:1\n"
              "c.hpn:1:13: error: 'x' is already declared at a.hpn:2\n"
              "c.hpn:2:14: error: expected '}' before the end of the file\n");
    EXPECT_EQ(ReadText(std::vector<std::pair<std::string, std::string>>()).diagnostics().print(),
              "error: the program has no procedure 'main'\n");
}

} // namespace
