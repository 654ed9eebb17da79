// List functions against the dialect's documented results.
#include "LispFixture.h"

using ListsTest = LispFixture;

TEST_F(ListsTest, AccessAndBuilding) {
    EXPECT_EQ(ev("(car '(a b c))"), "A");
    EXPECT_EQ(ev("(cdr '(a b c))"), "(B C)");
    EXPECT_EQ(ev("(car nil)"), "nil");
    EXPECT_EQ(ev("(cadr '(1 2 3))"), "2");
    EXPECT_EQ(ev("(caddr '(1 2 3))"), "3");
    EXPECT_EQ(ev("(cddddr '(1 2 3 4 5))"), "(5)");
    EXPECT_EQ(ev("(caar '((a b) c))"), "A");
    EXPECT_EQ(ev("(cadar '((a b) c))"), "B");
    EXPECT_EQ(ev("(cons 'a 'b)"), "(A . B)");
    EXPECT_EQ(ev("(cons 'a '(b))"), "(A B)");
    EXPECT_EQ(ev("(list 1 \"two\" 3.0)"), "(1 \"two\" 3.0)");
    EXPECT_EQ(ev("(append '(a b) '(c d) nil '(e))"), "(A B C D E)");
    EXPECT_EQ(ev("(append '(a) 'b)"), "ERROR: bad argument type: listp B");
    EXPECT_EQ(ev("(reverse '((a) b c))"), "(C B (A))");
    EXPECT_EQ(ev("(last '(a b c))"), "C");
    EXPECT_EQ(ev("(length '(a b c d))"), "4");
    EXPECT_EQ(ev("(length nil)"), "0");
    EXPECT_EQ(ev("(vl-list* 1 2 3)"), "(1 2 . 3)");
}

TEST_F(ListsTest, Search) {
    EXPECT_EQ(ev("(assoc \"B\" '((\"A\" . 1) (\"B\" . 2)))"), "(\"B\" . 2)");
    EXPECT_EQ(ev("(assoc 'size '((name box) (size 3)))"), "(SIZE 3)");
    EXPECT_EQ(ev("(assoc 'x '((a . 1)))"), "nil");
    // a text key passes over other keys of any kind and texts that differ in case or length
    EXPECT_EQ(ev("(assoc \"AB\" '(x 1 (2 . a) (AB . b) (\"ab\" . c) (\"ABC\" . d) (\"AB\" . e) "
                 "(\"AB\" . f)))"),
              "(\"AB\" . E)");
    EXPECT_EQ(ev("(assoc \"\" '((\"x\" . 1) (\"\" . 2)))"), "(\"\" . 2)");
    EXPECT_EQ(ev("(assoc \"z\" '((\"a\" . 1) (\"b\" . 2)))"), "nil");
    EXPECT_EQ(ev("(assoc \"a\" '((\"a\" . 1) . 5))"), "(\"a\" . 1)");
    EXPECT_EQ(ev("(assoc \"z\" '((\"a\" . 1) . 5))"),
              "ERROR: bad argument type: listp ((\"a\" . 1) . 5)");
    EXPECT_EQ(ev("(assoc 1 '((1.0 . a)))"), "(1.0 . A)");
    EXPECT_EQ(ev("(member 'c '(a b c d e))"), "(C D E)");
    EXPECT_EQ(ev("(member 'q '(a b c))"), "nil");
    EXPECT_EQ(ev("(nth 3 '(a b c d e))"), "D");
    EXPECT_EQ(ev("(nth 5 '(a b c))"), "nil");
    EXPECT_EQ(ev("(subst 'qq 'b '(a b (c d) b))"), "(A QQ (C D) QQ)");
    EXPECT_EQ(ev("(subst 'qq '(c d) '(a b (c d) b))"), "(A B QQ B)");
    EXPECT_EQ(ev("(vl-position 'c '(a b c))"), "2");
    EXPECT_EQ(ev("(vl-position 'z '(a b c))"), "nil");
    EXPECT_EQ(ev("(vl-remove 'b '(a b c b))"), "(A C)");
}

