# Makes the comments of the headers what the reference is made of.
1s#^/\* #/** @file\n * #
s#^( *)/\* #\1/** #
s#(, +|; +|[0-9A-Fa-f]u? +|\)u? +)/\* #\1/**< #
s|%#|\\%\\#|g
s#[@%]([A-Za-z])#\\&#g
s#\\@file#@file#
/^ \*  1\. /,/\*\/$/{
  s#^ \*##
  s#^  1\. #@verbatim\n&#
  s# \*/$#\n@endverbatim */#
}
