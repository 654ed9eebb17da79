// The evaluator: dynamic scope, defun with parameters and locals, lambda, defun-q, the
// control forms, errors with their messages, *error*, vl-catch-all-apply and the limits.
#include "LispFixture.h"

#include <thread>

using EvaluatorTest = LispFixture;

TEST_F(EvaluatorTest, DynamicScopeReachesCalledFunctions) {
    ev("(defun show () x)");
    ev("(defun outer (x) (show))");
    EXPECT_EQ(ev("(outer 42)"), "42");
    EXPECT_EQ(ev("(setq x 1) (outer 2) x"), "1");
}

TEST_F(EvaluatorTest, LocalsStartNilAndAreRestored) {
    ev("(setq a 10 b 20)");
    ev("(defun f (a / b) (setq r (list a b)) (setq a 99 b 98) 'done)");
    EXPECT_EQ(ev("(f 1)"), "DONE");
    EXPECT_EQ(ev("r"), "(1 nil)");
    EXPECT_EQ(ev("(list a b)"), "(10 20)");
}

TEST_F(EvaluatorTest, FirstOccurrenceOfARepeatedNameWins) {
    ev("(defun f (a a / a) a)");
    EXPECT_EQ(ev("(f 1 2)"), "1");
}

TEST_F(EvaluatorTest, ArgumentCountsAreChecked) {
    ev("(defun two (a b) (+ a b))");
    EXPECT_EQ(ev("(two 1)"), "ERROR: too few arguments");
    EXPECT_EQ(ev("(two 1 2 3)"), "ERROR: too many arguments");
    EXPECT_EQ(ev("(car)"), "ERROR: too few arguments");
    EXPECT_EQ(ev("(car '(1) '(2))"), "ERROR: too many arguments");
}

TEST_F(EvaluatorTest, LambdaAndDefunQ) {
    EXPECT_EQ(ev("((lambda (x) (* x x)) 7)"), "49");
    EXPECT_EQ(ev("(mapcar '(lambda (x) (1+ x)) '(1 2 3))"), "(2 3 4)");
    EXPECT_EQ(ev("(mapcar (function (lambda (x y) (+ x y))) '(1 2 3) '(10 20))"), "(11 22)");
    EXPECT_EQ(ev("(defun-q dq (x / y) (setq y 2) (* x y))"), "DQ");
    EXPECT_EQ(ev("dq"), "((X / Y) (SETQ Y 2) (* X Y))");
    EXPECT_EQ(ev("(dq 21)"), "42");
    EXPECT_EQ(ev("(apply '+ '(1 2 3))"), "6");
    EXPECT_EQ(ev("(apply 'dq '(5))"), "10");
}

TEST_F(EvaluatorTest, ControlForms) {
    EXPECT_EQ(ev("(if nil 1)"), "nil");
    EXPECT_EQ(ev("(if 0 'yes 'no)"), "YES");
    EXPECT_EQ(ev("(cond ((= 1 2) 'a) ((+ 1 2)) (t 'c))"), "3");
    EXPECT_EQ(ev("(setq i 0 s 0) (while (< i 5) (setq s (+ s i) i (1+ i))) s"), "10");
    EXPECT_EQ(ev("(setq n 0) (repeat 4 (setq n (+ n 2)))"), "8");
    EXPECT_EQ(ev("(setq acc nil) (foreach e '(1 2 3) (setq acc (cons e acc))) acc"), "(3 2 1)");
    EXPECT_EQ(ev("(setq e 'kept) (foreach e '(1) e) e"), "KEPT");
    EXPECT_EQ(ev("(and 1 \"x\")"), "T");
    EXPECT_EQ(ev("(and)"), "T");
    EXPECT_EQ(ev("(or nil 5)"), "T");
    EXPECT_EQ(ev("(or)"), "nil");
    EXPECT_EQ(ev("(progn 1 2 3)"), "3");
    EXPECT_EQ(ev("(apply 'and (mapcar 'numberp '(1 2.0)))"), "T");
    EXPECT_EQ(ev("(apply 'or '(nil nil))"), "nil");
    EXPECT_EQ(ev("(and nil (car 1))"), "nil");  // as a form it still stops early
    EXPECT_EQ(ev("(eval '(+ 1 2))"), "3");
    EXPECT_EQ(ev("(setq a 1 b (+ a 1))"), "2");
    EXPECT_EQ(ev("(setq a)"), "ERROR: too few arguments");
    EXPECT_EQ(ev("(setq 1 2)"), "ERROR: bad argument type: symbolp 1");
}

TEST_F(EvaluatorTest, ErrorMessages) {
    EXPECT_EQ(ev("(foo 1)"), "ERROR: no function definition: FOO");
    EXPECT_EQ(ev("(+ 1 nil)"), "ERROR: bad argument type: numberp: nil");
    EXPECT_EQ(ev("(strcat \"a\" 1)"), "ERROR: bad argument type: stringp 1");
    EXPECT_EQ(ev("(car 5)"), "ERROR: bad argument type: consp 5");
    EXPECT_EQ(ev("(itoa 1.5)"), "ERROR: bad argument type: fixnump: 1.5");
    EXPECT_EQ(ev("(/ 1 0)"), "ERROR: divide by zero");
    EXPECT_EQ(ev("(1 2)"), "ERROR: bad function: 1");
    EXPECT_EQ(ev("(exit)"), "ERROR: quit / exit abort");
}

