;;; Everyday helpers of the kind users keep in their own files, written from what each is
;;; documented to do.

;; Splits a string at every occurrence of a delimiter string; empty fields are kept.
(defun str-split (str delim / pos result)
  (while (setq pos (vl-string-search delim str))
    (setq result (cons (substr str 1 pos) result)
          str    (substr str (+ pos 1 (strlen delim)))))
  (reverse (cons str result)))

;; Joins a list of strings with a separator between them.
(defun str-join (lst sep / out)
  (setq out (car lst))
  (foreach s (cdr lst) (setq out (strcat out sep s)))
  (if out out ""))

;; Every occurrence of OLD in STR replaced by NEW.
(defun str-replace-all (new old str / pos)
  (setq pos 0)
  (while (setq pos (vl-string-search old str pos))
    (setq str (vl-string-subst new old str pos)
          pos (+ pos (strlen new))))
  str)

;; All atoms of a nested list, left to right.
(defun flatten (lst)
  (cond ((null lst) nil)
        ((atom lst) (list lst))
        (t (append (flatten (car lst)) (flatten (cdr lst))))))

;; Fields of one CSV line: commas separate, double quotes enclose a field that may hold
;; commas, and two double quotes inside a quoted field stand for one.
(defun csv-parse-line (line / i n ch field fields quoted)
  (setq i 1 n (strlen line) field "" quoted nil)
  (while (<= i n)
    (setq ch (substr line i 1))
    (cond ((and quoted (= ch "\"") (= (substr line (1+ i) 1) "\""))
           (setq field (strcat field "\"") i (1+ i)))
          ((= ch "\"") (setq quoted (not quoted)))
          ((and (= ch ",") (not quoted))
           (setq fields (cons field fields) field ""))
          (t (setq field (strcat field ch))))
    (setq i (1+ i)))
  (reverse (cons field fields)))

;; The list without repeated elements, first occurrences kept in order.
(defun unique (lst / out)
  (foreach x lst (if (not (member x out)) (setq out (cons x out))))
  (reverse out))

;; A number as text with leading zeros to the given width.
(defun pad-number (n width / s)
  (setq s (itoa n))
  (while (< (strlen s) width) (setq s (strcat "0" s)))
  s)

;; Association list value by key, or a default.
(defun alist-get (key alist default / pair)
  (if (setq pair (assoc key alist)) (cdr pair) default))
