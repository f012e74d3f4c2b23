#pragma once

/** @file
 * The library for programs in C, and in languages that call C: enrolment, comparison, searches and portraits,
 * from JPEG images and records in memory.
 *
 *     if (orbekInit("orbek.conf") != 0) return 1;
 *     switch (orbekFindEyes(jpeg, jpegSize, &x0, &y0, &x1, &y1)) { case 0: ... }
 *     if (orbekGenerateFIR(jpeg, jpegSize, x0, y0, x1, y1, fir, sizeof fir, &firSize) == 0) ...
 *
 * Every function but orbekCreatePopulation() returns a code, 0 for success. A function that fails for another
 * reason than its codes tell writes one line with the reason to the standard error stream, and leaves what
 * its pointers lead to as it is, unless said otherwise.
 *
 * Positions are pixels of the image, x to the right and y down, and (0.5, 0.5) is the middle of the first
 * pixel. The first eye, (x0, y0), is the left one as the observer of an upright picture sees it.
 *
 * orbekInit() comes first, and may not run beside any other call. After that, any number of threads may call
 * anything; calls with a population wait for one another.
 */

#ifdef __cplusplus
extern "C" {
#endif
#pragma GCC visibility push(default)

/** A person of a population who may be the one of a probe. */
typedef struct orbekMatch {
    char id[128]; /**< ends with a 0; a longer id is cut */
    float score;  /**< from 0 to 1 */
} orbekMatch;

/** What the analysis of a portrait has found. */
typedef struct orbekPortraitResult {
    unsigned char verdict; /**< 1 or 0 */
    float value;           /**< what the verdict is taken from */
} orbekPortraitResult;

/** Opens a configuration and reads all models, so that missing ones show here. A second call replaces the
 * configuration; populations keep theirs.
 * @return 0, or 1 for a failure */
int orbekInit(const char* configurationFile);

/** Makes the record of the person in a picture.
 * @param[out] buffer of `bufferSize` bytes. It may be null if `bufferSize` is 0
 * @param[out] firSize bytes of the record; set with the codes 0 and 3
 * @return 0; 2 if there is no record, because the picture does not serve or the configuration asks for more
 * than one; 3 if the buffer is too small, which is then left as it is; 4 for a failure */
int orbekGenerateFIR(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1, float y1,
                     unsigned char* buffer, int bufferSize, unsigned int* firSize);

/** Finds the eyes of the face that is seen best, of eye distances from 10 to 40 percent of the picture's
 * width.
 * @return 0; 1 if there is no face; 2 if not both eyes were found; 4 for a failure. The positions are set
 * with 0 only */
int orbekFindEyes(const char* jpeg, unsigned int jpegSize, float* x0, float* y0, float* x1, float* y1);

/** Compares two records.
 * @param[out] score how sure it is that they are of one person, from 0 to 1
 * @return 0, or 1 for a failure */
int orbekCompare(const unsigned char* fir1, unsigned int size1, const unsigned char* fir2, unsigned int size2,
                 float* score);

/** Makes one record from two of the same person. What the buffer is told as to orbekGenerateFIR().
 * @return 0; 1 for a failure; 3 if the buffer is too small, which is then left as it is */
int orbekMergeFIRs(const unsigned char* fir1, unsigned int size1, const unsigned char* fir2,
                   unsigned int size2, unsigned char* buffer, int bufferSize, unsigned int* firSize);

/** The threshold with a rate of false acceptances: the share of other people whose score reaches it.
 * @param rate from 0 to 1; beyond, it counts as 0 or 1
 * @param[out] threshold for orbekBestMatches(), and for scores of orbekCompare(), which reach it if they are
 * not below it. The greatest score is 1: a threshold of 1 does not keep everybody out
 * @return 0, or 1 for a failure */
int orbekRequestFAR(float rate, float* threshold);

/** The rate of false acceptances that a threshold has: as small as this is the share of other people with
 * such a score.
 * @return 0, or 1 for a failure */
int orbekExpectedFAR(float threshold, float* rate);

/** Makes an empty population.
 * @return a handle that is valid until orbekDeletePopulation(), or null for a failure */
void* orbekCreatePopulation(void);

/** A handle that is not valid, or not any more, is no failure here; in all other functions it is.
 * @return 0 */
int orbekDeletePopulation(void* population);

/** @param id an id may come more than once
 * @return 0, or 1 for a failure */
int orbekAppendToPopulation(void* population, const unsigned char* fir, unsigned int firSize, const char* id);

/** Removes the first record of that id, if there is one.
 * @return 0, or 1 for a failure */
int orbekRemoveFromPopulation(void* population, const char* id);

/** Searches the records that are most like one.
 * @param threshold that the scores of matches are above, in the algorithm's own scale: a record whose score
 * is at the threshold may match, and with a threshold of 1 those do that are beyond the end of the scale
 * @param[out] matches room for `maxMatches` of them; the best comes first
 * @param[out] count how many there are; 0 after a failure
 * @return 0, or 1 for a failure */
int orbekBestMatches(const unsigned char* fir, unsigned int firSize, void* population, float threshold,
                     unsigned int maxMatches, orbekMatch* matches, unsigned int* count);

/** @param[out] result whether a portrait is exposed well, and the mean gray level of the face, 0 to 255
 * @return 0, or 1 for a failure */
int orbekAnalyzePortraitExposure(const char* jpeg, unsigned int jpegSize, orbekPortraitResult* result,
                                 float x0, float y0, float x1, float y1);

/** @param[out] result whether the person wears glasses, and how sure that is: the more, the greater
 * @return 0, or 1 for a failure */
int orbekAnalyzePortraitGlasses(const char* jpeg, unsigned int jpegSize, orbekPortraitResult* result,
                                float x0, float y0, float x1, float y1);

/** Cuts the token face image of ISO/IEC 19794-5 out of a picture: four eye distances wide, and one third
 * higher. Written is a JPEG of the quality 100; its last two bytes are FF D9, and what lies behind it in the
 * buffer is left as it is.
 * @param[out] buffer of `bufferSize` bytes, never written beyond them
 * @return 0; 1 for a failure; 3 if the buffer is too small, which is then left as it is. See
 * orbekExtractTokenFaceImageSized() for the size */
int orbekExtractTokenFaceImage(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                               float y1, char* buffer, int bufferSize);

/** The same scaled to 240 by 320 pixels. */
int orbekExtractMinimalTokenFaceImage(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                                      float y1, char* buffer, int bufferSize);

/** As orbekExtractTokenFaceImage(), and tells the size of the JPEG.
 * @param[out] buffer may be null if `bufferSize` is 0, to ask for the size alone
 * @param[out] imageSize bytes of the JPEG, set with the codes 0 and 3; may be null */
int orbekExtractTokenFaceImageSized(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                                    float y1, char* buffer, int bufferSize, unsigned int* imageSize);

/** As orbekExtractMinimalTokenFaceImage(), and tells the size of the JPEG as
 * orbekExtractTokenFaceImageSized() does. */
int orbekExtractMinimalTokenFaceImageSized(const char* jpeg, unsigned int jpegSize, float x0, float y0,
                                           float x1, float y1, char* buffer, int bufferSize,
                                           unsigned int* imageSize);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif
