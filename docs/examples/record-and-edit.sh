#!/bin/sh
# Records the screen until Ctrl+C, then lets the user trim, save and share the recording with Clipsa.
#   record-and-edit.sh [APP-NAME]
# RECORDER is the command that records into the file which is its last argument. The recording stays in the current
# directory, whatever happens: what was done with it does not tell whether a save has gone well.
set -eu

# A name that nobody has yet.
recording=$(mktemp --suffix=.mp4 "$PWD/recording $(date '+%Y-%m-%d %H-%M-%S') XXXXXX")
trap : INT # ends the recorder, or the editor, not us

status=0
${RECORDER:-wf-recorder -y -f} "$recording" || status=$?
if ! [ -s "$recording" ]; then
    rm -f "$recording"
    echo "Nothing was recorded." >&2
    exit $((status ? status : 1))
fi

status=0
done=$(clipsa open "$recording" --app-name "${1:-Screen recording}") || status=$?
if [ "$status" -ne 0 ]; then
    echo "Clipsa ended with status $status, for the reason that it gave." >&2
elif [ -n "$done" ]; then
    echo "Done with the recording: $done"
else
    echo "The recording was looked at and closed."
fi
echo "It stays in $recording"
exit "$status"
