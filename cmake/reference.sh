#!/bin/sh
# reference.sh DOXYFILE DIR: the reference in DIR/html and DIR/man/man3. Section 3 has no folders and no namespaces: the page
# of lx/NAME.h is lx_NAME.h, and names of C++ and members have none.
set -e
rm -rf "$2"
mkdir -p "$2"
{ cat "$1" && echo "OUTPUT_DIRECTORY = \"$2\""; } | doxygen -
cd "$2/man/man3"
for page in [a-z]*.h.3; do
  case $page in lx.h.3 | nls1.h.3) ;; *) mv "$page" "lx_$page" ;; esac
done
for page in *; do
  case $page in
    lx_*.h.3 | lx.h.3 | nls1.h.3 | LX* | NLS1_* | Split* | MakePath.3) ;;
    *) rm -f -- "$page" ;;
  esac
done
sed -i -E 's#^\.TH "lx/#.TH "lx_#; s#^lx/([a-z]+\.h )#lx_\1#; s#^\.so man3/([a-z]+\.h)#.so man3/lx_\1#
           s#^\.so man3/lx_(lx|nls1)\.h#.so man3/\1.h#
           s#^\x27#\\\&\x27#' ./*
