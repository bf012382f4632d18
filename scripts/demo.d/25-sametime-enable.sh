# shellcheck shell=bash
# Install: the meeting feature in the Sametime 8 profiles.
section "Maintenance command: enable the meeting feature in the Sametime 8 profiles"
run -enablesametime8confige -issametime8enable
echo "  platform.xml now:"
sed 's/^/    /' "$config/platform.xml"
echo "  configuration folder now:"
listing "$config"
