// The option -j of verbs that process several files at once.
#pragma once

class Verb;

/// 1 to 256; remains 0 if not given.
void addThreads(Verb& verb, unsigned& threads);
/// The number itself, or one thread per core for 0.
unsigned threadsFor(unsigned asked);
