/// `clipsa save`: mixes the sound of a movie and puts it into the user's library of videos, as the editor's Save does.
#pragma once

#include "app/host/MediaCommandLine.h"

namespace host {

/// How much of a save is done when so much has been mixed and so much copied into the library, each from 0 to 1.
double partOfSave(double mixed, double copied);

/// Gives the exit status, and prints the path of the new file. Where the sound cannot be mixed the movie is saved as it
/// is, which one line says; others say what is left out of the mix, and that there is no thumbnail or no entry among the
/// recent files. The movie itself is never touched; what is made on the way goes, also when a signal comes.
int saveMovie(const SaveCommand& command);

} // namespace host
