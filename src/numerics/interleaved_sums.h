#pragma once
// Sums of the samples first .. end - 1 of a line in four interleaved
// partial sums: sample k goes into partial sum k mod 4 and the four are
// added pairwise at the end, so that neighbouring additions do not wait for
// each other. The samples go four at a time so that the partial sums stay in
// registers; every partial sum takes its samples in increasing order.

// Q sums at once: term(k, v) gives the Q values of sample k.
template <int Q, class Term>
inline void interleavedSums(int first, int end, Term term, double (&out)[Q]) {
  double acc[4][Q] = {};
  int k = first;
  for (; k < end && (k & 3) != 0; ++k) {
    double v[Q];
    term(k, v);
    for (int q = 0; q < Q; ++q) acc[k & 3][q] += v[q];
  }
  for (; k + 4 <= end; k += 4) {
    for (int u = 0; u < 4; ++u) {
      double v[Q];
      term(k + u, v);
      for (int q = 0; q < Q; ++q) acc[u][q] += v[q];
    }
  }
  for (; k < end; ++k) {
    double v[Q];
    term(k, v);
    for (int q = 0; q < Q; ++q) acc[k & 3][q] += v[q];
  }
  for (int q = 0; q < Q; ++q) out[q] = (acc[0][q] + acc[1][q]) + (acc[2][q] + acc[3][q]);
}
