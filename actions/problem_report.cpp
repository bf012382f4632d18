#include "actions/problem_report.h"

// Gathering, zipping and mailing arrive with the problem report work; until
// then the Action does nothing.
void CSendProblemReport::Send() {}
