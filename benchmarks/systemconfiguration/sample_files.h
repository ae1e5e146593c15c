#ifndef BENCHMARKS_SYSTEMCONFIGURATION_SAMPLE_FILES_H
#define BENCHMARKS_SYSTEMCONFIGURATION_SAMPLE_FILES_H

#include <string>
#include <vector>

/// A policy of that many lines of the kinds that stand in /etc/pam.d, without comments, which would be cheap.
std::string PolicyOf(int lines);

/// A name-service switch of that many lines. Databases occur again and again in a long one.
std::string SwitchOf(int lines);

/// The words of each line, a bracketed text of several words counting as one.
std::vector<std::vector<std::string>> WordsOfLines(const std::string& text);

#endif
