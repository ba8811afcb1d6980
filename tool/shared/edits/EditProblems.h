// The command's words for edits that cannot be made.
#pragma once

#include "audiofile/ChunkSurvey.h"
#include "audiofile/ContainerProblem.h"
#include "files/FileProblem.h"

#include <optional>
#include <string>

/// Throws the Failure of a problem, if there is one.
void requireNone(const FileProblem& problem);
void requireNone(const ContainerProblem& problem);

/// SurveyChunks; throws a problem.
ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id);
/// As above for the container at the path, which is opened.
ChunkSurvey surveyOf(const std::string& path, FourCC id);

/// The reason not to add a chunk, and what would be lost; none if there is none. Throws Failure if the container cannot
/// be walked.
/// the container cannot be walked.
std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id);
/// As above, for removing every chunk with the id.
std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id);

/// Commits an open file, or the folder that holds the path, to storage. Throws Failure.
void synchronize(int descriptor);
void synchronizeFolderOf(const std::string& path);
