// What the library tells of edits that cannot be made, in the command's words.
#pragma once

#include "audiofile/ChunkSurvey.h"
#include "audiofile/ContainerProblem.h"
#include "files/FileProblem.h"

#include <optional>
#include <string>

/// Throw the Failure of a problem, if it is one.
void requireNone(const FileProblem& problem);
void requireNone(const ContainerProblem& problem);

/// SurveyChunks, and the problem thrown.
ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id);
/// The same of the container at the path, which is opened for it.
ChunkSurvey surveyOf(const std::string& path, FourCC id);

/// Why a chunk should not be added, and what would be lost; none when nothing speaks against it. Throws Failure when
/// the container cannot be walked.
std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id);
/// The same for removing every chunk of the id.
std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id);

/// Commits an open file, or the folder that holds the path, to storage. Throws Failure.
void synchronize(int descriptor);
void synchronizeFolderOf(const std::string& path);
