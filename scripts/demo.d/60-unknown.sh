# shellcheck shell=bash
# A keyword the program does not know.
section "Unknown keyword"
run -nosuchkeyword
