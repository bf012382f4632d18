# shellcheck shell=bash
# Use: Action commands from the suite's programs.
section "Action commands"
run '<CmdLine><Action>OpenHelp</Action><hWnd>0</hWnd></CmdLine>' \
    '<CmdLine><Action>NoSuchAction</Action></CmdLine>'