TEST_F(ListsTest, SortingDropsDuplicateIntegersAsTheDialectDoes) {
    EXPECT_EQ(ev("(vl-sort '(3 2 1 3) '<)"), "(1 2 3)");
    EXPECT_EQ(ev("(vl-sort '(a d c b a) '(lambda (s1 s2) (< (vl-symbol-name s1) "
                 "(vl-symbol-name s2))))"),
              "(A B C D)");
    EXPECT_EQ(ev("(vl-sort '((1 3) (2 2) (3 1)) (function (lambda (e1 e2) (< (cadr e1) "
                 "(cadr e2)))))"),
              "((3 1) (2 2) (1 3))");
    EXPECT_EQ(ev("(vl-sort '(\"b\" \"a\" \"b\") '<)"), "(\"a\" \"b\" \"b\")");
    EXPECT_EQ(ev("(vl-sort-i '(\"a\" \"d\" \"f\" \"c\") '>)"), "(2 1 3 0)");
    EXPECT_EQ(ev("(vl-sort-i '(3 2 1 3) '<)"), "(2 1 3 0)");
    EXPECT_EQ(ev("(vl-sort-i '((1 3) (2 2) (3 1)) (function (lambda (e1 e2) (< (cadr e1) "
                 "(cadr e2)))))"),
              "(2 1 0)");
    EXPECT_EQ(ev("(vl-sort-i '(a d c b a) '(lambda (s1 s2) (< (vl-symbol-name s1) "
                 "(vl-symbol-name s2))))"),
              "(4 0 3 2 1)");
    EXPECT_EQ(ev("(vl-sort nil '<)"), "nil");
    // An inconsistent comparison still ends with every element.
    EXPECT_EQ(ev("(length (vl-sort '(\"5\" \"3\" \"9\" \"1\" \"7\") '(lambda (a b) t)))"), "5");
    EXPECT_EQ(ev("(acad_strlsort '(\"Mary\" \"joan\" \"Jim\"))"), "(\"Jim\" \"joan\" \"Mary\")");
}

// Equal elements come out last one first, in vl-sort-i and, where they stay, in vl-sort.
TEST_F(ListsTest, SortingPutsEqualElementsLastOneFirst) {
    EXPECT_EQ(ev("(vl-sort-i '(1 1 1) '<)"), "(2 1 0)");
    EXPECT_EQ(ev("(vl-sort-i '(\"b\" \"a\" \"b\" \"a\") '<)"), "(3 1 2 0)");
    EXPECT_EQ(ev("(vl-sort-i '(2.0 1 2.0) '>)"), "(2 0 1)");
    ev("(setq l '((1 \"a\") (0 \"b\") (1 \"c\") (0 \"d\")) f (lambda (x y) (< (car x) (car "
       "y))))");
    EXPECT_EQ(ev("(vl-sort l f)"), "((0 \"d\") (0 \"b\") (1 \"c\") (1 \"a\"))");
    EXPECT_EQ(ev("(equal (vl-sort l f) (mapcar '(lambda (i) (nth i l)) (vl-sort-i l f)))"), "T");
    EXPECT_EQ(ev("(vl-sort '(2.0 1 2.0 1) '<)"), "(1 2.0 2.0)");
}

TEST_F(ListsTest, PredicateFunctions) {
    EXPECT_EQ(ev("(vl-remove-if 'vl-symbolp '(a 1 b 2))"), "(1 2)");
    EXPECT_EQ(ev("(vl-remove-if-not 'numberp '(a 1 b 2.0))"), "(1 2.0)");
    EXPECT_EQ(ev("(vl-member-if '(lambda (x) (> x 2)) '(1 2 3 4))"), "(3 4)");
    EXPECT_EQ(ev("(vl-member-if-not 'numberp '(1 a 2))"), "(A 2)");
    EXPECT_EQ(ev("(vl-some '= '(1 2 3) '(4 2 6))"), "T");
    EXPECT_EQ(ev("(vl-some 'minusp '(1 2))"), "nil");
    EXPECT_EQ(ev("(vl-every '< '(1 2) '(3 4 0))"), "T");
    EXPECT_EQ(ev("(vl-every 'numberp '(1 a))"), "nil");
    EXPECT_EQ(ev("(mapcar '+ '(1 2 3) '(10 20 30))"), "(11 22 33)");
    EXPECT_EQ(ev("(mapcar 'car '((a) (b)))"), "(A B)");
}

TEST_F(ListsTest, TypesAndPredicates) {
    EXPECT_EQ(ev("(mapcar 'type (list 1 1.0 \"s\" 'a '(1) car))"), "(INT REAL STR SYM LIST SUBR)");
    EXPECT_EQ(ev("(defun f () 1) (type f)"), "USUBR");
    EXPECT_EQ(ev("(type nil)"), "nil");
    EXPECT_EQ(ev("(list (atom 'a) (atom '(a)) (atom nil))"), "(T nil T)");
    EXPECT_EQ(ev("(list (listp nil) (listp '(1)) (listp 1))"), "(T T nil)");
    EXPECT_EQ(ev("(list (vl-consp nil) (vl-consp '(1)))"), "(nil T)");
    EXPECT_EQ(ev("(list (null nil) (not 0) (numberp 1.0) (numberp \"1\"))"), "(T nil T nil)");
    EXPECT_EQ(ev("(setq bb nil) (list (boundp 'bb) (progn (setq bb 1) (boundp 'bb)))"), "(nil T)");
    EXPECT_EQ(ev("(set 'dyn 5) dyn"), "5");
    EXPECT_EQ(ev("(vl-symbol-value 'dyn)"), "5");
    EXPECT_EQ(ev("(vl-symbol-name 'dyn)"), "\"DYN\"");
    EXPECT_EQ(ev("(atoms-family 1 '(\"DYN\" \"NOSUCHTHING\"))"), "(\"DYN\" nil)");
    EXPECT_EQ(ev("(and (member 'CAR (atoms-family 0)) t)"), "T");
}