TEST_F(EvaluatorTest, UnhandledErrorsArePrintedOnTheCommandLine) {
    EXPECT_FALSE(lisp.evaluate("(setq v 1) (car 5) (setq v 2)"));
    EXPECT_EQ(output, "; error: bad argument type: consp 5\n");
    EXPECT_EQ(ev("v"), "1");
    zvlisp::Value result;
    EXPECT_TRUE(lisp.evaluate("(+ 1 2)", &result));
    EXPECT_EQ(zvlisp::Printer::prin1(result), "3");
}

TEST_F(EvaluatorTest, ErrorHandlerSeesTheMessageBeforeLocalsUnwind) {
    ev("(defun *error* (msg) (setq seen (list msg inner)))");
    ev("(defun f (/ inner) (setq inner 'local) (car 5))");
    EXPECT_FALSE(lisp.evaluate("(f)"));
    EXPECT_EQ(ev("seen"), "(\"bad argument type: consp 5\" LOCAL)");
    EXPECT_EQ(ev("inner"), "nil");
    EXPECT_EQ(output, "");
}

TEST_F(EvaluatorTest, LocalisedErrorHandlerIsUsedAndRestored) {
    ev("(defun *error* (msg) (setq who 'global))");
    ev("(defun c:cmd (/ *error*) (defun *error* (msg) (setq who 'local)) (exit))");
    EXPECT_FALSE(lisp.evaluate("(c:cmd)"));
    EXPECT_EQ(ev("who"), "LOCAL");
    EXPECT_FALSE(lisp.evaluate("(car 1)"));
    EXPECT_EQ(ev("who"), "GLOBAL");
}

TEST_F(EvaluatorTest, FailingErrorHandlerIsReported) {
    ev("(defun *error* (msg) (car msg))");
    EXPECT_FALSE(lisp.evaluate("(car 1)"));
    EXPECT_EQ(output, "; error: bad argument type: consp \"bad argument type: consp 1\"\n");
}

TEST_F(EvaluatorTest, CatchAllApply) {
    ev("(defun *error* (msg) (setq called t))");
    EXPECT_EQ(ev("(setq r (vl-catch-all-apply '/ '(1 0)))"), "#<%catch-all-apply-error%>");
    EXPECT_EQ(ev("(vl-catch-all-error-p r)"), "T");
    EXPECT_EQ(ev("(vl-catch-all-error-message r)"), "\"divide by zero\"");
    EXPECT_EQ(ev("called"), "nil");
    EXPECT_EQ(ev("(vl-catch-all-apply '+ '(1 2))"), "3");
    EXPECT_EQ(ev("(vl-catch-all-error-p 3)"), "nil");
    EXPECT_EQ(ev("(setq x 5) (vl-catch-all-apply '(lambda (/ x) (setq x 9) (exit)) nil) x"), "5");
}

TEST_F(EvaluatorTest, RunawayRecursionEndsInAnError) {
    ev("(defun down (n) (1+ (down n)))");
    EXPECT_EQ(ev("(down 1)"), "ERROR: stack overflow");
    EXPECT_EQ(ev("(+ 1 1)"), "2");
    ev("(defun *error* (msg) (setq got msg))");
    EXPECT_FALSE(lisp.evaluate("(down 1)"));
    EXPECT_EQ(ev("got"), "\"stack overflow\"");
}

TEST_F(EvaluatorTest, HostCanCancelARunawayLoop) {
    int polls = 0;
    lisp.setCancelCheck([&] { return ++polls > 3; });
    EXPECT_EQ(ev("(while t)"), "ERROR: Function cancelled");
    lisp.setCancelCheck(nullptr);
    std::thread canceller([this] {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        lisp.requestCancel();
    });
    EXPECT_EQ(ev("(vl-catch-all-apply '(lambda () (while t (setq x 1))) nil)"),
              "ERROR: Function cancelled");
    canceller.join();
    EXPECT_EQ(ev("(+ 2 2)"), "4");
}

TEST_F(EvaluatorTest, NativeFunctionsAndUserOverride) {
    lisp.define(
        "twice",
        [](zvlisp::Interpreter& in, zvlisp::Args a) {
            return zvlisp::Value::integer(2 * in.toInt(a[0]));
        },
        1, 1);
    EXPECT_EQ(ev("(twice 21)"), "42");
    EXPECT_EQ(ev("(type twice)"), "SUBR");
    EXPECT_EQ(ev("(twice)"), "ERROR: too few arguments");
    EXPECT_EQ(ev("(twice \"x\")"), "ERROR: bad argument type: fixnump: \"x\"");
    ev("(defun twice (x) (list x x))");
    EXPECT_EQ(ev("(twice 3)"), "(3 3)");
}

TEST_F(EvaluatorTest, CallingLispFromCpp) {
    ev("(defun greet (who n) (strcat \"hi \" who (itoa n)))");
    const zvlisp::Value r =
        lisp.call("greet", {zvlisp::Value::string("ana"), zvlisp::Value::integer(2)});
    EXPECT_EQ(r.asString(), "hi ana2");
    EXPECT_THROW(lisp.call("nosuch", {}), zvlisp::LispError);
    const zvlisp::Value lambda = lisp.evalText("(lambda (a) (* a 10))");
    const zvlisp::Value arg = zvlisp::Value::integer(4);
    EXPECT_EQ(lisp.apply(lambda, zvlisp::Args(&arg, 1)).asInt(), 40);
}

TEST_F(EvaluatorTest, LongListsAreBuiltAndFreedWithoutRecursion) {
    EXPECT_EQ(ev("(setq l nil) (repeat 300000 (setq l (cons 1 l))) (length l)"), "300000");
    EXPECT_EQ(ev("(setq l nil) (repeat 300000 (setq l (list l))) 'ok"), "OK");
    EXPECT_EQ(ev("(setq l nil) 'freed"), "FREED");
}
