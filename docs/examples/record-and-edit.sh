#!/bin/sh
# Records the screen until Ctrl+C, then lets the user trim, save and share the recording with Clipsa.
#   record-and-edit.sh [APP-NAME]
# RECORDER is the command that records into the file which is its last argument.
set -eu

recording=$(mktemp --suffix=.mp4)
trap 'rm -f "$recording"' EXIT # Clipsa works on a link or a copy of its own, and has finished by then
trap : INT                     # ends the recorder, not us

${RECORDER:-wf-recorder -y -f} "$recording" || [ -s "$recording" ]

done=$(clipsa open "$recording" --app-name "${1:-Screen recording}")
if [ -n "$done" ]; then
    echo "Done with the recording: $done"
else
    echo "The recording was looked at and closed; keeping it as recording.mp4"
    cp "$recording" recording.mp4
fi
